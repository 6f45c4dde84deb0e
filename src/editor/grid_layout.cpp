#include "editor/grid_layout.hpp"

namespace belvane::editor {

void ApplyLayout(grid::FlexGrid& g, std::span<const GridColumn> columns) {
  g.Cols(static_cast<int>(columns.size()));
  int others = 0;
  for (const GridColumn& col : columns)
    if (col.width != GridColumn::kFill && col.inFill) others += col.width;
  int c = 0;
  for (const GridColumn& col : columns) {
    if (col.alignment != GridColumn::kDefaultAlignment) g.ColAlignment(c, col.alignment);
    g.ColWidth(c, col.width == GridColumn::kFill ? g.Width() - others - 20 : col.width);
    g.CellFontBoldAt(0, c, true);
    g.TextMatrix(0, c, col.title);
    ++c;
  }
}

} // namespace belvane::editor
