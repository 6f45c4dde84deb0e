// The running totals of the selected lines: hours and amounts per
// operation, R&R at each line's own rate, report-only operations not
// charged, following what the estimator types.

#include "forms/keys.hpp"
#include "labour_fixture.hpp"
#include "text/number.hpp"

namespace belvane::test {
namespace {

using labour::frmLabour;
namespace col = labour::col;
namespace keys = forms::keys;

using TotalsTest = LabourFixture;

TEST_F(TotalsTest, TotalsFollowTheLinesAsTheyAreEdited) {
  text::ScopedNumberLocale locale{{".", ","}};
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);          // at the session rate 55
  AddRecord(2, "100", "BONNET R&I", "RA", 2.0);           // at 60
  AddRecord(3, "100", "BONNET R&I", "PAINT", 1.0, 1);     // report only: not charged
  AddRecord(4, "140", "Roof panel", "R&R", 3.0, 0, 70.0); // its own rate
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    labour::LabourTotals t = f.Totals();
    EXPECT_DOUBLE_EQ(t.hours[0], 4.5);
    EXPECT_DOUBLE_EQ(t.amounts[0], 1.5 * 55 + 3 * 70);
    EXPECT_DOUBLE_EQ(t.amounts[1], 120);
    EXPECT_DOUBLE_EQ(t.hours[2], 1);
    EXPECT_DOUBLE_EQ(t.amounts[2], 0);
    EXPECT_EQ(f.RunningTotals(), "R&R 4.50 h  292.50    Repair 2.00 h  120.00    Paint 1.00 h  "
                                 "0.00    Labour 7.50 h  412.50");

    user.ClickCell(f.FGSelectedLabour, 1, col::kRAHours);
    user.Type("3");
    EXPECT_DOUBLE_EQ(f.Totals().amounts[1], 180); // as typed, before the cell is left
    user.PressKey(keys::kEnter);
    user.ClickCell(f.FGSelectedLabour, 2, col::kItemNo);
    user.Click(f.cmdDelete);
    EXPECT_DOUBLE_EQ(f.Totals().Amount(), 1.5 * 55 + 180);
  });
}

} // namespace
} // namespace belvane::test
