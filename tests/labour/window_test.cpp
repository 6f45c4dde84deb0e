// The labour window for a day at the keyboard: Enter or Insert on an
// available row adds it, the access keys work the buttons and reach the
// lists, F1 and Help show the keys, and a larger window gives its room to
// the grids and their descriptions.

#include "forms/keys.hpp"
#include "labour_fixture.hpp"
#include "text/number.hpp"

namespace belvane::test {
namespace {

using labour::frmLabour;
namespace col = labour::col;
namespace keys = forms::keys;

class LabourWindowKeysTest : public LabourFixture {
protected:
  text::ScopedNumberLocale locale{{".", ","}};
  void Alt(char letter) { user.PressKey(letter, forms::kAltMask); }
  static bool IsGreyCell(const grid::FlexGrid& g, int r, int c) {
    return g.CellStyleAt(r, c).backColor == grid::kGrey;
  }
};

TEST_F(LabourWindowKeysTest, EnterOrInsertAddsTheWholeItemAsADoubleClickOnItsDescription) {
  Open(eEdit, [&](frmLabour& f) {
    auto& items = f.FGLabourItems(0);
    auto& sel = f.FGSelectedLabour;
    // An item with more than one operation.
    int row = 1;
    const auto operations = [&](int r) {
      int n = 0;
      for (int c = 2; c <= 4; ++c)
        n += !items.TextMatrix(r, c).empty() && !IsGreyCell(items, r, c);
      return n;
    };
    while (row < items.Rows() - 1 && operations(row) < 2)
      ++row;
    ASSERT_GE(operations(row), 2);

    // Alt+A to the list, the current cell on its R&R hours (where a double
    // click adds that operation only), then Enter: every operation comes.
    Alt('A');
    ASSERT_TRUE(items.HasFocus());
    user.ClickCell(items, row, 2);
    user.PressKey(keys::kEnter);
    ASSERT_EQ(sel.TextMatrix(1, col::kItemNo), items.TextMatrix(row, 0));
    int added = 0;
    for (int c : {col::kRRHours, col::kRAHours, col::kPTHours})
      added += !sel.TextMatrix(1, c).empty();
    EXPECT_EQ(added, operations(row));

    // Insert adds the row below; Shift+Enter is not the add key.
    user.ClickCell(items, row + 1, col::kDescription);
    user.PressKey(keys::kInsert);
    ASSERT_EQ(sel.Rows(), 3);
    EXPECT_EQ(sel.TextMatrix(2, col::kItemNo), items.TextMatrix(row + 1, 0));
    user.ClickCell(items, row + 2, col::kDescription);
    user.PressKey(keys::kEnter, forms::kShiftMask);
    EXPECT_EQ(sel.Rows(), 3);

    // The search results take Enter the same way.
    Alt('S');
    ASSERT_TRUE(f.txtSearch.HasFocus());
    user.Type("ROOF\r");
    ASSERT_TRUE(f.fgSearch.Visible());
    Alt('A');
    ASSERT_TRUE(f.fgSearch.HasFocus());
    user.PressKey(keys::kEnter);
    EXPECT_EQ(sel.Rows(), 4);
    EXPECT_EQ(sel.TextMatrix(3, col::kItemNo), f.fgSearch.TextMatrix(f.fgSearch.Row(), 0));
    Alt('C');
  });
  EXPECT_GE(Records().size(), 4u) << "the added items' operations are stored";
}

TEST_F(LabourWindowKeysTest, AccessKeysWorkButtonsAndOptionsAndReachTheLists) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    Alt('M'); // the MTA option: its schedule shows
    EXPECT_TRUE(f.optSchedule(1).Value());
    EXPECT_TRUE(f.FGLabourItems(1).Visible());
    Alt('E');
    EXPECT_TRUE(f.FGSelectedLabour.HasFocus());
    Alt('D'); // Delete: the only line empties
    EXPECT_EQ(f.FGSelectedLabour.TextMatrix(1, col::kItemNo), "");
    const forms::Control* focused = f.ActiveControl();
    Alt('B'); // Browse is off until a search: nothing happens
    Alt('Q'); // no control has Q: the key goes on to the focused control
    EXPECT_EQ(f.ActiveControl(), focused);
    Alt('H');
    ASSERT_EQ(runtime.Messages().size(), 1u);
    EXPECT_EQ(runtime.Messages()[0].title, "Labour editor keys");
    user.PressKey(keys::kF1);
    ASSERT_EQ(runtime.Messages().size(), 2u);
    EXPECT_EQ(runtime.Messages()[1].prompt, runtime.Messages()[0].prompt);
    EXPECT_NE(runtime.Messages()[0].prompt.find("Enter or Insert"), std::string::npos);
    EXPECT_NE(runtime.Messages()[0].prompt.find("Ctrl+Z"), std::string::npos);
    Alt('C');
  });
  EXPECT_TRUE(Records().empty());
}

TEST_F(LabourWindowKeysTest, ALargerWindowWidensTheDescriptionsAndKeepsTheDesignAtItsSize) {
  Open(eEdit, [&](frmLabour& f) {
    auto& sel = f.FGSelectedLabour;
    auto& items = f.FGLabourItems(0);
    const int designDesc = sel.ColWidth(col::kDescription);
    const int designHours = sel.ColWidth(col::kRRHours);
    const int itemsDesc = items.ColWidth(col::kDescription);
    const int width = f.ScaleWidth(), height = f.ScaleHeight();

    ASSERT_TRUE(user.Resize(f, width + 3000, height + 1032));
    EXPECT_EQ(sel.Width(), 10470 + 3000);
    EXPECT_EQ(sel.ColWidth(col::kDescription), designDesc + 3000);
    EXPECT_EQ(sel.ColWidth(col::kRRHours), designHours);
    EXPECT_EQ(items.ColWidth(col::kDescription), itemsDesc + 3000);
    // The height is shared as the design shares it between the two lists.
    EXPECT_EQ(items.Height(), 2925 + 585);
    EXPECT_EQ(sel.Top(), 4275 + 585);
    EXPECT_EQ(sel.Height(), 2235 + 447);
    EXPECT_EQ(f.cmdClose.Left(), 9360 + 3000);
    EXPECT_EQ(f.cmdClose.Top(), 6630 + 1032);

    // A schedule first shown in the large window fills it too.
    user.Click(f.optSchedule(2));
    auto& third = f.FGLabourItems(2);
    EXPECT_EQ(third.Width(), 10470 + 3000);
    const int thirdDesc = third.ColWidth(col::kDescription);

    // Back at the design size every control is where the design put it.
    ASSERT_TRUE(user.Resize(f, width, height));
    EXPECT_EQ(sel.ColWidth(col::kDescription), designDesc);
    EXPECT_EQ(third.ColWidth(col::kDescription), thirdDesc - 3000);
    EXPECT_EQ(sel.Top(), 4275);
    EXPECT_EQ(sel.Height(), 2235);
    EXPECT_EQ(f.cmdClose.Left(), 9360);
    // Never smaller than the design.
    ASSERT_TRUE(user.Resize(f, width - 2000, height - 2000));
    EXPECT_EQ(sel.Width(), 10470);
    EXPECT_EQ(f.cmdClose.Top(), 6630);
    user.Click(f.cmdClose);
  });
}

} // namespace
} // namespace belvane::test
