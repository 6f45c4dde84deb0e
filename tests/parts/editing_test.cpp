// Editing the quote's parts: the end-to-end path of an estimator adding an
// exchange part, the keys each column takes in the grid and in the editor,
// Escape, leaving a cell (formatting, repricing only after an edit, the side
// that follows the description), the right click, the part-type list and
// its two positions, Delete, and the description column's width.

#include "forms/keys.hpp"
#include "parts_fixture.hpp"

namespace belvane::test {
namespace {

using parts::frmParts;
namespace cat = parts::col::cat;
namespace sel = parts::col::sel;
namespace keys = forms::keys;

class EditingTest : public PartsFixture {
protected:
  // Two stored parts: a new one and a used one.
  void TwoParts() {
    AddPart({1, "P100", "FRONT BUMPER BAR", "O", "", 1, 100.0, 130.0, "FB-1001"});
    AddPart({2, "P140", "HEADLAMP", "O", "U", 2, 300.0, 360.0, "HL-9"});
    Stored();
  }
};

TEST_F(EditingTest, AnEstimatorAddsAnExchangePartAndDeletesAStoredOne) {
  TwoParts();
  const std::string headlamp = Records()[1];
  ASSERT_EQ(headlamp.substr(0, 5), "P140|");
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    user.Click(f.txtSearch);
    user.Type("bumper\n");
    ASSERT_TRUE(f.fgSearch.Visible());
    ASSERT_EQ(f.fgSearch.TextMatrix(2, cat::kItemNo), "P120");
    user.DoubleClickCell(f.fgSearch, 2, cat::kDescription);
    ASSERT_EQ(g.Rows(), 4);
    ASSERT_TRUE(f.T1.Visible());
    user.Type("100\n"); // the unit price
    EXPECT_EQ(g.TextMatrix(3, sel::kMarkup), "130.000");
    user.DoubleClickCell(g, 3, sel::kType);
    ASSERT_TRUE(f.LV1.Visible());
    user.ClickItem(f.LV1, 3); // "eXchange(X)"
    user.DoubleClickCell(g, 3, sel::kReport);
    user.ClickCell(g, 1, sel::kItemNo);
    user.Click(f.cmdDelete);
    user.Click(f.cmdClose);
    EXPECT_FALSE(f.Loaded());
  });
  EXPECT_TRUE(runtime.Messages().empty());
  ASSERT_EQ(Records(), (std::vector<std::string>{
                           "P120|REAR BUMPER COVER|o|X|2|100|120||1|<Null>|1",
                           headlamp,
                       }));
  quote->Find("itemno = 'P120'", 0, data::adSearchForward, data::adBookmarkFirst);
  EXPECT_EQ(quote->Collect("Category").ToText(), "PRT");
  EXPECT_TRUE(quote->Collect("ITEMID").IsNull());
  EXPECT_EQ(quote->StoredStatus(0), data::RecordStatus::Deleted);
}

TEST_F(EditingTest, TheEditorTakesOnlyWhatEachColumnHolds) {
  TwoParts();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    auto typeInto = [&](int col, const std::string& typed) {
      user.ClickCell(g, 1, col);
      user.PressKey(keys::kF2);
      if (f.LV1.Visible()) user.PressKey(keys::kEscape); // back to the editor
      f.T1.Text("");
      user.Type(typed);
      return f.T1.Text();
    };
    EXPECT_EQ(typeInto(sel::kQty, "1a 2."), "1 2");
    EXPECT_EQ(typeInto(sel::kUnitPrice, "1x2.5-"), "12.5");
    EXPECT_EQ(typeInto(sel::kMarkup, "9,9.5"), "99.5");
    EXPECT_EQ(typeInto(sel::kItemNo, "A-1/b"), "A-1/b");
    EXPECT_EQ(typeInto(sel::kPartNo, "PN 7"), "PN 7");
    // The type column: one letter, lower case raised; a space is a new part.
    EXPECT_EQ(typeInto(sel::kType, "q"), "");
    EXPECT_EQ(typeInto(sel::kType, "cu"), "C");
    EXPECT_EQ(typeInto(sel::kType, " "), " ");
    EXPECT_EQ(g.TextMatrix(1, sel::kType), " ");
    EXPECT_EQ(f.T1.MaxLength(), 1);
    user.PressKey(keys::kEscape);
  });
}

