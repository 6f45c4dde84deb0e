#include "text/error.hpp"
#include "text/strings.hpp"

#include <gtest/gtest.h>

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
