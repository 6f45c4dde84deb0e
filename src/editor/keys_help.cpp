#include "editor/keys_help.hpp"

#include "forms/runtime.hpp"

#include <string>

namespace belvane::editor {

namespace {
constexpr std::string_view kWindowKeys =
    "In every part of the window\r\n"
    "  Tab, Shift+Tab: the next or previous control.\r\n"
    "  Alt and an underlined letter: that button, option or list.\r\n"
    "  Ctrl+Z: takes back the last deletion; Ctrl+Y: deletes it again.\r\n"
    "  F1 or Help: these keys.\r\n"
    "  Close (Alt+C): keeps the lines. The window's close box asks first.\r\n"
    "The window can be made larger or maximised; it remembers its size.";
} // namespace

void ShowKeysHelp(std::string_view title, std::string_view editorLines) {
  std::string text(editorLines);
  text += "\r\n\r\n";
  text += kWindowKeys;
  forms::MsgBox(text, forms::msgbox::kInformation, title);
}

} // namespace belvane::editor