TEST_F(EditingTest, TypingInTheGridStartsTheCellAfresh) {
  TwoParts();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    struct Case {
      int col;
      std::string key;
      std::string cell;
      bool opens;
    };
    const std::vector<Case> cases = {
        {sel::kType, "x", "X", true},        {sel::kType, " ", "", true},
        {sel::kType, "q", "", false},        {sel::kQty, "5", "5", true},
        {sel::kQty, ".", "1", false},        {sel::kQty, " ", "", true},
        {sel::kUnitPrice, ".", ".", true},   {sel::kMarkup, "7", "7", true},
        {sel::kDescription, "b", "b", true}, {sel::kSide, "L", "O", false},
    };
    for (const Case& c : cases) {
      g.TextMatrix(1, sel::kQty, "1");
      g.TextMatrix(1, sel::kType, "");
      user.ClickCell(g, 2, sel::kItemNo); // away, so the cell is entered afresh
      user.ClickCell(g, 1, c.col);
      user.Type(c.key);
      EXPECT_EQ(g.TextMatrix(1, c.col), c.cell) << c.col << " '" << c.key << "'";
      EXPECT_EQ(f.T1.Visible(), c.opens) << c.col << " '" << c.key << "'";
      if (f.LV1.Visible()) user.PressKey(keys::kEscape);
    }
    // Backspace drops the last character and opens the editor on the rest.
    user.ClickCell(g, 2, sel::kPartNo);
    user.PressKey(keys::kBack);
    EXPECT_EQ(g.TextMatrix(2, sel::kPartNo), "HL-");
    EXPECT_TRUE(f.T1.Visible());
    // Space ticks and unticks the report column.
    user.ClickCell(g, 2, sel::kReport);
    user.Type(" ");
    EXPECT_EQ(g.TextMatrix(2, sel::kReport), "R");
    EXPECT_EQ(g.ToolTipText(), "Report Only: Yes");
    user.Type(" ");
    EXPECT_EQ(g.TextMatrix(2, sel::kReport), "£");
    // Enter moves on: along the row, then to the next row's first cell;
    // the last cell stays.
    user.ClickCell(g, 1, sel::kReport);
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.Row(), 2);
    EXPECT_EQ(g.Col(), sel::kItemNo);
    user.ClickCell(g, 2, sel::kReport);
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.Row(), 2);
    EXPECT_EQ(g.Col(), sel::kReport);
    user.Click(f.cmdClose);
  });
}

TEST_F(EditingTest, EscapeBringsBackTheTextTheCellHadWhenEntered) {
  TwoParts();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    // The cell the editor starts on.
    user.Click(g);
    user.PressKey(keys::kF2);
    user.Type("XYZ");
    user.PressKey(keys::kEscape);
    EXPECT_EQ(f.T1.Text(), "FRONT BUMPER BAR");
    EXPECT_EQ(g.TextMatrix(1, sel::kDescription), "FRONT BUMPER BAR");
    // Typed into the grid, then more in the editor, then opened again: the
    // text from entering the cell, not from opening the editor.
    user.ClickCell(g, 2, sel::kUnitPrice);
    user.Type("5");
    user.Type("5");
    user.PressKey(keys::kEscape);
    EXPECT_EQ(f.T1.Text(), "300.00");
    EXPECT_EQ(f.T1.SelStart(), f.T1.Length());
    user.PressKey(keys::kEnter);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records()[0].substr(0, 21), "P100|FRONT BUMPER BAR");
}

