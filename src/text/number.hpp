#pragma once
// Number texts as the estimator sees them: the three display patterns and the
// reading of typed numbers under the user's numeric locale.

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>

namespace belvane::text {

// Decimal and group separators. Taken from the environment's numeric locale
// (LC_ALL, LC_NUMERIC, LANG); "." and "," where the locale sets none.
struct NumberLocale {
  std::string decimal = ".";
  std::string group = ",";
};

// The locale in force on this thread: an override set by ScopedNumberLocale,
// else the environment's, read once per process.
const NumberLocale& CurrentNumberLocale();
NumberLocale EnvironmentNumberLocale();

// Sets the numeric locale of this thread for its lifetime (tests, hosts that
// keep their own settings).
class ScopedNumberLocale {
public:
  explicit ScopedNumberLocale(NumberLocale locale);
  ~ScopedNumberLocale();
  ScopedNumberLocale(const ScopedNumberLocale&) = delete;
  ScopedNumberLocale& operator=(const ScopedNumberLocale&) = delete;

private:
  std::optional<NumberLocale> previous_;
};

// The patterns the system uses.
inline constexpr std::string_view kHours = "###,##0.00";  // hours, rates, unit costs
inline constexpr std::string_view kPrice = "###,##0.000"; // prices with markup
inline constexpr std::string_view kPlain = "###0.00";     // no grouping

// Formats a number with a pattern of the form "#,##0.00" (any count of
// '#'/'0' before the point, a ',' anywhere there turns on grouping by
// threes, the count of '0' after the point fixes the decimals). Rounds half
// away from zero on the shortest decimal form of the value, so 2.675 gives
// "2.68" and 1.005 gives "1.01". Negative values keep their sign; a value
// that rounds to zero shows no sign.
std::string FormatNumber(double value, std::string_view pattern);

// FormatNumber with one pattern over a pass through many values (a
// catalogue load), keeping each text it makes: catalogues repeat a few
// thousand hours and costs over a hundred thousand rows. Texts are made
// under the locale in force when they are first asked for, so an instance
// lives no longer than the pass.
class NumberTexts {
public:
  explicit NumberTexts(std::string_view pattern) : pattern_(pattern) {}
  const std::string& operator()(double value);

private:
  std::string pattern_;
  std::unordered_map<std::uint64_t, std::string> made_; // by the value's bits
};

// Formats a text: a numeric text (see IsNumeric) is read and formatted, any
// other text is returned unchanged.
std::string Format(std::string_view value, std::string_view pattern);

// Reads a number typed under the current locale. Accepted, after blanks
// (spaces and tabs) at either end are dropped:
//   [sign] digits-with-groups [decimal digits*]   or   [sign] decimal digits+
// where sign is one '+' or '-', and group separators may stand only between
// two digits of the integer part ("1,234", "12,34"; not ",1", "1,", "1,,2").
// At least one digit is required. No exponents, no currency symbols, no
// parentheses. Not numbers: "", "  ", "abc", "1.2.3", "--1", "1 2", "+".
std::optional<double> ParseNumber(std::string_view textValue);
bool IsNumeric(std::string_view textValue);

// ParseNumber that raises error 13 (type mismatch) on a non-number.
double ToDouble(std::string_view textValue);

} // namespace belvane::text
