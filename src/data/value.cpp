#include "data/value.hpp"

#include "text/error.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <charconv>
#include <cmath>
#include <limits>

namespace belvane::data {

namespace {

[[noreturn]] void Mismatch(std::string_view what) {
  throw Error(err::kTypeMismatch, "Type mismatch: " + std::string(what), "Belvane.Recordset");
}

[[noreturn]] void NullUse() {
  throw Error(err::kInvalidUseOfNull, "Invalid use of Null", "Belvane.Recordset");
}

[[noreturn]] void Overflow(double d) {
  throw Error(err::kOverflow, "Overflow: " + text::FormatNumber(d, "0.########"),
              "Belvane.Recordset");
}

// Rounds to a whole number half to even, as integer conversion of the
// host's runtime does (2.5 -> 2, 3.5 -> 4).
double RoundHalfEven(double d) {
  double r = std::nearbyint(d); // default rounding mode is to nearest, ties to even
  return r;
}

template <typename Int> Int ToInteger(double d) {
  double r = RoundHalfEven(d);
  if (!(r >= static_cast<double>(std::numeric_limits<Int>::min()) &&
        r <= static_cast<double>(std::numeric_limits<Int>::max())))
    Overflow(d);
  return static_cast<Int>(r);
}

} // namespace

const char* DataTypeName(DataType t) {
  switch (t) {
  case DataType::SmallInt:
    return "16-bit integer";
  case DataType::Integer:
    return "32-bit integer";
  case DataType::Double:
    return "Double";
  case DataType::Boolean:
    return "Boolean";
  case DataType::Variant:
    return "Variant";
  case DataType::VarWChar:
    return "Text";
  }
  return "unknown";
}

bool Value::IsNumber() const {
  auto t = Type();
  return t == ValueType::Integer || t == ValueType::Long || t == ValueType::Double;
}

double Value::ToDouble() const {
  switch (Type()) {
  case ValueType::Null:
    NullUse();
  case ValueType::Boolean:
    return std::get<bool>(v_) ? -1.0 : 0.0;
  case ValueType::Integer:
    return std::get<int16_t>(v_);
  case ValueType::Long:
    return std::get<int32_t>(v_);
  case ValueType::Double:
    return std::get<double>(v_);
  case ValueType::Text: {
    const auto& s = std::get<std::string>(v_);
    if (auto n = text::ParseNumber(s)) return *n;
    Mismatch("\"" + s + "\" is not a number");
  }
  }
  return 0;
}

int16_t Value::ToInt16() const {
  if (Type() == ValueType::Integer) return std::get<int16_t>(v_);
  return ToInteger<int16_t>(ToDouble());
}

int32_t Value::ToInt32() const {
  if (Type() == ValueType::Long) return std::get<int32_t>(v_);
  if (Type() == ValueType::Integer) return std::get<int16_t>(v_);
  return ToInteger<int32_t>(ToDouble());
}

bool Value::ToBool() const {
  switch (Type()) {
  case ValueType::Null:
    NullUse();
  case ValueType::Boolean:
    return std::get<bool>(v_);
  case ValueType::Text: {
    const auto& s = std::get<std::string>(v_);
    std::string t = text::UCase(text::Trim(s));
    if (t == "TRUE") return true;
    if (t == "FALSE") return false;
    if (auto n = text::ParseNumber(s)) return *n != 0;
    Mismatch("\"" + s + "\" is not a Boolean");
  }
  default:
    return ToDouble() != 0;
  }
}

std::string Value::ToText() const {
  switch (Type()) {
  case ValueType::Null:
    return {};
  case ValueType::Boolean:
    return std::get<bool>(v_) ? "True" : "False";
  case ValueType::Integer:
    return std::to_string(std::get<int16_t>(v_));
  case ValueType::Long:
    return std::to_string(std::get<int32_t>(v_));
  case ValueType::Double: {
    double d = std::get<double>(v_);
    char buf[64];
    auto res = std::to_chars(buf, buf + sizeof buf, d);
    std::string s(buf, static_cast<size_t>(res.ptr - buf));
    const std::string& dec = text::CurrentNumberLocale().decimal;
    if (auto p = s.find('.'); p != std::string::npos && dec != ".") s.replace(p, 1, dec);
    return s;
  }
  case ValueType::Text:
    return std::get<std::string>(v_);
  }
  return {};
}

Value Value::ConvertTo(DataType type) const {
  if (IsNull()) return *this;
  switch (type) {
  case DataType::SmallInt:
    return Value(ToInt16());
  case DataType::Integer:
    return Value(ToInt32());
  case DataType::Double:
    return Value(ToDouble());
  case DataType::Boolean:
    return Value(ToBool());
  case DataType::VarWChar:
    return Value(ToText());
  case DataType::Variant:
    return *this;
  }
  return *this;
}

bool HoldsType(const Value& v, DataType type) {
  switch (type) {
  case DataType::SmallInt:
    return v.Type() == ValueType::Integer;
  case DataType::Integer:
    return v.Type() == ValueType::Long;
  case DataType::Double:
    return v.Type() == ValueType::Double;
  case DataType::Boolean:
    return v.Type() == ValueType::Boolean;
  case DataType::VarWChar:
    return v.Type() == ValueType::Text;
  case DataType::Variant:
    return true;
  }
  return false;
}

std::weak_ordering CompareValues(const Value& a, const Value& b) {
  if (a.IsNull() || b.IsNull()) {
    if (a.IsNull() && b.IsNull()) return std::weak_ordering::equivalent;
    return a.IsNull() ? std::weak_ordering::less : std::weak_ordering::greater;
  }
  const std::string* ta = a.TextIf();
  const std::string* tb = b.TextIf();
  if (!ta && !tb) {
    double x = a.ToDouble(), y = b.ToDouble();
    if (x < y) return std::weak_ordering::less;
    if (x > y) return std::weak_ordering::greater;
    return std::weak_ordering::equivalent;
  }
  if (ta && tb) {
    std::string ua = text::UCase(*ta), ub = text::UCase(*tb);
    int c = ua.compare(ub);
    return c < 0 ? std::weak_ordering::less
                 : (c > 0 ? std::weak_ordering::greater : std::weak_ordering::equivalent);
  }
  // One number, one text.
  const std::string& t = ta ? *ta : *tb;
  if (auto n = text::ParseNumber(t)) {
    double x = ta ? *n : a.ToDouble();
    double y = tb ? *n : b.ToDouble();
    if (x < y) return std::weak_ordering::less;
    if (x > y) return std::weak_ordering::greater;
    return std::weak_ordering::equivalent;
  }
  return CompareValues(Value(a.ToText()), Value(b.ToText()));
}

} // namespace belvane::data
