#pragma once
// The in-cell editor both editors lay over the current cell of their
// selected grid: where it goes, where its caret goes, the arrows that leave
// it at the edges of its text, and Backspace on a cell.

#include "forms/controls.hpp"

#include <string>

namespace belvane::editor {

// Moves `editor` exactly over the grid's current cell (scrolling the cell
// into view first, so the editor lands on it in every view).
void PlaceOverCurrentCell(forms::TextBox& editor, grid::FlexGrid& grid);

// The caret of a freshly opened editor: the whole text selected, or the
// caret after the last character.
void PlaceCaret(forms::TextBox& editor, bool selectAll);

// The arrows in the editor: Left at the text's start goes one column left
// (from column 1 to the last column of the row above), Right at its end one
// column right (from the last column to column 1 of the row below), Up and
// Down one row. Moving the current cell hides the editor through the
// form's EnterCell. Other keys are left alone.
void MoveAtTextEdges(const forms::TextBox& editor, grid::FlexGrid& grid, int keyCode);

// The text without its last character (a whole UTF-8 character, so a text
// ending in "£" never keeps half of it).
std::string DropLastCharacter(const std::string& s);

} // namespace belvane::editor
