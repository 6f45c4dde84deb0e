#pragma once
// Qt's keys and buttons in the terms of the forms runtime: the desktop's
// virtual key codes, the shift mask, the character a key makes, and mouse
// buttons. Key codes follow a US keyboard, as the forms' own keys do.

#include <Qt>

class QKeyEvent;

namespace belvane::qt {

struct KeyStroke {
  int keyCode = 0;        // 0: a key the forms have no code for
  int shift = 0;          // forms::kShiftMask, kCtrlMask, kAltMask
  char32_t character = 0; // the character the key makes, 0 for none
};

KeyStroke FromQtKey(const QKeyEvent& event);
int ShiftOf(Qt::KeyboardModifiers modifiers);
// forms::kLeftButton, kRightButton or kMiddleButton; 0 for other buttons.
int ButtonOf(Qt::MouseButton button);

} // namespace belvane::qt
