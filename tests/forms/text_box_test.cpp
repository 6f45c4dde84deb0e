#include "forms/keys.hpp"
#include "forms/simulated_user.hpp"
#include "probe_form.hpp"

#include <gtest/gtest.h>

using namespace belvane::forms;
using belvane::forms::testing::ProbeForm;

namespace {
class TextBoxEditing : public ::testing::Test {
protected:
  void SetUp() override {
    ThreadHeadlessRuntime().Reset();
    form.Show();
  }
  TextBox& box() { return form.txtA; }
  ProbeForm form;
  SimulatedUser user;
};
} // namespace

TEST_F(TextBoxEditing, TypingReplacesTheSelectionAndMovesTheCaret) {
  box().Text("hello");
  box().SelStart(1);
  box().SelLength(3);
  EXPECT_EQ(box().SelText(), "ell");
  user.Type("XY");
  EXPECT_EQ(box().Text(), "hXYo");
  EXPECT_EQ(box().SelStart(), 3);
  EXPECT_EQ(box().SelLength(), 0);
}

TEST_F(TextBoxEditing, BackspaceAndDeleteRemoveOneCharacterOrTheSelection) {
  box().Text("12345");
  box().SelStart(2);
  user.PressKey(keys::kBack);
  EXPECT_EQ(box().Text(), "1345");
  user.PressKey(keys::kDelete);
  EXPECT_EQ(box().Text(), "145");
  box().SelStart(0);
  box().SelLength(2);
  user.PressKey(keys::kBack);
  EXPECT_EQ(box().Text(), "5");
  user.PressKey(keys::kBack); // at the start: nothing
  EXPECT_EQ(box().Text(), "5");
}

TEST_F(TextBoxEditing, ArrowsHomeEndAndShiftSelect) {
  box().Text("abcdef");
  user.PressKey(keys::kEnd);
  EXPECT_EQ(box().SelStart(), 6);
  user.PressKey(keys::kLeft, kShiftMask);
  user.PressKey(keys::kLeft, kShiftMask);
  EXPECT_EQ(box().SelStart(), 4);
  EXPECT_EQ(box().SelLength(), 2);
  user.PressKey(keys::kLeft); // collapses to the selection's start
  EXPECT_EQ(box().SelStart(), 4);
  EXPECT_EQ(box().SelLength(), 0);
  user.PressKey(keys::kHome, kShiftMask);
  EXPECT_EQ(box().SelText(), "abcd");
  user.PressKey(keys::kRight);
  EXPECT_EQ(box().SelStart(), 4);
  user.PressKey(keys::kRight);
  user.PressKey(keys::kRight);
  user.PressKey(keys::kRight);
  EXPECT_EQ(box().SelStart(), 6);
}

TEST_F(TextBoxEditing, MaxLengthLimitsTypingButNotCode) {
  box().MaxLength(3);
  user.Type("abcd");
  EXPECT_EQ(box().Text(), "abc");
  box().SelStart(1);
  box().SelLength(1);
  user.Type("Z"); // replacing keeps the length
  EXPECT_EQ(box().Text(), "aZc");
  box().Text("longer than three");
  EXPECT_EQ(box().Text(), "longer than three");
}

TEST_F(TextBoxEditing, PositionsCountCharactersOfUtf8Text) {
  box().Text("£5é");
  EXPECT_EQ(box().Length(), 3);
  box().SelStart(10);
  EXPECT_EQ(box().SelStart(), 3);
  user.PressKey(keys::kLeft);
  user.PressKey(keys::kBack); // removes "5"
  EXPECT_EQ(box().Text(), "£é");
  user.Type("€");
  EXPECT_EQ(box().Text(), "£€é");
  box().SelStart(0);
  box().SelLength(1);
  EXPECT_EQ(box().SelText(), "£");
}

TEST_F(TextBoxEditing, SettingTextFiresChangeOnlyWhenItDiffersAndResetsTheCaret) {
  int changes = 0;
  box().OnChange = [&changes] { ++changes; };
  box().Text("abc");
  box().SelStart(3);
  box().Text("abc");
  EXPECT_EQ(changes, 1);
  EXPECT_EQ(box().SelStart(), 3);
  box().Text("xyz");
  EXPECT_EQ(changes, 2);
  EXPECT_EQ(box().SelStart(), 0);
  user.PressKey(keys::kEnter); // a single-line box types nothing for Enter
  user.PressKey(keys::kEscape);
  EXPECT_EQ(box().Text(), "xyz");
  box().Locked(true);
  user.Type("q");
  EXPECT_EQ(box().Text(), "xyz");
}
