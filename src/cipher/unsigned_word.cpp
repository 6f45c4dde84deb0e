#include "cipher/unsigned_word.hpp"

#include "text/error.hpp"

#include <cmath>
#include <cstdio>

namespace belvane::cipher {

std::uint32_t DoubleToWord(double d) {
  // The negated comparison also refuses NaN.
  if (!(d >= 0.0 && d <= 4294967295.0)) {
    char buf[96];
    std::snprintf(buf, sizeof buf, "Overflow: %g is not an unsigned 32-bit value", d);
    throw Error(err::kOverflow, buf, "Belvane.Cipher");
  }
  return static_cast<std::uint32_t>(std::nearbyint(d));
}

} // namespace belvane::cipher
