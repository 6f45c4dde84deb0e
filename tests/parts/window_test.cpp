// The parts window at the keyboard: Enter or Insert on an available part
// or a search result adds it as a double click does, Help and F1 show the
// keys, and a larger window widens the descriptions and moves the cell
// editor with its cell.

#include "forms/keys.hpp"
#include "parts_fixture.hpp"

namespace belvane::test {
namespace {

using parts::frmParts;
namespace cat = parts::col::cat;
namespace sel = parts::col::sel;
namespace keys = forms::keys;

class PartsWindowKeysTest : public PartsFixture {
protected:
  void Alt(char letter) { user.PressKey(letter, forms::kAltMask); }
};

TEST_F(PartsWindowKeysTest, EnterOrInsertAddsTheCurrentPartOnce) {
  Open(eEdit, [&](frmParts& f) {
    auto& parts = f.FGParts;
    auto& g = f.FGSelectedParts;
    Alt('A');
    ASSERT_TRUE(parts.HasFocus());
    user.ClickCell(parts, 2, cat::kUnitPrice);
    user.PressKey(keys::kEnter);
    f.FGParts.SetFocus(); // the new part's cell editor took the focus
    ASSERT_EQ(g.TextMatrix(1, sel::kPartNo), parts.TextMatrix(2, cat::kPartNo));
    const int rows = g.Rows();
    user.PressKey(keys::kInsert); // the same part again: never twice
    f.FGParts.SetFocus();
    EXPECT_EQ(g.Rows(), rows);
    user.ClickCell(parts, 3, cat::kDescription);
    user.PressKey(keys::kInsert);
    f.FGParts.SetFocus();
    EXPECT_EQ(g.Rows(), rows + 1);

    Alt('H');
    user.PressKey(keys::kF1);
    ASSERT_EQ(runtime.Messages().size(), 2u);
    EXPECT_EQ(runtime.Messages()[0].title, "Parts editor keys");
    EXPECT_EQ(runtime.Messages()[1].prompt, runtime.Messages()[0].prompt);
    Alt('C');
  });
  EXPECT_EQ(Records().size(), 2u);
}

TEST_F(PartsWindowKeysTest, ALargerWindowWidensTheDescriptionsAndTheEditorFollowsItsCell) {
  AddPart({1, "P100", "FRONT BUMPER BAR"});
  Stored();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    const int desc = g.ColWidth(sel::kDescription);
    const int price = g.ColWidth(sel::kUnitPrice);
    const int catalogueDesc = f.FGParts.ColWidth(cat::kDescription);
    user.DoubleClickCell(g, 1, sel::kUnitPrice);
    ASSERT_TRUE(f.T1.Visible());
    const int editorLeft = f.T1.Left();
    ASSERT_TRUE(user.Resize(f, f.ScaleWidth() + 1500, f.ScaleHeight() + 600));
    EXPECT_EQ(g.ColWidth(sel::kDescription), desc + 1500);
    EXPECT_EQ(g.ColWidth(sel::kUnitPrice), price);
    EXPECT_EQ(f.FGParts.ColWidth(cat::kDescription), catalogueDesc + 1500);
    // The price cell lies 1500 twips further right, and the editor on it.
    EXPECT_EQ(f.T1.Left(), editorLeft + 1500);
    EXPECT_EQ(f.T1.Top(), g.Top() + g.CellTop());
    user.Type("7\r");
    user.Click(f.cmdClose);
  });
}

} // namespace
} // namespace belvane::test
