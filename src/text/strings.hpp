#pragma once
// Text helpers: blanks, letter case and the Windows-1252 <-> UTF-8 boundary.
// Every text inside the program is UTF-8; enciphered catalogue values are
// Windows-1252 byte strings and cross that boundary only here.

#include <optional>
#include <string>
#include <string_view>

namespace belvane::text {

// Drop spaces at the start, the end, or both (as the forms' Trim does: only
// the space character, code 32).
std::string LTrim(std::string_view s);
std::string RTrim(std::string_view s);
std::string Trim(std::string_view s);

// Upper and lower case of ASCII and Latin-1 letters (U+00C0..U+00FE, and
// U+00FF <-> U+0178); every other character is kept as it is.
std::string UCase(std::string_view utf8);
std::string LCase(std::string_view utf8);

// Case-insensitive equality under the rules of UCase.
bool EqualsNoCase(std::string_view a, std::string_view b);

// Whether `haystack` holds `needleUpper`, a text already in upper case (as
// UCase gives it), without regard to case under the rules of UCase. An
// ASCII needle is matched in place, without an upper-case copy of the
// haystack: bytes of other characters can never match it.
bool ContainsNoCase(std::string_view haystack, std::string_view needleUpper);

// True when the text is well-formed UTF-8: no overlong forms, no
// surrogates, nothing past U+10FFFF, no cut-off sequence.
bool IsValidUtf8(std::string_view text);

// The UTF-8 form of one character; surrogates and values past U+10FFFF
// give U+FFFD.
std::string EncodeUtf8(char32_t character);

// Windows-1252 bytes to UTF-8. Every byte maps to a character: the five
// codes Windows-1252 leaves undefined (0x81, 0x8D, 0x8F, 0x90, 0x9D) map to
// the C1 controls U+0081 etc., so any byte string round-trips.
std::string Cp1252ToUtf8(std::string_view bytes);

// UTF-8 to Windows-1252 bytes. Returns nothing when the text is not valid
// UTF-8 or holds a character Windows-1252 cannot hold.
std::optional<std::string> TryUtf8ToCp1252(std::string_view utf8);

// As TryUtf8ToCp1252, raising error 5 that names the first character that
// cannot be held (or the invalid UTF-8 byte) instead of returning nothing.
std::string Utf8ToCp1252(std::string_view utf8);

} // namespace belvane::text
