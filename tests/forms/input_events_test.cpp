#include "error_number.hpp"
#include "forms/input.hpp"
#include "forms/keys.hpp"
#include "forms/simulated_user.hpp"
#include "probe_form.hpp"
#include "text/error.hpp"

#include <gtest/gtest.h>

#include <algorithm>

using namespace belvane::forms;
using belvane::forms::testing::ProbeForm;
using Log = std::vector<std::string>;

namespace {

class InputEvents : public ::testing::Test {
protected:
  void SetUp() override {
    ThreadHeadlessRuntime().Reset();
    form.Show();
    form.log.clear();
  }
  HeadlessRuntime& headless() { return ThreadHeadlessRuntime(); }

  ProbeForm form;
  SimulatedUser user;
};

using belvane::test::ErrorNumber;

} // namespace

TEST_F(InputEvents, AKeyRunsKeyDownKeyPressDefaultThenKeyUp) {
  ASSERT_TRUE(form.txtA.HasFocus());
  user.Type("a");
  EXPECT_EQ(form.log,
            (Log{"txtA_KeyDown(65)", "txtA_KeyPress(97)", "txtA_Change", "txtA_KeyUp(65)"}));
  EXPECT_EQ(form.txtA.Text(), "a");
}

TEST_F(InputEvents, KeyPressHandlerMayChangeOrSwallowTheCharacter) {
  form.txtA.OnKeyPress = [](int& ascii) {
    if (ascii >= 'a' && ascii <= 'z')
      ascii -= 32; // upper case
    else if (ascii >= '0' && ascii <= '9')
      ascii = 0; // digits refused
  };
  int changes = 0;
  form.txtA.OnChange = [&changes] { ++changes; };
  user.Type("a1b2");
  EXPECT_EQ(form.txtA.Text(), "AB");
  EXPECT_EQ(changes, 2);
}

TEST_F(InputEvents, KeyDownHandlerSettingKeyCodeZeroConsumesTheKey) {
  form.txtA.Text("abc");
  form.txtA.SelStart(3);
  form.txtA.OnKeyDown = [](int& key, int) {
    if (key == keys::kLeft || key == keys::kEnter) key = 0;
  };
  bool pressed = false;
  form.txtA.OnKeyPress = [&pressed](int&) { pressed = true; };
  user.PressKey(keys::kLeft);
  user.PressKey(keys::kEnter);
  EXPECT_EQ(form.txtA.SelStart(), 3);
  EXPECT_FALSE(pressed);
}

TEST_F(InputEvents, KeyUpGoesToTheControlThatHasTheFocusOnRelease) {
  form.txtA.OnKeyPress = [this](int& ascii) {
    if (ascii == keys::kEnter) {
      ascii = 0;
      form.txtB.SetFocus();
    }
  };
  user.PressKey(keys::kEnter);
  EXPECT_EQ(form.log,
            (Log{"txtA_KeyDown(13)", "txtA_LostFocus", "txtB_GotFocus", "txtB_KeyUp(13)"}));
}

TEST_F(InputEvents, ClickMovesTheFocusBetweenMouseDownAndClick) {
  user.Click(form.cmdOk);
  EXPECT_EQ(form.log, (Log{"cmdOk_MouseDown(1)", "txtA_LostFocus", "cmdOk_GotFocus", "cmdOk_Click",
                           "cmdOk_MouseUp(1)"}));
  form.log.clear();
  user.DoubleClick(form.cmdOk);
  EXPECT_EQ(form.log,
            (Log{"cmdOk_MouseDown(1)", "cmdOk_Click", "cmdOk_MouseUp(1)", "cmdOk_DblClick"}));
  form.log.clear();
  user.Click(form.lblInfo); // a label takes no focus
  EXPECT_EQ(form.log, (Log{"lblInfo_MouseDown(1)", "lblInfo_Click", "lblInfo_MouseUp(1)"}));
  EXPECT_TRUE(form.cmdOk.HasFocus());
}

