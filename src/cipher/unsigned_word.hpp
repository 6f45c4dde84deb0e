#pragma once
// 32-bit words treated as unsigned values. Blowfish maps four bytes to a word
// big-endian (the first byte is the most significant) for key bytes, block
// bytes and S-box indices alike; all word arithmetic is modulo 2^32.

#include <array>
#include <cstdint>

namespace belvane::cipher {

// The four bytes of a word, most significant first.
constexpr std::array<std::uint8_t, 4> WordToBytes(std::uint32_t w) {
  return {static_cast<std::uint8_t>(w >> 24), static_cast<std::uint8_t>(w >> 16),
          static_cast<std::uint8_t>(w >> 8), static_cast<std::uint8_t>(w)};
}

// b0 * 2^24 + b1 * 2^16 + b2 * 2^8 + b3.
constexpr std::uint32_t BytesToWord(std::uint8_t b0, std::uint8_t b1, std::uint8_t b2,
                                    std::uint8_t b3) {
  return (std::uint32_t{b0} << 24) | (std::uint32_t{b1} << 16) | (std::uint32_t{b2} << 8) |
         std::uint32_t{b3};
}

// The word shifted left by 8 bits; the top 8 bits are dropped.
constexpr std::uint32_t ShiftLeft8(std::uint32_t w) { return w << 8; }

// The sum modulo 2^32.
constexpr std::uint32_t UnsignedAdd(std::uint32_t a, std::uint32_t b) { return a + b; }

// The unsigned value 0 to 4294967295 as a floating-point number.
constexpr double WordToDouble(std::uint32_t w) { return static_cast<double>(w); }

// The word whose unsigned value is `d`, rounded to the nearest whole number
// (halves to even). A number outside 0 to 4294967295, or not a number at all,
// raises an overflow error (6).
std::uint32_t DoubleToWord(double d);

} // namespace belvane::cipher
