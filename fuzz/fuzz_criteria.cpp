// Criteria texts as Find, Filter and Sort take them, and LIKE patterns.
// Input: a mode byte, then the text. 'F' Filter, 'f' Find (then one byte of
// direction and start, eight bytes of skip count), 'S' Sort, 'L' LIKE (value,
// a line feed, pattern); any other byte picks a mode by its value.
#include "data/criteria.hpp"
#include "data/recordset.hpp"
#include "text/error.hpp"

#include <cstdint>
#include <cstring>
#include <memory>
#include <string_view>

using namespace belvane;
using namespace belvane::data;

namespace {

std::unique_ptr<Recordset> MakeRecords() {
  auto rs = std::make_unique<Recordset>();
  auto& f = rs->Fields();
  f.Append("ITEMID", DataType::Integer);
  f.Append("report_on", DataType::SmallInt);
  f.Append("rrhour", DataType::Double);
  f.Append("itemno", DataType::VarWChar);
  f.Append("DELITEM", DataType::Boolean);
  f.Append("any", DataType::Variant);
  rs->Open();
  rs->AppendLoaded(
      {Value(1), Value(int16_t{0}), Value(1.5), Value("A100"), Value(false), Value("x")});
  rs->AppendLoaded({Value(-2147483647 - 1), Value(int16_t{-32768}), Value(-1e300),
                    Value(std::string(300, 'a')), Value(true), Value(7)});
  rs->AppendLoaded({Value(), Value(), Value(), Value(), Value(), Value()});
  rs->AppendLoaded({Value(2147483647), Value(int16_t{32767}), Value(0.0), Value("Ünïcödé ✓"),
                    Value(false), Value(2.5)});
  rs->MoveFirst();
  return rs;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static std::unique_ptr<Recordset> rs = MakeRecords();
  if (size == 0) return 0;
  const char mode = static_cast<char>(data[0]);
  std::string_view text(reinterpret_cast<const char*>(data) + 1, size - 1);
  const int pick = mode == 'F'   ? 0
                   : mode == 'f' ? 1
                   : mode == 'S' ? 2
                   : mode == 'L' ? 3
                                 : data[0] % 4;
  try {
    switch (pick) {
    case 0:
      rs->SetFilter(text);
      for (rs->MoveFirst(); !rs->Eof(); rs->MoveNext())
        (void)rs->Collect("ITEMID");
      rs->SetFilter("");
      break;
    case 1: {
      uint8_t how = 0;
      int64_t skip = 0;
      if (text.size() >= 9) {
        how = static_cast<uint8_t>(text[0]);
        std::memcpy(&skip, text.data() + 1, sizeof skip);
        text.remove_prefix(9);
      }
      const auto direction = (how & 1) ? adSearchBackward : adSearchForward;
      const auto start = static_cast<BookmarkEnum>((how >> 1) % 3);
      rs->MoveFirst();
      rs->Find(text, static_cast<long>(skip), direction, start);
      if (!rs->Eof() && !rs->Bof()) (void)rs->Collect("itemno");
      break;
    }
    case 2:
      rs->SetSort(text);
      rs->SetSort("");
      break;
    default: {
      const size_t nl = text.find('\n');
      const std::string_view value = text.substr(0, nl);
      const std::string_view pattern = nl == std::string_view::npos ? "" : text.substr(nl + 1);
      (void)LikeMatch(value, pattern);
      (void)ParseCriteria(text);
      break;
    }
    }
  } catch (const Error&) {
    // A malformed text is refused with an error: that is the sound outcome.
    try {
      rs->SetFilter("");
      rs->SetSort("");
    } catch (const Error&) {
    }
  }
  return 0;
}
