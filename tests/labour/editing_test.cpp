// Editing the selected labour lines in place: the in-cell editor and its
// keys, typing into the grid, the Enter move, the rate rule, flags and tool
// tips, highlighting, view mode and deleting lines. Everything is driven by
// the simulated user.

#include "forms/keys.hpp"
#include "labour_fixture.hpp"
#include "text/number.hpp"

namespace belvane::test {
namespace {

using labour::frmLabour;
namespace col = labour::col;
namespace keys = forms::keys;

class EditingTest : public LabourFixture {
protected:
  text::ScopedNumberLocale locale{{".", ","}};

  // Four stored lines:
  //   row 1  100 BONNET R&I    R&R 1.50, Repair 2.00, Paint 0.80 (report only), rate <Default>
  //   row 2  120 L/H FRONT GUARD  Paint 2.00 only, mask 1 (R&R and Repair grey), <NA>
  //   row 3  130 REAR DOOR     Paint 1.00 only, mask 7: R&R may be added, <NA>
  //   row 4  140 Roof panel £  R&R 3.00 at rate 60, mask 6 (Paint grey)
  void FourLines() {
    AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
    AddRecord(2, "100", "BONNET R&I", "RA", 2.0);
    AddRecord(3, "100", "BONNET R&I", "PAINT", 0.8, 1);
    AddRecord(4, "120", "L/H FRONT GUARD", "PAINT", 2.0, 0, std::nullopt, "1");
    AddRecord(5, "130", "REAR DOOR", "PAINT", 1.0);
    AddRecord(6, "140", "Roof panel £", "R&R", 3.0, 0, 60.0, "6");
    Stored();
  }

  static bool Italic(grid::FlexGrid& g, int r, int c) { return g.CellStyleAt(r, c).fontItalic; }
  static grid::Color Back(grid::FlexGrid& g, int r, int c) { return g.CellStyleAt(r, c).backColor; }
};

TEST_F(EditingTest, TypingAndF2OpenTheEditorOverTheCell) {
  FourLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    // Typing 5 on the empty R&R hours of a paint-only line.
    ASSERT_TRUE(user.ClickCell(g, 3, col::kRRHours));
    EXPECT_EQ(Back(g, 3, col::kRRHours), grid::kYellow);
    user.Type("5");
    ASSERT_TRUE(f.T1.Visible());
    EXPECT_EQ(f.T1.Text(), "5");
    EXPECT_EQ(f.T1.SelStart(), 1);
    EXPECT_EQ(f.T1.Alignment(), forms::kRightJustify);
    EXPECT_EQ(f.T1.Left(), g.Left() + g.ColWidth(0) + g.ColWidth(1));
    EXPECT_EQ(f.T1.Top(), g.Top() + g.RowPos(3));
    EXPECT_EQ(f.T1.Width(), 900);
    EXPECT_EQ(f.T1.Height(), g.RowHeight(3));
    EXPECT_EQ(g.TextMatrix(3, col::kRRHours), "5"); // formatted only when left
    user.PressKey(keys::kEnter);
    EXPECT_FALSE(f.T1.Visible());
    EXPECT_TRUE(g.HasFocus());
    EXPECT_EQ(g.TextMatrix(3, col::kRRHours), "5.00");
    EXPECT_EQ(g.TextMatrix(3, col::kRate), "<Default>");
    EXPECT_TRUE(Italic(g, 3, col::kRate));
    EXPECT_EQ(g.Col(), col::kRRReport);
    EXPECT_EQ(Back(g, 3, col::kRRHours), grid::kWhite);
    EXPECT_EQ(Back(g, 3, col::kRRReport), grid::kYellow);

    // F2: hours selected, description and rate with the caret at the end,
    // nothing on a flag.
    user.ClickCell(g, 1, col::kRAHours);
    user.PressKey(keys::kF2);
    EXPECT_EQ(f.T1.Text(), "2.00");
    EXPECT_EQ(f.T1.SelLength(), 4);
    user.ClickCell(g, 1, col::kDescription);
    EXPECT_FALSE(f.T1.Visible());
    EXPECT_EQ(g.ToolTipText(), "BONNET R&I");
    user.PressKey(keys::kF2);
    EXPECT_EQ(f.T1.Alignment(), forms::kLeftJustify);
    EXPECT_EQ(f.T1.SelStart(), 10);
    user.ClickCell(g, 1, col::kRRReport);
    user.PressKey(keys::kF2);
    EXPECT_FALSE(f.T1.Visible());

    // A double click selects hours but leaves the caret at a description's
    // end; typing on a description starts it afresh; Backspace drops a whole
    // last character.
    user.DoubleClickCell(g, 4, col::kDescription);
    EXPECT_EQ(f.T1.SelStart(), f.T1.Length());
    user.ClickCell(g, 2, col::kDescription);
    user.Type("W");
    EXPECT_EQ(g.TextMatrix(2, col::kDescription), "W");
    EXPECT_EQ(f.T1.SelStart(), 1);
    user.ClickCell(g, 4, col::kDescription);
    user.PressKey(keys::kBack);
    EXPECT_EQ(g.TextMatrix(4, col::kDescription), "Roof panel ");

    // Grey cells are never highlighted or edited.
    user.ClickCell(g, 2, col::kRRHours);
    EXPECT_EQ(Back(g, 2, col::kRRHours), grid::kGrey);
    EXPECT_EQ(Back(g, 4, col::kDescription), grid::kWhite);
    user.Type("5");
    user.DoubleClickCell(g, 2, col::kRRHours);
    user.PressKey(keys::kF2);
    EXPECT_FALSE(f.T1.Visible());
    EXPECT_EQ(g.TextMatrix(2, col::kRRHours), "");
  });
}

