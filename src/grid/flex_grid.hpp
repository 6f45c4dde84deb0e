#pragma once
// FlexGrid: the grid control model every grid of the editors is an instance
// of. One fixed header row (row 0) and no fixed column; data rows are 1 to
// Rows() - 1. Lengths are twips.
//
// Storage is built for large catalogues: the texts of a row live in one
// packed buffer, formats are kept only for the cells that have one (and
// travel with their row when rows are inserted or removed), and AddItem at
// the end is amortised constant time.
//
// Events: setting the current cell (Row, Col or SetCurrentCell) to a
// different cell fires OnLeaveCell while the old cell is still current, then
// OnEnterCell with the new one current; the same cell fires nothing. A change
// of TopRow or LeftCol fires OnScroll. Structural changes (Rows, Cols,
// AddItem, RemoveItem, Clear) keep the current cell's indexes where they
// still exist and otherwise pull them back inside, without events.
//
// Out-of-range rows raise error 30009 (invalid row value), columns 30010.

#include "grid/control_model.hpp"

#include <cstdint>
#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace belvane::grid {

// Cell and column alignment codes.
inline constexpr int kAlignLeftTop = 0;
inline constexpr int kAlignLeftCenter = 1;
inline constexpr int kAlignLeftBottom = 2;
inline constexpr int kAlignCenterTop = 3;
inline constexpr int kAlignCenterCenter = 4;
inline constexpr int kAlignCenterBottom = 5;
inline constexpr int kAlignRightTop = 6;
inline constexpr int kAlignRightCenter = 7;
inline constexpr int kAlignRightBottom = 8;
inline constexpr int kAlignGeneral = 9; // texts left, numbers right

inline constexpr int kDefaultColWidth = 960;
inline constexpr int kDefaultRowHeight = 240;
inline constexpr Color kFixedBackColor = 0xC0C0C0;

// The effective look of one cell, for views.
struct CellStyle {
  Color backColor = kWhite;
  Color foreColor = kBlack;
  int alignment = kAlignGeneral;
  std::string fontName;
  double fontSize = 8.25;
  bool fontBold = false;
  bool fontItalic = false;
};

class FlexGrid : public ControlModel {
public:
  FlexGrid();
  ~FlexGrid() override;

  // ---- shape ----
  int Rows() const noexcept { return static_cast<int>(rows_.size()); }
  void Rows(int count); // at least 1 (the header); new rows are empty
  int Cols() const noexcept { return cols_; }
  void Cols(int count); // at least 1
  static constexpr int FixedRows() noexcept { return 1; }
  static constexpr int FixedCols() noexcept { return 0; }

  // ---- current cell ----
  int Row() const noexcept { return row_; }
  void Row(int row);
  int Col() const noexcept { return col_; }
  void Col(int col);
  // Moves to (row, col) as one move: one LeaveCell, one EnterCell.
  void SetCurrentCell(int row, int col);

  // ---- texts ----
  std::string Text() const { return TextMatrix(row_, col_); }
  void Text(std::string_view text) { TextMatrix(row_, col_, text); }
  std::string TextMatrix(int row, int col) const;
  void TextMatrix(int row, int col, std::string_view text);
  // The text without a copy; valid until the grid next changes. Inline:
  // searches and views read every cell they show through it.
  std::string_view TextView(int row, int col) const {
    if (row < 0 || row >= Rows() || col < 0 || col >= cols_) CheckCell(row, col); // raises
    const std::string& packed = rows_[static_cast<std::size_t>(row)].cells;
    if (packed.empty()) return {};
    std::uint32_t begin = 0, end = 0;
    const char* offsets = packed.data();
    if (col > 0) std::memcpy(&begin, offsets + (col - 1) * sizeof begin, sizeof begin);
    std::memcpy(&end, offsets + col * sizeof end, sizeof end);
    return std::string_view(packed.data() + static_cast<std::size_t>(cols_) * sizeof end + begin,
                            end - begin);
  }

  // Appends a row, or inserts it before `index` (1 to Rows()). Fields are
  // separated by tabs: field k goes to column k, missing fields leave cells
  // empty, fields beyond the last column are dropped.
  void AddItem(std::string_view item);
  void AddItem(std::string_view item, int index);
  // Appends a row whose first `count` cells are those of `source`'s row
  // `sourceRow` (any row, the header too), whose next cell holds `next`
  // and whose other cells are empty: the same row AddItem makes of those
  // texts joined by tabs, copied without splitting them again. Cells past
  // this grid's last column are dropped. `source` may be this grid.
  // With `withFormats`, the copied cells keep their formats too (colours,
  // fonts, alignment), so a row copied from a list looks as it does there.
  void AddItemFrom(const FlexGrid& source, int sourceRow, int count, std::string_view next,
                   bool withFormats = false);
  // Removes a data row (1 to Rows() - 1); rows below move up. Removing the
  // last data row leaves the header alone.
  void RemoveItem(int index);
  // Empties every cell and drops every cell format; rows, columns, widths and
  // heights stay.
  void Clear();

