#pragma once
// A field value as record sets hold it: Null, Boolean, 16-bit or 32-bit
// integer, Double or Text (UTF-8). Conversions follow what a host expects of
// its record set: numeric texts read under the user's locale, a text that is
// not a number is a type mismatch, Null converts only to Null.

#include <compare>
#include <cstdint>
#include <string>
#include <string_view>
#include <variant>

namespace belvane::data {

struct Null {
  friend bool operator==(Null, Null) = default;
};

enum class ValueType { Null, Boolean, Integer, Long, Double, Text };

// Field data types, numbered as the record set's data type constants.
enum class DataType : int {
  SmallInt = 2, // 16-bit integer
  Integer = 3,  // 32-bit integer
  Double = 5,
  Boolean = 11,
  Variant = 12,  // takes any value as it is given
  VarWChar = 202 // text
};

const char* DataTypeName(DataType t);

class Value {
public:
  Value() = default;
  Value(Null) {}
  Value(bool b) : v_(b) {}
  Value(int16_t i) : v_(i) {}
  Value(int32_t i) : v_(i) {}
  Value(double d) : v_(d) {}
  Value(std::string s) : v_(std::move(s)) {}
  Value(std::string_view s) : v_(std::string(s)) {}
  Value(const char* s) : v_(std::string(s)) {}

  ValueType Type() const { return static_cast<ValueType>(v_.index()); }
  bool IsNull() const { return v_.index() == 0; }
  bool IsNumber() const;

  // Conversions. Each raises error 94 (invalid use of Null) on Null, error 13
  // (type mismatch) on a text that does not convert, and error 6 (overflow)
  // when the number does not fit.
  bool ToBool() const;
  int16_t ToInt16() const;
  int32_t ToInt32() const;
  double ToDouble() const;
  // Text form: numbers in their shortest form with the locale's decimal
  // separator, Booleans "True"/"False". Null gives "" (as "" & Null does).
  std::string ToText() const;

  // Converts to a field's type: Null stays Null; raises as above otherwise.
  Value ConvertTo(DataType type) const;

  const std::string* TextIf() const { return std::get_if<std::string>(&v_); }

  // Same type and same value (Null equals Null here; criteria comparison
  // treats Null apart).
  friend bool operator==(const Value& a, const Value& b) { return a.v_ == b.v_; }

private:
  std::variant<Null, bool, int16_t, int32_t, double, std::string> v_;
};

// Whether a value already has the type a field of `type` holds (Variant
// holds any value): converting it to that type would change nothing.
bool HoldsType(const Value& v, DataType type);

// Orders two values as a sort or a criterion compares them: Null first,
// numbers (and Booleans) numerically, texts without regard to case; a
// number against a text compares as numbers when the text is numeric, else
// as texts.
std::weak_ordering CompareValues(const Value& a, const Value& b);

} // namespace belvane::data
