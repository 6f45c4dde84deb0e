// Number texts as typed under several numeric locales, the display
// patterns, and the conversions of texts to the record set's types.
// Input: a locale byte, a pattern byte, then the text.
#include "data/value.hpp"
#include "text/error.hpp"
#include "text/number.hpp"

#include <array>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <string_view>

using namespace belvane;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const std::array<text::NumberLocale, 6> kLocales{{
      {".", ","},
      {",", "."},
      {",", " "},
      {".", "'"},
      {",", "\xC2\xA0"},        // no-break space
      {"\xD9\xAB", "\xD9\xAC"}, // Arabic decimal and thousands separators
  }};
  static const std::array<std::string_view, 6> kPatterns{
      {text::kHours, text::kPrice, text::kPlain, "0", "#,##0.0000000000", "###0."}};
  if (size < 2) return 0;
  text::ScopedNumberLocale locale(kLocales[data[0] % kLocales.size()]);
  const std::string_view pattern = kPatterns[data[1] % kPatterns.size()];
  const std::string_view s(reinterpret_cast<const char*>(data) + 2, size - 2);

  const auto n = text::ParseNumber(s);
  if (n.has_value() != text::IsNumeric(s)) std::abort();
  (void)text::Format(s, pattern);
  if (n) {
    const std::string shown = text::FormatNumber(*n, pattern);
    if (shown.empty()) std::abort();
  }
  const data::Value v{std::string(s)};
  for (auto type : {data::DataType::SmallInt, data::DataType::Integer, data::DataType::Double,
                    data::DataType::Boolean, data::DataType::VarWChar}) {
    try {
      (void)v.ConvertTo(type).ToText();
    } catch (const Error&) {
    }
  }
  return 0;
}