TEST_F(EditingTest, EditorKeysFilterEscapeAndArrows) {
  FourLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    // Hours take digits, point, minus and blank only.
    user.DoubleClickCell(g, 1, col::kRAHours);
    user.Type("1a2b,.5");
    EXPECT_EQ(f.T1.Text(), "12.5");
    // Escape: the text on entry, editor still open.
    user.PressKey(keys::kEscape);
    EXPECT_TRUE(f.T1.Visible());
    EXPECT_EQ(f.T1.Text(), "2.00");
    EXPECT_EQ(f.T1.SelStart(), 4);
    // Escape after typing on the grid: the text on entry too.
    user.ClickCell(g, 4, col::kRRHours);
    user.Type("9");
    user.PressKey(keys::kEscape);
    EXPECT_EQ(f.T1.Text(), "3.00");
    // The description takes any character.
    user.ClickCell(g, 1, col::kDescription);
    user.PressKey(keys::kF2);
    user.Type(" #2/x");
    EXPECT_EQ(g.TextMatrix(1, col::kDescription), "BONNET R&I #2/x");

    // Left only at the caret's start; from column 1 to the last column of
    // the row above.
    user.ClickCell(g, 3, col::kDescription);
    user.PressKey(keys::kF2);
    user.PressKey(keys::kLeft);
    EXPECT_TRUE(f.T1.Visible());
    EXPECT_EQ(f.T1.SelStart(), 8);
    user.PressKey(keys::kHome);
    user.PressKey(keys::kLeft);
    EXPECT_FALSE(f.T1.Visible());
    EXPECT_EQ(g.Row(), 2);
    EXPECT_EQ(g.Col(), g.Cols() - 1);
    // Right only at the caret's end: the first press ends the selection.
    user.DoubleClickCell(g, 4, col::kRate);
    user.PressKey(keys::kRight);
    EXPECT_TRUE(f.T1.Visible());
    user.PressKey(keys::kRight);
    EXPECT_EQ(g.Col(), col::kMechanical);
    // Up and Down; the cell left is formatted.
    user.ClickCell(g, 3, col::kRRHours);
    user.Type("7");
    user.PressKey(keys::kDown);
    EXPECT_EQ(g.Row(), 4);
    EXPECT_EQ(g.TextMatrix(3, col::kRRHours), "7.00");
    EXPECT_EQ(g.TextMatrix(3, col::kRate), "<Default>");
    user.PressKey(keys::kF2);
    user.PressKey(keys::kUp);
    EXPECT_EQ(g.Row(), 3);
    user.ClickCell(g, 1, col::kDescription);
    user.PressKey(keys::kF2);
    user.PressKey(keys::kUp);
    EXPECT_TRUE(f.T1.Visible()); // no row above
  });
}

