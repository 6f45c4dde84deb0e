// The Windows-1252 / UTF-8 boundary and letter case: every byte string
// becomes valid UTF-8 and comes back unchanged; texts that are not UTF-8
// are refused with an error, never read past their end.
#include "text/error.hpp"
#include "text/strings.hpp"

#include <cstdint>
#include <cstdlib>
#include <string_view>

using namespace belvane;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const std::string_view s(reinterpret_cast<const char*>(data), size);
  const std::string utf8 = text::Cp1252ToUtf8(s);
  if (!text::IsValidUtf8(utf8)) std::abort();
  const auto back = text::TryUtf8ToCp1252(utf8);
  if (!back || *back != s) std::abort();

  const auto bytes = text::TryUtf8ToCp1252(s);
  bool threw = false;
  try {
    if (text::Utf8ToCp1252(s) != bytes.value_or("")) std::abort();
  } catch (const Error&) {
    threw = true;
  }
  if (threw == bytes.has_value()) std::abort();

  const std::string upper = text::UCase(s), lower = text::LCase(s);
  if (text::IsValidUtf8(s) && (!text::IsValidUtf8(upper) || !text::IsValidUtf8(lower)))
    std::abort();
  if (!text::EqualsNoCase(s, upper) && text::IsValidUtf8(s)) std::abort();
  (void)text::Trim(s);
  return 0;
}
