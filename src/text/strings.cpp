#include "text/strings.hpp"

#include "text/error.hpp"

#include <array>
#include <cstdint>
#include <cstdio>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace belvane::text {

namespace {

// Characters of the codes 0x80..0x9F in Windows-1252; the undefined ones
// carry their own code.
constexpr std::array<char32_t, 32> kHigh = {
    0x20AC, 0x0081, 0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021, 0x02C6, 0x2030, 0x0160,
    0x2039, 0x0152, 0x008D, 0x017D, 0x008F, 0x0090, 0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
    0x2013, 0x2014, 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0x009D, 0x017E, 0x0178};

void AppendUtf8(std::string& out, char32_t c) {
  if (c > 0x10FFFF || (c >= 0xD800 && c <= 0xDFFF)) c = 0xFFFD;
  if (c < 0x80) {
    out.push_back(static_cast<char>(c));
  } else if (c < 0x800) {
    out.push_back(static_cast<char>(0xC0 | (c >> 6)));
    out.push_back(static_cast<char>(0x80 | (c & 0x3F)));
  } else if (c < 0x10000) {
    out.push_back(static_cast<char>(0xE0 | (c >> 12)));
    out.push_back(static_cast<char>(0x80 | ((c >> 6) & 0x3F)));
    out.push_back(static_cast<char>(0x80 | (c & 0x3F)));
  } else {
    out.push_back(static_cast<char>(0xF0 | (c >> 18)));
    out.push_back(static_cast<char>(0x80 | ((c >> 12) & 0x3F)));
    out.push_back(static_cast<char>(0x80 | ((c >> 6) & 0x3F)));
    out.push_back(static_cast<char>(0x80 | (c & 0x3F)));
  }
}

// Decodes one UTF-8 character at s[i]; advances i. Returns nothing on an
// invalid sequence (overlong forms, surrogates and truncation included).
std::optional<char32_t> DecodeUtf8(std::string_view s, size_t& i) {
  const auto b0 = static_cast<unsigned char>(s[i]);
  if (b0 < 0x80) {
    ++i;
    return b0;
  }
  int extra = 0;
  char32_t c = 0;
  char32_t min = 0;
  if ((b0 & 0xE0) == 0xC0) {
    extra = 1, c = b0 & 0x1F, min = 0x80;
  } else if ((b0 & 0xF0) == 0xE0) {
    extra = 2, c = b0 & 0x0F, min = 0x800;
  } else if ((b0 & 0xF8) == 0xF0) {
    extra = 3, c = b0 & 0x07, min = 0x10000;
  } else {
    return std::nullopt;
  }
  if (i + static_cast<size_t>(extra) >= s.size()) return std::nullopt;
  for (int k = 1; k <= extra; ++k) {
    const auto b = static_cast<unsigned char>(s[i + static_cast<size_t>(k)]);
    if ((b & 0xC0) != 0x80) return std::nullopt;
    c = (c << 6) | (b & 0x3F);
  }
  if (c < min || c > 0x10FFFF || (c >= 0xD800 && c <= 0xDFFF)) return std::nullopt;
  i += static_cast<size_t>(extra) + 1;
  return c;
}

std::optional<unsigned char> ToCp1252(char32_t c) {
  if (c < 0x80 || (c >= 0xA0 && c <= 0xFF)) return static_cast<unsigned char>(c);
  for (size_t k = 0; k < kHigh.size(); ++k) {
    if (kHigh[k] == c) return static_cast<unsigned char>(0x80 + k);
  }
  return std::nullopt;
}

char32_t UpperChar(char32_t c) {
  if (c >= 'a' && c <= 'z') return c - 32;
  if (c >= 0xE0 && c <= 0xFE && c != 0xF7) return c - 32;
  if (c == 0xFF) return 0x178;
  if (c == 0x161 || c == 0x17E || c == 0x153) return c - 1; // š ž œ
  return c;
}

char32_t LowerChar(char32_t c) {
  if (c >= 'A' && c <= 'Z') return c + 32;
  if (c >= 0xC0 && c <= 0xDE && c != 0xD7) return c + 32;
  if (c == 0x178) return 0xFF;
  if (c == 0x160 || c == 0x17D || c == 0x152) return c + 1; // Š Ž Œ
  return c;
}

template <typename F> std::string MapChars(std::string_view s, F f) {
  std::string out;
  out.reserve(s.size());
  size_t i = 0;
  while (i < s.size()) {
    // Plain ASCII, the common case, maps byte by byte.
    if (static_cast<unsigned char>(s[i]) < 0x80) {
      out.push_back(static_cast<char>(f(static_cast<unsigned char>(s[i]))));
      ++i;
      continue;
    }
    size_t start = i;
    auto c = DecodeUtf8(s, i);
    if (!c) { // keep bytes of an invalid sequence as they are
      out.push_back(s[start]);
      i = start + 1;
      continue;
    }
    AppendUtf8(out, f(*c));
  }
  return out;
}

} // namespace

bool IsValidUtf8(std::string_view text) {
  size_t i = 0;
  while (i < text.size())
    if (!DecodeUtf8(text, i)) return false;
  return true;
}

std::string EncodeUtf8(char32_t character) {
  std::string out;
  AppendUtf8(out, character);
  return out;
}

std::string LTrim(std::string_view s) {
  size_t b = s.find_first_not_of(' ');
  return b == std::string_view::npos ? std::string() : std::string(s.substr(b));
}

std::string RTrim(std::string_view s) {
  size_t e = s.find_last_not_of(' ');
  return e == std::string_view::npos ? std::string() : std::string(s.substr(0, e + 1));
}

std::string Trim(std::string_view s) { return LTrim(RTrim(s)); }