  // ---- format of the current cell (read back exactly as set) ----
  Color CellBackColor() const;
  void CellBackColor(Color color);
  Color CellForeColor() const;
  void CellForeColor(Color color);
  int CellAlignment() const;
  void CellAlignment(int alignment);
  std::string CellFontName() const;
  void CellFontName(std::string_view name);
  double CellFontSize() const;
  void CellFontSize(double points);
  bool CellFontBold() const;
  void CellFontBold(bool bold);
  bool CellFontItalic() const;
  void CellFontItalic(bool italic);
  // The same formats set on any cell, without moving the current cell (so
  // without LeaveCell and EnterCell).
  void CellBackColorAt(int row, int col, Color color);
  void CellForeColorAt(int row, int col, Color color);
  void CellAlignmentAt(int row, int col, int alignment);
  void CellFontNameAt(int row, int col, std::string_view name);
  void CellFontSizeAt(int row, int col, double points);
  void CellFontBoldAt(int row, int col, bool bold);
  void CellFontItalicAt(int row, int col, bool italic);
  // The effective look of any cell (what a view paints).
  CellStyle CellStyleAt(int row, int col) const;

  // ---- columns and rows ----
  int ColWidth(int col) const;
  void ColWidth(int col, int width); // -1 restores the default width
  int ColAlignment(int col) const;
  void ColAlignment(int col, int alignment);
  int RowHeight(int row) const;
  void RowHeight(int row, int height); // -1 restores the default height

  // ---- scrolling and geometry ----
  // First data row and first column shown. Setting clamps to the furthest
  // scroll the grid's size allows; a change fires OnScroll.
  int TopRow() const noexcept { return topRow_; }
  void TopRow(int row);
  int LeftCol() const noexcept { return leftCol_; }
  void LeftCol(int col);
  // Scrolls to a position (clamped like TopRow and LeftCol); OnScroll fires
  // once if it changed.
  void ScrollTo(int topRow, int leftCol);
  // Scrolls as little as needed so the cell is wholly in view (when it fits).
  void EnsureVisible(int row, int col);
  bool IsCellVisible(int row, int col) const;
  // Position of a row's top or a column's left edge inside the grid at the
  // current scroll position (negative when scrolled out above or left).
  int RowPos(int row) const;
  int ColPos(int col) const;
  // Position and size of the current cell inside the grid. Reading them
  // first scrolls the cell into view, so a control laid over the cell lands
  // on it.
  int CellLeft();
  int CellTop();
  int CellWidth();
  int CellHeight();
  // The cell under a point of the grid (row or column -1 outside any cell).
  void HitTest(int x, int y, int& row, int& col) const;

  // ---- scroll bars ----
  // Thickness in twips of the scroll bars a view draws inside the grid's
  // rectangle. A bar shows when the rows (or columns) do not fit, counting
  // the room the other bar takes; the cells in view, the scroll limits and
  // the page of PageUp/PageDown then leave the bars' room out, so the model
  // and the view agree on what is seen. 0, the default (no view), leaves
  // the bars out of the geometry. A view's setting survives Reset.
  int ScrollBarSize() const noexcept { return scrollBarSize_; }
  void ScrollBarSize(int twips);
  bool VScrollBarShown() const;
  bool HScrollBarShown() const;
  // The furthest TopRow and LeftCol the grid scrolls to (a view's scroll
  // bar ranges).
  int MaxTopRow() const;
  int MaxLeftCol() const;

  // ---- mouse ----
  int MouseRow() const noexcept { return mouseRow_; }
  int MouseCol() const noexcept { return mouseCol_; }
  void MouseMove(int x, int y); // sets MouseRow and MouseCol from a point

  // ---- painting ----
  // While false, views are not told of cell changes; setting it true again
  // tells them once that every cell may have changed.
  bool Redraw() const noexcept { return redraw_; }
  void Redraw(bool redraw);

  // ---- the user's keyboard navigation ----
  // Arrows, Home/End (with Ctrl: first/last cell), PageUp/PageDown move the
  // current cell and bring it into view. Returns whether the key is one of
  // them.
  bool NavigateByKey(int keyCode, int shift);

  // Back to a new grid's state (two rows, two columns, no texts or
  // formats), without events.
  void Reset();

  // ---- events ----
  std::function<void()> OnEnterCell;
  std::function<void()> OnLeaveCell;
  std::function<void()> OnScroll;

private:
  struct RowExtras;
  struct RowData {
    std::string cells; // packed texts, empty when every cell is empty
    std::unique_ptr<RowExtras> extras;
  };
  struct CellFormat;

  void CheckRow(int row) const;
  void CheckCol(int col) const;
  void CheckCell(int row, int col) const;
  void MoveTo(int row, int col);
  void ClampCurrent();
  const CellFormat* FindFormat(int row, int col) const;
  CellFormat& EditFormat(int row, int col);
  std::uint16_t FontIndex(std::string_view name);
  void CellChanged(int row, int col);
  void AllCellsChanged();
  // The room for cells: the grid's size less the scroll bars shown.
  void ScrollBars(bool& vertical, bool& horizontal) const;
  int RoomWidth() const;
  int RoomHeight() const;
  bool RowsExceed(int room) const;
  bool ColsExceed(int room) const;
  int FixedHeight() const;
  void FillRow(RowData& row, std::string_view item) const;

  std::vector<RowData> rows_;
  int cols_ = 2;
  std::vector<int> colWidths_;
  std::vector<int> colAligns_;
  std::vector<std::string> fontNames_; // cell font names, interned
  int row_ = 1;
  int col_ = 0;
  int topRow_ = 1;
  int leftCol_ = 0;
  int mouseRow_ = -1;
  int mouseCol_ = -1;
  bool redraw_ = true;
  int scrollBarSize_ = 0;
};

} // namespace belvane::grid
