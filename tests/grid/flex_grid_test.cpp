#include "error_number.hpp"
#include "grid/flex_grid.hpp"
#include "text/error.hpp"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using belvane::Error;
using namespace belvane::grid;

namespace {

using belvane::test::ErrorNumber;

// Records LeaveCell and EnterCell with the cell that is current when each fires.
struct CellEvents {
  explicit CellEvents(FlexGrid& g) : grid(g) {
    grid.OnLeaveCell = [this] { log.push_back("L" + Here()); };
    grid.OnEnterCell = [this] { log.push_back("E" + Here()); };
  }
  std::string Here() const { return std::to_string(grid.Row()) + "," + std::to_string(grid.Col()); }
  FlexGrid& grid;
  std::vector<std::string> log;
};

using Log = std::vector<std::string>;

std::vector<std::string> RowTexts(const FlexGrid& g, int row) {
  std::vector<std::string> texts;
  for (int c = 0; c < g.Cols(); ++c)
    texts.push_back(g.TextMatrix(row, c));
  return texts;
}

} // namespace

TEST(FlexGridCurrentCell, LeaveFiresOnTheOldCellThenEnterOnTheNew) {
  FlexGrid g;
  g.Rows(5);
  g.Cols(4);
  CellEvents events(g);

  g.Row(3);
  EXPECT_EQ(events.log, (Log{"L1,0", "E3,0"}));
  events.log.clear();
  g.Col(2);
  EXPECT_EQ(events.log, (Log{"L3,0", "E3,2"}));
  events.log.clear();
  g.SetCurrentCell(1, 1); // one move, one pair
  EXPECT_EQ(events.log, (Log{"L3,2", "E1,1"}));
  events.log.clear();

  g.Row(1); // the same cell: nothing
  g.Col(1);
  g.SetCurrentCell(1, 1);
  EXPECT_TRUE(events.log.empty());
}

TEST(FlexGridCurrentCell, LeaveCellHandlerWritesIntoTheCellBeingLeft) {
  FlexGrid g;
  g.Rows(3);
  g.OnLeaveCell = [&g] { g.Text(g.Text() + "!"); };
  g.Text("a");
  g.Row(2);
  EXPECT_EQ(g.TextMatrix(1, 0), "a!");
  EXPECT_EQ(g.TextMatrix(2, 0), "");
}

TEST(FlexGridCurrentCell, StructuralChangesPullTheCellInsideWithoutEvents) {
  FlexGrid g;
  g.Rows(10);
  g.Cols(5);
  g.SetCurrentCell(9, 4);
  CellEvents events(g);
  g.Rows(4);
  g.Cols(2);
  EXPECT_EQ(g.Row(), 3);
  EXPECT_EQ(g.Col(), 1);
  g.RemoveItem(3);
  EXPECT_EQ(g.Row(), 2);
  EXPECT_TRUE(events.log.empty());
}

