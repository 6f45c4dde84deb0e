#pragma once
// Byte strings under Blowfish: padding, block packing and unpadding.
//
// A byte string is a std::string whose every char is one byte (0-255), as
// enciphered values are stored. Both operations use this thread's cipher
// state (see blowfish.hpp); set a key up first.

#include <string>
#include <string_view>

namespace belvane::cipher {

// Pads the text with p bytes of value p, p = 1 to 8 (a whole block of eights
// when its length is a multiple of 8, so the empty text gives one block), and
// enciphers it block by block. The result has 8 * (n / 8 + 1) bytes.
std::string BlowfishEncryptString(std::string_view plain);

// Deciphers the whole blocks of `data` (bytes past the last whole block are
// ignored) and removes the padding leniently: the last deciphered byte is the
// pad count when it is 1 to 8; any other value removes nothing, and the other
// pad bytes are not checked. Data shorter than one block raises error 9.
std::string BlowfishDecryptString(std::string_view data);

// As BlowfishDecryptString, on `data` in place (no copy for a caller that
// owns the bytes already). On an error `data` is unchanged.
void BlowfishDecryptInPlace(std::string& data);

} // namespace belvane::cipher