TEST_F(EditingTest, EnterMovesToTheNextCellThatIsNotGrey) {
  FourLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    user.ClickCell(g, 2, col::kDescription);
    user.PressKey(keys::kF2);
    user.PressKey(keys::kEnter); // over the grey R&R and Repair cells
    EXPECT_EQ(g.Col(), col::kPTHours);
    user.PressKey(keys::kEnter); // editor closed: the grid moves too
    EXPECT_EQ(g.Col(), col::kPTReport);
    user.ClickCell(g, 2, col::kMechanical);
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.Row(), 3);
    EXPECT_EQ(g.Col(), col::kItemNo);
    user.ClickCell(g, 4, col::kRAReport);
    user.PressKey(keys::kEnter); // over the grey paint cells
    EXPECT_EQ(g.Col(), col::kRate);
    user.PressKey(keys::kEnter);
    user.PressKey(keys::kEnter); // the last row ends on "Allow"
    EXPECT_EQ(g.Col(), col::kAllow);
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.Row(), 4);
    EXPECT_EQ(g.Col(), col::kAllow);
    EXPECT_TRUE(g.Redraw());
  });
}

TEST_F(EditingTest, TheRateRule) {
  FourLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    auto typeRate = [&](const std::string& typed) {
      user.DoubleClickCell(g, 4, col::kRate);
      user.PressKey(keys::kBack);
      user.Type(typed + "\n");
      return g.TextMatrix(4, col::kRate);
    };
    EXPECT_EQ(g.TextMatrix(4, col::kRate), "60.00");
    EXPECT_EQ(typeRate("55"), "<Default>");
    EXPECT_TRUE(Italic(g, 4, col::kRate));
    EXPECT_EQ(g.Col(), col::kMechanical);
    EXPECT_EQ(typeRate("72.5"), "72.50");
    EXPECT_FALSE(Italic(g, 4, col::kRate));
    EXPECT_EQ(typeRate("55.00"), "<Default>");
    EXPECT_EQ(typeRate("1234"), "1,234.00");
    EXPECT_EQ(typeRate(""), "<Default>");
    EXPECT_EQ(typeRate("  "), "<Default>");

    // The default rate is edited as its number.
    user.DoubleClickCell(g, 4, col::kRate);
    EXPECT_EQ(f.T1.Text(), "55.00");
    user.PressKey(keys::kEscape);
    EXPECT_EQ(f.T1.Text(), "55.00");
    user.ClickCell(g, 4, col::kDescription);
    EXPECT_EQ(g.TextMatrix(4, col::kRate), "<Default>");
    user.ClickCell(g, 4, col::kRate);
    user.PressKey(keys::kBack);
    EXPECT_EQ(f.T1.Text(), "55.0");
    user.Type("9\n");
    EXPECT_EQ(g.TextMatrix(4, col::kRate), "55.09");
    // Typing a number on the rate starts it afresh, as on hours.
    user.ClickCell(g, 4, col::kRate);
    user.Type("6");
    EXPECT_EQ(f.T1.Text(), "6");
    user.ClickCell(g, 4, col::kDescription); // left by the mouse: the rule too
    EXPECT_EQ(g.TextMatrix(4, col::kRate), "6.00");

    // "<NA>": nothing opens it.
    user.ClickCell(g, 3, col::kRate);
    for (int key : {keys::kBack, int{'5'}, keys::kF2}) {
      user.PressKey(key);
      EXPECT_FALSE(f.T1.Visible()) << key;
    }
    user.DoubleClickCell(g, 3, col::kRate);
    EXPECT_FALSE(f.T1.Visible());
    EXPECT_EQ(g.TextMatrix(3, col::kRate), "<NA>");
  });
}

