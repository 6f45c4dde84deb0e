// The labour editor at the sizes an estimator meets at the far end, each
// against a baseline in the same run:
//
//   Quote*     a quote of 500, 2,000 or 5,000 lines (three stored records
//              each: R&R, RA and PAINT) opened in edit mode; the estimator
//              changes three lines' hours, then the editor writes the lines
//              back (SaveLabourChanges during the session, and Close).
//              Baseline: the same Finds by ITEMID and field writes done
//              directly on the record set, once.
//   Schedule*  a schedule of 20,000 items, half of them with enciphered
//              hours, filled into its grid as the editor opens, and one text
//              search over it. Baselines: the same rows read with SQLite
//              alone (and their hours deciphered), GetLabourItems' record
//              set against stepping its query, the grid's AddItem of the
//              same rows, and a plain case-free scan of the same texts.
//
// Every benchmark times only its phase in the thread's processor time
// (manual time); the rest of the session (building the quote, the other
// phases) runs untimed. The goals at the end compare each with its
// baseline.

#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "data/quote_store.hpp"
#include "data/tools/catalogue_writer.hpp"
#include "entry/cforms.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"
#include "forms/simulated_user.hpp"
#include "grid/flex_grid.hpp"
#include "labour/frm_labour.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include "bench_util.hpp"
#include "goals.hpp"

#include <benchmark/benchmark.h>
#include <sqlite3.h>
#include <unistd.h>

#include <array>
#include <charconv>
#include <chrono>
#include <filesystem>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

using namespace belvane;

