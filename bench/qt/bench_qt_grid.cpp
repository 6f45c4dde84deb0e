// The desktop grid view over a large grid: painting a screenful and
// scrolling a page must cost the same whether the grid holds 1,000 rows or
// 100,000. Each benchmark renders the grid's widget into an image (what a
// paint of the window does for that grid); the scroll moves TopRow by a
// page first, as PageDown does, so the view follows the model and paints
// the new rows. Runs offscreen (QT_QPA_PLATFORM=offscreen).

#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/runtime.hpp"
#include "qt/grid_view.hpp"
#include "qt/qt_runtime.hpp"

#include "bench_util.hpp"
#include "goals.hpp"

#include <QApplication>
#include <QImage>
#include <QWidget>

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <map>
#include <memory>
#include <string>

using namespace belvane;

namespace {

constexpr int kCols = 8;

class frmBigGrid : public forms::Form {
public:
  forms::FlexGrid fgItems{*this, "fgItems"};
  frmBigGrid() : Form("frmBigGrid") {}

protected:
  void Design() override {
    Caption("Grid");
    ScaleWidth(12000);
    ScaleHeight(7200);
    fgItems.Move(120, 120, 11000, 26 * 240);
    fgItems.Cols(kCols);
    const int widths[kCols] = {900, 3600, 900, 900, 900, 900, 900, 900};
    for (int c = 0; c < kCols; ++c)
      fgItems.ColWidth(c, widths[c]);
  }
};

// One window per size, filled once and kept for the run.
class BigGrid {
public:
  explicit BigGrid(int rows) {
    Runtime(); // the desktop runtime shows the form
    form_.Show(forms::ShowStyle::Modeless);
    forms::FlexGrid& g = form_.fgItems;
    g.Redraw(false);
    g.Rows(1);
    std::string row;
    for (int r = 0; r < rows; ++r) {
      row = std::to_string(100000 + r) + "\tFRONT BUMPER BAR COVER ASSEMBLY " +
            std::to_string(r % 97) + "\t1.50\t\t2.25\t\t0.75\t" + std::to_string(r % 8);
      g.AddItem(row);
      if (r % 7 == 0) g.CellBackColorAt(r + 1, 2, grid::kGrey);
    }
    g.Redraw(true);
    QApplication::processEvents();
  }
  ~BigGrid() { form_.Unload(); }

  forms::FlexGrid& Grid() { return form_.fgItems; }
  QWidget* Widget() { return Runtime().Widget(form_.fgItems); }

  static qt::QtRuntime& Runtime() {
    static qt::QtRuntime runtime;
    static forms::ScopedRuntime use(runtime);
    return runtime;
  }

private:
  frmBigGrid form_;
};

// The windows, closed in main while the runtime still stands.
std::map<int, std::unique_ptr<BigGrid>>& Grids() {
  static std::map<int, std::unique_ptr<BigGrid>> grids;
  return grids;
}

BigGrid& GridOf(int rows) {
  auto& g = Grids()[rows];
  if (!g) g = std::make_unique<BigGrid>(rows);
  return *g;
}

// A screenful painted: the grid's widget rendered into an image.
void BM_GridPaint(benchmark::State& state) {
  BigGrid& big = GridOf(static_cast<int>(state.range(0)));
  QWidget* widget = big.Widget();
  if (!widget) {
    state.SkipWithError("the grid has no widget");
    return;
  }
  QImage image(widget->size(), QImage::Format_ARGB32_Premultiplied);
  // Half way down, where a large grid's rows are far from the start.
  big.Grid().TopRow(big.Grid().Rows() / 2);
  QApplication::processEvents();
  for (auto _ : state) {
    const auto t0 = bench::ThreadClock::now();
    widget->render(&image);
    state.SetIterationTime(bench::Seconds(t0, bench::ThreadClock::now()));
  }
}

// A page scrolled (TopRow moved by the rows in view, as PageDown does) and
// the new screenful painted.
void BM_GridScrollPage(benchmark::State& state) {
  BigGrid& big = GridOf(static_cast<int>(state.range(0)));
  forms::FlexGrid& g = big.Grid();
  QWidget* widget = big.Widget();
  if (!widget) {
    state.SkipWithError("the grid has no widget");
    return;
  }
  QImage image(widget->size(), QImage::Format_ARGB32_Premultiplied);
  const int page = 20;
  const int first = g.Rows() / 2;
  int top = first;
  for (auto _ : state) {
    top = top + page < g.MaxTopRow() && top < first + 50 * page ? top + page : first;
    const auto t0 = bench::ThreadClock::now();
    g.TopRow(top);
    QApplication::processEvents();
    widget->render(&image);
    state.SetIterationTime(bench::Seconds(t0, bench::ThreadClock::now()));
  }
  if (g.TopRow() != top) state.SkipWithError("the grid did not scroll");
}

} // namespace

int main(int argc, char** argv) {
  setenv("QT_QPA_PLATFORM", "offscreen", 0);
  qt::QtRuntime::Application();
  for (auto* b : {benchmark::RegisterBenchmark("BM_GridPaint", BM_GridPaint),
                  benchmark::RegisterBenchmark("BM_GridScrollPage", BM_GridScrollPage)})
    b->Arg(1000)->Arg(100000)->UseManualTime()->Unit(benchmark::kMicrosecond);
  auto m = [](const char* name, const char* label = "") {
    return bench::Measure{std::string(name) + "/manual_time", "", label};
  };
  // "The same cost" within the run-to-run noise of a shared machine.
  bench::AddRatioGoal("Grid view paints a screenful: 100,000 vs 1,000 rows",
                      m("BM_GridPaint/100000"), m("BM_GridPaint/1000", "1,000 rows"), 1.25);
  bench::AddRatioGoal("Grid view scrolls a page: 100,000 vs 1,000 rows",
                      m("BM_GridScrollPage/100000"), m("BM_GridScrollPage/1000", "1,000 rows"),
                      1.25);
  const int rc = bench::RunWithGoals(argc, argv);
  Grids().clear();
  return rc;
}
