#include "editor/deletion_history.hpp"

#include <algorithm>

namespace belvane::editor {

DeletedRow SnapshotRow(const grid::FlexGrid& g, int row, std::vector<std::string> ids,
                       bool blanked) {
  DeletedRow d;
  d.row = row;
  d.blanked = blanked;
  d.ids = std::move(ids);
  for (int c = 0; c < g.Cols(); ++c) {
    d.texts.emplace_back(g.TextView(row, c));
    grid::CellStyle style = g.CellStyleAt(row, c);
    if (style.backColor == grid::kYellow) style.backColor = grid::kWhite;
    d.styles.push_back(std::move(style));
  }
  return d;
}

void RestoreRow(grid::FlexGrid& g, const DeletedRow& d) {
  std::string rowText;
  for (size_t c = 0; c < d.texts.size(); ++c) {
    if (c) rowText += '\t';
    rowText += d.texts[c];
  }
  if (d.blanked) {
    for (int c = 0; c < static_cast<int>(d.texts.size()) && c < g.Cols(); ++c)
      g.TextMatrix(d.row, c, d.texts[static_cast<size_t>(c)]);
  } else {
    g.AddItem(rowText, std::min(d.row, g.Rows()));
  }
  const int r = d.blanked ? d.row : std::min(d.row, g.Rows() - 1);
  for (int c = 0; c < static_cast<int>(d.styles.size()) && c < g.Cols(); ++c) {
    const grid::CellStyle& s = d.styles[static_cast<size_t>(c)];
    g.CellBackColorAt(r, c, s.backColor);
    g.CellForeColorAt(r, c, s.foreColor);
    g.CellAlignmentAt(r, c, s.alignment);
    if (!s.fontName.empty()) g.CellFontNameAt(r, c, s.fontName);
    g.CellFontSizeAt(r, c, s.fontSize);
    g.CellFontBoldAt(r, c, s.fontBold);
    g.CellFontItalicAt(r, c, s.fontItalic);
  }
}

void ForgetRemovedItems(data::Recordset& removed, const std::vector<std::string>& ids) {
  for (const std::string& id : ids) {
    if (removed.RecordCount() < 1) return;
    for (removed.MoveFirst(); !removed.Eof(); removed.MoveNext())
      if (removed.Collect("ITEMID").ToText() == id) {
        removed.Delete();
        break;
      }
  }
}

void DeletionHistory::Deleted(DeletedRow row) {
  undo_.push_back(std::move(row));
  redo_.clear();
}

DeletedRow DeletionHistory::Undo() {
  DeletedRow d = std::move(undo_.back());
  undo_.pop_back();
  redo_.push_back(d);
  return d;
}

DeletedRow DeletionHistory::Redo() {
  DeletedRow d = std::move(redo_.back());
  redo_.pop_back();
  return d;
}

void DeletionHistory::Clear() {
  undo_.clear();
  redo_.clear();
}

} // namespace belvane::editor
