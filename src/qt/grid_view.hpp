#pragma once
// The grid's view: a model/view table over the grid model (never a widget
// per cell). The widget is a frame holding a QTableView, whose header row
// is the grid's row 0, and the grid's own scroll bars:
//
// - Geometry: column widths, row heights and the header row's height come
//   from the model in twips at the window's scale; the table fills the room
//   the model leaves beside its scroll bars, so both agree on which cells
//   are in view. The vertical header stays hidden and fixed.
// - Scrolling: the model's TopRow and LeftCol set the table's offsets and
//   the scroll bars; the user's scroll bars and wheel go into Input::Scroll
//   and come back as the model's scroll position.
// - Painting: each cell in its back colour, fore colour, font, bold and
//   italic and alignment; a cell in the "Wingdings 2" font holding "R" or
//   "£" shows a ticked or an empty box drawn by the platform style's check
//   box (desktops here have no such font); the current cell of a focused
//   grid has a focus rectangle. Tool tips show the grid's ToolTipText.

#include "qt/control_view.hpp"

#include <QAbstractTableModel>
#include <QHeaderView>
#include <QTableView>

#include <functional>
#include <string_view>

class QScrollBar;
class QWheelEvent;

namespace belvane::forms {
class FlexGrid;
}
namespace belvane::grid {
struct CellStyle;
}

namespace belvane::qt {

// The grid model as a Qt item model: row r is the grid's data row r + 1,
// row 0 being the header. It answers the display roles (text, colours,
// font, alignment, tool tip) and, for a flag cell, the check state it
// shows. Its row and column counts change only as the grid tells of it.
class GridItemModel : public QAbstractTableModel {
  Q_OBJECT
public:
  GridItemModel(const forms::FlexGrid& grid, QObject* parent);

  int rowCount(const QModelIndex& parent = {}) const override;
  int columnCount(const QModelIndex& parent = {}) const override;
  QVariant data(const QModelIndex& index, int role) const override;
  QVariant headerData(int section, Qt::Orientation orientation, int role) const override;
  Qt::ItemFlags flags(const QModelIndex& index) const override;

  // The grid shown, nullptr once it is gone: nothing reads it any more.
  const forms::FlexGrid* Grid() const noexcept { return grid_; }
  void Detach() noexcept { grid_ = nullptr; }

  void Insert(int firstRow, int count);
  void Remove(int firstRow, int count);
  void Changed(int firstRow, int firstCol, int lastRow, int lastCol);
  // Starts afresh when the grid's shape differs from the one shown.
  void Reshape();

private:
  QVariant CellData(int row, int col, int role) const;

  const forms::FlexGrid* grid_;
  int rows_;
  int cols_;
};

// Whether a cell shows a flag box: its font is "Wingdings 2" and its text
// "R" (ticked) or "£" (empty).
enum class FlagGlyph { None, Ticked, Empty };
FlagGlyph FlagGlyphOf(const grid::CellStyle& style, std::string_view text);

class GridTable : public QTableView {
  Q_OBJECT
public:
  explicit GridTable(QWidget* parent) : QTableView(parent) {}
  std::function<void()> onGeometries;

protected:
  void updateGeometries() override;
};

class GridView : public ControlView {
  Q_OBJECT
public:
  GridView(FormWindow& window, forms::FlexGrid& grid, QWidget* parent);
  ~GridView() override;

  void SyncAll() override;
  GridTable* Table() const noexcept { return table_; }
  QScrollBar* VerticalBar() const noexcept { return vbar_; }
  QScrollBar* HorizontalBar() const noexcept { return hbar_; }
  // Where a cell is drawn, in the coordinates of the control's widget
  // (an empty rectangle for a cell out of view).
  QRect CellRect(int row, int col) const;

  void CellsChanged(int firstRow, int firstCol, int lastRow, int lastCol) override;
  void RowsInserted(int firstRow, int count) override;
  void RowsRemoved(int firstRow, int count) override;
  void LayoutChanged() override;
  void ScrollChanged(int topRow, int leftCol) override;
  void CurrentCellChanged(int row, int col) override;
  void FocusChanged(bool hasFocus) override;
  void RepaintRequested() override;
  void ModelDestroyed() override;

protected:
  void Sync(grid::Property property) override;
  bool Other(QWidget* source, QEvent* event) override;
  QPoint TwipsAt(QWidget* source, QPoint pixels) const override;

private:
  void ApplyShape();
  void ApplyColumns();
  void ApplyRows();
  void LayOut();
  void SyncScroll();
  void UserScrolled();
  void Wheel(QWheelEvent* event);
  void Repaint();

  // The frame's layout last applied: table size and which bars show.
  struct Layout {
    int tableWidth = -1;
    int tableHeight = -1;
    int width = -1;
    int height = -1;
    bool vertical = false;
    bool horizontal = false;
    bool operator==(const Layout&) const = default;
  };

  forms::FlexGrid& grid_;
  GridTable* table_ = nullptr;
  GridItemModel* items_ = nullptr;
  QScrollBar* vbar_ = nullptr;
  QScrollBar* hbar_ = nullptr;
  QWidget* corner_ = nullptr;
  QWidget* focusFrame_ = nullptr; // over the cells while the grid has the focus
  Layout layout_;
  bool uniformRows_ = true; // every data row of the standard height
  bool syncingScroll_ = false;
  int wheelRemainder_ = 0;
};

} // namespace belvane::qt
