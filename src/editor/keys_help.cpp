#include "editor/keys_help.hpp"

#include "forms/control.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"

#include <string>

namespace belvane::editor {

namespace {
constexpr std::string_view kWindowKeys =
    "ANYWHERE IN THE WINDOW\r\n"
    "Tab, Shift+Tab: the next or previous control.\r\n"
    "Alt and an underlined letter: that button, option or list.\r\n"
    "Ctrl+Z: takes back the last deletion; Ctrl+Y: deletes it again.\r\n"
    "F1 or Alt+H: these keys.\r\n"
    "Alt+C: Close, keeping the changes; the window's close box asks.\r\n"
    "The window can be made larger or maximised.";
} // namespace

void ShowKeysHelp(std::string_view title, std::string_view editorLines) {
  std::string text(editorLines);
  text += "\r\n\r\n";
  text += kWindowKeys;
  forms::MsgBox(text, forms::msgbox::kInformation, title);
}

WindowKey WindowKeyOf(int keyCode, int shift, const forms::Control* focused) {
  if (keyCode == forms::keys::kF1 && shift == 0) return WindowKey::kHelp;
  if (shift != forms::kCtrlMask || (keyCode != 'Z' && keyCode != 'Y')) return WindowKey::kNone;
  if (focused && focused->Kind() == forms::ControlKind::TextBox) return WindowKey::kNone;
  return keyCode == 'Z' ? WindowKey::kUndo : WindowKey::kRedo;
}

} // namespace belvane::editor