TEST(FlexGridErrors, OutOfRangeIsInvalidRowOrColumnAndChangesNothing) {
  FlexGrid g;
  g.Rows(3);
  g.Cols(3);
  g.SetCurrentCell(2, 2);
  EXPECT_EQ(ErrorNumber([&] { g.Row(3); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.Row(-1); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.Col(3); }), belvane::err::kInvalidColValue);
  EXPECT_EQ(ErrorNumber([&] { g.SetCurrentCell(1, 7); }), belvane::err::kInvalidColValue);
  EXPECT_EQ(ErrorNumber([&] { (void)g.TextMatrix(3, 0); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.TextMatrix(0, -1, "x"); }), belvane::err::kInvalidColValue);
  EXPECT_EQ(ErrorNumber([&] { g.RemoveItem(0); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.RemoveItem(3); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.AddItem("x", 0); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.AddItem("x", 4); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.Rows(0); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.Cols(0); }), belvane::err::kInvalidColValue);
  EXPECT_EQ(ErrorNumber([&] { g.ColWidth(3, 100); }), belvane::err::kInvalidColValue);
  EXPECT_EQ(ErrorNumber([&] { (void)g.RowHeight(9); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.CellAlignment(10); }), kInvalidPropertyValue);
  EXPECT_EQ(ErrorNumber([&] { g.TopRow(0); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(g.Rows(), 3);
  EXPECT_EQ(g.Cols(), 3);
  EXPECT_EQ(g.Row(), 2);
  EXPECT_EQ(g.Col(), 2);
}

TEST(FlexGridErrors, ACellThatVanishesInLeaveCellIsReportedNotEntered) {
  FlexGrid g;
  g.Rows(5);
  bool entered = false;
  g.OnLeaveCell = [&g] { g.Rows(2); };
  g.OnEnterCell = [&entered] { entered = true; };
  EXPECT_EQ(ErrorNumber([&] { g.Row(4); }), belvane::err::kInvalidRowValue);
  EXPECT_FALSE(entered);
  EXPECT_EQ(g.Row(), 1);
}

TEST(FlexGridRows, AddItemSplitsOnTabsIntoColumns) {
  FlexGrid g;
  g.Cols(4);
  g.AddItem("101\tFront bumper\t1.50\t\textra\tfields");
  g.AddItem("only");
  g.AddItem("");
  g.AddItem("\t\t\tlast");
  EXPECT_EQ(g.Rows(), 6);
  EXPECT_EQ(RowTexts(g, 2), (std::vector<std::string>{"101", "Front bumper", "1.50", ""}));
  EXPECT_EQ(RowTexts(g, 3), (std::vector<std::string>{"only", "", "", ""}));
  EXPECT_EQ(RowTexts(g, 4), (std::vector<std::string>{"", "", "", ""}));
  EXPECT_EQ(RowTexts(g, 5), (std::vector<std::string>{"", "", "", "last"}));
}

// A row copied from another grid must be exactly the row AddItem makes of
// the same texts joined by tabs, whatever the two grids' shapes.
TEST(FlexGridRows, AddItemFromMakesTheRowAddItemMakesOfTheSameTexts) {
  FlexGrid source;
  source.Cols(5);
  source.TextMatrix(0, 1, "Title");
  source.AddItem("101\tFront bumper\t1.50\t\tgroup");
  source.AddItem("");                  // every cell empty
  source.AddItem("\t\t\t\tonly last"); // empty cells before a text
  for (int destCols : {1, 3, 4, 5, 7}) {
    for (int row = 0; row < source.Rows(); ++row) {
      for (int count : {0, 1, 3, 5}) {
        for (const std::string next : {"", "42"}) {
          FlexGrid copied, added;
          copied.Cols(destCols);
          added.Cols(destCols);
          copied.AddItemFrom(source, row, count, next);
          std::string joined;
          for (int c = 0; c < count; ++c)
            joined += source.TextMatrix(row, c) + '\t';
          added.AddItem(joined + next);
          const int last = copied.Rows() - 1;
          ASSERT_EQ(RowTexts(copied, last), RowTexts(added, last))
              << destCols << " columns, row " << row << ", " << count << " cells, next " << next;
          // The copy is a row of its own: changing it leaves the source alone.
          copied.TextMatrix(last, 0, "changed");
          ASSERT_EQ(source.TextMatrix(row, 0),
                    row == 2 ? "101" : ""); // row 1: a new grid's blank row
        }
      }
    }
  }
}

TEST(FlexGridRows, AddItemFromKeepsTheCopiedCellsFormatsOnlyWhenAsked) {
  FlexGrid source;
  source.Cols(4);
  source.AddItem("a\tb\tc\td");
  source.CellBackColorAt(2, 0, kGrey);
  source.CellFontItalicAt(2, 1, true);
  source.CellBackColorAt(2, 3, kYellow); // past the cells copied
  FlexGrid copy;
  copy.Cols(4);
  copy.AddItemFrom(source, 2, 3, "x", true);
  copy.AddItemFrom(source, 2, 3, "x");
  copy.AddItemFrom(copy, 2, 2, "y", true); // from its own row, as the grid grows
  EXPECT_EQ(copy.CellStyleAt(2, 0).backColor, kGrey);
  EXPECT_TRUE(copy.CellStyleAt(2, 1).fontItalic);
  EXPECT_EQ(copy.CellStyleAt(2, 3).backColor, copy.CellStyleAt(1, 3).backColor);
  EXPECT_EQ(copy.CellStyleAt(3, 0).backColor, copy.CellStyleAt(1, 0).backColor);
  EXPECT_FALSE(copy.CellStyleAt(3, 1).fontItalic);
  EXPECT_EQ(copy.CellStyleAt(4, 0).backColor, kGrey);
  EXPECT_TRUE(copy.CellStyleAt(4, 1).fontItalic);
  // The copy's formats are its own.
  source.CellBackColorAt(2, 0, kWhite);
  EXPECT_EQ(copy.CellStyleAt(2, 0).backColor, kGrey);
}

TEST(FlexGridRows, AddItemFromItsOwnRowsAndOutOfRange) {
  FlexGrid g;
  g.Cols(3);
  g.AddItem("a\tb\tc");
  int inserted = 0;
  struct Listener : ModelObserver {
    int* count;
    explicit Listener(int* c) : count(c) {}
    void RowsInserted(int, int n) override { *count += n; }
  } listener(&inserted);
  g.AddObserver(&listener);
  // From this very grid, with the next text a view of the row copied.
  for (int i = 0; i < 40; ++i)
    g.AddItemFrom(g, 2, 2, g.TextView(2, 2));
  EXPECT_EQ(inserted, 40);
  EXPECT_EQ(RowTexts(g, g.Rows() - 1), (std::vector<std::string>{"a", "b", "c"}));
  const int rows = g.Rows();
  EXPECT_EQ(ErrorNumber([&] { g.AddItemFrom(g, rows, 1, ""); }), belvane::err::kInvalidRowValue);
  EXPECT_EQ(ErrorNumber([&] { g.AddItemFrom(g, 1, 4, ""); }), belvane::err::kInvalidColValue);
  EXPECT_EQ(ErrorNumber([&] { g.AddItemFrom(g, 1, -1, ""); }), belvane::err::kInvalidColValue);
  EXPECT_EQ(g.Rows(), rows);
  g.RemoveObserver(&listener);
}

TEST(FlexGridRows, CellTextsOfARowStayApartWhenOneChanges) {
  FlexGrid g;
  g.Cols(3);
  g.AddItem("a\tbb\tccc");
  g.TextMatrix(2, 1, "£ a much longer text than before, in UTF-8: é");
  g.TextMatrix(2, 0, "");
  EXPECT_EQ(RowTexts(g, 2),
            (std::vector<std::string>{"", "£ a much longer text than before, in UTF-8: é", "ccc"}));
  g.TextMatrix(2, 2, g.TextView(2, 1)); // a text taken from the same row
  EXPECT_EQ(g.TextMatrix(2, 2), g.TextMatrix(2, 1));
  for (int c = 0; c < 3; ++c)
    g.TextMatrix(2, c, "");
  g.TextMatrix(2, 1, "back");
  EXPECT_EQ(RowTexts(g, 2), (std::vector<std::string>{"", "back", ""}));
}

TEST(FlexGridRows, ColsKeepsTheTextsOfRemainingColumns) {
  FlexGrid g;
  g.Cols(4);
  g.AddItem("a\tb\tc\td");
  g.Cols(2);
  EXPECT_EQ(RowTexts(g, 2), (std::vector<std::string>{"a", "b"}));
  g.Cols(3);
  EXPECT_EQ(RowTexts(g, 2), (std::vector<std::string>{"a", "b", ""}));
  g.TextMatrix(2, 2, "z");
  EXPECT_EQ(RowTexts(g, 2), (std::vector<std::string>{"a", "b", "z"}));
}

TEST(FlexGridRows, FormatsTravelWithTheirRows) {
  FlexGrid g;
  g.Cols(3);
  g.AddItem("r2");
  g.AddItem("r3");
  g.SetCurrentCell(3, 1);
  g.CellBackColor(kGrey);
  g.CellFontItalic(true);
  g.RowHeight(3, 400);

  g.AddItem("new", 1); // inserted above: "r3" is now row 4
  g.SetCurrentCell(4, 1);
  EXPECT_EQ(g.TextMatrix(4, 0), "r3");
  EXPECT_EQ(g.CellBackColor(), kGrey);
  EXPECT_TRUE(g.CellFontItalic());
  EXPECT_EQ(g.RowHeight(4), 400);
  g.SetCurrentCell(3, 1);
  EXPECT_EQ(g.CellBackColor(), kWhite);

  g.RemoveItem(2); // "r3" back to row 3
  g.SetCurrentCell(3, 1);
  EXPECT_EQ(g.TextMatrix(3, 0), "r3");
  EXPECT_EQ(g.CellBackColor(), kGrey);

  g.Rows(3); // dropped with its row
  g.Rows(4);
  g.SetCurrentCell(3, 1);
  EXPECT_EQ(g.CellBackColor(), kWhite);
  EXPECT_EQ(g.RowHeight(3), kDefaultRowHeight);
}

TEST(FlexGridRows, RemovingTheLastDataRowLeavesTheHeader) {
  FlexGrid g;
  g.TextMatrix(0, 0, "Title");
  g.RemoveItem(1);
  EXPECT_EQ(g.Rows(), 1);
  EXPECT_EQ(g.Row(), 0);
  g.AddItem("again");
  EXPECT_EQ(g.TextMatrix(1, 0), "again");
}

TEST(FlexGridRows, ClearEmptiesTextsAndFormatsButKeepsTheShape) {
  FlexGrid g;
  g.Cols(3);
  g.ColWidth(1, 2000);
  g.TextMatrix(0, 1, "Description");
  g.AddItem("a\tb\tc");
  g.SetCurrentCell(2, 2);
  g.CellBackColor(kYellow);
  g.CellFontBold(true);
  g.Clear();
  EXPECT_EQ(g.Rows(), 3);
  EXPECT_EQ(g.Cols(), 3);
  EXPECT_EQ(g.ColWidth(1), 2000);
  EXPECT_EQ(g.TextMatrix(0, 1), "");
  EXPECT_EQ(RowTexts(g, 2), (std::vector<std::string>{"", "", ""}));
  EXPECT_EQ(g.CellBackColor(), kWhite);
  EXPECT_FALSE(g.CellFontBold());
}

TEST(FlexGridFormats, CellFormatsReadBackExactlyAndOnlyOnTheirCell) {
  FlexGrid g;
  g.Rows(3);
  g.Cols(3);
  g.ColAlignment(2, kAlignRightCenter);
  g.SetCurrentCell(1, 1);
  g.CellFontName("Wingdings 2");
  g.CellFontSize(12);
  g.CellFontBold(true);
  g.CellAlignment(kAlignCenterCenter);
  g.CellBackColor(kGrey);
  EXPECT_EQ(g.CellFontName(), "Wingdings 2");
  EXPECT_EQ(g.CellFontSize(), 12.0);
  EXPECT_TRUE(g.CellFontBold());
  EXPECT_FALSE(g.CellFontItalic());
  EXPECT_EQ(g.CellAlignment(), kAlignCenterCenter);
  EXPECT_EQ(g.CellBackColor(), kGrey);
  g.CellBackColor(kWhite); // overwriting keeps the rest
  EXPECT_EQ(g.CellBackColor(), kWhite);
  EXPECT_EQ(g.CellFontName(), "Wingdings 2");

  g.SetCurrentCell(1, 2); // a neighbour: the grid's and the column's defaults
  EXPECT_EQ(g.CellFontName(), g.FontName());
  EXPECT_EQ(g.CellFontSize(), g.FontSize());
  EXPECT_EQ(g.CellAlignment(), kAlignRightCenter);
  EXPECT_EQ(g.CellBackColor(), kWhite);
  g.SetCurrentCell(0, 2);
  EXPECT_EQ(g.CellBackColor(), kFixedBackColor);
}

namespace {
struct CountingObserver : ModelObserver {
  int cells = 0;
  int inserted = 0;
  int removed = 0;
  int scrolls = 0;
  std::vector<int> lastRange;
  void CellsChanged(int r0, int c0, int r1, int c1) override {
    ++cells;
    lastRange = {r0, c0, r1, c1};
  }
  void RowsInserted(int, int count) override { inserted += count; }
  void RowsRemoved(int, int count) override { removed += count; }
  void ScrollChanged(int, int) override { ++scrolls; }
};
} // namespace

TEST(FlexGridObservers, RedrawOffHoldsCellNoticesAndReleasesOne) {
  FlexGrid g;
  g.Cols(3);
  CountingObserver seen;
  g.AddObserver(&seen);
  g.TextMatrix(1, 1, "x");
  EXPECT_EQ(seen.cells, 1);
  EXPECT_EQ(seen.lastRange, (std::vector<int>{1, 1, 1, 1}));

  g.Redraw(false);
  for (int i = 0; i < 50; ++i)
    g.AddItem("a\tb");
  g.SetCurrentCell(5, 2);
  g.CellBackColor(kYellow);
  EXPECT_EQ(seen.cells, 1);
  EXPECT_EQ(seen.inserted, 50); // the shape is always told
  g.Redraw(true);
  EXPECT_EQ(seen.cells, 2);
  EXPECT_EQ(seen.lastRange, (std::vector<int>{0, 0, 51, 2}));
  g.RemoveItem(3);
  EXPECT_EQ(seen.removed, 1);
  g.RemoveObserver(&seen);
  g.TextMatrix(1, 1, "y");
  EXPECT_EQ(seen.cells, 2);
}

TEST(FlexGridObservers, AnObserverMayLeaveWhileBeingNotified) {
  FlexGrid g;
  struct Leaver : ModelObserver {
    FlexGrid* grid = nullptr;
    int calls = 0;
    void CellsChanged(int, int, int, int) override {
      ++calls;
      grid->RemoveObserver(this);
    }
  } first, second;
  first.grid = second.grid = &g;
  g.AddObserver(&first);
  g.AddObserver(&second);
  g.TextMatrix(1, 0, "a");
  g.TextMatrix(1, 0, "b");
  EXPECT_EQ(first.calls, 1);
  EXPECT_EQ(second.calls, 1);
  EXPECT_FALSE(g.HasObservers());
}

TEST(FlexGridRows, ALargeGridFillsAndEditsInPlace) {
  FlexGrid g;
  g.Cols(16);
  g.Rows(1);
  for (int r = 0; r < 20000; ++r)
    g.AddItem(std::to_string(r) + "\tItem " + std::to_string(r) + "\t1.50\t\t2.00");
  EXPECT_EQ(g.Rows(), 20001);
  EXPECT_EQ(g.TextMatrix(19999, 1), "Item 19998");
  g.RemoveItem(10000);
  EXPECT_EQ(g.TextMatrix(10000, 0), "10000");
  g.AddItem("x\ty", 5);
  EXPECT_EQ(g.TextMatrix(5, 1), "y");
  EXPECT_EQ(g.TextMatrix(6, 0), "4");
  EXPECT_EQ(g.TextMatrix(20000, 4), "2.00");
}
