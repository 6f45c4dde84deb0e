// Filling a grid of 100,000 rows by 16 columns with AddItem, as a catalogue
// load does, against a baseline in the same process: the same rows split
// into a vector of 16 strings each. Counters give the heap the filled grid
// holds (MiB) and the time per row.

#include "grid/flex_grid.hpp"

#include <benchmark/benchmark.h>
#include <malloc.h>

#include <string>
#include <vector>

namespace {

constexpr int kRows = 100000;
constexpr int kCols = 16;

// Rows shaped like the selected labour grid: item number, description,
// hours, flags, rate marker and record ids.
std::vector<std::string> MakeRows() {
  std::vector<std::string> rows;
  rows.reserve(kRows);
  for (int r = 0; r < kRows; ++r) {
    rows.push_back(std::to_string(10000 + r) + "\tL/H Front bumper bar cover assembly " +
                   std::to_string(r % 97) + "\t1.50\t£\t2.25\t£\t0.75\t£\t£\t<Default>\t£\t7\t\t" +
                   std::to_string(500000 + r) + "\t" + std::to_string(600000 + r) + "\t" +
                   std::to_string(700000 + r));
  }
  return rows;
}

const std::vector<std::string>& Rows() {
  static const std::vector<std::string> rows = MakeRows();
  return rows;
}

std::size_t HeapInUse() { return mallinfo2().uordblks; }

void BM_FlexGridAddItem(benchmark::State& state) {
  const auto& rows = Rows();
  double heapMiB = 0;
  for (auto _ : state) {
    const std::size_t before = HeapInUse();
    belvane::grid::FlexGrid grid;
    grid.Cols(kCols);
    grid.Rows(1);
    grid.Redraw(false);
    for (const std::string& row : rows)
      grid.AddItem(row);
    grid.Redraw(true);
    heapMiB = static_cast<double>(HeapInUse() - before) / (1024.0 * 1024.0);
    benchmark::DoNotOptimize(grid.TextMatrix(kRows, 1));
  }
  state.counters["heap_MiB"] = heapMiB;
  state.counters["rows"] = benchmark::Counter(static_cast<double>(state.iterations()) * kRows,
                                              benchmark::Counter::kIsRate);
}
BENCHMARK(BM_FlexGridAddItem)->Unit(benchmark::kMillisecond);

// Baseline: one vector of 16 strings per row.
void BM_BaselineVectorOfStrings(benchmark::State& state) {
  const auto& rows = Rows();
  double heapMiB = 0;
  for (auto _ : state) {
    const std::size_t before = HeapInUse();
    std::vector<std::vector<std::string>> table;
    for (const std::string& row : rows) {
      std::vector<std::string> cells(kCols);
      std::size_t pos = 0;
      for (int c = 0; c < kCols && pos != std::string::npos; ++c) {
        const std::size_t tab = row.find('\t', pos);
        cells[static_cast<std::size_t>(c)] =
            row.substr(pos, tab == std::string::npos ? std::string::npos : tab - pos);
        pos = tab == std::string::npos ? tab : tab + 1;
      }
      table.push_back(std::move(cells));
    }
    heapMiB = static_cast<double>(HeapInUse() - before) / (1024.0 * 1024.0);
    benchmark::DoNotOptimize(table.back()[1]);
  }
  state.counters["heap_MiB"] = heapMiB;
  state.counters["rows"] = benchmark::Counter(static_cast<double>(state.iterations()) * kRows,
                                              benchmark::Counter::kIsRate);
}
BENCHMARK(BM_BaselineVectorOfStrings)->Unit(benchmark::kMillisecond);

// The same fill with a view listening: the notice per row must stay cheap.
void BM_FlexGridAddItemObserved(benchmark::State& state) {
  struct Listener : belvane::grid::ModelObserver {
    long inserted = 0;
    void RowsInserted(int, int count) override { inserted += count; }
  };
  const auto& rows = Rows();
  for (auto _ : state) {
    belvane::grid::FlexGrid grid;
    Listener listener;
    grid.AddObserver(&listener);
    grid.Cols(kCols);
    grid.Rows(1);
    for (const std::string& row : rows)
      grid.AddItem(row);
    benchmark::DoNotOptimize(listener.inserted);
  }
}
BENCHMARK(BM_FlexGridAddItemObserved)->Unit(benchmark::kMillisecond);

// Reading every cell back, as a search over a catalogue grid does.
void BM_FlexGridScanAllCells(benchmark::State& state) {
  belvane::grid::FlexGrid grid;
  grid.Cols(kCols);
  grid.Rows(1);
  for (const std::string& row : Rows())
    grid.AddItem(row);
  for (auto _ : state) {
    std::size_t total = 0;
    for (int r = 1; r < grid.Rows(); ++r)
      for (int c = 0; c < kCols; ++c)
        total += grid.TextView(r, c).size();
    benchmark::DoNotOptimize(total);
  }
}
BENCHMARK(BM_FlexGridScanAllCells)->Unit(benchmark::kMillisecond);

} // namespace

BENCHMARK_MAIN();
