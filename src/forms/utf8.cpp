#include "forms/utf8.hpp"

#include "text/strings.hpp"

namespace belvane::forms::utf8 {

namespace {
unsigned char Byte(std::string_view text, std::size_t i) {
  return static_cast<unsigned char>(text[i]);
}
bool IsContinuation(unsigned char b) { return (b & 0xC0) == 0x80; }

// Length of a well-formed sequence starting at pos, or 0.
std::size_t SequenceLength(std::string_view text, std::size_t pos) {
  const unsigned char b = Byte(text, pos);
  std::size_t length = b < 0x80           ? 1
                       : (b >> 5) == 0x6  ? 2
                       : (b >> 4) == 0xE  ? 3
                       : (b >> 3) == 0x1E ? 4
                                          : 0;
  if (length == 0 || pos + length > text.size()) return 0;
  for (std::size_t i = 1; i < length; ++i)
    if (!IsContinuation(Byte(text, pos + i))) return 0;
  return length;
}
} // namespace

int CharCount(std::string_view text) {
  int count = 0;
  for (std::size_t pos = 0; pos < text.size(); ++count) {
    const std::size_t length = SequenceLength(text, pos);
    pos += length == 0 ? 1 : length;
  }
  return count;
}

std::size_t ByteOffset(std::string_view text, int index) {
  std::size_t pos = 0;
  for (int i = 0; i < index && pos < text.size(); ++i) {
    const std::size_t length = SequenceLength(text, pos);
    pos += length == 0 ? 1 : length;
  }
  return pos;
}

std::string Encode(char32_t c) { return text::EncodeUtf8(c); }

char32_t Next(std::string_view text, std::size_t& pos) {
  const std::size_t length = SequenceLength(text, pos);
  if (length == 0) {
    ++pos;
    return 0xFFFD;
  }
  char32_t c = Byte(text, pos);
  if (length > 1) {
    c &= length == 2 ? 0x1F : length == 3 ? 0x0F : 0x07;
    for (std::size_t i = 1; i < length; ++i)
      c = (c << 6) | (Byte(text, pos + i) & 0x3F);
  }
  pos += length;
  return c;
}

} // namespace belvane::forms::utf8
