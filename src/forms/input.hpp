#pragma once
// The input paths. Every key and click reaches the forms through here: the
// SimulatedUser of tests and scripted sessions, and the desktop views,
// which forward real input. The event order is the contract of the forms:
//
//   key:    KeyDown(KeyCode, Shift) on the focused control; unless the
//           handler set KeyCode to 0: the control's default key handling,
//           then, for a key that makes a character, KeyPress(KeyAscii) and,
//           unless KeyAscii became 0, the default character handling (a
//           text box types it). KeyUp goes to whichever control has the
//           focus when the key is released. Tab moves the focus instead.
//   mouse:  MouseDown, the focus moves to the control (LostFocus, GotFocus),
//           the control's own reaction (a grid moves its current cell to the
//           cell clicked: LeaveCell, EnterCell); on release Click (left
//           button, released on the control it went down on), MouseUp.
//           DoubleClick raises DblClick after the click of its first press.
//   access: Alt and a control's access key (Control::AccessKey) on the
//           active form, before the focused control sees the key: a button
//           takes the focus and clicks, a check box toggles, an option
//           button turns on; a label or frame gives the focus to the next
//           control in the tab order that takes it.
//
// Input is refused (the call returns false) for a control that is hidden or
// disabled, or in a frame that is, and for a form that is not shown, is
// disabled or lies under a modal form. An error raised by a handler that
// input ran ends that handler only: it goes to the runtime's
// UnhandledError and the input goes on.

namespace belvane::forms {

class Control;
class Form;
class FlexGrid;

class Input {
public:
  // To the focused control of the active form. `character` is the Unicode
  // character the key makes (0 for none).
  static bool KeyDown(int keyCode, int shift, char32_t character = 0);
  static bool KeyUp(int keyCode, int shift);
  // x and y in twips inside the control.
  static bool MouseDown(Control& control, int button, int shift, int x, int y);
  static bool MouseUp(Control& control, int button, int shift, int x, int y);
  static bool DoubleClick(Control& control, int button, int shift, int x, int y);
  // The user scrolls a grid (the grid's scroll bars).
  static bool Scroll(FlexGrid& grid, int topRow, int leftCol);
  // The user scrolls just far enough to see a cell.
  static bool ScrollIntoView(FlexGrid& grid, int row, int col);
  // The window's close box.
  static bool CloseBox(Form& form);
  // The user resized a sizable window to a client area of the given twips:
  // the form takes the size, then Form_Resize runs. Refused for a form that
  // is not loaded or not sizable.
  static bool Resize(Form& form, int scaleWidth, int scaleHeight);

  // The form that keyboard input goes to: the topmost shown form.
  static Form* ActiveForm();
  // Whether input to the control would be taken now.
  static bool Accepts(const Control& control);

private:
  static bool AccessKeyDown(Form& form, int keyCode);
};

} // namespace belvane::forms
