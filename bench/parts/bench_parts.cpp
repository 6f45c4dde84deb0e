// The parts editor at the sizes an estimator meets at the far end, each
// against a baseline in the same run:
//
//   CatalogueOpen    the editor opened in edit mode on a vehicle of 100,000
//                    catalogue parts whose names, part numbers and groups
//                    are enciphered: Form_Load reads and deciphers them into
//                    the available parts grid. Baseline: the same record
//                    set read from the catalogue and its three enciphered
//                    fields deciphered, with SQLite alone (no grid). The
//                    counter "retained_per_text" is the memory the open
//                    editor holds (heap in use, measured inside the session,
//                    less before it) over the bytes of the catalogue's text
//                    as the grid shows it.
//   Search           one text search over the 100,000 available parts.
//                    Baseline: a plain case-free substring scan of the same
//                    item numbers and descriptions, held as strings.
//   QuoteOpen        the editor opened on a quote of 500 or 5,000 parts.
//   QuoteSave        SavePartsChanges on the same quotes, its all-or-nothing
//                    check included. Baseline: the same Finds by ITEMID and
//                    the same field writes (the values the write-back
//                    stores) made directly on the record set, once.
//
// Baselines with SQLite alone step the same query the catalogue service
// runs.
//
// Every benchmark times only its phase, in the calling thread's processor
// time (manual time): the machines these run on are shared, and the wall
// clock there measures the neighbours as much as the code. Building the
// catalogue and the quote runs untimed.

#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "data/quote_store.hpp"
#include "data/tools/catalogue_writer.hpp"
#include "entry/cforms.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"
#include "forms/simulated_user.hpp"
#include "grid/flex_grid.hpp"
#include "parts/frm_parts.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include "bench_util.hpp"
#include "goals.hpp"

#include <benchmark/benchmark.h>
#include <malloc.h>
#include <sqlite3.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <ctime>
#include <filesystem>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

using namespace belvane;

