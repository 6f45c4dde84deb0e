// Taking back deletions of parts: Ctrl+Z puts the part back where it stood
// with its texts and id, so the write-back keeps its record; Ctrl+Y deletes
// it again.

#include "parts_fixture.hpp"

namespace belvane::test {
namespace {

using parts::frmParts;
namespace sel = parts::col::sel;

using PartsUndoTest = PartsFixture;

TEST_F(PartsUndoTest, ADeletedPartComesBackAndIsKept) {
  AddPart({1, "P100", "FRONT BUMPER BAR"});
  AddPart({2, "P140", "HEADLAMP", "O", "U"});
  Stored();
  const std::vector<std::string> before = Records();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    const std::string headlamp = RowText(g, 2);
    user.ClickCell(g, 2, sel::kItemNo);
    user.Click(f.cmdDelete);
    ASSERT_EQ(g.Rows(), 2);
    EXPECT_EQ(f.DeletedItems()->RecordCount(), 1);
    user.PressKey('Z', forms::kCtrlMask);
    ASSERT_EQ(g.Rows(), 3);
    EXPECT_EQ(RowText(g, 2), headlamp);
    EXPECT_EQ(g.CellStyleAt(2, sel::kReport).fontName, parts::kFlagFont);
    EXPECT_EQ(f.DeletedItems()->RecordCount(), 0);
    user.PressKey('Y', forms::kCtrlMask); // deleted again
    EXPECT_EQ(g.Rows(), 2);
    user.PressKey('Z', forms::kCtrlMask);
    EXPECT_EQ(g.Rows(), 3);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records(), before);
  for (size_t i = 0; i < quote->StoredCount(); ++i)
    EXPECT_NE(quote->StoredStatus(i), data::RecordStatus::Deleted);
}

} // namespace
} // namespace belvane::test

namespace belvane::test {
namespace {

TEST_F(PartsUndoTest, RunningTotalsFollowPricesAndLeaveReportOnlyPartsOut) {
  AddPart({1, "P100", "FRONT BUMPER BAR"}); // 1 at 100.00, 130.000 with markup
  Stored();
  Open(eEdit, [&](frmParts& f) {
    EXPECT_DOUBLE_EQ(f.Totals().cost, 100);
    EXPECT_DOUBLE_EQ(f.Totals().sell, 130);
    EXPECT_EQ(f.RunningTotals(), "Parts at cost 100.00    With markup 130.00    Margin 30.00");
    user.ClickCell(f.FGSelectedParts, 1, sel::kQty);
    user.Type("3");
    EXPECT_DOUBLE_EQ(f.Totals().Margin(), 90); // as typed
    user.PressKey(forms::keys::kEnter);
    user.ClickCell(f.FGSelectedParts, 1, sel::kReport);
    user.PressKey(forms::keys::kSpace); // report only: not charged
    EXPECT_DOUBLE_EQ(f.Totals().sell, 0);
    runtime.QueueAnswer(forms::msgbox::kNo);
  });
}

} // namespace
} // namespace belvane::test