std::string UCase(std::string_view utf8) { return MapChars(utf8, UpperChar); }
std::string LCase(std::string_view utf8) { return MapChars(utf8, LowerChar); }

bool EqualsNoCase(std::string_view a, std::string_view b) {
  if (a.size() == b.size()) {
    bool ascii = true;
    for (size_t i = 0; i < a.size(); ++i) {
      auto ca = static_cast<unsigned char>(a[i]);
      auto cb = static_cast<unsigned char>(b[i]);
      if (ca >= 0x80 || cb >= 0x80) {
        ascii = false;
        break;
      }
      if (ca != cb && (ca | 0x20) != (cb | 0x20)) return false;
      if (ca != cb && !((ca | 0x20) >= 'a' && (ca | 0x20) <= 'z')) return false;
    }
    if (ascii) return true;
  }
  return UCase(a) == UCase(b);
}

bool ContainsNoCase(std::string_view haystack, std::string_view needleUpper) {
  const size_t n = needleUpper.size();
  if (n == 0) return true;
  for (char c : needleUpper)
    if (static_cast<unsigned char>(c) >= 0x80)
      return UCase(haystack).find(needleUpper) != std::string::npos;
  if (haystack.size() < n) return false;
  // ASCII letters in upper case; every other byte as it is.
  static constexpr std::array<unsigned char, 256> kUpper = [] {
    std::array<unsigned char, 256> t{};
    for (int c = 0; c < 256; ++c)
      t[static_cast<size_t>(c)] = static_cast<unsigned char>(c >= 'a' && c <= 'z' ? c - 32 : c);
    return t;
  }();
  const auto* needle = reinterpret_cast<const unsigned char*>(needleUpper.data());
  const auto* p = reinterpret_cast<const unsigned char*>(haystack.data());
  const size_t last = n - 1;
  const size_t starts = haystack.size() - n + 1; // positions a match can start at
  // A candidate start has the needle's first and last bytes in place. Each
  // is tested with one comparison: a letter's two cases differ only in bit
  // 0x20, so that bit is set on both sides; other bytes compare as they are.
  auto foldOf = [](unsigned char c) -> unsigned char { return c >= 'A' && c <= 'Z' ? 0x20 : 0; };
  const unsigned char foldFirst = foldOf(needle[0]), first = needle[0] | foldFirst;
  const unsigned char foldLast = foldOf(needle[last]), lastByte = needle[last] | foldLast;
  auto matchesAt = [&](size_t i) {
    for (size_t k = 1; k < last; ++k)
      if (kUpper[p[i + k]] != needle[k]) return false;
    return true;
  };
  size_t i = 0;
#if defined(__SSE2__)
  // Sixteen candidate starts at a time; both loads stay inside the text.
  const __m128i vFirst = _mm_set1_epi8(static_cast<char>(first));
  const __m128i vFoldFirst = _mm_set1_epi8(static_cast<char>(foldFirst));
  const __m128i vLast = _mm_set1_epi8(static_cast<char>(lastByte));
  const __m128i vFoldLast = _mm_set1_epi8(static_cast<char>(foldLast));
  for (; i + 16 <= starts; i += 16) {
    const __m128i a = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p + i));
    const __m128i b = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p + i + last));
    const __m128i both = _mm_and_si128(_mm_cmpeq_epi8(_mm_or_si128(a, vFoldFirst), vFirst),
                                       _mm_cmpeq_epi8(_mm_or_si128(b, vFoldLast), vLast));
    for (auto mask = static_cast<unsigned>(_mm_movemask_epi8(both)); mask != 0; mask &= mask - 1)
      if (matchesAt(i + static_cast<size_t>(__builtin_ctz(mask)))) return true;
  }
#endif
  for (; i < starts; ++i)
    if ((p[i] | foldFirst) == first && (p[i + last] | foldLast) == lastByte && matchesAt(i))
      return true;
  return false;
}

std::string Cp1252ToUtf8(std::string_view bytes) {
  std::string out;
  out.reserve(bytes.size());
  for (char ch : bytes) {
    const auto b = static_cast<unsigned char>(ch);
    if (b < 0x80) {
      out.push_back(ch);
    } else if (b < 0xA0) {
      AppendUtf8(out, kHigh[b - 0x80]);
    } else {
      AppendUtf8(out, b);
    }
  }
  return out;
}

std::optional<std::string> TryUtf8ToCp1252(std::string_view utf8) {
  std::string out;
  out.reserve(utf8.size());
  size_t i = 0;
  while (i < utf8.size()) {
    auto c = DecodeUtf8(utf8, i);
    if (!c) return std::nullopt;
    auto b = ToCp1252(*c);
    if (!b) return std::nullopt;
    out.push_back(static_cast<char>(*b));
  }
  return out;
}

std::string Utf8ToCp1252(std::string_view utf8) {
  std::string out;
  out.reserve(utf8.size());
  size_t i = 0;
  while (i < utf8.size()) {
    size_t start = i;
    auto c = DecodeUtf8(utf8, i);
    if (!c) {
      char buf[96];
      std::snprintf(buf, sizeof buf, "Invalid UTF-8 byte 0x%02X at offset %zu",
                    static_cast<unsigned>(static_cast<unsigned char>(utf8[start])), start);
      throw Error(err::kInvalidCall, buf, "Belvane.Text");
    }
    auto b = ToCp1252(*c);
    if (!b) {
      char buf[128];
      std::snprintf(
          buf, sizeof buf, "Character U+%04X (\"%s\") at offset %zu cannot be held in Windows-1252",
          static_cast<unsigned>(*c), std::string(utf8.substr(start, i - start)).c_str(), start);
      throw Error(err::kInvalidCall, buf, "Belvane.Text");
    }
    out.push_back(static_cast<char>(*b));
  }
  return out;
}

} // namespace belvane::text