TEST_F(EditingTest, FlagsToggleOnlyOverNumericHours) {
  FourLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    user.ClickCell(g, 3, col::kRRReport); // R&R hours empty
    EXPECT_EQ(g.ToolTipText(), "RR Report Only: No");
    user.PressKey(keys::kSpace);
    user.DoubleClickCell(g, 3, col::kMechanical);
    EXPECT_EQ(g.TextMatrix(3, col::kRRReport), "£");
    EXPECT_EQ(g.TextMatrix(3, col::kMechanical), "£");

    user.ClickCell(g, 1, col::kRRReport);
    user.PressKey(keys::kSpace);
    EXPECT_EQ(g.TextMatrix(1, col::kRRReport), "R");
    EXPECT_EQ(g.ToolTipText(), "RR Report Only: Yes");
    user.DoubleClickCell(g, 1, col::kRRReport);
    EXPECT_EQ(g.TextMatrix(1, col::kRRReport), "£");
    EXPECT_EQ(g.ToolTipText(), "RR Report Only: No");
    EXPECT_FALSE(f.T1.Visible());
    const std::vector<std::pair<int, std::string>> tips = {
        {col::kRAReport, "RA Report Only: Yes"},
        {col::kPTReport, "PT Report Only: No"}, // was on
        {col::kBlend, "PT Blend: Yes"},
        {col::kMechanical, "Mechanical Item: Yes"},
    };
    for (const auto& [c, tip] : tips) {
      user.ClickCell(g, 1, c);
      user.PressKey(keys::kSpace);
      EXPECT_EQ(g.ToolTipText(), tip) << c;
    }
    // Grey flags never toggle.
    user.ClickCell(g, 2, col::kRRReport);
    user.PressKey(keys::kSpace);
    EXPECT_EQ(g.TextMatrix(2, col::kRRReport), "£");
  });
}

TEST_F(EditingTest, ClearingHoursResetsTheirFlags) {
  FourLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    for (int c : {col::kRRReport, col::kRAReport, col::kBlend, col::kMechanical}) {
      user.ClickCell(g, 1, c);
      user.PressKey(keys::kSpace);
    }
    ASSERT_EQ(g.TextMatrix(1, col::kPTReport), "R");
    // Paint cleared with Enter: report only and blend go off.
    user.DoubleClickCell(g, 1, col::kPTHours);
    user.PressKey(keys::kBack);
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.TextMatrix(1, col::kPTHours), "");
    EXPECT_EQ(g.TextMatrix(1, col::kPTReport), "£");
    EXPECT_EQ(g.TextMatrix(1, col::kBlend), "£");
    // Repair blanked with Enter.
    user.DoubleClickCell(g, 1, col::kRAHours);
    user.Type("  \n");
    EXPECT_EQ(g.TextMatrix(1, col::kRAHours), "");
    EXPECT_EQ(g.TextMatrix(1, col::kRAReport), "£");
    // R&R emptied and left by the mouse: no rate, the flag stays.
    user.DoubleClickCell(g, 1, col::kRRHours);
    user.PressKey(keys::kBack);
    user.ClickCell(g, 1, col::kDescription);
    EXPECT_EQ(g.TextMatrix(1, col::kRate), "<NA>");
    EXPECT_TRUE(Italic(g, 1, col::kRate));
    EXPECT_EQ(g.TextMatrix(1, col::kRRReport), "R");
    // Retyping R&R hours from a blank keeps the line's own rate: the cell is
    // not left while the editor is open on it.
    user.ClickCell(g, 4, col::kRRHours);
    user.Type(" ");
    user.PressKey(keys::kBack);
    user.Type("4\n");
    EXPECT_EQ(g.TextMatrix(4, col::kRRHours), "4.00");
    EXPECT_EQ(g.TextMatrix(4, col::kRate), "60.00");
  });
}

TEST_F(EditingTest, ViewModeChangesNothing) {
  FourLines();
  Open(eView, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    const std::string before = RowText(g, 1);
    user.ClickCell(g, 1, col::kRRHours);
    user.Type("5");
    user.PressKey(keys::kBack);
    user.PressKey(keys::kF2);
    user.DoubleClickCell(g, 1, col::kDescription);
    user.ClickCell(g, 1, col::kRRReport);
    user.PressKey(keys::kSpace);
    user.DoubleClickCell(g, 1, col::kRRReport);
    EXPECT_FALSE(f.T1.Visible());
    EXPECT_EQ(RowText(g, 1), before);
    EXPECT_FALSE(user.Click(f.cmdDelete));
  });
}

