#pragma once
// Laying a grid out from a table of columns, and turning its painting off
// for a scope.

#include "grid/flex_grid.hpp"

#include <span>

namespace belvane::editor {

// The step by which a grid's description column narrows once its rows
// reach the point where the vertical scroll bar takes room (each caller
// keeps its own row-count condition).
inline constexpr int kRowStepTwips = 240;

// One column of a layout. The fill column (width kFill) takes the grid's
// width less the widths of the columns marked `inFill` less 20 twips; the
// other columns lie beyond the visible width.
struct GridColumn {
  static constexpr int kFill = -1;
  static constexpr int kDefaultAlignment = -1;
  const char* title;
  int width;
  int alignment = kDefaultAlignment;
  bool inFill = true;
};

// Sets the column count, each column's alignment and width, and the titles
// of row 0 in bold.
void ApplyLayout(grid::FlexGrid& grid, std::span<const GridColumn> columns);

// Turns the grid's painting off for a scope, and on again however the scope
// ends (an error included), so a grid is never left unpainted.
class RedrawSuspended {
public:
  explicit RedrawSuspended(grid::FlexGrid& g) : grid_(g) { grid_.Redraw(false); }
  ~RedrawSuspended() { grid_.Redraw(true); }
  RedrawSuspended(const RedrawSuspended&) = delete;
  RedrawSuspended& operator=(const RedrawSuspended&) = delete;

private:
  grid::FlexGrid& grid_;
};

} // namespace belvane::editor
