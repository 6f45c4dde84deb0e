#pragma once
// Character positions in UTF-8 texts, for the caret and selection of text
// boxes, and the decoding of typed text. Invalid bytes count as one
// character each and decode as U+FFFD.

#include <cstddef>
#include <string>
#include <string_view>

namespace belvane::forms::utf8 {

int CharCount(std::string_view text);
// Byte offset of character `index` (clamped to the text's end).
std::size_t ByteOffset(std::string_view text, int index);
std::string Encode(char32_t character);
// Decodes the character at `pos` and moves `pos` past it.
char32_t Next(std::string_view text, std::size_t& pos);

} // namespace belvane::forms::utf8
