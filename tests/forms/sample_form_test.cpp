// A small editor written the way the component's editors are: a form class
// with its controls as members, the design in Design(), handlers named
// control_Event connected in the constructor, and a test that drives it
// only through a modal show and the simulated user.

#include "editor/cell_editor.hpp"
#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"
#include "forms/simulated_user.hpp"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace belvane::forms;
namespace grid = belvane::grid;

namespace {

class frmSample : public Form {
public:
  FlexGrid fgLines{*this, "fgLines"};
  TextBox T1{*this, "T1"}; // the in-cell editor
  CommandButton cmdClose{*this, "cmdClose"};

  // What Close wrote back, one tab-separated text per line.
  std::vector<std::string> written;

  frmSample() : Form("frmSample") {
    fgLines.OnEnterCell = [this] { fgLines_EnterCell(); };
    fgLines.OnLeaveCell = [this] { fgLines_LeaveCell(); };
    fgLines.OnKeyPress = [this](int& keyAscii) { fgLines_KeyPress(keyAscii); };
    fgLines.OnDblClick = [this] { OpenCellEditor(true); };
    T1.OnChange = [this] { fgLines.Text(T1.Text()); };
    T1.OnKeyDown = [this](int& keyCode, int shift) { T1_KeyDown(keyCode, shift); };
    T1.OnKeyPress = [this](int& keyAscii) { T1_KeyPress(keyAscii); };
    cmdClose.OnGotFocus = [this] { T1.Visible(false); };
    cmdClose.OnClick = [this] { cmdClose_Click(); };
  }

protected:
  void Design() override {
    Caption("Sample lines");
    ScaleWidth(6000);
    ScaleHeight(3000);
    fgLines.Move(120, 120, 5000, 2000);
    fgLines.Cols(3);
    const char* titles[] = {"Item No", "Description", "Hours"};
    const int widths[] = {800, 2800, 1000};
    for (int c = 0; c < 3; ++c) {
      fgLines.ColWidth(c, widths[c]);
      fgLines.TextMatrix(0, c, titles[c]);
      fgLines.Row(0);
      fgLines.Col(c);
      fgLines.CellFontBold(true);
    }
    fgLines.ColAlignment(2, grid::kAlignRightCenter);
    T1.Visible(false);
    cmdClose.Caption("Close");
    cmdClose.Move(4800, 2400, 1000, 375);
  }

  void Form_Load() override {
    fgLines.Rows(1);
    fgLines.AddItem("101\tFront bumper\t1.50");
    fgLines.AddItem("102\tBonnet\t");
    fgLines.SetCurrentCell(1, 1);
  }

private:
  void OpenCellEditor(bool selectAll) {
    if (fgLines.Row() < 1) return;
    belvane::editor::PlaceOverCurrentCell(T1, fgLines);
    T1.Text(fgLines.Text());
    T1.Visible(true);
    belvane::editor::PlaceCaret(T1, selectAll);
    T1.SetFocus();
  }

  void fgLines_EnterCell() {
    if (!Visible()) return;
    T1.Visible(false);
    fgLines.Tag(fgLines.Text());
    if (fgLines.Row() >= 1) fgLines.CellBackColor(grid::kYellow);
    fgLines.SetFocus();
  }

  void fgLines_LeaveCell() {
    if (fgLines.Row() >= 1) fgLines.CellBackColor(grid::kWhite);
  }

  void fgLines_KeyPress(int& keyAscii) {
    if (keyAscii == keys::kEnter) {
      if (fgLines.Col() < fgLines.Cols() - 1) fgLines.Col(fgLines.Col() + 1);
      return;
    }
    if (keyAscii < 32) return;
    fgLines.Text(std::string(1, static_cast<char>(keyAscii)));
    OpenCellEditor(false);
  }

  void T1_KeyDown(int& keyCode, int) {
    if (keyCode == keys::kEscape) {
      T1.Text(fgLines.Tag());
      T1.SelStart(T1.Length());
    }
  }

  void T1_KeyPress(int& keyAscii) {
    if (keyAscii == keys::kEnter) {
      keyAscii = 0;
      T1.Visible(false);
      fgLines.SetFocus();
      if (fgLines.Col() < fgLines.Cols() - 1) fgLines.Col(fgLines.Col() + 1);
    } else if (fgLines.Col() == 2 && keyAscii != keys::kBack &&
               !(keyAscii >= '0' && keyAscii <= '9') && keyAscii != '.') {
      keyAscii = 0; // hours take digits and the point only
    }
  }

  void cmdClose_Click() {
    written.clear();
    for (int r = 1; r < fgLines.Rows(); ++r)
      written.push_back(fgLines.TextMatrix(r, 0) + "\t" + fgLines.TextMatrix(r, 1) + "\t" +
                        fgLines.TextMatrix(r, 2));
    Unload();
  }
};

} // namespace

TEST(SampleForm, AnEditorSessionDrivenByTheSimulatedUser) {
  HeadlessRuntime& headless = ThreadHeadlessRuntime();
  headless.Reset();
  frmSample form;
  SimulatedUser user;

  headless.QueueModal([&](Form&) {
    // Loaded and shown: the first line's description is current.
    EXPECT_EQ(form.fgLines.Rows(), 3);
    EXPECT_TRUE(form.fgLines.HasFocus());

    // Double-click the hours of line 2: the editor lies over the cell.
    user.DoubleClickCell(form.fgLines, 2, 2);
    ASSERT_TRUE(form.T1.HasFocus());
    EXPECT_EQ(form.T1.Left(), form.fgLines.Left() + 800 + 2800);
    EXPECT_EQ(form.T1.Top(), form.fgLines.Top() + 2 * 240);
    EXPECT_EQ(form.fgLines.CellBackColor(), grid::kYellow);
    user.Type("2x.5"); // x is refused
    EXPECT_EQ(form.fgLines.TextMatrix(2, 2), "2.5");
    user.PressKey(keys::kEscape); // back to the text on entry, editor open
    EXPECT_EQ(form.fgLines.TextMatrix(2, 2), "");
    user.Type("3\n");
    EXPECT_FALSE(form.T1.Visible());
    EXPECT_TRUE(form.fgLines.HasFocus());

    // Typing on the grid starts the editor with that character.
    user.ClickCell(form.fgLines, 1, 1);
    user.Type("Rear bumper\n");
    EXPECT_EQ(form.fgLines.TextMatrix(1, 1), "Rear bumper");
    EXPECT_EQ(form.fgLines.Col(), 2);
    form.fgLines.Col(1); // the cell left lost its highlight, the new one has it
    EXPECT_EQ(form.fgLines.CellStyleAt(1, 2).backColor, grid::kWhite);
    EXPECT_EQ(form.fgLines.CellBackColor(), grid::kYellow);

    user.Click(form.cmdClose);
  });
  form.Show(ShowStyle::Modal);

  EXPECT_EQ(form.written, (std::vector<std::string>{"101\tRear bumper\t1.50", "102\tBonnet\t3"}));
  EXPECT_FALSE(form.Loaded());
  EXPECT_TRUE(headless.UnhandledErrors().empty());
}