TEST_F(InputEvents, ClickingACellFocusesTheGridThenMovesItsCurrentCell) {
  int mouseRow = -1;
  int mouseCol = -1;
  form.fgLines.OnMouseDown = [&](int, int, int, int) {
    mouseRow = form.fgLines.MouseRow();
    mouseCol = form.fgLines.MouseCol();
    form.log.push_back("fgLines_MouseDown");
  };
  user.ClickCell(form.fgLines, 3, 2);
  EXPECT_EQ(form.log,
            (Log{"fgLines_MouseDown", "txtA_LostFocus", "fgLines_GotFocus", "fgLines_LeaveCell",
                 "fgLines_EnterCell", "fgLines_Click", "fgLines_MouseUp(1)"}));
  EXPECT_EQ(mouseRow, 3);
  EXPECT_EQ(mouseCol, 2);
  EXPECT_EQ(form.fgLines.Row(), 3);
  EXPECT_EQ(form.fgLines.Col(), 2);

  form.log.clear();
  user.DoubleClickCell(form.fgLines, 3, 2); // the same cell: no cell events
  EXPECT_EQ(form.log,
            (Log{"fgLines_MouseDown", "fgLines_Click", "fgLines_MouseUp(1)", "fgLines_DblClick"}));

  form.log.clear();
  user.ClickCell(form.fgLines, 0, 1); // the header row is not entered
  EXPECT_EQ(form.fgLines.Row(), 3);
  user.ClickCell(form.fgLines, 1, 1, kRightButton); // right button: no move, no click
  EXPECT_EQ(form.fgLines.Row(), 3);
  EXPECT_EQ(form.log, (Log{"fgLines_MouseDown", "fgLines_Click", "fgLines_MouseUp(1)",
                           "fgLines_MouseDown", "fgLines_MouseUp(2)"}));
}

TEST_F(InputEvents, ClickingACellOutOfViewScrollsFirst) {
  form.fgLines.Rows(40);
  user.ClickCell(form.fgLines, 30, 0);
  EXPECT_EQ(form.fgLines.Row(), 30);
  EXPECT_TRUE(form.fgLines.IsCellVisible(30, 0));
  ASSERT_FALSE(form.log.empty());
  EXPECT_EQ(form.log.front(), "fgLines_Scroll");
}

TEST_F(InputEvents, ArrowsMoveTheGridCellUnlessKeyDownConsumesThem) {
  form.fgLines.SetFocus();
  form.log.clear();
  user.PressKey(keys::kDown);
  EXPECT_EQ(form.log, (Log{"fgLines_KeyDown(40)", "fgLines_LeaveCell", "fgLines_EnterCell",
                           "fgLines_KeyUp(40)"}));
  EXPECT_EQ(form.fgLines.Row(), 2);
  form.fgLines.OnKeyDown = [](int& key, int) { key = 0; };
  user.PressKey(keys::kDown);
  EXPECT_EQ(form.fgLines.Row(), 2);
}

TEST_F(InputEvents, SetFocusFromCodeFiresLostThenGotAndRefusesWhatCannotTakeIt) {
  form.txtB.SetFocus();
  form.txtB.SetFocus(); // already there: nothing
  EXPECT_EQ(form.log, (Log{"txtA_LostFocus", "txtB_GotFocus"}));
  form.cmdOk.Enabled(false);
  EXPECT_EQ(ErrorNumber([&] { form.cmdOk.SetFocus(); }), belvane::err::kInvalidCall);
  form.chkFlag.Visible(false);
  EXPECT_EQ(ErrorNumber([&] { form.chkFlag.SetFocus(); }), belvane::err::kInvalidCall);
  EXPECT_EQ(ErrorNumber([&] { form.lblInfo.SetFocus(); }), belvane::err::kInvalidCall);
  form.fraSearch.Enabled(false); // what a frame holds goes with it
  EXPECT_EQ(ErrorNumber([&] { form.txtInFrame.SetFocus(); }), belvane::err::kInvalidCall);
  form.Hide();
  EXPECT_EQ(ErrorNumber([&] { form.txtA.SetFocus(); }), belvane::err::kInvalidCall);
  EXPECT_TRUE(form.txtB.HasFocus());
}

TEST_F(InputEvents, DisabledOrHiddenControlsTakeNoInput) {
  form.cmdOk.Enabled(false);
  form.chkFlag.Visible(false);
  form.fraSearch.Visible(false);
  EXPECT_FALSE(user.Click(form.cmdOk));
  EXPECT_FALSE(user.Click(form.chkFlag));
  EXPECT_FALSE(user.Click(form.txtInFrame));
  EXPECT_TRUE(form.log.empty());
  EXPECT_EQ(form.chkFlag.Value(), kUnchecked);

  form.Enabled(false); // a disabled form takes none either
  EXPECT_FALSE(user.Type("x"));
  EXPECT_FALSE(user.Click(form.txtB));
  form.Enabled(true);
  EXPECT_TRUE(user.Type("x"));
}