namespace {

using Clock = bench::ThreadClock;
using bench::Seconds;
namespace col = labour::col;

// A field key of the benchmark's own, so that no machine key file matters.
constexpr const char* kFieldKey =
    "00112233445566778899AABBCCDDEEFF0123456789ABCDEFFEDCBA98765432100F1E2D3C";

constexpr int kScheduleItems = 20000;
constexpr const char* kBigSchedule = "N20000";   // the 20,000 items
constexpr const char* kSmallSchedule = "N30000"; // the quote's vehicle: 40 items
constexpr const char* kSearchText = "bumper";
constexpr double kRRRate = 55, kRARate = 60, kPTRate = 65;

constexpr std::array<const char*, 24> kPanels = {
    "FRONT BUMPER BAR",  "REAR BUMPER BAR",   "BONNET",         "BOOT LID",       "L/H FRONT GUARD",
    "R/H FRONT GUARD",   "L/H FRONT DOOR",    "R/H FRONT DOOR", "L/H REAR DOOR",  "R/H REAR DOOR",
    "L/H QUARTER PANEL", "R/H QUARTER PANEL", "ROOF PANEL",     "GRILLE",         "L/H HEADLAMP",
    "R/H HEADLAMP",      "WINDSCREEN",        "REAR SCREEN",    "L/H SILL PANEL", "R/H SILL PANEL",
    "RADIATOR SUPPORT",  "FRONT APRON",       "REAR APRON",     "TAILGATE"};

std::string Description(int i) {
  return std::string(kPanels[static_cast<size_t>(i) % kPanels.size()]) + " R&I " +
         std::to_string(i / static_cast<int>(kPanels.size()));
}

// The hours of schedule item i.
double RRHours(int i) { return 0.5 + (i % 9) * 0.25; }
double PTHours(int i) { return 1.0 + (i % 5) * 0.5; }

// The items' masks: mostly every operation, some without repair or paint.
constexpr std::array<int, 8> kMasks = {7, 7, 7, 5, 7, 6, 4, 7};

// The catalogue of both schedules, written once per run.
class BenchCatalogue {
public:
  BenchCatalogue() {
    cipher::SetFieldKeyText(kFieldKey);
    path_ = (std::filesystem::temp_directory_path() /
             ("belvane-bench-labour-" + std::to_string(getpid()) + ".db"))
                .string();
    data::tools::SqliteCatalogueWriter writer(path_);
    // Plain hours are stored as numbers, enciphered ones as the enciphered
    // text of the number written with ".".
    auto hours = [](double h, bool enciphered) {
      if (!enciphered) return data::Value(h);
      char buf[32];
      const auto end = std::to_chars(buf, buf + sizeof buf, h).ptr;
      return data::Value(cipher::EncryptField(std::string_view(buf, end)));
    };
    auto add = [&](const char* schedId, int i, bool enciphered) {
      writer.Insert("LABOUR_ITEM",
                    {data::Value(int16_t{0}), data::Value(std::string(schedId)), data::Value(),
                     data::Value(std::to_string(100000 + i)), data::Value(Description(i)),
                     hours(RRHours(i), enciphered), hours(PTHours(i), enciphered),
                     data::Value(int16_t(kMasks[i % kMasks.size()]))});
    };
    for (int i = 0; i < kScheduleItems; ++i)
      add(kBigSchedule, i, i % 2 == 1);
    for (int i = 0; i < 40; ++i)
      add(kSmallSchedule, i, i % 2 == 1);
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

// ---- the quotes ----

// The quote as a host loads it: lines of three stored records each,
// ITEMIDs 1 to 3 x lines, in item number order.
data::RecordsetPtr MakeQuote(int lines) {
  data::RecordsetPtr quote = data::QuoteStore::NewItemRecordset();
  data::Recordset& rs = *quote;
  int id = 0;
  for (int line = 0; line < lines; ++line) {
    struct Op {
      const char* category;
      const char* field;
      double hours;
      double rate;
    };
    const Op ops[] = {{"R&R", "rrhour", 1.5, kRRRate},
                      {"RA", "rahour", 2.0, kRARate},
                      {"PAINT", "pthour", 0.75, kPTRate}};
    for (const Op& op : ops) {
      rs.AddNew();
      rs.Collect("ITEMID", data::Value(++id));
      rs.Collect("DELITEM", data::Value(false));
      rs.Collect("tag", data::Value("1"));
      rs.Collect("qtnno", data::Value("Q1001"));
      rs.Collect("subquote", data::Value("0"));
      rs.Collect("itemno", data::Value(std::to_string(100000 + line)));
      rs.Collect("script", data::Value(Description(line)));
      rs.Collect("Category", data::Value(op.category));
      rs.Collect(op.field, data::Value(op.hours));
      rs.Collect("report_on", data::Value(int16_t{0}));
      rs.Collect("blend", data::Value(int16_t{0}));
      rs.Collect("allow_tick", data::Value("7"));
      rs.Collect("rr_rate2", data::Value(op.rate));
      rs.Collect("partno", data::Value(""));
    }
  }
  rs.AcceptChanges();
  return quote;
}

// Opens the labour editor through CForms in edit mode; `script` plays the
// estimator. False (and the benchmark skipped) when the editor reported an
// error.
bool Session(benchmark::State& state, data::RecordsetPtr& quote, const char* schedId,
             const std::function<void(labour::frmLabour&)>& script) {
  forms::HeadlessRuntime& runtime = forms::ThreadHeadlessRuntime();
  runtime.Reset();
  runtime.QueueModal([&](forms::Form& f) { script(static_cast<labour::frmLabour&>(f)); });
  std::string schedType = "NRMA";
  CForms().ShowLabourForm(quote, schedType, "Q1001", "0", "KESTREL", "1001", "", schedId, "", "",
                          kRRRate, kRARate, kPTRate, false, false, eEdit);
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

// The estimator's change: R&R hours of the first, middle and last line.
std::array<int, 3> ChangedRows(int lines) { return {1, lines / 2, lines}; }
void ChangeHours(labour::frmLabour& f, forms::SimulatedUser& user, int lines) {
  for (int row : ChangedRows(lines)) {
    user.ClickCell(f.FGSelectedLabour, row, col::kRRHours);
    user.Type("2.5\n");
  }
}

// The changed hours reached the record set, and nothing else was lost.
bool Written(benchmark::State& state, data::Recordset& rs, int lines) {
  int changed = 0;
  for (rs.MoveFirst(); !rs.Eof(); rs.MoveNext())
    if (rs.Collect("Category").ToText() == "R&R" && rs.Collect("rrhour").ToDouble() == 2.5)
      ++changed;
  if (rs.RecordCount() != 3 * lines || changed != static_cast<int>(ChangedRows(lines).size())) {
    state.SkipWithError("the write-back did not give the expected records");
    return false;
  }
  return true;
}

enum class QuotePhase { Load, SaveLabourChanges, Close };

void QuoteSession(benchmark::State& state, QuotePhase phase) {
  UseCatalogue();
  const int lines = static_cast<int>(state.range(0));
  forms::SimulatedUser user;
  for (auto _ : state) {
    data::RecordsetPtr quote = MakeQuote(lines);
    double seconds = 0;
    const auto opened = Clock::now();
    const bool ok = Session(state, quote, kSmallSchedule, [&](labour::frmLabour& f) {
      if (phase == QuotePhase::Load) seconds = Seconds(opened, Clock::now());
      if (f.FGSelectedLabour.Rows() != lines + 1) {
        state.SkipWithError("the quote's lines did not load");
        return;
      }
      ChangeHours(f, user, lines);
      if (phase == QuotePhase::SaveLabourChanges) {
        const auto t0 = Clock::now();
        CForms().SaveLabourChanges();
        seconds = Seconds(t0, Clock::now());
        if (!Written(state, *quote, lines)) return;
      }
      const auto t0 = Clock::now();
      user.Click(f.cmdClose);
      if (phase == QuotePhase::Close) seconds = Seconds(t0, Clock::now());
    });
    if (!ok || state.error_occurred() || !Written(state, *quote, lines)) break;
    state.SetIterationTime(seconds);
  }
  state.counters["records"] = 3 * lines;
}

void BM_QuoteLoad(benchmark::State& state) { QuoteSession(state, QuotePhase::Load); }
void BM_QuoteSaveLabourChanges(benchmark::State& state) {
  QuoteSession(state, QuotePhase::SaveLabourChanges);
}
void BM_QuoteClose(benchmark::State& state) { QuoteSession(state, QuotePhase::Close); }

// Baseline: what the write-back cannot do without, on the same record set:
// each record found by its ITEMID and its fields written once, as the
// writer's last pass writes them.
void BM_QuoteFindAndWriteBaseline(benchmark::State& state) {
  const int lines = static_cast<int>(state.range(0));
  for (auto _ : state) {
    data::RecordsetPtr quote = MakeQuote(lines);
    data::Recordset& rs = *quote;
    const auto t0 = Clock::now();
    int id = 0;
    for (int line = 0; line < lines; ++line) {
      const std::string itemNo = std::to_string(100000 + line);
      const std::string script = Description(line);
      for (const char* category : {"R&R", "RA", "PAINT"}) {
        rs.Find("ITEMID = " + std::to_string(++id), 0, data::adSearchForward,
                data::adBookmarkFirst);
        const std::string c = category;
        rs.Collect("DELITEM", data::Value(false));
        rs.Collect("qtnno", data::Value("Q1001"));
        rs.Collect("subquote", data::Value("0"));
        rs.Collect("itemno", data::Value(itemNo));
        rs.Collect("script", data::Value(script));
        rs.Collect("Category", data::Value(c));
        rs.Collect(c == "R&R" ? "rrhour" : c == "RA" ? "rahour" : "pthour", data::Value(2.5));
        rs.Collect("report_on", data::Value(int16_t{0}));
        if (c == "PAINT") rs.Collect("blend", data::Value(int16_t{0}));
        rs.Collect("allow_tick", data::Value("7"));
        rs.Collect("Rev", data::Value());
        rs.Collect("tag", data::Value("1"));
        rs.Collect("rr_rate2", data::Value(c == "R&R" ? kRRRate : c == "RA" ? kRARate : kPTRate));
        if (c == "R&R") rs.Collect("partno", data::Value(""));
      }
    }
    state.SetIterationTime(Seconds(t0, Clock::now()));
  }
  state.counters["records"] = 3 * lines;
}

// ---- the 20,000-item schedule ----

// The rows the schedule grid holds once loaded (item, description, R&R,
// Repair, Paint, mask).
const std::vector<std::string>& ScheduleRows() {
  static const std::vector<std::string> rows = [] {
    std::vector<std::string> out;
    out.reserve(kScheduleItems);
    for (int i = 0; i < kScheduleItems; ++i) {
      const int mask = kMasks[i % kMasks.size()];
      const std::string rr = (mask & 4) ? text::FormatNumber(RRHours(i), text::kHours) : "";
      const std::string pt = (mask & 1) ? text::FormatNumber(PTHours(i), text::kHours) : "";
      out.push_back(std::to_string(100000 + i) + '\t' + Description(i) + '\t' + rr + "\t\t" + pt +
                    '\t' + std::to_string(mask));
    }
    return out;
  }();
  return rows;
}

// The schedule grid's shape before its load: the title row and one blank
// row that the load's first AddItem follows.
void ShapeScheduleGrid(grid::FlexGrid& g) {
  g.Cols(6);
  g.Rows(2);
}

// Opening the editor on an empty quote: Form_Load fills the schedule grid.
void BM_ScheduleOpen(benchmark::State& state) {
  UseCatalogue();
  data::RecordsetPtr quote = data::QuoteStore::NewItemRecordset();
  forms::SimulatedUser user;
  int rows = 0;
  bool checked = false;
  for (auto _ : state) {
    double seconds = 0;
    const auto opened = Clock::now();
    if (!Session(state, quote, kBigSchedule, [&](labour::frmLabour& f) {
          seconds = Seconds(opened, Clock::now());
          const grid::FlexGrid& g = f.FGLabourItems(0);
          rows = g.Rows() - 1;
          if (!checked && rows == kScheduleItems) {
            // Every row as the schedule gives it, enciphered hours deciphered.
            checked = true;
            for (int r = 1; r <= rows && checked; ++r) {
              std::string text(g.TextView(r, 0));
              for (int c = 1; c < 6; ++c)
                text += '\t' + std::string(g.TextView(r, c));
              checked = text == ScheduleRows()[static_cast<size_t>(r - 1)];
            }
            if (!checked) state.SkipWithError("the schedule grid does not show the catalogue");
          }
          user.Click(f.cmdClose);
        }))
      break;
    state.SetIterationTime(seconds);
  }
  if (rows != kScheduleItems) state.SkipWithError("the schedule did not fill its grid");
  state.counters["items"] = rows;
}

// The schedule items whose description holds the search text.
int ExpectedMatches() {
  const std::string needle = text::UCase(kSearchText);
  int n = 0;
  for (int i = 0; i < kScheduleItems; ++i)
    if (Description(i).find(needle) != std::string::npos) ++n;
  return n;
}

// One search: the text typed into the search box, then Enter.
void BM_ScheduleSearch(benchmark::State& state) {
  UseCatalogue();
  data::RecordsetPtr quote = data::QuoteStore::NewItemRecordset();
  forms::SimulatedUser user;
  int found = 0;
  for (auto _ : state) {
    double seconds = 0;
    if (!Session(state, quote, kBigSchedule, [&](labour::frmLabour& f) {
          user.Click(f.txtSearch);
          user.Type(kSearchText);
          const auto t0 = Clock::now();
          user.PressKey(forms::keys::kEnter);
          seconds = Seconds(t0, Clock::now());
          found = f.fgSearch.Visible() ? f.fgSearch.Rows() - 1 : 0;
          user.Click(f.cmdClose);
        }))
      break;
    state.SetIterationTime(seconds);
  }
  if (found != ExpectedMatches()) state.SkipWithError("the search found the wrong rows");
  state.counters["found"] = found;
}

// The schedule query as the catalogue service runs it.
constexpr const char* kLabourItemsSql =
    "SELECT allow_tick, ItemNo, Script, rrhour, pthour FROM LABOUR_ITEM"
    " WHERE schedule = ?1 AND sched_id = ?2"
    " AND (body_id IS NULL OR body_id = '' OR body_id = ?3)"
    " ORDER BY rowid";

// Baseline: the same rows read with SQLite alone, every column's value
// taken as a string or a number, and (with `decipher`) the enciphered
// hours deciphered; no record set, no grid.
void RawSchedule(benchmark::State& state, bool decipher) {
  sqlite3* db = nullptr;
  sqlite3_open_v2(UseCatalogue().Path().c_str(), &db, SQLITE_OPEN_READONLY, nullptr);
  long rows = 0;
  for (auto _ : state) {
    const auto t0 = Clock::now();
    sqlite3_stmt* st = nullptr;
    sqlite3_prepare_v2(db, kLabourItemsSql, -1, &st, nullptr);
    sqlite3_bind_int(st, 1, 0);
    sqlite3_bind_text(st, 2, kBigSchedule, -1, SQLITE_STATIC);
    sqlite3_bind_text(st, 3, "", -1, SQLITE_STATIC);
    rows = 0;
    while (sqlite3_step(st) == SQLITE_ROW) {
      for (int c = 0; c < 5; ++c) {
        if (sqlite3_column_type(st, c) == SQLITE_TEXT) {
          std::string text(reinterpret_cast<const char*>(sqlite3_column_text(st, c)),
                           static_cast<size_t>(sqlite3_column_bytes(st, c)));
          if (decipher && c >= 3 && text.size() >= 16) text = cipher::DecryptField(text);
          benchmark::DoNotOptimize(text);
        } else {
          benchmark::DoNotOptimize(sqlite3_column_double(st, c));
        }
      }
      ++rows;
    }
    sqlite3_finalize(st);
    state.SetIterationTime(Seconds(t0, Clock::now()));
  }
  sqlite3_close(db);
  if (rows != kScheduleItems) state.SkipWithError("the query did not give the schedule");
  state.counters["items"] = static_cast<double>(rows);
}
void BM_ScheduleSqliteStepBaseline(benchmark::State& state) { RawSchedule(state, false); }
void BM_ScheduleSqliteDecipherBaseline(benchmark::State& state) { RawSchedule(state, true); }

// GetLabourItems' record set of the same rows (the call alone).
void BM_GetLabourItems(benchmark::State& state) {
  UseCatalogue();
  long rows = 0;
  for (auto _ : state) {
    const auto t0 = Clock::now();
    data::RecordsetPtr rs;
    data::Catalogue()->GetLabourItems(rs, 0, kBigSchedule, "", "");
    rows = rs->RecordCount();
    rs.reset();
    state.SetIterationTime(Seconds(t0, Clock::now()));
  }
  state.counters["items"] = static_cast<double>(rows);
}

// Baseline: the grid's AddItem of the same rows.
void BM_ScheduleGridAddItemBaseline(benchmark::State& state) {
  const auto& rows = ScheduleRows();
  for (auto _ : state) {
    grid::FlexGrid g;
    ShapeScheduleGrid(g);
    g.Redraw(false);
    for (const std::string& row : rows)
      g.AddItem(row);
    g.Redraw(true);
    benchmark::DoNotOptimize(g.Rows());
  }
  state.counters["items"] = static_cast<double>(rows.size());
}

// Baseline: a plain case-free substring scan of the same item numbers and
// descriptions, held as strings.
void BM_ScheduleSearchScanBaseline(benchmark::State& state) {
  std::vector<std::pair<std::string, std::string>> texts;
  for (int i = 0; i < kScheduleItems; ++i)
    texts.emplace_back(std::to_string(100000 + i), Description(i));
  const std::string needle = text::UCase(kSearchText);
  int found = 0;
  for (auto _ : state) {
    const auto t0 = Clock::now();
    found = bench::PlainScan(texts, needle);
    benchmark::DoNotOptimize(found);
    state.SetIterationTime(Seconds(t0, Clock::now()));
  }
  if (found != ExpectedMatches()) state.SkipWithError("the scan found the wrong rows");
  state.counters["found"] = found;
}

} // namespace

constexpr int kSmallQuote = 500, kQuote = 2000, kLargeQuote = 5000;

int main(int argc, char** argv) {
  using bench::Measure;
  auto sized = [](benchmark::internal::Benchmark* b) {
    b->Arg(kSmallQuote)
        ->Arg(kQuote)
        ->Arg(kLargeQuote)
        ->UseManualTime()
        ->Unit(benchmark::kMillisecond);
  };
  benchmark::RegisterBenchmark("BM_QuoteLoad", BM_QuoteLoad)->Apply(sized);
  benchmark::RegisterBenchmark("BM_QuoteSaveLabourChanges", BM_QuoteSaveLabourChanges)
      ->Apply(sized);
  benchmark::RegisterBenchmark("BM_QuoteClose", BM_QuoteClose)
      ->Arg(kQuote)
      ->UseManualTime()
      ->Unit(benchmark::kMillisecond);
  benchmark::RegisterBenchmark("BM_QuoteFindAndWriteBaseline", BM_QuoteFindAndWriteBaseline)
      ->Apply(sized);
  for (auto* b : {
           benchmark::RegisterBenchmark("BM_ScheduleOpen", BM_ScheduleOpen),
           benchmark::RegisterBenchmark("BM_ScheduleSqliteDecipherBaseline",
                                        BM_ScheduleSqliteDecipherBaseline),
           benchmark::RegisterBenchmark("BM_GetLabourItems", BM_GetLabourItems),
           benchmark::RegisterBenchmark("BM_ScheduleSqliteStepBaseline",
                                        BM_ScheduleSqliteStepBaseline),
           // Each search opens the schedule first (untimed): a fixed count
           // of searches keeps the run short.
           benchmark::RegisterBenchmark("BM_ScheduleSearch", BM_ScheduleSearch)->Iterations(200),
           benchmark::RegisterBenchmark("BM_ScheduleSearchScanBaseline",
                                        BM_ScheduleSearchScanBaseline),
       })
    b->UseManualTime()->Unit(benchmark::kMillisecond);
  benchmark::RegisterBenchmark("BM_ScheduleGridAddItemBaseline", BM_ScheduleGridAddItemBaseline)
      ->Unit(benchmark::kMillisecond);

  auto m = [](std::string name, std::string label = "") {
    return Measure{std::move(name) + "/manual_time", "", std::move(label)};
  };
  auto quote = [](const char* what, int lines) {
    return std::string(what) + "/" + std::to_string(lines);
  };
  bench::AddRatioGoal("Labour editor opens on 20,000 items (half enciphered)", m("BM_ScheduleOpen"),
                      m("BM_ScheduleSqliteDecipherBaseline", "SQLite read + decipher"), 1.2);
  bench::AddRatioGoal("GetLabourItems record set, 20,000 items", m("BM_GetLabourItems"),
                      m("BM_ScheduleSqliteStepBaseline", "stepping the query"), 1.3);
  bench::AddRatioGoal("Text search over 20,000 labour items", m("BM_ScheduleSearch"),
                      m("BM_ScheduleSearchScanBaseline", "plain case-free scan"), 1.1);
  bench::AddRatioGoal("Labour write-back, 2,000 lines (6,000 records), check included",
                      m(quote("BM_QuoteSaveLabourChanges", kQuote)),
                      m(quote("BM_QuoteFindAndWriteBaseline", kQuote), "Finds + writes once"), 1.5);
  bench::AddRatioGoal("Labour Close (write-back and unload), 2,000 lines",
                      m(quote("BM_QuoteClose", kQuote)),
                      m(quote("BM_QuoteFindAndWriteBaseline", kQuote), "Finds + writes once"), 1.5);
  bench::AddRatioGoal("Labour write-back grows linearly: 5,000 vs 500 lines",
                      m(quote("BM_QuoteSaveLabourChanges", kLargeQuote)),
                      m(quote("BM_QuoteSaveLabourChanges", kSmallQuote), "500 lines"), 11);
  bench::AddRatioGoal("Labour quote load grows linearly: 5,000 vs 500 lines",
                      m(quote("BM_QuoteLoad", kLargeQuote)),
                      m(quote("BM_QuoteLoad", kSmallQuote), "500 lines"), 11);
  return bench::RunWithGoals(argc, argv);
}
