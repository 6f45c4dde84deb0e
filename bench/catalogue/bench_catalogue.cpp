// Opening a vehicle's parts catalogue of 100,000 parts, as the parts form
// does when it loads. The baseline steps the same query with SQLite alone,
// so the difference is what building the record set costs.
#include "data/sqlite/sqlite_catalogue.hpp"
#include "data/tools/sample_catalogue.hpp"

#include "goals.hpp"

#include <benchmark/benchmark.h>
#include <sqlite3.h>
#include <unistd.h>

#include <filesystem>
#include <string>

using namespace belvane::data;

namespace {

constexpr int kParts = 100000;

// One sample catalogue of a single model with kParts parts, made once.
class PartsCatalogue {
public:
  PartsCatalogue() {
    path_ = (std::filesystem::temp_directory_path() /
             ("belvane-bench-catalogue-" + std::to_string(getpid()) + ".db"))
                .string();
    tools::SampleOptions options;
    options.models = 1;
    options.partsPerModel = kParts;
    options.labourItems = 0;
    tools::WriteSampleCatalogueFile(path_, options);
  }
  ~PartsCatalogue() { std::filesystem::remove(path_); }
  const std::string& Path() const { return path_; }

private:
  std::string path_;
};

const PartsCatalogue& Catalogue() {
  static PartsCatalogue catalogue;
  return catalogue;
}

// The first sample model: KESTREL, catalogue KS100, first body 10011.
constexpr const char* kMake = "KESTREL";
constexpr const char* kCatNo = "KS100";
constexpr const char* kBody = "10011";
constexpr int16_t kState = 1;

void SqliteStepBaseline(benchmark::State& state) {
  sqlite3* db = nullptr;
  sqlite3_open_v2(Catalogue().Path().c_str(), &db, SQLITE_OPEN_READONLY, nullptr);
  const char* sql =
      "SELECT ItemNo, PARTNAME, Script, SIDE, QTY, unitcost, partno, \"Group\" FROM VEHICLE_PART"
      " WHERE cat_no = ?1 AND make = ?2 COLLATE NOCASE"
      " AND (body_id IS NULL OR body_id = '' OR body_id = ?3)"
      " AND (state IS NULL OR state = 0 OR state = ?4) ORDER BY rowid";
  sqlite3_stmt* st = nullptr;
  sqlite3_prepare_v2(db, sql, -1, &st, nullptr);
  long rows = 0;
  for (auto _ : state) {
    sqlite3_bind_text(st, 1, kCatNo, -1, SQLITE_STATIC);
    sqlite3_bind_text(st, 2, kMake, -1, SQLITE_STATIC);
    sqlite3_bind_text(st, 3, kBody, -1, SQLITE_STATIC);
    sqlite3_bind_int(st, 4, kState);
    rows = 0;
    while (sqlite3_step(st) == SQLITE_ROW) {
      for (int c = 0; c < 8; ++c) {
        if (sqlite3_column_type(st, c) == SQLITE_TEXT)
          benchmark::DoNotOptimize(
              std::string(reinterpret_cast<const char*>(sqlite3_column_text(st, c)),
                          static_cast<size_t>(sqlite3_column_bytes(st, c))));
        else
          benchmark::DoNotOptimize(sqlite3_column_double(st, c));
      }
      ++rows;
    }
    sqlite3_reset(st);
  }
  sqlite3_finalize(st);
  sqlite3_close(db);
  state.counters["parts"] = static_cast<double>(rows);
}

void GetVehicleParts(benchmark::State& state) {
  SqliteCatalogue cat(Catalogue().Path());
  long rows = 0;
  for (auto _ : state) {
    RecordsetPtr rs;
    cat.GetVehicleParts(rs, kMake, kCatNo, kBody, kState);
    rows = rs->RecordCount();
    benchmark::DoNotOptimize(rs);
  }
  state.counters["parts"] = static_cast<double>(rows);
}

// The call and one forward read of the fields the parts loader uses.
void GetVehiclePartsAndRead(benchmark::State& state) {
  SqliteCatalogue cat(Catalogue().Path());
  for (auto _ : state) {
    RecordsetPtr rs;
    cat.GetVehicleParts(rs, kMake, kCatNo, kBody, kState);
    for (; !rs->Eof(); rs->MoveNext())
      for (const char* f :
           {"ItemNo", "PARTNAME", "Script", "SIDE", "QTY", "unitcost", "partno", "Group"})
        benchmark::DoNotOptimize(rs->Fields(f).Value());
  }
}

} // namespace

BENCHMARK(SqliteStepBaseline)->Unit(benchmark::kMillisecond);
BENCHMARK(GetVehicleParts)->Unit(benchmark::kMillisecond);
BENCHMARK(GetVehiclePartsAndRead)->Unit(benchmark::kMillisecond);

int main(int argc, char** argv) {
  belvane::bench::AddRatioGoal("GetVehicleParts record set, 100,000-part sample model",
                               {"GetVehicleParts", "", ""},
                               {"SqliteStepBaseline", "", "stepping the query"}, 1.3);
  return belvane::bench::RunWithGoals(argc, argv);
}