TEST_F(InputEvents, HidingTheFocusedControlTakesTheFocusAway) {
  form.txtA.Visible(false);
  EXPECT_EQ(form.log, (Log{"txtA_LostFocus"}));
  EXPECT_EQ(form.ActiveControl(), nullptr);
  EXPECT_FALSE(user.Type("x")); // keys go nowhere
  form.txtA.Visible(true);
  EXPECT_EQ(form.ActiveControl(), nullptr);
}

TEST_F(InputEvents, TabFollowsTheTabOrderSkippingWhatCannotTakeTheFocus) {
  form.txtA.Text("abc");
  form.txtB.Text("hello");
  form.cmdOk.Enabled(false);
  user.PressKey(keys::kTab);
  EXPECT_TRUE(form.txtB.HasFocus());
  EXPECT_EQ(form.txtB.SelLength(), 5); // tabbing in selects the text
  user.PressKey(keys::kTab);
  EXPECT_TRUE(form.chkFlag.HasFocus()); // the label and the disabled button are skipped
  user.PressKey(keys::kTab, kShiftMask);
  user.PressKey(keys::kTab, kShiftMask);
  EXPECT_TRUE(form.txtA.HasFocus());
  form.lvTypes.TabIndex(-1); // first in the order now
  user.PressKey(keys::kTab, kShiftMask);
  EXPECT_TRUE(form.lvTypes.HasFocus());
}

TEST_F(InputEvents, OptionButtonsOfAGroupTurnEachOtherOff) {
  form.optKind(1).Value(true);
  EXPECT_EQ(form.log, (Log{"optKind(1)_Click"}));
  form.optInFrame.Value(true); // another container, another group
  user.Click(form.optKind(2));
  EXPECT_FALSE(form.optKind(1).Value());
  EXPECT_TRUE(form.optKind(2).Value());
  EXPECT_TRUE(form.optInFrame.Value());
  form.log.clear();
  form.optKind(2).Value(true); // already on: no event from code
  EXPECT_TRUE(form.log.empty());
  user.Click(form.optKind(2)); // the user's click still clicks
  EXPECT_EQ(form.log.at(1), "optKind(2)_Click");
  EXPECT_EQ(form.optKind(0).Index(), 0);
  EXPECT_EQ(ErrorNumber([&] { form.optKind(3); }), belvane::err::kSubscript);
}

TEST_F(InputEvents, CheckBoxValueChangesClickFromCodeClickAndSpace) {
  form.chkFlag.Value(kChecked);
  form.chkFlag.Value(kChecked);
  EXPECT_EQ(form.log, (Log{"chkFlag_Click"}));
  user.Click(form.chkFlag);
  EXPECT_EQ(form.chkFlag.Value(), kUnchecked);
  form.log.clear();
  user.PressKey(keys::kSpace);
  EXPECT_EQ(form.chkFlag.Value(), kChecked);
  EXPECT_EQ(form.log, (Log{"chkFlag_KeyDown(32)", "chkFlag_KeyPress(32)", "chkFlag_KeyUp(32)",
                           "chkFlag_Click"}));
  EXPECT_EQ(ErrorNumber([&] { form.chkFlag.Value(3); }), 380);
}

TEST_F(InputEvents, ListViewClickSelectsTheItemThenClicks) {
  user.ClickItem(form.lvTypes, 2);
  EXPECT_EQ(form.lvTypes.SelectedIndex(), 2);
  EXPECT_EQ(form.log, (Log{"lvTypes_MouseDown(1)", "txtA_LostFocus", "lvTypes_GotFocus",
                           "lvTypes_ItemClick(2)", "lvTypes_Click", "lvTypes_MouseUp(1)"}));
  user.PressKey(keys::kDown);
  user.PressKey(keys::kDown);
  EXPECT_EQ(form.lvTypes.SelectedIndex(), 3);
  EXPECT_EQ(ErrorNumber([&] { form.lvTypes.SelectItem(4); }), kIndexOutOfBounds);
}

