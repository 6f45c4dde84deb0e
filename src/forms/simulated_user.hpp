#pragma once
// The simulated user: keyboard and mouse gestures made of the input paths
// of input.hpp, as a person at the desk would make them. Tests and scripted
// sessions drive the editors only through this and the component's public
// calls. Each gesture returns false when the input was refused (a hidden or
// disabled control, a form under a modal one, ...).

#include "forms/keys.hpp"

#include <string_view>

namespace belvane::forms {

class Control;
class FlexGrid;
class Form;
class ListView;
class WebBrowser;

class SimulatedUser {
public:
  // Types each character into the focused control: KeyDown, KeyPress,
  // default handling, KeyUp, with the key code and shift state of a US
  // keyboard. Tab, "\n" and "\b" press Tab, Enter and Backspace.
  bool Type(std::string_view utf8);
  // Presses and releases one key. Enter, Escape, Backspace and Space make
  // their character; letters and digits make theirs (Ctrl+letter its
  // control character).
  bool PressKey(int keyCode, int shift = 0);

  bool Click(Control& control, int button = kLeftButton, int shift = 0);
  bool DoubleClick(Control& control);
  // Clicks a cell; a cell out of view is first scrolled into view, as the
  // user would with the scroll bars.
  bool ClickCell(FlexGrid& grid, int row, int col, int button = kLeftButton, int shift = 0);
  bool DoubleClickCell(FlexGrid& grid, int row, int col);
  bool ClickItem(ListView& list, int index);
  bool DoubleClickItem(ListView& list, int index);
  // Scrolls with the scroll bars (leftCol -1 keeps the column).
  bool ScrollGrid(FlexGrid& grid, int topRow, int leftCol = -1);
  // The window's close box.
  bool Close(Form& form);
  // Drags the window's border to a client area of the given twips.
  bool Resize(Form& form, int scaleWidth, int scaleHeight);

  // Clicks on the page a web browser shows (headless, through the page host,
  // which plays the page's script: page_host.hpp). By element id or name; the
  // panel or button of a group; the page's cancel button.
  bool ClickOnPage(WebBrowser& browser, std::string_view nameOrId);
  bool PickGroupOnPage(WebBrowser& browser, std::string_view group);
  bool CancelPage(WebBrowser& browser);

private:
  bool ClickAt(Control& control, int x, int y, int button, int shift);
  bool CellPoint(FlexGrid& grid, int row, int col, int& x, int& y);
};

} // namespace belvane::forms
