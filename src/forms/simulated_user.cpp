#include "forms/simulated_user.hpp"

#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/input.hpp"
#include "forms/page_host.hpp"
#include "forms/utf8.hpp"

#include <algorithm>
#include <string_view>

namespace belvane::forms {

namespace {

struct KeyStroke {
  int keyCode;
  int shift;
};

// The key of a US keyboard that makes a character.
KeyStroke KeyFor(char32_t c) {
  if (c >= 'a' && c <= 'z') return {static_cast<int>(c - 'a' + 'A'), 0};
  if (c >= 'A' && c <= 'Z') return {static_cast<int>(c), kShiftMask};
  if (c >= '0' && c <= '9') return {static_cast<int>(c), 0};
  constexpr std::string_view kPlain = " -=[]\\;',./`";
  constexpr int kPlainKeys[] = {32, 189, 187, 219, 221, 220, 186, 222, 188, 190, 191, 192};
  constexpr std::string_view kShifted = ")!@#$%^&*(_+{}|:\"<>?~";
  constexpr int kShiftedKeys[] = {'0', '1', '2', '3', '4', '5', '6', '7', '8', '9', 189,
                                  187, 219, 221, 220, 186, 222, 188, 190, 191, 192};
  if (c < 128) {
    const char ch = static_cast<char>(c);
    if (auto i = kPlain.find(ch); i != std::string_view::npos) return {kPlainKeys[i], 0};
    if (auto i = kShifted.find(ch); i != std::string_view::npos)
      return {kShiftedKeys[i], kShiftMask};
  }
  return {keys::kPacket, 0};
}

// The character a key makes, if any.
char32_t CharacterOf(int keyCode, int shift) {
  const bool ctrl = (shift & kCtrlMask) != 0;
  if ((shift & kAltMask) != 0) return 0; // Alt combinations type nothing
  switch (keyCode) {
  case keys::kEnter:
  case keys::kEscape:
  case keys::kBack:
  case keys::kSpace:
    return static_cast<char32_t>(keyCode);
  default:
    break;
  }
  if (keyCode >= 'A' && keyCode <= 'Z') {
    if (ctrl) return static_cast<char32_t>(keyCode - 'A' + 1);
    return static_cast<char32_t>((shift & kShiftMask) ? keyCode : keyCode - 'A' + 'a');
  }
  if (keyCode >= '0' && keyCode <= '9' && !ctrl && !(shift & kShiftMask))
    return static_cast<char32_t>(keyCode);
  return 0;
}

} // namespace

bool SimulatedUser::PressKey(int keyCode, int shift) {
  if (!Input::KeyDown(keyCode, shift, CharacterOf(keyCode, shift))) return false;
  Input::KeyUp(keyCode, shift);
  return true;
}

bool SimulatedUser::Type(std::string_view text) {
  std::size_t pos = 0;
  while (pos < text.size()) {
    const char32_t c = utf8::Next(text, pos);
    bool delivered = false;
    if (c == '\t')
      delivered = PressKey(keys::kTab);
    else if (c == '\n' || c == '\r')
      delivered = PressKey(keys::kEnter);
    else if (c == '\b')
      delivered = PressKey(keys::kBack);
    else {
      const KeyStroke key = KeyFor(c);
      delivered = Input::KeyDown(key.keyCode, key.shift, c);
      if (delivered) Input::KeyUp(key.keyCode, key.shift);
    }
    if (!delivered) return false;
  }
  return true;
}

bool SimulatedUser::ClickAt(Control& control, int x, int y, int button, int shift) {
  if (!Input::MouseDown(control, button, shift, x, y)) return false;
  Input::MouseUp(control, button, shift, x, y);
  return true;
}

bool SimulatedUser::Click(Control& control, int button, int shift) {
  const auto& model = control.Model();
  return ClickAt(control, model.Width() / 2, model.Height() / 2, button, shift);
}

bool SimulatedUser::DoubleClick(Control& control) {
  const auto& model = control.Model();
  const int x = model.Width() / 2;
  const int y = model.Height() / 2;
  if (!ClickAt(control, x, y, kLeftButton, 0)) return false;
  return Input::DoubleClick(control, kLeftButton, 0, x, y);
}

bool SimulatedUser::CellPoint(FlexGrid& grid, int row, int col, int& x, int& y) {
  if (!Input::Accepts(grid)) return false;
  grid.TextView(row, col); // raises for a cell out of range
  if (!grid.IsCellVisible(row, col) && !Input::ScrollIntoView(grid, row, col)) return false;
  x = std::min(grid.ColPos(col) + grid.ColWidth(col) / 2, grid.Width() - 1);
  y = std::min(grid.RowPos(row) + grid.RowHeight(row) / 2, grid.Height() - 1);
  return true;
}

bool SimulatedUser::ClickCell(FlexGrid& grid, int row, int col, int button, int shift) {
  int x = 0;
  int y = 0;
  return CellPoint(grid, row, col, x, y) && ClickAt(grid, x, y, button, shift);
}

bool SimulatedUser::DoubleClickCell(FlexGrid& grid, int row, int col) {
  int x = 0;
  int y = 0;
  if (!CellPoint(grid, row, col, x, y) || !ClickAt(grid, x, y, kLeftButton, 0)) return false;
  return Input::DoubleClick(grid, kLeftButton, 0, x, y);
}

bool SimulatedUser::ClickItem(ListView& list, int index) {
  return ClickAt(list, list.Width() / 2, list.ItemTop(index) + ListView::kItemHeight / 2,
                 kLeftButton, 0);
}

bool SimulatedUser::DoubleClickItem(ListView& list, int index) {
  const int x = list.Width() / 2;
  const int y = list.ItemTop(index) + ListView::kItemHeight / 2;
  if (!ClickAt(list, x, y, kLeftButton, 0)) return false;
  return Input::DoubleClick(list, kLeftButton, 0, x, y);
}

bool SimulatedUser::ScrollGrid(FlexGrid& grid, int topRow, int leftCol) {
  return Input::Scroll(grid, topRow, leftCol < 0 ? grid.LeftCol() : leftCol);
}

bool SimulatedUser::Resize(Form& form, int scaleWidth, int scaleHeight) {
  return Input::Resize(form, scaleWidth, scaleHeight);
}

bool SimulatedUser::Close(Form& form) { return Input::CloseBox(form); }

bool SimulatedUser::ClickOnPage(WebBrowser& browser, std::string_view nameOrId) {
  return PageHost::Click(browser, nameOrId);
}

bool SimulatedUser::PickGroupOnPage(WebBrowser& browser, std::string_view group) {
  return PageHost::PickGroup(browser, group);
}

bool SimulatedUser::CancelPage(WebBrowser& browser) { return PageHost::Cancel(browser); }

} // namespace belvane::forms
