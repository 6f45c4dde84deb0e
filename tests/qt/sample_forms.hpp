#pragma once
// Forms written the way the component's editors are, for driving the Qt
// views with real input: a lines editor (a grid with an in-cell editor,
// flag cells drawn as boxes, a note box, a check box and a Close button)
// and a small status box.

#include "editor/cell_editor.hpp"
#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"

#include <string>
#include <vector>

namespace belvane::qt::testing {

namespace forms = belvane::forms;
namespace grid = belvane::grid;
namespace keys = belvane::forms::keys;

inline constexpr const char* kTicked = "R";
inline constexpr const char* kEmpty = "\xC2\xA3";

class frmLines : public forms::Form {
public:
  static constexpr int kColItem = 0;
  static constexpr int kColDescription = 1;
  static constexpr int kColHours = 2;
  static constexpr int kColFlag = 3;

  forms::FlexGrid fgLines{*this, "fgLines"};
  forms::TextBox T1{*this, "T1"};
  forms::TextBox txtNote{*this, "txtNote"};
  forms::Label lblNote{*this, "lblNote"};
  forms::CheckBox chkAuto{*this, "chkAuto"};
  forms::CommandButton cmdClose{*this, "cmdClose"};
  forms::Label lblLoading{*this, "lblLoading"}; // beneath the grid

  int lineCount = 30;
  std::vector<std::string> written; // what Close wrote back
  std::vector<std::string> events;  // grid events, in order

  frmLines() : Form("frmLines") {
    fgLines.OnEnterCell = [this] { fgLines_EnterCell(); };
    fgLines.OnLeaveCell = [this] { fgLines_LeaveCell(); };
    fgLines.OnScroll = [this] { events.push_back("Scroll"); };
    fgLines.OnKeyPress = [this](int& keyAscii) { fgLines_KeyPress(keyAscii); };
    fgLines.OnDblClick = [this] { fgLines_DblClick(); };
    fgLines.OnGotFocus = [this] { PaintCurrent(grid::kYellow); };
    fgLines.OnLostFocus = [this] { PaintCurrent(grid::kWhite); };
    T1.OnChange = [this] { fgLines.Text(T1.Text()); };
    T1.OnKeyDown = [this](int& keyCode, int shift) { T1_KeyDown(keyCode, shift); };
    T1.OnKeyPress = [this](int& keyAscii) { T1_KeyPress(keyAscii); };
    txtNote.OnGotFocus = [this] { txtNote.BackColor(grid::kYellow); };
    txtNote.OnLostFocus = [this] { txtNote.BackColor(grid::kCyan); };
    cmdClose.OnClick = [this] { cmdClose_Click(); };
  }

  void OpenCellEditor(bool selectAll) {
    if (fgLines.Row() < 1 || fgLines.Col() == kColFlag || fgLines.Col() == kColItem) return;
    editor::PlaceOverCurrentCell(T1, fgLines);
    T1.Text(fgLines.Text());
    T1.Visible(true);
    T1.ZOrder(0);
    editor::PlaceCaret(T1, selectAll);
    T1.SetFocus();
  }

protected:
  void Design() override {
    Caption("Lines");
    ScaleWidth(7200);
    ScaleHeight(4200);
    fgLines.Move(120, 120, 6000, 9 * 240);
    fgLines.Cols(4);
    const char* titles[] = {"Item No", "Description", "Hours", "Flag"};
    const int widths[] = {800, 2800, 1000, 600};
    const int aligns[] = {grid::kAlignCenterCenter, grid::kAlignLeftCenter, grid::kAlignRightCenter,
                          grid::kAlignCenterCenter};
    for (int c = 0; c < 4; ++c) {
      fgLines.ColWidth(c, widths[c]);
      fgLines.ColAlignment(c, aligns[c]);
      fgLines.TextMatrix(0, c, titles[c]);
      fgLines.Row(0);
      fgLines.Col(c);
      fgLines.CellFontBold(true);
    }
    T1.Visible(false);
    lblNote.Caption("&Note:");
    lblNote.Move(120, 2520, 600, 255);
    txtNote.Move(720, 2460, 3000, 315);
    txtNote.BackColor(grid::kCyan);
    chkAuto.Caption("Auto Return to Col. 1");
    chkAuto.Move(120, 2950, 2400, 255);
    cmdClose.Caption("Close");
    cmdClose.Move(5900, 3600, 1095, 375);
    lblLoading.Caption("L O A D I N G . . .");
    lblLoading.Move(2000, 1000, 2400, 255);
  }

