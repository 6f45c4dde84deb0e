#pragma once
// The editors' key reference, shown by their Help button and by F1: the
// lines of the editor itself, then the keys every editor window shares.

#include <string_view>

namespace belvane::forms {
class Control;
}

namespace belvane::editor {

void ShowKeysHelp(std::string_view title, std::string_view editorLines);

// The keys every editor window answers before its controls see them.
enum class WindowKey { kNone, kHelp, kUndo, kRedo };

// Which of them a key press is: F1 the key reference; Ctrl+Z and Ctrl+Y
// taking back and redoing a deletion, unless a text box has the focus, where
// they stay the box's own.
WindowKey WindowKeyOf(int keyCode, int shift, const forms::Control* focused);

} // namespace belvane::editor