TEST_F(EditingTest, LeavingACellFormatsItAndRepricesOnlyAfterAnEdit) {
  TwoParts();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    // Passing through: formatted, not repriced.
    g.TextMatrix(1, sel::kUnitPrice, "100.5");
    user.ClickCell(g, 1, sel::kUnitPrice);
    user.ClickCell(g, 1, sel::kMarkup);
    EXPECT_EQ(g.TextMatrix(1, sel::kUnitPrice), "100.50");
    EXPECT_EQ(g.TextMatrix(1, sel::kMarkup), "130.000");
    // Typed: repriced with the new-part markup (30).
    user.ClickCell(g, 1, sel::kUnitPrice);
    user.Type("100\n");
    EXPECT_EQ(g.TextMatrix(1, sel::kUnitPrice), "100.00");
    EXPECT_EQ(g.TextMatrix(1, sel::kMarkup), "130.000");
    // A Markup typed by hand stays (formatted) until the price or the type
    // is edited again; changing the quantity leaves it.
    user.Type("125.5\n");
    EXPECT_EQ(g.TextMatrix(1, sel::kMarkup), "125.500");
    user.ClickCell(g, 1, sel::kQty);
    user.Type("3\n");
    EXPECT_EQ(g.TextMatrix(1, sel::kMarkup), "125.500");
    user.ClickCell(g, 1, sel::kType);
    user.Type("x");
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.TextMatrix(1, sel::kType), "X");
    EXPECT_EQ(g.TextMatrix(1, sel::kMarkup), "120.000"); // the used markup (20)
    EXPECT_EQ(g.CellStyleAt(1, sel::kType).alignment, grid::kAlignRightCenter);
    // A space is a new part.
    user.ClickCell(g, 1, sel::kType);
    user.Type(" ");
    user.ClickCell(g, 1, sel::kItemNo);
    EXPECT_EQ(g.TextMatrix(1, sel::kMarkup), "130.000");
    // Not numbers: "0" and "0.00".
    g.TextMatrix(1, sel::kQty, "abc");
    g.TextMatrix(1, sel::kUnitPrice, "");
    g.TextMatrix(1, sel::kMarkup, "x");
    for (int c : {sel::kQty, sel::kUnitPrice, sel::kMarkup, sel::kItemNo})
      user.ClickCell(g, 1, c);
    EXPECT_EQ(RowText(g, 1, sel::kMarkup), "P100|FRONT BUMPER BAR|O||0|0.00|0.00");
    // A row without an item number is left alone.
    g.TextMatrix(2, sel::kItemNo, "");
    g.TextMatrix(2, sel::kQty, "abc");
    user.ClickCell(g, 2, sel::kQty);
    user.ClickCell(g, 2, sel::kPartNo);
    EXPECT_EQ(g.TextMatrix(2, sel::kQty), "abc");
    EXPECT_EQ(g.CellStyleAt(2, sel::kQty).backColor, grid::kWhite);
    g.TextMatrix(2, sel::kQty, "2");
    user.Click(f.cmdClose);
  });
}

TEST_F(EditingTest, TheSideFollowsTheDescriptionAtEitherEnd) {
  AddPart({1, "P1", "X"});
  Stored();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    const std::vector<std::pair<std::string, std::string>> cases = {
        {"MIRROR R\\H", "R"}, {"mirror r/h", "R"},      {"DOOR L/H", "L"},
        {"door l\\h", "L"},   {"L/H FRONT GUARD", "L"}, {"r\\h tail lamp", "R"},
        {"R/HFRONT", "O"},    {"BONNET", "O"},          {"HL/HX", "O"},
    };
    for (const auto& [description, side] : cases) {
      g.TextMatrix(1, sel::kSide, "?");
      user.ClickCell(g, 1, sel::kDescription);
      user.PressKey(keys::kF2);
      f.T1.Text(description);
      user.PressKey(keys::kEnter);
      EXPECT_EQ(g.TextMatrix(1, sel::kSide), side) << description;
    }
    // An empty description leaves the side alone.
    g.TextMatrix(1, sel::kSide, "?");
    user.ClickCell(g, 1, sel::kDescription);
    user.PressKey(keys::kF2);
    f.T1.Text("");
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.TextMatrix(1, sel::kSide), "?");
    g.TextMatrix(1, sel::kDescription, "BONNET");
  });
}

