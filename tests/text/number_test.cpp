#include "text/error.hpp"
#include "text/number.hpp"

#include <gtest/gtest.h>

using namespace belvane::text;

namespace {
NumberLocale English() { return NumberLocale{".", ","}; }
NumberLocale German() { return NumberLocale{",", "."}; }
} // namespace

TEST(FormatNumber, RoundsHalfAwayFromZeroOnShortestDecimalForm) {
  ScopedNumberLocale loc(English());
  EXPECT_EQ(FormatNumber(2.675, kHours), "2.68"); // binary 2.67499999...
  EXPECT_EQ(FormatNumber(1.005, kHours), "1.01");
  EXPECT_EQ(FormatNumber(0.125, kHours), "0.13");
  EXPECT_EQ(FormatNumber(-2.675, kHours), "-2.68");
  EXPECT_EQ(FormatNumber(2.5, kHours), "2.50");
  EXPECT_EQ(FormatNumber(9.995, kHours), "10.00");
  EXPECT_EQ(FormatNumber(999999.995, kHours), "1,000,000.00");
  EXPECT_EQ(FormatNumber(1.0005, kPrice), "1.001");
  EXPECT_EQ(FormatNumber(0.0004, kPrice), "0.000");
  EXPECT_EQ(FormatNumber(-0.004, kHours), "0.00"); // no "-0.00"
  EXPECT_EQ(FormatNumber(1e-7, kHours), "0.00");
  EXPECT_EQ(FormatNumber(0, kHours), "0.00");
}

TEST(FormatNumber, GroupsThousandsOnlyWhenThePatternDoes) {
  ScopedNumberLocale loc(English());
  EXPECT_EQ(FormatNumber(1234567.891, kHours), "1,234,567.89");
  EXPECT_EQ(FormatNumber(1234567.891, kPlain), "1234567.89");
  EXPECT_EQ(FormatNumber(123.4, kHours), "123.40");
  EXPECT_EQ(FormatNumber(-1234.5, kPrice), "-1,234.500");
  EXPECT_EQ(FormatNumber(1e21, kPlain), "1000000000000000000000.00");
}

TEST(FormatNumber, UsesTheLocaleSeparators) {
  ScopedNumberLocale loc(German());
  EXPECT_EQ(FormatNumber(1234.5, kHours), "1.234,50");
  EXPECT_EQ(Format("1.234,5", kHours), "1.234,50");
}

TEST(Format, LeavesNonNumbersUnchanged) {
  ScopedNumberLocale loc(English());
  EXPECT_EQ(Format("<Default>", kHours), "<Default>");
  EXPECT_EQ(Format("", kHours), "");
  EXPECT_EQ(Format("abc", kHours), "abc");
  EXPECT_EQ(Format(" 2.5 ", kHours), "2.50");
  EXPECT_EQ(Format("1,234.5", kPlain), "1234.50");
}

TEST(ParseNumber, AcceptsWhatAnEstimatorTypes) {
  ScopedNumberLocale loc(English());
  EXPECT_DOUBLE_EQ(*ParseNumber("1.50"), 1.5);
  EXPECT_DOUBLE_EQ(*ParseNumber("1,234.50"), 1234.5);
  EXPECT_DOUBLE_EQ(*ParseNumber(" -3 "), -3);
  EXPECT_DOUBLE_EQ(*ParseNumber(".5"), 0.5);
  EXPECT_DOUBLE_EQ(*ParseNumber("-.5"), -0.5);
  EXPECT_DOUBLE_EQ(*ParseNumber("+2"), 2);
  EXPECT_DOUBLE_EQ(*ParseNumber("5."), 5);
  EXPECT_DOUBLE_EQ(*ParseNumber("\t7\t"), 7);
  EXPECT_DOUBLE_EQ(*ParseNumber("12,34"), 1234);
}

TEST(ParseNumber, RefusesNonNumbers) {
  ScopedNumberLocale loc(English());
  for (const char* bad : {"", "   ", "abc", "1.2.3", "--1", "+-1", "1 2", "+", "-", ".", ",1", "1,",
                          "1,,2", "1.5,0", "1e5", "$5", "(5)", "5-", "0x10"}) {
    EXPECT_FALSE(IsNumeric(bad)) << bad;
  }
  EXPECT_THROW(ToDouble("abc"), belvane::Error);
  try {
    ToDouble("1.2.3");
  } catch (const belvane::Error& e) {
    EXPECT_EQ(e.Number(), 13);
  }
}

TEST(ParseNumber, FollowsTheLocale) {
  ScopedNumberLocale loc(German());
  EXPECT_DOUBLE_EQ(*ParseNumber("1.234,5"), 1234.5);
  EXPECT_DOUBLE_EQ(*ParseNumber("2,5"), 2.5);
  EXPECT_FALSE(IsNumeric("2,5,1"));
  // In a German locale "2.5" is 25 (a group separator between digits).
  EXPECT_DOUBLE_EQ(*ParseNumber("2.5"), 25);
}

TEST(NumberLocale, ScopedOverrideIsRestored) {
  {
    ScopedNumberLocale outer(German());
    {
      ScopedNumberLocale inner(English());
      EXPECT_EQ(CurrentNumberLocale().decimal, ".");
    }
    EXPECT_EQ(CurrentNumberLocale().decimal, ",");
  }
  EXPECT_EQ(CurrentNumberLocale().decimal, EnvironmentNumberLocale().decimal);
}
