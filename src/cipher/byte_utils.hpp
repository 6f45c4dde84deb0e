#pragma once
// Hexadecimal forms of byte strings: two digits per byte, most significant
// digit first, no separators. Digits are read in either case and written in
// upper case. A digit pair that is not hexadecimal raises a type mismatch
// (13); a last digit without a partner is ignored.

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

namespace belvane::cipher {

// Writes the values of the digit pairs of `hex` to bytes 0, 1, ... and
// returns their count, hex.size() / 2. When `bytes` is too small for them,
// raises error 9 before writing anything.
std::size_t HexToBytes(std::string_view hex, std::span<std::uint8_t> bytes);

// Two uppercase digits per byte of `bytes`.
std::string StringToHex(std::string_view bytes);

// The byte string of hex.size() / 2 bytes that `hex` spells.
std::string HexToString(std::string_view hex);

// Writes the hex.size() / 2 bytes that `hex` spells to `out`, which has room
// for them. Returns false, the bytes unspecified, when a digit pair is not
// hexadecimal (where HexToBytes would raise error 13).
bool TryHexToBytes(std::string_view hex, std::uint8_t* out);

} // namespace belvane::cipher
