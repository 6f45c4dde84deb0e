#include "text/error.hpp"
#include "text/strings.hpp"

#include <gtest/gtest.h>

#include <cctype>
#include <string>

using namespace belvane::text;

TEST(Trim, DropsSpacesOnly) {
  EXPECT_EQ(Trim("  FORD  "), "FORD");
  EXPECT_EQ(LTrim("  a b "), "a b ");
  EXPECT_EQ(RTrim("  a b "), "  a b");
  EXPECT_EQ(Trim("    "), "");
  EXPECT_EQ(Trim("\tx\t"), "\tx\t");
}

TEST(Case, AsciiAndLatin1Letters) {
  EXPECT_EQ(UCase("mta"), "MTA");
  EXPECT_EQ(UCase("3rd"), "3RD");
  EXPECT_EQ(UCase("crème brûlée ÿ"), "CRÈME BRÛLÉE Ÿ");
  EXPECT_EQ(LCase("CRÈME Ÿ"), "crème ÿ");
  EXPECT_EQ(UCase("÷ß€"), "÷ß€"); // not letters with a Latin-1 upper case
  EXPECT_TRUE(EqualsNoCase("Bonnet", "BONNET"));
  EXPECT_TRUE(EqualsNoCase("Pare-Chocs Avant é", "PARE-CHOCS AVANT É"));
  EXPECT_FALSE(EqualsNoCase("bonnet", "bonnets"));
  EXPECT_FALSE(EqualsNoCase("[", "{")); // differ by 0x20 but are not letters
}

TEST(Cp1252, EveryByteRoundTrips) {
  std::string all;
  for (int b = 0; b < 256; ++b)
    all.push_back(static_cast<char>(b));
  std::string utf8 = Cp1252ToUtf8(all);
  EXPECT_EQ(Utf8ToCp1252(utf8), all);
}

TEST(Cp1252, MapsTheHighCodes) {
  EXPECT_EQ(Cp1252ToUtf8("\x80"), "€");
  EXPECT_EQ(Cp1252ToUtf8("\xA3"), "£");
  EXPECT_EQ(Cp1252ToUtf8("\x92"), "\u2019");
  EXPECT_EQ(Utf8ToCp1252("L/H Guard £5 – €"), "L/H Guard \xA3"
                                              "5 \x96 \x80");
}

TEST(Cp1252, RefusesWhatItCannotHold) {
  EXPECT_FALSE(TryUtf8ToCp1252("Ω").has_value());
  EXPECT_FALSE(TryUtf8ToCp1252("\xC3").has_value());         // truncated
  EXPECT_FALSE(TryUtf8ToCp1252("\xC0\xAF").has_value());     // overlong
  EXPECT_FALSE(TryUtf8ToCp1252("\xED\xA0\x80").has_value()); // surrogate
  try {
    Utf8ToCp1252("abc漢");
    FAIL() << "expected an error";
  } catch (const belvane::Error& e) {
    EXPECT_EQ(e.Number(), 5);
    EXPECT_NE(e.Description().find("U+6F22"), std::string::npos);
    EXPECT_NE(e.Description().find("offset 3"), std::string::npos);
  }
}

// The search scans sixteen start positions at a time, then the rest one by
// one: every length and match position across those boundaries must agree
// with a plain upper-case search.
TEST(ContainsNoCase, AgreesWithAnUpperCaseSearchAtEveryLengthAndPosition) {
  const std::string needles[] = {"B", "BU", "BUMPER", "41", "L/H", "TAILGATE 41", "-7"};
  for (const std::string& needle : needles) {
    for (size_t length = 0; length <= 40; ++length) {
      for (size_t at = 0; at + needle.size() <= length; ++at) {
        // Filler that shares letters with the needles, the needle in mixed
        // case at `at`.
        std::string hay(length, 'a');
        for (size_t i = 0; i < length; ++i)
          hay[i] = "bumpertailgte"[i % 13];
        for (size_t k = 0; k < needle.size(); ++k)
          hay[at + k] = static_cast<char>(k % 2 ? std::tolower(needle[k]) : needle[k]);
        const bool expected = UCase(hay).find(needle) != std::string::npos;
        ASSERT_EQ(ContainsNoCase(hay, needle), expected) << needle << " in " << hay;
        ASSERT_TRUE(expected);
      }
      // No match anywhere: the needle's first and last bytes alone, and a
      // near miss in the last position.
      std::string miss(length, 'x');
      if (length >= needle.size() && needle.size() > 1) {
        miss.replace(length - needle.size(), needle.size(), needle);
        miss[length - 1] = '#';
      }
      ASSERT_EQ(ContainsNoCase(miss, needle), UCase(miss).find(needle) != std::string::npos)
          << needle << " in " << miss;
    }
  }
}

TEST(ContainsNoCase, BytesOfOtherCharactersNeverMatchAnAsciiNeedle) {
  // 0xC1 | 0x20 is 0xE1 and "Á" folds to nothing ASCII: only real letters
  // match, whatever bit 0x20 does to other bytes.
  EXPECT_FALSE(ContainsNoCase("\xC3\x81\xC3\xA1", "A"));
  EXPECT_FALSE(ContainsNoCase("@@@@@@@@@@@@@@@@@@@@", "`"));
  EXPECT_FALSE(ContainsNoCase("[[[[[[[[[[[[[[[[[[[[", "{"));
  EXPECT_TRUE(ContainsNoCase("caf\xC3\xA9 bar", "BAR"));
  EXPECT_TRUE(ContainsNoCase("anything", ""));
  EXPECT_FALSE(ContainsNoCase("", "A"));
  EXPECT_FALSE(ContainsNoCase("BUMPE", "BUMPER"));
  // A needle with other characters takes the full case mapping.
  EXPECT_TRUE(ContainsNoCase("front caf\xC3\xA9 panel", UCase("CAF\xC3\xA9")));
  EXPECT_FALSE(ContainsNoCase("front cafe panel", UCase("CAF\xC3\xA9")));
}
