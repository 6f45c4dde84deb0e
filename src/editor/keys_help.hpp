#pragma once
// The editors' key reference, shown by their Help button and by F1: the
// lines of the editor itself, then the keys every editor window shares.

#include <string_view>

namespace belvane::editor {

void ShowKeysHelp(std::string_view title, std::string_view editorLines);

} // namespace belvane::editor