TEST_F(EditingTest, DeletingLinesRecordsTheirStoredRecords) {
  FourLines();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    user.ClickCell(g, 2, col::kDescription);
    EXPECT_TRUE(user.Click(f.cmdDelete));
    EXPECT_EQ(g.Rows(), 4);
    EXPECT_EQ(g.TextMatrix(2, col::kItemNo), "130");
    EXPECT_TRUE(g.HasFocus());
    EXPECT_EQ(Back(g, 2, col::kDescription), grid::kYellow);
    // Escape restores the text of the line now current, not the deleted one.
    user.PressKey(keys::kF2);
    user.Type("X");
    user.PressKey(keys::kEscape);
    EXPECT_EQ(f.T1.Text(), "REAR DOOR");
    user.ClickCell(g, 1, col::kRAHours);
    user.Click(f.cmdDelete);
    EXPECT_EQ(f.DeletedItems()->RecordCount(), 4);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{"130 PAINT 1", "140 R&R 3"}));
}

TEST_F(EditingTest, DeletingTheOnlyLineLeavesThePlaceholder) {
  AddRecord(7, "100", "BONNET R&I", "R&R", 1.5);
  AddRecord(8, "100", "BONNET R&I", "PAINT", 0.8);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    user.ClickCell(g, 1, col::kRRHours);
    user.Click(f.cmdDelete);
    EXPECT_EQ(g.Rows(), 2);
    EXPECT_EQ(RowText(g, 1), "|||||||||||||||");
    EXPECT_EQ(f.DeletedItems()->RecordCount(), 2);
    user.Click(f.cmdDelete); // nothing left to record
    EXPECT_EQ(f.DeletedItems()->RecordCount(), 2);
    user.Click(f.cmdClose);
  });
  EXPECT_TRUE(Records().empty());
}

TEST_F(EditingTest, DeletingDownToTenLinesWidensTheDescription) {
  for (int i = 0; i < 11; ++i)
    AddRecord(i + 1, std::to_string(100 + i), "ITEM " + std::to_string(i), "R&R", 1.0);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    const int narrow = g.ColWidth(col::kDescription);
    user.ClickCell(g, 1, col::kItemNo);
    user.Click(f.cmdDelete); // 12 rows to 11
    EXPECT_EQ(g.ColWidth(col::kDescription), narrow + 240);
    user.Click(f.cmdDelete); // 11 to 10
    EXPECT_EQ(g.ColWidth(col::kDescription), narrow + 240);
  });
}

TEST_F(EditingTest, ClosingStraightFromTheEditorKeepsTheLineConsistent) {
  FourLines();
  Open(eEdit, [&](frmLabour& f) {
    user.ClickCell(f.FGSelectedLabour, 3, col::kRRHours);
    user.Type("2.5");
    EXPECT_TRUE(f.T1.HasFocus());
    EXPECT_TRUE(user.Click(f.cmdClose));
  });
  EXPECT_EQ(Records(),
            (std::vector<std::string>{"100 R&R 1.5", "100 RA 2", "100 PAINT 0.8", "120 PAINT 2",
                                      "130 PAINT 1", "130 R&R 2.5", "140 R&R 3"}));
  data::Recordset& rs = *quote;
  rs.Find("ITEMID = 5", 0, data::adSearchForward, data::adBookmarkFirst);
  rs.MoveNext(); // the new R&R record of the line
  EXPECT_EQ(rs.Collect("rr_rate2"), data::Value(rrRate));
}

TEST_F(EditingTest, AddingFromTheCatalogueOpensTheEditorOnTheHours) {
  Open(eEdit, [&](frmLabour& f) {
    auto& cat = f.FGLabourItems(0);
    ASSERT_EQ(cat.TextMatrix(1, 0), "100");
    user.DoubleClickCell(cat, 1, 2);
    auto& g = f.FGSelectedLabour;
    ASSERT_TRUE(f.T1.HasFocus());
    EXPECT_EQ(g.Row(), 1);
    EXPECT_EQ(g.Col(), col::kRRHours);
    EXPECT_EQ(f.T1.SelLength(), 4); // "1.50" selected
    user.Type("2.5\n");
    EXPECT_EQ(g.Col(), col::kRRReport);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 2.5"}));
  quote->MoveFirst();
  EXPECT_EQ(quote->Collect("rr_rate2"), data::Value(rrRate));
  EXPECT_EQ(quote->Collect("tag"), data::Value("1"));
  EXPECT_EQ(schedType, "NRMA");
}

} // namespace
} // namespace belvane::test
