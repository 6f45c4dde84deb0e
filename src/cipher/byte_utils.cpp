#include "cipher/byte_utils.hpp"

#include "text/error.hpp"

#include <array>

namespace belvane::cipher {

namespace {

// Value of each character as a hexadecimal digit, or -1.
constexpr std::array<std::int8_t, 256> kDigitValue = [] {
  std::array<std::int8_t, 256> t{};
  t.fill(-1);
  for (int c = 0; c < 10; ++c)
    t['0' + c] = static_cast<std::int8_t>(c);
  for (int c = 0; c < 6; ++c) {
    t['A' + c] = static_cast<std::int8_t>(10 + c);
    t['a' + c] = static_cast<std::int8_t>(10 + c);
  }
  return t;
}();

[[noreturn]] void BadPair(std::string_view hex, std::size_t at) {
  std::string shown;
  for (char ch : hex.substr(at, 2)) {
    const auto b = static_cast<unsigned char>(ch);
    if (b >= 0x20 && b < 0x7F) {
      shown.push_back(ch);
    } else {
      static constexpr char kHex[] = "0123456789ABCDEF";
      shown += "\\x";
      shown.push_back(kHex[b >> 4]);
      shown.push_back(kHex[b & 0xF]);
    }
  }
  throw Error(err::kTypeMismatch,
              "Type mismatch: \"" + shown + "\" at position " + std::to_string(at + 1) +
                  " is not a pair of hexadecimal digits",
              "Belvane.Cipher");
}

// The value of the digit pair at `at`, or a negative number when either
// digit is not hexadecimal.
int PairValue(std::string_view hex, std::size_t at) {
  const int hi = kDigitValue[static_cast<unsigned char>(hex[at])];
  const int lo = kDigitValue[static_cast<unsigned char>(hex[at + 1])];
  return (hi | lo) < 0 ? -1 : hi << 4 | lo;
}

// Decodes the digit pairs of `hex` into `out`, which has room for them;
// raises error 13 naming the first pair that is not hexadecimal.
void DecodePairs(std::string_view hex, std::uint8_t* out) {
  if (TryHexToBytes(hex, out)) return;
  for (std::size_t at = 0;; at += 2)
    if (PairValue(hex, at) < 0) BadPair(hex, at);
}

} // namespace

std::size_t HexToBytes(std::string_view hex, std::span<std::uint8_t> bytes) {
  const std::size_t count = hex.size() / 2;
  if (count > bytes.size()) {
    throw Error(err::kSubscript,
                "Subscript out of range: " + std::to_string(count) +
                    " bytes do not fit an array of " + std::to_string(bytes.size()),
                "Belvane.Cipher");
  }
  DecodePairs(hex, bytes.data());
  return count;
}

bool TryHexToBytes(std::string_view hex, std::uint8_t* out) {
  // A bad pair is negative and sets the sign bit of `bad`, so one test at
  // the end covers them all.
  const std::size_t count = hex.size() / 2;
  int bad = 0;
  for (std::size_t i = 0; i < count; ++i) {
    const int v = PairValue(hex, 2 * i);
    bad |= v;
    out[i] = static_cast<std::uint8_t>(v);
  }
  return bad >= 0;
}

std::string StringToHex(std::string_view bytes) {
  static constexpr char kDigits[] = "0123456789ABCDEF";
  std::string out(bytes.size() * 2, '0');
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    const auto b = static_cast<unsigned char>(bytes[i]);
    out[2 * i] = kDigits[b >> 4];
    out[2 * i + 1] = kDigits[b & 0xF];
  }
  return out;
}

std::string HexToString(std::string_view hex) {
  std::string out(hex.size() / 2, '\0');
  DecodePairs(hex, reinterpret_cast<std::uint8_t*>(out.data()));
  return out;
}

} // namespace belvane::cipher
