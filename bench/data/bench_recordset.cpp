// Find by ITEMID as the writers use it: one Find per quote line. The
// baseline is the same Find on a field without an integer type, which can
// only be answered by walking the records.
#include "data/recordset.hpp"

#include <benchmark/benchmark.h>

#include <string>

using namespace belvane::data;

namespace {

std::unique_ptr<Recordset> Quote(int records, DataType idType) {
  auto rs = std::make_unique<Recordset>();
  rs->Fields().Append("ITEMID", idType);
  rs->Fields().Append("itemno", DataType::VarWChar);
  rs->Fields().Append("rrhour", DataType::Double);
  rs->Open();
  for (int i = 0; i < records; ++i)
    rs->AppendLoaded({Value(1000 + i), Value(std::to_string(i)), Value(1.5)});
  return rs;
}

void FindEveryRecord(benchmark::State& state, DataType idType) {
  const int n = static_cast<int>(state.range(0));
  auto rs = Quote(n, idType);
  for (auto _ : state) {
    for (int i = 0; i < n; ++i) {
      rs->Find("ITEMID = " + std::to_string(1000 + i), 0, adSearchForward, adBookmarkFirst);
      benchmark::DoNotOptimize(rs->Eof());
    }
  }
  state.SetItemsProcessed(state.iterations() * n);
}

void BM_FindIndexed(benchmark::State& state) { FindEveryRecord(state, DataType::Integer); }
void BM_FindLinearBaseline(benchmark::State& state) { FindEveryRecord(state, DataType::Variant); }

void BM_SortByItemNo(benchmark::State& state) {
  auto rs = Quote(static_cast<int>(state.range(0)), DataType::Integer);
  for (auto _ : state) {
    rs->SetSort("itemno ASC");
    rs->SetSort("");
  }
}

} // namespace

// 2,000 labour lines of three records each.
BENCHMARK(BM_FindIndexed)->Arg(6000)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_FindLinearBaseline)->Arg(6000)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_SortByItemNo)->Arg(6000)->Unit(benchmark::kMillisecond);
BENCHMARK_MAIN();
