#include "editor/cell_editor.hpp"

#include "forms/keys.hpp"
#include "forms/utf8.hpp"

namespace belvane::editor {

void PlaceOverCurrentCell(forms::TextBox& editor, grid::FlexGrid& g) {
  // Reading the cell's geometry scrolls it into view first.
  const int left = g.Left() + g.CellLeft();
  const int top = g.Top() + g.CellTop();
  const int width = g.CellWidth();
  const int height = g.CellHeight();
  editor.Move(left, top, width, height);
}

void PlaceCaret(forms::TextBox& editor, bool selectAll) {
  if (selectAll) {
    editor.SelStart(0);
    editor.SelLength(editor.Length());
  } else {
    editor.SelStart(editor.Length());
  }
}

void MoveAtTextEdges(const forms::TextBox& editor, grid::FlexGrid& g, int keyCode) {
  namespace keys = forms::keys;
  const int r = g.Row();
  const int c = g.Col();
  switch (keyCode) {
  case keys::kLeft:
    if (editor.SelStart() != 0) break;
    if (c >= 2)
      g.Col(c - 1);
    else if (r >= 2)
      g.SetCurrentCell(r - 1, g.Cols() - 1);
    break;
  case keys::kUp:
    if (r >= 2) g.Row(r - 1);
    break;
  case keys::kRight:
    if (editor.SelStart() != editor.Length()) break;
    if (c < g.Cols() - 1)
      g.Col(c + 1);
    else if (r < g.Rows() - 1)
      g.SetCurrentCell(r + 1, 1);
    break;
  case keys::kDown:
    if (r < g.Rows() - 1) g.Row(r + 1);
    break;
  default:
    break;
  }
}

std::string DropLastCharacter(const std::string& s) {
  const int count = forms::utf8::CharCount(s);
  return count == 0 ? s : s.substr(0, forms::utf8::ByteOffset(s, count - 1));
}

} // namespace belvane::editor