namespace {

using Clock = bench::ThreadClock;
using bench::Seconds;
namespace cat = parts::col::cat;

// A field key of the benchmark's own, so that no machine key file matters.
constexpr const char* kFieldKey =
    "00112233445566778899AABBCCDDEEFF0123456789ABCDEFFEDCBA98765432100F1E2D3C";

constexpr int kCatalogueParts = 100000;
constexpr int kSmallParts = 40;             // the vehicle of the 500-part quote
constexpr const char* kBigModel = "1001";   // cat_no BIG
constexpr const char* kSmallModel = "1002"; // cat_no SMALL
// The searches: a common word (one part in twelve matches) and a rare
// text (a few dozen parts).
constexpr std::array<const char*, 2> kSearchTexts = {"bumper", "tailgate 41"};
constexpr double kNewMarkup = 30, kUsedMarkup = 20, kRecoreMarkup = 15, kAfterMarkup = 10;

constexpr std::array<const char*, 24> kPanels = {
    "FRONT BUMPER BAR",  "REAR BUMPER BAR", "BONNET",          "BOOT LID",   "FRONT GUARD",
    "FRONT GUARD MOULD", "FRONT DOOR",      "FRONT DOOR TRIM", "REAR DOOR",  "REAR DOOR TRIM",
    "QUARTER PANEL",     "QUARTER GLASS",   "ROOF PANEL",      "GRILLE",     "HEADLAMP",
    "HEADLAMP BULB",     "WINDSCREEN",      "REAR SCREEN",     "SILL PANEL", "SILL MOULD",
    "RADIATOR SUPPORT",  "FRONT APRON",     "REAR APRON",      "TAILGATE"};
constexpr std::array<const char*, 4> kSides = {"O", "L", "R", "O"};

std::string PartName(int i) {
  return std::string(kPanels[static_cast<size_t>(i) % kPanels.size()]) + " " +
         std::to_string(i / static_cast<int>(kPanels.size()));
}
std::string ItemNo(int i) { return "P" + std::to_string(200000 + i); }
std::string PartNo(int i) { return "PN-" + std::to_string(7000000 + i * 7); }
std::string Group(int i) { return kPanels[static_cast<size_t>(i) % kPanels.size()]; }
const char* Side(int i) { return kSides[static_cast<size_t>(i) % kSides.size()]; }
double UnitCost(int i) { return 10 + (i % 997) * 1.25; }

// The catalogue, written once per run.
class BenchCatalogue {
public:
  BenchCatalogue() {
    cipher::SetFieldKeyText(kFieldKey);
    path_ = (std::filesystem::temp_directory_path() /
             ("belvane-bench-parts-" + std::to_string(getpid()) + ".db"))
                .string();
    data::tools::SqliteCatalogueWriter writer(path_);
    using data::Value;
    writer.Insert("ALLMODEL", {Value(int32_t{1001}), Value("KESTREL"), Value("BIG"), Value(),
                               Value(), Value(), Value("BIG"), Value(), Value(), Value()});
    writer.Insert("ALLMODEL", {Value(int32_t{1002}), Value("KESTREL"), Value("SMALL"), Value(),
                               Value(), Value(), Value("SMALL"), Value(), Value(), Value()});
    writer.Insert("cinfo", {Value(int16_t{1}), Value("Bench"), Value("2024")});
    auto part = [&](const char* catNo, int i) {
      writer.Insert("VEHICLE_PART", {Value("KESTREL"), Value(catNo), Value(), Value(),
                                     Value(ItemNo(i)), Value(cipher::EncryptField(PartName(i))),
                                     Value(""), Value(Side(i)), Value(int32_t{1 + i % 3}),
                                     Value(UnitCost(i)), Value(cipher::EncryptField(PartNo(i))),
                                     Value(cipher::EncryptField(Group(i)))});
    };
    for (int i = 0; i < kCatalogueParts; ++i)
      part("BIG", i);
    for (int i = 0; i < kSmallParts; ++i)
      part("SMALL", i);
    for (int i = 0; i < 20; ++i)
      writer.Insert("ITEM_2",
                    {Value("G" + std::to_string(i)), Value("GENERAL ITEM " + std::to_string(i)),
                     Value("PRT"), Value("O"), Value("GENERAL")});
    writer.Commit();
    data::SetCatalogueLocation(path_);
  }
  ~BenchCatalogue() { std::filesystem::remove(path_); }
  const std::string& Path() const { return path_; }

private:
  std::string path_;
};

const BenchCatalogue& UseCatalogue() {
  static BenchCatalogue catalogue;
  return catalogue;
}

// Heap bytes in use.
size_t HeapInUse() {
  const struct mallinfo2 m = mallinfo2();
  return m.uordblks + m.hblkhd;
}

// Opens the parts editor through CForms in edit mode; `script` plays the
// estimator. False (and the benchmark skipped) when the editor reported an
// error.
bool Session(benchmark::State& state, data::RecordsetPtr& quote, const char* modelId,
             const std::function<void(parts::frmParts&)>& script) {
  forms::HeadlessRuntime& runtime = forms::ThreadHeadlessRuntime();
  runtime.Reset();
  runtime.QueueModal([&](forms::Form& f) { script(static_cast<parts::frmParts&>(f)); });
  CForms().ShowPartsForm(quote, "Q1001", "0", "KESTREL", modelId, "", kNewMarkup, kUsedMarkup,
                         kRecoreMarkup, kAfterMarkup, 25, 18, 12, 8, eEdit);
  if (!runtime.Messages().empty()) {
    state.SkipWithError(("message box: " + runtime.Messages().front().prompt).c_str());
    return false;
  }
  if (!runtime.UnhandledErrors().empty()) {
    state.SkipWithError(
        ("handler failed: " + runtime.UnhandledErrors().front().description).c_str());
    return false;
  }
  return true;
}

// The bytes of the texts the available parts grid shows.
size_t GridTextBytes(const grid::FlexGrid& g) {
  size_t bytes = 0;
  for (int r = 1; r < g.Rows(); ++r)
    for (int c = 0; c < g.Cols(); ++c)
      bytes += g.TextView(r, c).size();
  return bytes;
}

// ---- the 100,000-part catalogue ----

void BM_CatalogueOpen(benchmark::State& state) {
  UseCatalogue();
  data::RecordsetPtr quote = data::QuoteStore::NewItemRecordset();
  forms::SimulatedUser user;
  int rows = 0;
  double retainedPerText = 0;
  bool checked = false;
  for (auto _ : state) {
    double seconds = 0;
    const size_t heapBefore = HeapInUse();
    const auto opened = Clock::now();
    if (!Session(state, quote, kBigModel, [&](parts::frmParts& f) {
          seconds = Seconds(opened, Clock::now());
          const size_t retained = HeapInUse() - heapBefore;
          const grid::FlexGrid& g = f.FGParts;
          rows = g.Rows() - 1;
          retainedPerText = static_cast<double>(retained) / static_cast<double>(GridTextBytes(g));
          if (!checked) {
            // Spot checks: names, numbers and groups deciphered, the side
            // in front of the description.
            checked = true;
            for (int i : {0, 1, 2, kCatalogueParts / 2 + 1, kCatalogueParts - 1}) {
              const std::string side = Side(i);
              const std::string desc = side == "O" ? PartName(i) : side + "/H " + PartName(i);
              if (g.TextMatrix(i + 1, cat::kItemNo) != ItemNo(i) ||
                  g.TextMatrix(i + 1, cat::kDescription) != desc ||
                  g.TextMatrix(i + 1, cat::kPartNo) != PartNo(i) ||
                  g.TextMatrix(i + 1, cat::kGroup) != Group(i))
                state.SkipWithError("the available parts do not show the catalogue");
            }
          }
          user.Click(f.cmdClose);
        }))
      break;
    state.SetIterationTime(seconds);
  }
  if (rows != kCatalogueParts + 20) state.SkipWithError("the catalogue did not fill its grid");
  state.counters["parts"] = rows;
  state.counters["retained_per_text"] = retainedPerText;
}

// Baseline: the same vehicle's parts read with SQLite alone, every column
// taken as a string or a number, the enciphered ones (name, part number,
// group) deciphered together; no record set, no grid.
void BM_CatalogueReadDecipherBaseline(benchmark::State& state) {
  sqlite3* db = nullptr;
  sqlite3_open_v2(UseCatalogue().Path().c_str(), &db, SQLITE_OPEN_READONLY, nullptr);
  const char* sql =
      "SELECT ItemNo, PARTNAME, Script, SIDE, QTY, unitcost, partno, \"Group\" FROM VEHICLE_PART"
      " WHERE cat_no = ?1 AND make = ?2 COLLATE NOCASE"
      " AND (body_id IS NULL OR body_id = '' OR body_id = ?3)"
      " AND (state IS NULL OR state = 0 OR state = ?4) ORDER BY rowid";
  long rows = 0;
  for (auto _ : state) {
    const auto t0 = Clock::now();
    sqlite3_stmt* st = nullptr;
    sqlite3_prepare_v2(db, sql, -1, &st, nullptr);
    sqlite3_bind_text(st, 1, "BIG", -1, SQLITE_STATIC);
    sqlite3_bind_text(st, 2, "KESTREL", -1, SQLITE_STATIC);
    sqlite3_bind_text(st, 3, "", -1, SQLITE_STATIC);
    sqlite3_bind_int(st, 4, 1);
    rows = 0;
    std::array<std::string_view, 3> enciphered;
    std::array<std::string, 3> clear;
    while (sqlite3_step(st) == SQLITE_ROW) {
      enciphered = {};
      for (int c = 0; c < 8; ++c) {
        if (sqlite3_column_type(st, c) == SQLITE_TEXT) {
          const std::string_view view(reinterpret_cast<const char*>(sqlite3_column_text(st, c)),
                                      static_cast<size_t>(sqlite3_column_bytes(st, c)));
          if (c == 1 || c == 6 || c == 7) {
            enciphered[c == 1 ? 0 : c - 5] = view;
            continue;
          }
          std::string text(view);
          benchmark::DoNotOptimize(text);
        } else {
          benchmark::DoNotOptimize(sqlite3_column_double(st, c));
        }
      }
      // The enciphered fields of a row are deciphered together, the
      // quickest way there is.
      cipher::DecryptFields(enciphered, clear);
      benchmark::DoNotOptimize(clear);
      ++rows;
    }
    sqlite3_finalize(st);
    state.SetIterationTime(Seconds(t0, Clock::now()));
  }
  sqlite3_close(db);
  if (rows != kCatalogueParts) state.SkipWithError("the query did not give the catalogue");
  state.counters["parts"] = static_cast<double>(rows);
}

// The catalogue parts whose item number or description holds the search
// text, and the general items that do.
int ExpectedMatches(const std::string& searchText) {
  const std::string needle = text::UCase(searchText);
  int n = 0;
  for (int i = 0; i < kCatalogueParts; ++i)
    if (PartName(i).find(needle) != std::string::npos) ++n;
  return n;
}

// One search: the text typed into the search box, then Enter.
void BM_Search(benchmark::State& state) {
  const std::string searchText = kSearchTexts[static_cast<size_t>(state.range(0))];
  UseCatalogue();
  data::RecordsetPtr quote = data::QuoteStore::NewItemRecordset();
  forms::SimulatedUser user;
  int found = 0;
  for (auto _ : state) {
    double seconds = 0;
    if (!Session(state, quote, kBigModel, [&](parts::frmParts& f) {
          user.Click(f.txtSearch);
          user.Type(searchText);
          const auto t0 = Clock::now();
          user.PressKey(forms::keys::kEnter);
          seconds = Seconds(t0, Clock::now());
          found = f.fgSearch.Visible() ? f.fgSearch.Rows() - 1 : 0;
          user.Click(f.cmdClose);
        }))
      break;
    state.SetIterationTime(seconds);
  }
  if (found != ExpectedMatches(searchText)) state.SkipWithError("the search found the wrong rows");
  state.counters["found"] = found;
}

// Baseline: a plain case-free substring scan of the same item numbers and
// descriptions, held as strings.
void BM_SearchScanBaseline(benchmark::State& state) {
  const std::string searchText = kSearchTexts[static_cast<size_t>(state.range(0))];
  std::vector<std::pair<std::string, std::string>> texts;
  texts.reserve(kCatalogueParts);
  for (int i = 0; i < kCatalogueParts; ++i) {
    const std::string side = Side(i);
    texts.emplace_back(ItemNo(i), side == "O" ? PartName(i) : side + "/H " + PartName(i));
  }
  const std::string needle = text::UCase(searchText);
  int found = 0;
  for (auto _ : state) {
    const auto t0 = Clock::now();
    found = bench::PlainScan(texts, needle);
    benchmark::DoNotOptimize(found);
    state.SetIterationTime(Seconds(t0, Clock::now()));
  }
  if (found != ExpectedMatches(searchText)) state.SkipWithError("the scan found the wrong rows");
  state.counters["found"] = found;
}

// ---- the quotes ----

data::RecordsetPtr MakeQuote(int parts) {
  data::RecordsetPtr quote = data::QuoteStore::NewItemRecordset();
  data::Recordset& rs = *quote;
  const std::array<const char*, 5> marks = {"", "U", "X", "C", "A"};
  for (int i = 0; i < parts; ++i) {
    rs.AddNew();
    rs.Collect("ITEMID", data::Value(int32_t(i + 1)));
    rs.Collect("DELITEM", data::Value(false));
    rs.Collect("tag", data::Value("1"));
    rs.Collect("qtnno", data::Value("Q1001"));
    rs.Collect("subquote", data::Value("0"));
    rs.Collect("itemno", data::Value(ItemNo(i)));
    rs.Collect("script", data::Value(PartName(i)));
    rs.Collect("Category", data::Value("PRT"));
    rs.Collect("side", data::Value(Side(i)));
    rs.Collect("mark", data::Value(marks[static_cast<size_t>(i) % marks.size()]));
    rs.Collect("qty", data::Value(1.0));
    rs.Collect("unitcost", data::Value(UnitCost(i)));
    // Half priced with the old markups, half with the current ones.
    rs.Collect("rrhour", data::Value(UnitCost(i) * (i % 2 ? 1.25 : 1.30)));
    rs.Collect("partno", data::Value(PartNo(i)));
    rs.Collect("report_on", data::Value(int16_t{0}));
  }
  rs.AcceptChanges();
  return quote;
}

void BM_QuoteOpen(benchmark::State& state) {
  UseCatalogue();
  const int parts = static_cast<int>(state.range(0));
  forms::SimulatedUser user;
  int rows = 0;
  for (auto _ : state) {
    data::RecordsetPtr quote = MakeQuote(parts);
    double seconds = 0;
    const auto opened = Clock::now();
    if (!Session(state, quote, kSmallModel, [&](parts::frmParts& f) {
          seconds = Seconds(opened, Clock::now());
          rows = f.FGSelectedParts.Rows() - 1;
          user.Click(f.cmdClose);
        }))
      break;
    state.SetIterationTime(seconds);
  }
  if (rows != parts) state.SkipWithError("the quote's parts did not load");
  state.counters["parts"] = rows;
}

// The field writes SavePartsChanges makes: the fields it writes, with the
// values a save of the quote stores in them.
const std::vector<const char*> kWrittenFields = {
    "DELITEM", "qtnno",    "subquote", "Category", "itemno",    "script", "side", "mark",
    "qty",     "unitcost", "rrhour",   "partno",   "report_on", "Rev",    "tag"};

void BM_QuoteSave(benchmark::State& state) {
  UseCatalogue();
  const int parts = static_cast<int>(state.range(0));
  for (auto _ : state) {
    data::RecordsetPtr quote = MakeQuote(parts);
    double seconds = 0;
    if (!Session(state, quote, kSmallModel, [&](parts::frmParts& f) {
          const auto t0 = Clock::now();
          CForms().SavePartsChanges();
          seconds = Seconds(t0, Clock::now());
          forms::SimulatedUser().Click(f.cmdClose);
        }))
      break;
    if (quote->RecordCount() != parts) {
      state.SkipWithError("the write-back did not give the expected records");
      break;
    }
    state.SetIterationTime(seconds);
  }
  state.counters["records"] = parts;
}

void BM_QuoteSaveFindAndWriteBaseline(benchmark::State& state) {
  UseCatalogue();
  const int parts = static_cast<int>(state.range(0));
  // What the write-back stores, taken from one real save (untimed).
  std::vector<std::vector<data::Value>> stored;
  {
    data::RecordsetPtr saved = MakeQuote(parts);
    if (!Session(state, saved, kSmallModel, [&](parts::frmParts& f) {
          CForms().SavePartsChanges();
          forms::SimulatedUser().Click(f.cmdClose);
        }))
      return;
    for (saved->MoveFirst(); !saved->Eof(); saved->MoveNext()) {
      std::vector<data::Value> values;
      for (const char* field : kWrittenFields)
        values.push_back(saved->Collect(field));
      stored.push_back(std::move(values));
    }
  }
  for (auto _ : state) {
    data::RecordsetPtr quote = MakeQuote(parts);
    data::Recordset& rs = *quote;
    const auto t0 = Clock::now();
    for (int i = 0; i < parts; ++i) {
      rs.Find("ITEMID = " + std::to_string(i + 1), 0, data::adSearchForward, data::adBookmarkFirst);
      const auto& values = stored[static_cast<size_t>(i)];
      for (size_t k = 0; k < kWrittenFields.size(); ++k)
        rs.Collect(kWrittenFields[k], values[k]);
    }
    state.SetIterationTime(Seconds(t0, Clock::now()));
  }
  state.counters["records"] = parts;
}

} // namespace

