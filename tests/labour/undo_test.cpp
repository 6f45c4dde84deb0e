// Taking back deletions: Ctrl+Z puts the last deleted line back where it
// stood, with its texts, formats and ids, so the write-back is as if it
// had never been deleted; Ctrl+Y deletes it again.

#include "forms/keys.hpp"
#include "labour_fixture.hpp"
#include "text/number.hpp"

namespace belvane::test {
namespace {

using labour::frmLabour;
namespace col = labour::col;
namespace keys = forms::keys;

class UndoTest : public LabourFixture {
protected:
  text::ScopedNumberLocale locale{{".", ","}};

  void ThreeLines() {
    AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
    AddRecord(2, "120", "L/H FRONT GUARD", "PAINT", 2.0, 0, std::nullopt, "1");
    AddRecord(3, "140", "Roof panel", "R&R", 3.0);
    Stored();
  }
  void Delete(frmLabour& f, int row) {
    user.ClickCell(f.FGSelectedLabour, row, col::kItemNo);
    user.Click(f.cmdDelete);
  }
  void Undo() { user.PressKey('Z', forms::kCtrlMask); }
  void Redo() { user.PressKey('Y', forms::kCtrlMask); }
};

TEST_F(UndoTest, ADeletionTakenBackIsAsIfItNeverHappened) {
  ThreeLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    const std::string guard = RowText(g, 2);
    const grid::Color grey = g.CellStyleAt(2, col::kRRHours).backColor;
    Delete(f, 2);
    Delete(f, 1);
    ASSERT_EQ(g.Rows(), 2);
    EXPECT_EQ(f.DeletedItems()->RecordCount(), 2);

    Undo(); // the bonnet, back in row 1
    Undo(); // the guard, back in row 2 with its grey cells
    ASSERT_EQ(g.Rows(), 4);
    EXPECT_EQ(g.TextMatrix(1, col::kItemNo), "100");
    EXPECT_EQ(RowText(g, 2), guard);
    EXPECT_EQ(g.CellStyleAt(2, col::kRRHours).backColor, grey);
    EXPECT_EQ(g.CellStyleAt(2, col::kRRReport).fontName, labour::kFlagFont);
    EXPECT_EQ(f.DeletedItems()->RecordCount(), 0);
    Undo(); // nothing more to take back
    EXPECT_EQ(g.Rows(), 4);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5", "120 PAINT 2", "140 R&R 3"}));
  for (size_t i = 0; i < quote->StoredCount(); ++i)
    EXPECT_NE(quote->StoredStatus(i), data::RecordStatus::Deleted);
  EXPECT_TRUE(runtime.Messages().empty());
}

TEST_F(UndoTest, RedoDeletesAgainAndANewDeletionEndsTheRedo) {
  ThreeLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    Delete(f, 3);
    Undo();
    EXPECT_EQ(g.Rows(), 4);
    Redo();
    EXPECT_EQ(g.Rows(), 3);
    EXPECT_EQ(f.DeletedItems()->RecordCount(), 1);
    Undo();
    Delete(f, 1);
    Redo(); // the new deletion ended what could be done again
    EXPECT_EQ(g.Rows(), 3);
    EXPECT_EQ(g.TextMatrix(2, col::kItemNo), "140");
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{"120 PAINT 2", "140 R&R 3"}));
}

TEST_F(UndoTest, TheOnlyLineAndTheDescriptionWidthComeBack) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    Delete(f, 1);
    EXPECT_EQ(g.TextMatrix(1, col::kItemNo), "");
    Undo();
    EXPECT_EQ(g.Rows(), 2);
    EXPECT_EQ(g.TextMatrix(1, col::kDescription), "BONNET R&I");
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5"}));

  for (int i = 2; i <= 11; ++i)
    AddRecord(i, std::to_string(100 + i), "LINE " + std::to_string(i), "R&R", 1.0);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    const int narrow = g.ColWidth(col::kDescription);
    Delete(f, 5);
    EXPECT_EQ(g.ColWidth(col::kDescription), narrow + 240);
    Undo();
    EXPECT_EQ(g.ColWidth(col::kDescription), narrow);
    user.Click(f.cmdClose);
  });
}

TEST_F(UndoTest, InATextBoxCtrlZIsTheBoxsOwn) {
  ThreeLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    Delete(f, 3);
    ASSERT_EQ(g.Rows(), 3);
    user.Click(f.txtSearch);
    Undo();
    EXPECT_EQ(g.Rows(), 3); // the search box keeps the key
    user.ClickCell(g, 1, col::kItemNo);
    Undo();
    EXPECT_EQ(g.Rows(), 4);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5", "120 PAINT 2", "140 R&R 3"}));
}

TEST_F(UndoTest, ViewModeTakesNothingBack) {
  ThreeLines();
  Open(eView, [&](frmLabour& f) {
    user.ClickCell(f.FGSelectedLabour, 1, col::kItemNo);
    Undo();
    EXPECT_EQ(f.FGSelectedLabour.Rows(), 4);
  });
}

} // namespace
} // namespace belvane::test
