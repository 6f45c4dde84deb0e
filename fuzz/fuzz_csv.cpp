// The CSV reader: any text parses into records or is refused with an error
// naming a line of the text.
#include "data/tools/csv_import.hpp"
#include "text/error.hpp"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <string_view>

using namespace belvane;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const std::string_view s(reinterpret_cast<const char*>(data), size);
  const long lines = 1 + static_cast<long>(std::count(s.begin(), s.end(), '\n'));
  try {
    const auto records = data::tools::ParseCsv(s, "fuzz.csv");
    long last = 0;
    for (const auto& r : records) {
      if (r.fields.empty() || r.line <= last || r.line > lines) std::abort();
      last = r.line;
    }
  } catch (const Error& e) {
    if (e.Description().find("fuzz.csv line ") != 0) std::abort();
  }
  return 0;
}
