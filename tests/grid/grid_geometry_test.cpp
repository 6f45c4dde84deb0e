#include "grid/flex_grid.hpp"

#include <gtest/gtest.h>

using namespace belvane::grid;

namespace {
// A grid showing the header and exactly five data rows, three of its six
// columns wide.
void Shape(FlexGrid& g, int rows) {
  g.Cols(6);
  g.Rows(rows);
  for (int c = 0; c < 6; ++c)
    g.ColWidth(c, 1000);
  g.Width(3000);
  g.Height(6 * kDefaultRowHeight);
}
} // namespace

TEST(FlexGridGeometry, CellPositionsFollowWidthsHeightsAndScroll) {
  FlexGrid g;
  Shape(g, 20);
  g.ColWidth(0, 800);
  g.RowHeight(2, 300);
  g.SetCurrentCell(3, 2);
  EXPECT_EQ(g.CellLeft(), 1800);
  EXPECT_EQ(g.CellTop(), 240 + 240 + 300);
  EXPECT_EQ(g.CellWidth(), 1000);
  EXPECT_EQ(g.CellHeight(), 240);

  g.TopRow(3);
  g.LeftCol(1);
  EXPECT_EQ(g.RowPos(3), 240);
  EXPECT_EQ(g.ColPos(2), 1000);
  EXPECT_EQ(g.RowPos(1), 240 - 540); // scrolled out above
  EXPECT_EQ(g.RowPos(0), 0);         // the header stays
}

TEST(FlexGridGeometry, ReadingTheCellPositionBringsTheCellIntoView) {
  FlexGrid g;
  Shape(g, 30);
  int scrolls = 0;
  g.OnScroll = [&scrolls] { ++scrolls; };
  g.SetCurrentCell(12, 5); // moving by code does not scroll
  EXPECT_EQ(g.TopRow(), 1);
  EXPECT_EQ(scrolls, 0);

  const int top = g.CellTop();
  EXPECT_EQ(scrolls, 1);
  EXPECT_EQ(g.TopRow(), 8); // row 12 at the bottom of five rows
  EXPECT_EQ(g.LeftCol(), 3);
  EXPECT_EQ(top, 240 + 4 * 240);
  EXPECT_EQ(g.CellLeft(), 2000);
  EXPECT_EQ(scrolls, 1); // already in view
  EXPECT_TRUE(g.IsCellVisible(12, 5));

  g.SetCurrentCell(2, 0);
  EXPECT_EQ(g.CellTop(), 240);
  EXPECT_EQ(g.TopRow(), 2);
  EXPECT_EQ(g.LeftCol(), 0);
}

TEST(FlexGridGeometry, TopRowIsClampedToAFullLastPage) {
  FlexGrid g;
  Shape(g, 12); // data rows 1..11
  int scrolls = 0;
  g.OnScroll = [&scrolls] { ++scrolls; };
  g.TopRow(10);
  EXPECT_EQ(g.TopRow(), 7); // rows 7..11 fill the view
  g.TopRow(7);
  EXPECT_EQ(scrolls, 1);
  g.Rows(4); // fewer rows than fit: back to the top
  EXPECT_EQ(g.TopRow(), 1);
}

TEST(FlexGridGeometry, MouseRowAndColFollowTheScrolledView) {
  FlexGrid g;
  Shape(g, 30);
  g.MouseMove(1500, 100);
  EXPECT_EQ(g.MouseRow(), 0);
  EXPECT_EQ(g.MouseCol(), 1);
  g.TopRow(10);
  g.LeftCol(2);
  g.MouseMove(500, 240 + 240 + 10);
  EXPECT_EQ(g.MouseRow(), 11);
  EXPECT_EQ(g.MouseCol(), 2);
  g.MouseMove(3500, 100); // outside the grid
  EXPECT_EQ(g.MouseCol(), -1);
  g.Rows(3);
  g.MouseMove(10, 240 * 4); // below the last row
  EXPECT_EQ(g.MouseRow(), -1);
}

TEST(FlexGridGeometry, KeyboardMovesStayInsideAndScrollAlong) {
  FlexGrid g;
  Shape(g, 10);
  int leaves = 0;
  g.OnLeaveCell = [&leaves] { ++leaves; };
  EXPECT_TRUE(g.NavigateByKey(38, 0)); // Up from row 1: the header is not entered
  EXPECT_EQ(g.Row(), 1);
  EXPECT_EQ(leaves, 0);
  g.NavigateByKey(35, 2); // Ctrl+End
  EXPECT_EQ(g.Row(), 9);
  EXPECT_EQ(g.Col(), 5);
  EXPECT_EQ(g.TopRow(), 5);
  EXPECT_EQ(g.LeftCol(), 3);
  g.NavigateByKey(40, 0); // Down on the last row
  EXPECT_EQ(g.Row(), 9);
  g.NavigateByKey(33, 0); // PageUp: one screen of five rows
  EXPECT_EQ(g.Row(), 4);
  g.NavigateByKey(36, 0); // Home
  EXPECT_EQ(g.Col(), 0);
  EXPECT_EQ(g.LeftCol(), 0);
  EXPECT_FALSE(g.NavigateByKey(113, 0)); // F2 is not navigation
  EXPECT_EQ(leaves, 3);
}

TEST(FlexGridGeometry, ScrollBarsOfAViewTakeRoomFromTheCellsInView) {
  FlexGrid g;
  Shape(g, 20); // taller and wider than the grid: both bars
  EXPECT_EQ(g.ScrollBarSize(), 0);
  EXPECT_TRUE(g.IsCellVisible(5, 2)); // without a view the bars take no room

  g.ScrollBarSize(240);
  EXPECT_TRUE(g.VScrollBarShown());
  EXPECT_TRUE(g.HScrollBarShown());
  EXPECT_FALSE(g.IsCellVisible(5, 0)); // under the horizontal bar
  EXPECT_FALSE(g.IsCellVisible(1, 2)); // under the vertical bar
  g.SetCurrentCell(5, 0);
  EXPECT_EQ(g.CellTop(), 240 + 3 * 240); // scrolled one row so it shows above the bar
  EXPECT_EQ(g.TopRow(), 2);
  int row = 0;
  int col = 0;
  g.HitTest(100, 6 * 240 - 10, row, col); // a point on the bar is no cell
  EXPECT_EQ(row, -1);
  g.TopRow(19); // clamped: the last rows fill the room left above the bar
  EXPECT_EQ(g.TopRow(), 16);

  // A bar shows only when needed, and one bar can bring the other.
  FlexGrid fit;
  fit.Cols(2);
  fit.ColWidth(0, 1000);
  fit.ColWidth(1, 1900);
  fit.Width(3000);
  fit.Height(6 * kDefaultRowHeight);
  fit.ScrollBarSize(240);
  fit.Rows(6); // header and five rows fit exactly
  EXPECT_FALSE(fit.VScrollBarShown());
  EXPECT_FALSE(fit.HScrollBarShown());
  fit.Rows(7); // the vertical bar leaves 2760 for 2900 of columns
  EXPECT_TRUE(fit.VScrollBarShown());
  EXPECT_TRUE(fit.HScrollBarShown());

  g.Reset(); // a view's setting is no design state
  EXPECT_EQ(g.ScrollBarSize(), 240);
}