int main(int argc, char** argv) {
  using bench::Measure;
  constexpr int kSmallQuote = 500, kLargeQuote = 5000;
  auto ms = [](benchmark::internal::Benchmark* b) {
    b->UseManualTime()->Unit(benchmark::kMillisecond);
  };
  benchmark::RegisterBenchmark("BM_CatalogueOpen", BM_CatalogueOpen)->Apply(ms);
  benchmark::RegisterBenchmark("BM_CatalogueReadDecipherBaseline", BM_CatalogueReadDecipherBaseline)
      ->Apply(ms);
  // Each search opens the whole catalogue first (untimed): a fixed count of
  // searches keeps the run short.
  benchmark::RegisterBenchmark("BM_Search", BM_Search)->DenseRange(0, 1)->Iterations(40)->Apply(ms);
  benchmark::RegisterBenchmark("BM_SearchScanBaseline", BM_SearchScanBaseline)
      ->DenseRange(0, 1)
      ->Apply(ms);
  for (const char* name : {"BM_QuoteOpen", "BM_QuoteSave", "BM_QuoteSaveFindAndWriteBaseline"}) {
    auto* fn = std::string(name) == "BM_QuoteOpen"   ? BM_QuoteOpen
               : std::string(name) == "BM_QuoteSave" ? BM_QuoteSave
                                                     : BM_QuoteSaveFindAndWriteBaseline;
    benchmark::RegisterBenchmark(name, fn)->Arg(kSmallQuote)->Arg(kLargeQuote)->Apply(ms);
  }

  auto m = [](std::string name, std::string label = "") {
    return Measure{std::move(name) + "/manual_time", "", std::move(label)};
  };
  bench::AddRatioGoal("Parts editor opens on 100,000 parts (names, numbers, groups enciphered)",
                      m("BM_CatalogueOpen"),
                      m("BM_CatalogueReadDecipherBaseline", "SQLite read + decipher"), 1.2);
  bench::AddValueGoal("Parts editor memory over the catalogue's text",
                      Measure{"BM_CatalogueOpen/manual_time", "retained_per_text", ""}, 2.0,
                      bench::Limit::AtMost, "x");
  bench::AddRatioGoal("Text search over 100,000 parts, common word (8,334 hits)", m("BM_Search/0"),
                      m("BM_SearchScanBaseline/0", "plain case-free scan"), 1.1);
  bench::AddRatioGoal("Text search over 100,000 parts, rare text (77 hits)", m("BM_Search/1"),
                      m("BM_SearchScanBaseline/1", "plain case-free scan"), 1.1);
  bench::AddRatioGoal("Parts write-back, 5,000 parts, check included", m("BM_QuoteSave/5000"),
                      m("BM_QuoteSaveFindAndWriteBaseline/5000", "Finds + writes once"), 1.5);
  bench::AddRatioGoal("Parts write-back grows linearly: 5,000 vs 500 parts", m("BM_QuoteSave/5000"),
                      m("BM_QuoteSave/500", "500 parts"), 11);
  bench::AddRatioGoal("Parts quote load grows linearly: 5,000 vs 500 parts", m("BM_QuoteOpen/5000"),
                      m("BM_QuoteOpen/500", "500 parts"), 11);
  return bench::RunWithGoals(argc, argv);
}