TEST_F(EditingTest, ACataloguePartKeepsItsSideWhenItsDescriptionIsPassed) {
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    user.DoubleClickCell(f.FGParts, 2, cat::kItemNo); // "L/H FRONT GUARD", side L
    user.PressKey(keys::kEnter);
    user.ClickCell(g, 1, sel::kDescription);
    user.ClickCell(g, 1, sel::kQty);
    EXPECT_EQ(g.TextMatrix(1, sel::kSide), "L");
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records()[0].substr(0, 23), "P110|L/H FRONT GUARD|L|");
}

TEST_F(EditingTest, ARightClickOnTheHeaderOrTheFirstColumnGoesToTheNearestDataCell) {
  TwoParts();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    user.ClickCell(g, 2, sel::kQty);
    user.ClickCell(g, 0, sel::kMarkup, forms::kRightButton);
    EXPECT_EQ(g.Row(), 1);
    EXPECT_EQ(g.Col(), sel::kMarkup);
    user.ClickCell(g, 2, sel::kItemNo, forms::kRightButton);
    EXPECT_EQ(g.Row(), 2);
    EXPECT_EQ(g.Col(), sel::kDescription);
    user.ClickCell(g, 1, sel::kQty, forms::kRightButton);
    EXPECT_EQ(g.Row(), 2);
    EXPECT_EQ(g.Col(), sel::kDescription);
  });
}

TEST_F(EditingTest, ThePartTypeListByKeyAndByClick) {
  TwoParts(); // row 1: unit price 100.00, new
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    auto pick = [&](const std::string& key) {
      user.ClickCell(g, 1, sel::kType);
      user.PressKey(keys::kF2);
      EXPECT_TRUE(f.LV1.Visible());
      EXPECT_TRUE(f.LV1.HasFocus());
      user.Type(key);
      EXPECT_FALSE(f.LV1.Visible());
      EXPECT_FALSE(f.T1.Visible());
      return g.TextMatrix(1, sel::kType) + " " + g.TextMatrix(1, sel::kMarkup);
    };
    EXPECT_EQ(pick("u"), "U 120.000");
    EXPECT_EQ(pick("c"), "C 115.000");
    EXPECT_EQ(pick("a"), "A 110.000");
    EXPECT_EQ(pick("X"), "X 120.000");
    EXPECT_EQ(pick(" "), " 130.000");
    EXPECT_EQ(pick("\n"), " 130.000"); // Enter: the item of the cell, "New"
    // The list opens on the item of the cell.
    g.TextMatrix(1, sel::kType, "C");
    user.ClickCell(g, 1, sel::kQty);
    user.ClickCell(g, 1, sel::kType);
    user.PressKey(keys::kF2);
    EXPECT_EQ(f.LV1.SelectedIndex(), 4);
    // Other keys do nothing; Escape leaves type and price as they were.
    user.Type("q");
    EXPECT_TRUE(f.LV1.Visible());
    user.PressKey(keys::kEscape);
    EXPECT_FALSE(f.LV1.Visible());
    EXPECT_TRUE(f.T1.HasFocus());
    EXPECT_EQ(g.TextMatrix(1, sel::kType), "C");
    EXPECT_EQ(g.TextMatrix(1, sel::kMarkup), "130.000");
    // The drop-down button: shown on the type cell, opening and closing
    // the list; a click on an item commits it.
    user.PressKey(keys::kEnter);
    user.ClickCell(g, 1, sel::kType);
    ASSERT_TRUE(f.CB1.Visible());
    user.Click(f.CB1);
    EXPECT_TRUE(f.LV1.Visible());
    EXPECT_EQ(f.LV1.SelectedIndex(), 4);
    user.Click(f.CB1);
    EXPECT_FALSE(f.LV1.Visible());
    EXPECT_TRUE(f.T1.HasFocus());
    user.Click(f.CB1);
    user.ClickItem(f.LV1, 2);
    EXPECT_EQ(g.TextMatrix(1, sel::kType), "U");
    EXPECT_EQ(g.TextMatrix(1, sel::kMarkup), "120.000");
    EXPECT_TRUE(f.CB1.Visible());
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records()[0].substr(0, 26), "P100|FRONT BUMPER BAR|O|U|");
}