TEST_F(InputEvents, AHandlerErrorEndsOnlyThatHandler) {
  form.txtA.OnKeyPress = [](int&) { throw belvane::Error(13, "Type mismatch"); };
  EXPECT_TRUE(user.Type("x"));
  EXPECT_EQ(form.txtA.Text(), "x"); // the default processing still ran
  ASSERT_EQ(headless().UnhandledErrors().size(), 1u);
  EXPECT_EQ(headless().UnhandledErrors()[0].where, "txtA_KeyPress");
  EXPECT_EQ(headless().UnhandledErrors()[0].number, 13);
  EXPECT_EQ(form.log.back(), "txtA_KeyUp(88)");

  // The same handler run by code passes its error to the code.
  form.cmdOk.OnClick = [] { throw belvane::Error(5, "x"); };
  form.chkFlag.OnClick = [this] { form.cmdOk.OnClick(); };
  EXPECT_EQ(ErrorNumber([&] { form.chkFlag.Value(kChecked); }), 5);
}

// ---- access keys, the form's key preview, resizing ----

TEST_F(InputEvents, AltAndAnAccessKeyWorksItsControlBeforeTheFocusedControlSeesTheKey) {
  form.cmdOk.Caption("&Ok");   // marked in the caption
  form.chkFlag.AccessKey('f'); // given by the form, any case
  form.optKind(2).Caption("Kind &3");
  form.lblInfo.Caption("&Info && more");
  EXPECT_EQ(form.cmdOk.AccessKey(), U'O');
  EXPECT_EQ(form.chkFlag.AccessKey(), U'F');
  EXPECT_EQ(form.lblInfo.AccessKey(), U'I');
  form.log.clear();

  user.PressKey('O', kAltMask);
  EXPECT_TRUE(form.cmdOk.HasFocus());
  EXPECT_EQ(std::count(form.log.begin(), form.log.end(), "cmdOk_Click"), 1);
  EXPECT_EQ(std::count(form.log.begin(), form.log.end(), "txtA_KeyDown(79)"), 0);
  user.PressKey('F', kAltMask);
  EXPECT_EQ(form.chkFlag.Value(), kChecked);
  user.PressKey('3', kAltMask);
  EXPECT_TRUE(form.optKind(2).Value());
  // A label passes the focus on to the next control in the tab order.
  user.PressKey('I', kAltMask);
  EXPECT_TRUE(form.cmdOk.HasFocus());

  // A disabled control's key, or a key no control has, goes to the focused
  // control, and Alt types nothing.
  form.txtA.SetFocus();
  form.chkFlag.Enabled(false);
  form.log.clear();
  user.PressKey('F', kAltMask);
  user.PressKey('Z', kAltMask);
  EXPECT_EQ(form.chkFlag.Value(), kChecked);
  EXPECT_EQ(form.log,
            (Log{"txtA_KeyDown(70)", "txtA_KeyUp(70)", "txtA_KeyDown(90)", "txtA_KeyUp(90)"}));
  EXPECT_EQ(form.txtA.Text(), "");
  EXPECT_THROW(form.cmdOk.AccessKey(U'-'), belvane::Error);
}

namespace {

class WatchingForm : public ProbeForm {
public:
  int resized = 0;
  std::vector<int> previewed;

protected:
  void Form_KeyDown(int& keyCode, int) override {
    previewed.push_back(keyCode);
    if (keyCode == keys::kF1) keyCode = 0;
  }
  void Form_Resize() override { ++resized; }
};

} // namespace

TEST(FormHooks, KeyPreviewSeesKeysFirstAndResizeOnlyReachesASizableLoadedForm) {
  ThreadHeadlessRuntime().Reset();
  WatchingForm form;
  SimulatedUser user;
  EXPECT_FALSE(user.Resize(form, 6000, 4000)); // not loaded
  form.Show();
  user.PressKey(keys::kF1);
  EXPECT_TRUE(form.previewed.empty()) << "KeyPreview is off";

  form.KeyPreview(true);
  form.log.clear();
  user.PressKey(keys::kF1); // consumed by the form
  user.Type("x");           // seen by the form, then typed
  EXPECT_EQ(form.previewed, (std::vector<int>{keys::kF1, 'X'}));
  EXPECT_EQ(form.txtA.Text(), "x");

  EXPECT_FALSE(user.Resize(form, 6000, 4000)); // not sizable
  EXPECT_EQ(form.resized, 0);
  form.Sizable(true);
  ASSERT_TRUE(user.Resize(form, 6000, 4000));
  EXPECT_EQ(form.resized, 1);
  EXPECT_EQ(form.ScaleWidth(), 6000);
  EXPECT_EQ(form.ScaleHeight(), 4000);
  form.Unload();
  EXPECT_TRUE(form.Sizable()) << "part of the form's make";
}
