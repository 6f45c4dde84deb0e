#include "text/number.hpp"

#include "text/error.hpp"

#include <charconv>
#include <clocale>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <langinfo.h>
#include <locale.h>

namespace belvane::text {

namespace {

thread_local std::optional<NumberLocale> tlsOverride;

bool IsBlank(char c) { return c == ' ' || c == '\t'; }
bool IsDigit(char c) { return c >= '0' && c <= '9'; }

struct PatternInfo {
  int decimals = 0;
  int minIntegerDigits = 0;
  bool grouping = false;
};

PatternInfo ReadPattern(std::string_view pattern) {
  PatternInfo info;
  bool afterPoint = false;
  for (char c : pattern) {
    if (c == '.') {
      afterPoint = true;
    } else if (c == ',' && !afterPoint) {
      info.grouping = true;
    } else if (c == '0' || c == '#') {
      if (afterPoint) {
        if (c == '0') ++info.decimals;
      } else if (c == '0') {
        ++info.minIntegerDigits;
      }
    }
  }
  return info;
}

// The shortest decimal form of |value| as digits and the position of the
// decimal point within them (digits "2675", point 1 means 2.675).
struct Decimal {
  std::string digits;
  int point = 0;
};

Decimal ShortestDecimal(double magnitude) {
  char buf[64];
  auto res = std::to_chars(buf, buf + sizeof buf, magnitude, std::chars_format::scientific);
  std::string_view s(buf, static_cast<size_t>(res.ptr - buf));
  Decimal d;
  size_t e = s.find('e');
  for (size_t i = 0; i < e; ++i) {
    if (IsDigit(s[i])) d.digits.push_back(s[i]);
  }
  int exponent = std::atoi(std::string(s.substr(e + 1)).c_str());
  d.point = exponent + 1;
  return d;
}

} // namespace

NumberLocale EnvironmentNumberLocale() {
  NumberLocale result;
  locale_t loc = newlocale(LC_NUMERIC_MASK, "", static_cast<locale_t>(nullptr));
  if (loc == static_cast<locale_t>(nullptr)) return result;
  const char* radix = nl_langinfo_l(RADIXCHAR, loc);
  const char* thousands = nl_langinfo_l(THOUSEP, loc);
  if (radix != nullptr && *radix != '\0') result.decimal = radix;
  if (thousands != nullptr && *thousands != '\0') result.group = thousands;
  if (result.group == result.decimal) result.group = result.decimal == "," ? "." : ",";
  freelocale(loc);
  return result;
}

const NumberLocale& CurrentNumberLocale() {
  if (tlsOverride) return *tlsOverride;
  static const NumberLocale environment = EnvironmentNumberLocale();
  return environment;
}

ScopedNumberLocale::ScopedNumberLocale(NumberLocale locale) : previous_(tlsOverride) {
  tlsOverride = std::move(locale);
}

ScopedNumberLocale::~ScopedNumberLocale() { tlsOverride = previous_; }

const std::string& NumberTexts::operator()(double value) {
  std::uint64_t bits;
  std::memcpy(&bits, &value, sizeof bits);
  auto [it, added] = made_.try_emplace(bits);
  if (added) it->second = FormatNumber(value, pattern_);
  return it->second;
}

std::string FormatNumber(double value, std::string_view pattern) {
  if (std::isnan(value)) return "NaN";
  if (std::isinf(value)) return value < 0 ? "-Infinity" : "Infinity";
  const PatternInfo info = ReadPattern(pattern);
  const NumberLocale& loc = CurrentNumberLocale();

  Decimal d = ShortestDecimal(std::fabs(value));
  if (value == 0) d = Decimal{"0", 1};

  // Make sure the digit string reaches the rounding position.
  if (d.point < 0) {
    d.digits.insert(0, static_cast<size_t>(-d.point), '0');
    d.point = 0;
  }
  const int keep = d.point + info.decimals; // digits kept
  if (static_cast<int>(d.digits.size()) < keep)
    d.digits.append(static_cast<size_t>(keep) - d.digits.size(), '0');
  bool roundUp =
      static_cast<int>(d.digits.size()) > keep && d.digits[static_cast<size_t>(keep)] >= '5';
  d.digits.resize(static_cast<size_t>(keep));
  if (roundUp) {
    int i = keep - 1;
    while (i >= 0 && d.digits[static_cast<size_t>(i)] == '9')
      d.digits[static_cast<size_t>(i--)] = '0';
    if (i >= 0) {
      ++d.digits[static_cast<size_t>(i)];
    } else {
      d.digits.insert(d.digits.begin(), '1');
      ++d.point;
    }
  }

  std::string intPart = d.digits.substr(0, static_cast<size_t>(d.point));
  std::string fracPart = d.digits.substr(static_cast<size_t>(d.point));
  size_t firstNonZero = intPart.find_first_not_of('0');
  intPart = firstNonZero == std::string::npos ? "" : intPart.substr(firstNonZero);
  if (static_cast<int>(intPart.size()) < info.minIntegerDigits)
    intPart.insert(0, static_cast<size_t>(info.minIntegerDigits) - intPart.size(), '0');

  bool allZero = intPart.find_first_not_of('0') == std::string::npos &&
                 fracPart.find_first_not_of('0') == std::string::npos;

  std::string out;
  if (value < 0 && !allZero) out.push_back('-');
  if (info.grouping) {
    for (size_t i = 0; i < intPart.size(); ++i) {
      if (i > 0 && (intPart.size() - i) % 3 == 0) out += loc.group;
      out.push_back(intPart[i]);
    }
  } else {
    out += intPart;
  }
  if (info.decimals > 0) {
    out += loc.decimal;
    out += fracPart;
  }
  return out;
}

std::string Format(std::string_view value, std::string_view pattern) {
  if (auto n = ParseNumber(value)) return FormatNumber(*n, pattern);
  return std::string(value);
}

std::optional<double> ParseNumber(std::string_view s) {
  const NumberLocale& loc = CurrentNumberLocale();
  while (!s.empty() && IsBlank(s.front()))
    s.remove_prefix(1);
  while (!s.empty() && IsBlank(s.back()))
    s.remove_suffix(1);
  if (s.empty()) return std::nullopt;

  std::string plain; // "C" form: [-]digits[.digits]
  size_t i = 0;
  if (s[i] == '+' || s[i] == '-') {
    if (s[i] == '-') plain.push_back('-');
    ++i;
  }
  int digits = 0;
  bool lastWasDigit = false;
  // Integer part with group separators between digits.
  while (i < s.size()) {
    if (IsDigit(s[i])) {
      plain.push_back(s[i]);
      ++digits;
      lastWasDigit = true;
      ++i;
    } else if (!loc.group.empty() && s.substr(i).starts_with(loc.group) && lastWasDigit &&
               i + loc.group.size() < s.size() && IsDigit(s[i + loc.group.size()])) {
      i += loc.group.size();
      lastWasDigit = false;
    } else {
      break;
    }
  }
  if (i < s.size() && s.substr(i).starts_with(loc.decimal)) {
    i += loc.decimal.size();
    plain.push_back('.');
    while (i < s.size() && IsDigit(s[i])) {
      plain.push_back(s[i]);
      ++digits;
      ++i;
    }
  }
  if (i != s.size() || digits == 0) return std::nullopt;

  double result = 0;
  const char* first = plain.data();
  const char* last = plain.data() + plain.size();
  auto [ptr, ec] = std::from_chars(first, last, result);
  if (ec != std::errc() || ptr != last) return std::nullopt;
  return result;
}

bool IsNumeric(std::string_view textValue) { return ParseNumber(textValue).has_value(); }

double ToDouble(std::string_view textValue) {
  if (auto n = ParseNumber(textValue)) return *n;
  throw Error(err::kTypeMismatch, "Type mismatch", "Belvane");
}

} // namespace belvane::text
