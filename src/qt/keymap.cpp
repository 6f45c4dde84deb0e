#include "qt/keymap.hpp"

#include "forms/keys.hpp"

#include <QKeyEvent>
#include <QString>

namespace belvane::qt {

namespace keys = forms::keys;

namespace {

// The virtual key of a key that Qt names by the character it makes.
int PunctuationKey(int key) {
  switch (key) {
  case Qt::Key_Semicolon:
  case Qt::Key_Colon:
    return 186;
  case Qt::Key_Equal:
  case Qt::Key_Plus:
    return 187;
  case Qt::Key_Comma:
  case Qt::Key_Less:
    return 188;
  case Qt::Key_Minus:
  case Qt::Key_Underscore:
    return 189;
  case Qt::Key_Period:
  case Qt::Key_Greater:
    return 190;
  case Qt::Key_Slash:
  case Qt::Key_Question:
    return 191;
  case Qt::Key_QuoteLeft:
  case Qt::Key_AsciiTilde:
    return 192;
  case Qt::Key_BracketLeft:
  case Qt::Key_BraceLeft:
    return 219;
  case Qt::Key_Backslash:
  case Qt::Key_Bar:
    return 220;
  case Qt::Key_BracketRight:
  case Qt::Key_BraceRight:
    return 221;
  case Qt::Key_Apostrophe:
  case Qt::Key_QuoteDbl:
    return 222;
  // The shifted digits of a US keyboard.
  case Qt::Key_ParenRight:
    return '0';
  case Qt::Key_Exclam:
    return '1';
  case Qt::Key_At:
    return '2';
  case Qt::Key_NumberSign:
    return '3';
  case Qt::Key_Dollar:
    return '4';
  case Qt::Key_Percent:
    return '5';
  case Qt::Key_AsciiCircum:
    return '6';
  case Qt::Key_Ampersand:
    return '7';
  case Qt::Key_Asterisk:
    return '8';
  case Qt::Key_ParenLeft:
    return '9';
  default:
    return 0;
  }
}

int KeypadKey(int key) {
  if (key >= Qt::Key_0 && key <= Qt::Key_9) return 96 + (key - Qt::Key_0);
  switch (key) {
  case Qt::Key_Asterisk:
    return 106;
  case Qt::Key_Plus:
    return 107;
  case Qt::Key_Minus:
    return 109;
  case Qt::Key_Period:
  case Qt::Key_Comma:
    return 110;
  case Qt::Key_Slash:
    return 111;
  default:
    return 0;
  }
}

int VirtualKey(int key, bool keypad) {
  if (keypad)
    if (const int code = KeypadKey(key)) return code;
  if (key >= Qt::Key_A && key <= Qt::Key_Z) return key; // same codes as 'A' to 'Z'
  if (key >= Qt::Key_0 && key <= Qt::Key_9) return key;
  if (key >= Qt::Key_F1 && key <= Qt::Key_F24) return keys::kF1 + (key - Qt::Key_F1);
  switch (key) {
  case Qt::Key_Backspace:
    return keys::kBack;
  case Qt::Key_Tab:
  case Qt::Key_Backtab:
    return keys::kTab;
  case Qt::Key_Return:
  case Qt::Key_Enter:
    return keys::kEnter;
  case Qt::Key_Shift:
    return keys::kShift;
  case Qt::Key_Control:
    return keys::kControl;
  case Qt::Key_Alt:
    return keys::kAlt;
  case Qt::Key_Escape:
    return keys::kEscape;
  case Qt::Key_Space:
    return keys::kSpace;
  case Qt::Key_PageUp:
    return keys::kPageUp;
  case Qt::Key_PageDown:
    return keys::kPageDown;
  case Qt::Key_End:
    return keys::kEnd;
  case Qt::Key_Home:
    return keys::kHome;
  case Qt::Key_Left:
    return keys::kLeft;
  case Qt::Key_Up:
    return keys::kUp;
  case Qt::Key_Right:
    return keys::kRight;
  case Qt::Key_Down:
    return keys::kDown;
  case Qt::Key_Insert:
    return keys::kInsert;
  case Qt::Key_Delete:
    return keys::kDelete;
  default:
    return PunctuationKey(key);
  }
}

} // namespace

int ShiftOf(Qt::KeyboardModifiers modifiers) {
  int shift = 0;
  if (modifiers & Qt::ShiftModifier) shift |= forms::kShiftMask;
  if (modifiers & Qt::ControlModifier) shift |= forms::kCtrlMask;
  if (modifiers & Qt::AltModifier) shift |= forms::kAltMask;
  return shift;
}

int ButtonOf(Qt::MouseButton button) {
  switch (button) {
  case Qt::LeftButton:
    return forms::kLeftButton;
  case Qt::RightButton:
    return forms::kRightButton;
  case Qt::MiddleButton:
    return forms::kMiddleButton;
  default:
    return 0;
  }
}

KeyStroke FromQtKey(const QKeyEvent& event) {
  KeyStroke stroke;
  const int key = event.key();
  stroke.shift = ShiftOf(event.modifiers());
  if (key == Qt::Key_Backtab) stroke.shift |= forms::kShiftMask;
  stroke.keyCode = VirtualKey(key, (event.modifiers() & Qt::KeypadModifier) != 0);

  const bool ctrl = (stroke.shift & forms::kCtrlMask) != 0;
  const bool alt = (stroke.shift & forms::kAltMask) != 0;
  switch (stroke.keyCode) {
  case keys::kEnter:
  case keys::kEscape:
  case keys::kBack:
  case keys::kSpace:
    stroke.character = static_cast<char32_t>(stroke.keyCode);
    return stroke;
  case keys::kTab:
  case keys::kDelete:
    return stroke;
  default:
    break;
  }
  if (alt) return stroke; // Alt combinations are the window's, they type nothing
  if (ctrl) {
    if (key >= Qt::Key_A && key <= Qt::Key_Z)
      stroke.character = static_cast<char32_t>(key - Qt::Key_A + 1);
    return stroke;
  }
  const QString text = event.text();
  if (!text.isEmpty()) {
    const char32_t c = text.toUcs4().value(0);
    if (c >= 32 && c != 127) stroke.character = c;
  }
  // A character with no key of its own on a US keyboard.
  if (stroke.keyCode == 0 && stroke.character != 0) stroke.keyCode = keys::kPacket;
  return stroke;
}

} // namespace belvane::qt
