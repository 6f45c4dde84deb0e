#include "data/value.hpp"
#include "error_number.hpp"
#include "text/error.hpp"
#include "text/number.hpp"

#include <gtest/gtest.h>

using namespace belvane;
using namespace belvane::data;

namespace {
using belvane::test::ErrorNumber;
} // namespace

TEST(Value, ConvertsAsAHostExpects) {
  text::ScopedNumberLocale loc({".", ","});
  EXPECT_DOUBLE_EQ(Value("1,234.50").ConvertTo(DataType::Double).ToDouble(), 1234.5);
  EXPECT_EQ(Value(2.5).ConvertTo(DataType::VarWChar).ToText(), "2.5");
  EXPECT_EQ(Value(int16_t{1}).ConvertTo(DataType::VarWChar).ToText(), "1");
  EXPECT_EQ(Value(2.5).ConvertTo(DataType::SmallInt).ToInt16(), 2); // half to even
  EXPECT_EQ(Value(3.5).ConvertTo(DataType::SmallInt).ToInt16(), 4);
  EXPECT_EQ(Value("True").ConvertTo(DataType::Boolean), Value(true));
  EXPECT_EQ(Value("0").ConvertTo(DataType::Boolean), Value(false));
  EXPECT_EQ(Value(false).ToText(), "False");
  EXPECT_TRUE(Value().ConvertTo(DataType::Double).IsNull());
  EXPECT_EQ(Value().ToText(), "");
}

TEST(Value, RefusesWhatCannotConvert) {
  EXPECT_EQ(ErrorNumber([] { Value("abc").ConvertTo(DataType::Double); }), err::kTypeMismatch);
  EXPECT_EQ(ErrorNumber([] { Value("yes").ConvertTo(DataType::Boolean); }), err::kTypeMismatch);
  EXPECT_EQ(ErrorNumber([] { Value(40000).ConvertTo(DataType::SmallInt); }), err::kOverflow);
  EXPECT_EQ(ErrorNumber([] { Value(3e10).ConvertTo(DataType::Integer); }), err::kOverflow);
  EXPECT_EQ(ErrorNumber([] { (void)Value().ToDouble(); }), err::kInvalidUseOfNull);
}

TEST(Value, DecimalCommaLocale) {
  text::ScopedNumberLocale loc({",", "."});
  EXPECT_DOUBLE_EQ(Value("2,5").ToDouble(), 2.5);
  EXPECT_EQ(Value(2.5).ToText(), "2,5");
}

TEST(Value, OrdersNullFirstNumbersNumericallyTextsWithoutCase) {
  EXPECT_TRUE(CompareValues(Value(), Value(0)) < 0);
  EXPECT_TRUE(CompareValues(Value(2), Value(10.0)) < 0);
  EXPECT_TRUE(CompareValues(Value("abc"), Value("ABC")) == 0);
  EXPECT_TRUE(CompareValues(Value("a"), Value("B")) < 0);
  EXPECT_TRUE(CompareValues(Value(12), Value("12")) == 0);
  EXPECT_TRUE(CompareValues(Value("10"), Value("9")) < 0); // both texts: as texts
}