TEST_F(EditingTest, TheListDropsBelowTheCellOrAboveWhereThereIsNoRoom) {
  for (int i = 1; i <= 8; ++i)
    AddPart({i, "P" + std::to_string(i), "PART " + std::to_string(i)});
  Stored();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    user.DoubleClickCell(g, 1, sel::kType);
    ASSERT_TRUE(f.LV1.Visible());
    EXPECT_EQ(f.LV1.Top(), f.T1.Top() + f.T1.Height());
    EXPECT_EQ(f.LV1.Left() + f.LV1.Width(), f.T1.Left() + f.T1.Width() + f.CB1.Width());
    EXPECT_EQ(f.LV1.ColumnWidth(), f.LV1.Width() - 300);
    EXPECT_EQ(f.LV1.SelectedIndex(), 1);
    user.PressKey(keys::kEscape);
    user.DoubleClickCell(g, 8, sel::kType);
    ASSERT_TRUE(f.LV1.Visible());
    EXPECT_EQ(f.LV1.Top(), f.T1.Top() - f.LV1.Height());
    EXPECT_LE(f.LV1.Top() + f.LV1.Height(), f.ScaleHeight());
    user.PressKey(keys::kEscape);
  });
}

TEST_F(EditingTest, DeletingTheOnlyAStoredAndANewPart) {
  AddPart({1, "P1", "ONLY"});
  Stored();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    user.Click(f.cmdDelete);
    EXPECT_EQ(g.Rows(), 2);
    EXPECT_EQ(RowText(g, 1), "||||||||||");
    ASSERT_EQ(f.DeletedItems()->RecordCount(), 1);
    // A part added in this session leaves no trace; a stored one does.
    user.DoubleClickCell(f.FGParts, 1, cat::kItemNo);
    user.DoubleClickCell(f.FGParts, 2, cat::kItemNo);
    EXPECT_EQ(g.Rows(), 3);
    user.ClickCell(g, 2, sel::kItemNo);
    user.Click(f.cmdDelete);
    EXPECT_EQ(g.Rows(), 2);
    EXPECT_EQ(g.TextMatrix(1, sel::kItemNo), "P100");
    EXPECT_EQ(f.DeletedItems()->RecordCount(), 1);
    EXPECT_TRUE(g.HasFocus());
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records().size(), 1u);
  EXPECT_EQ(Records()[0].substr(0, 5), "P100|");
}

TEST_F(EditingTest, TheDescriptionNarrowsAtTheTenthPartAndWidensWhenLeftWithTen) {
  for (int i = 1; i <= 9; ++i)
    AddPart({i, "Q" + std::to_string(i), "PART " + std::to_string(i)});
  Stored();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    const int wide = g.ColWidth(sel::kDescription);
    user.DoubleClickCell(f.FGParts, 1, cat::kItemNo); // the tenth part: 11 rows
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.Rows(), 11);
    EXPECT_EQ(g.ColWidth(sel::kDescription), wide - 240);
    user.DoubleClickCell(f.FGParts, 2, cat::kItemNo); // the eleventh: no change
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.ColWidth(sel::kDescription), wide - 240);
    user.Click(f.cmdDelete); // left with 11 rows: wider
    EXPECT_EQ(g.Rows(), 11);
    EXPECT_EQ(g.ColWidth(sel::kDescription), wide);
    user.Click(f.cmdDelete); // left with 10 rows: no change
    EXPECT_EQ(g.ColWidth(sel::kDescription), wide);
    user.Click(f.cmdClose);
  });
}

} // namespace
} // namespace belvane::test