  void Form_Load() override {
    fgLines.Rows(1);
    for (int i = 1; i <= lineCount; ++i) {
      const std::string flag = i % 2 ? kTicked : kEmpty;
      fgLines.AddItem(std::to_string(100 + i) + "\tPanel " + std::to_string(i) + "\t" +
                      std::to_string(i % 4) + ".50\t" + flag);
      fgLines.Row(i);
      fgLines.Col(kColFlag);
      fgLines.CellFontName("Wingdings 2");
      fgLines.CellFontSize(12);
    }
    fgLines.Row(2);
    fgLines.Col(kColDescription);
    fgLines.CellFontItalic(true);
    fgLines.CellBackColor(grid::kGrey);
    fgLines.SetCurrentCell(1, kColDescription);
  }

private:
  void PaintCurrent(grid::Color color) {
    if (fgLines.Row() >= 1 && fgLines.Row() != 2) fgLines.CellBackColor(color);
  }

  void fgLines_EnterCell() {
    events.push_back("EnterCell(" + std::to_string(fgLines.Row()) + "," +
                     std::to_string(fgLines.Col()) + ")");
    if (!Visible()) return;
    T1.Visible(false);
    fgLines.Tag(fgLines.Text());
    if (fgLines.HasFocus()) PaintCurrent(grid::kYellow);
    fgLines.ToolTipText(fgLines.Col() == kColFlag ? (fgLines.Text() == kTicked ? "Yes" : "No")
                                                  : std::string());
    if (fgLines.CanTakeFocus()) fgLines.SetFocus();
  }

  void fgLines_LeaveCell() {
    events.push_back("LeaveCell(" + std::to_string(fgLines.Row()) + "," +
                     std::to_string(fgLines.Col()) + ")");
    PaintCurrent(grid::kWhite);
  }

  void ToggleFlag() {
    fgLines.Text(fgLines.Text() == kTicked ? kEmpty : kTicked);
    fgLines.ToolTipText(fgLines.Text() == kTicked ? "Yes" : "No");
  }

  void fgLines_KeyPress(int& keyAscii) {
    if (keyAscii == keys::kEnter) {
      if (fgLines.Col() < fgLines.Cols() - 1) fgLines.Col(fgLines.Col() + 1);
      return;
    }
    if (fgLines.Col() == kColFlag) {
      if (keyAscii == keys::kSpace) ToggleFlag();
      return;
    }
    if (keyAscii < 32) return;
    if (fgLines.Col() != kColDescription && fgLines.Col() != kColHours) return;
    fgLines.Text(std::string(1, static_cast<char>(keyAscii)));
    OpenCellEditor(false);
  }

  void fgLines_DblClick() {
    if (fgLines.Col() == kColFlag)
      ToggleFlag();
    else
      OpenCellEditor(true);
  }

  void CloseEditor(int step) {
    T1.Visible(false);
    fgLines.SetFocus();
    const int col = fgLines.Col() + step;
    if (col >= 0 && col < fgLines.Cols()) fgLines.Col(col);
  }

  void T1_KeyDown(int& keyCode, int shift) {
    if (keyCode == keys::kEscape) {
      T1.Text(fgLines.Tag());
      T1.SelStart(T1.Length());
    } else if (keyCode == keys::kLeft && shift == 0 && T1.SelStart() == 0 && T1.SelLength() == 0) {
      keyCode = 0;
      CloseEditor(-1);
    } else if (keyCode == keys::kRight && shift == 0 && T1.SelStart() == T1.Length()) {
      keyCode = 0;
      CloseEditor(+1);
    }
  }

  void T1_KeyPress(int& keyAscii) {
    if (keyAscii == keys::kEnter) {
      keyAscii = 0;
      CloseEditor(+1);
    } else if (fgLines.Col() == kColHours && keyAscii != keys::kBack &&
               !(keyAscii >= '0' && keyAscii <= '9') && keyAscii != '.') {
      keyAscii = 0; // hours take digits and the point only
    }
  }

  void cmdClose_Click() {
    written.clear();
    for (int r = 1; r < fgLines.Rows(); ++r)
      written.push_back(fgLines.TextMatrix(r, 0) + "\t" + fgLines.TextMatrix(r, 1) + "\t" +
                        fgLines.TextMatrix(r, 2) + "\t" +
                        (fgLines.TextMatrix(r, 3) == kTicked ? "Yes" : "No"));
    Unload();
  }
};

// A status box: a frame with a label, shown modeless while something loads.
class frmBusy : public forms::Form {
public:
  forms::Frame frStatus{*this, "frStatus"};
  forms::Label lblMsg{*this, "lblMsg"};

  frmBusy() : Form("frmBusy") {}

  void ShowStatusBox(const std::string& message) {
    forms::Screen.MousePointer(forms::kPointerHourglass);
    Load();
    if (!Visible()) {
      lblMsg.Caption(message);
      Show();
      ZOrder(0);
      forms::DoEvents();
    }
  }

protected:
  void Design() override {
    Caption("Please wait");
    ScaleWidth(3975);
    ScaleHeight(945);
    FontSize(9.75);
    lblMsg.Container(&frStatus);
    frStatus.Move(120, 0, 3735, 855);
    lblMsg.Move(120, 360, 3495, 255);
  }
  void Form_Unload(int&) override { forms::Screen.MousePointer(forms::kPointerDefault); }
};

} // namespace belvane::qt::testing
