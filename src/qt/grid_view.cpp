#include "qt/grid_view.hpp"

#include "forms/controls.hpp"
#include "forms/input.hpp"
#include "qt/form_window.hpp"
#include "text/number.hpp"

#include <QApplication>
#include <QHelpEvent>
#include <QMouseEvent>
#include <QPainter>
#include <QScrollBar>
#include <QStyle>
#include <QStyleOptionButton>
#include <QStyledItemDelegate>
#include <QToolTip>
#include <QWheelEvent>

#include <algorithm>

namespace belvane::qt {

namespace {

constexpr std::string_view kFlagFont = "Wingdings 2";
constexpr std::string_view kTicked = "R";
constexpr std::string_view kEmpty = "\xC2\xA3"; // "£"
constexpr int kTextPadding = 2;                 // pixels between a cell's edge and its text
// What lies beyond the last row and column.
constexpr grid::Color kBackgroundColor = 0xABABAB;

bool SameNameIgnoringCase(std::string_view a, std::string_view b) {
  return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) {
           return std::tolower(static_cast<unsigned char>(x)) ==
                  std::tolower(static_cast<unsigned char>(y));
         });
}

Qt::Alignment AlignmentOf(int code, std::string_view text) {
  if (code == grid::kAlignGeneral)
    return (text::IsNumeric(text) ? Qt::AlignRight : Qt::AlignLeft) | Qt::AlignVCenter;
  const Qt::Alignment horizontal = code / 3 == 0   ? Qt::AlignLeft
                                   : code / 3 == 1 ? Qt::AlignHCenter
                                                   : Qt::AlignRight;
  const Qt::Alignment vertical = code % 3 == 0   ? Qt::AlignTop
                                 : code % 3 == 1 ? Qt::AlignVCenter
                                                 : Qt::AlignBottom;
  return horizontal | vertical;
}

// Paints one cell, the header's included: background, then the text or the
// flag box, then the focus rectangle.
void PaintCell(QPainter& painter, const QRect& rect, const grid::CellStyle& style,
               std::string_view text, bool focusRect, const QWidget* widget) {
  painter.save();
  painter.setClipRect(rect);
  painter.fillRect(rect, ToQColor(style.backColor));
  const Qt::Alignment alignment = AlignmentOf(style.alignment, text);
  const FlagGlyph glyph = FlagGlyphOf(style, text);
  const QRect inner = rect.adjusted(kTextPadding, 0, -kTextPadding, 0);
  if (glyph != FlagGlyph::None) {
    QStyle* platform = widget->style();
    const int width = platform->pixelMetric(QStyle::PM_IndicatorWidth, nullptr, widget);
    const int height = platform->pixelMetric(QStyle::PM_IndicatorHeight, nullptr, widget);
    const int side = std::max(1, std::min({width, height, rect.height() - 2}));
    QStyleOptionButton box;
    box.initFrom(widget);
    // Like the glyph it stands for, the box lies on the cell's own colour.
    box.palette.setColor(QPalette::Base, ToQColor(style.backColor));
    box.rect = QStyle::alignedRect(Qt::LeftToRight,
                                   (alignment & Qt::AlignHorizontal_Mask) | Qt::AlignVCenter,
                                   QSize(side, side), inner);
    box.state =
        QStyle::State_Enabled | (glyph == FlagGlyph::Ticked ? QStyle::State_On : QStyle::State_Off);
    platform->drawPrimitive(QStyle::PE_IndicatorCheckBox, &box, &painter, widget);
  } else if (!text.empty()) {
    painter.setFont(ToQFont(style.fontName, style.fontSize, style.fontBold, style.fontItalic));
    painter.setPen(ToQColor(style.foreColor));
    painter.drawText(inner, static_cast<int>(alignment) | Qt::TextSingleLine, ToQString(text));
  }
  if (focusRect) {
    QPen pen(ToQColor(style.foreColor), 0, Qt::DotLine);
    painter.setPen(pen);
    painter.setBrush(Qt::NoBrush);
    painter.drawRect(rect.adjusted(0, 0, -1, -1));
  }
  painter.restore();
}

// Paints the data cells.
class GridDelegate : public QStyledItemDelegate {
public:
  GridDelegate(const GridItemModel& items, QObject* parent)
      : QStyledItemDelegate(parent), items_(items) {}

  void paint(QPainter* painter, const QStyleOptionViewItem& option,
             const QModelIndex& index) const override {
    const forms::FlexGrid* grid = items_.Grid();
    const int row = index.row() + 1;
    const int col = index.column();
    if (!grid || row >= grid->Rows() || col >= grid->Cols()) return;
    const bool focus = grid->HasFocus() && row == grid->Row() && col == grid->Col();
    PaintCell(*painter, option.rect, grid->CellStyleAt(row, col), grid->TextView(row, col), focus,
              option.widget);
  }

private:
  const GridItemModel& items_;
};

// Paints the grid's row 0.
class GridHeader : public QHeaderView {
public:
  GridHeader(const GridItemModel& items, QWidget* parent)
      : QHeaderView(Qt::Horizontal, parent), items_(items) {}

protected:
  void paintSection(QPainter* painter, const QRect& rect, int logicalIndex) const override {
    const forms::FlexGrid* grid = items_.Grid();
    if (!grid || logicalIndex >= grid->Cols() || !rect.isValid()) return;
    PaintCell(*painter, rect.adjusted(0, 0, -1, -1), grid->CellStyleAt(0, logicalIndex),
              grid->TextView(0, logicalIndex), false, this);
    painter->save();
    painter->setPen(palette().color(QPalette::Dark));
    painter->drawLine(rect.topRight(), rect.bottomRight());
    painter->drawLine(rect.bottomLeft(), rect.bottomRight());
    painter->restore();
  }

private:
  const GridItemModel& items_;
};

// The start of a row or column section in its header, or the header's end.
int SectionStart(const QHeaderView& header, int section) {
  if (section < 0) return 0;
  if (section >= header.count()) return header.length();
  return header.sectionPosition(section);
}

} // namespace

FlagGlyph FlagGlyphOf(const grid::CellStyle& style, std::string_view text) {
  if (!SameNameIgnoringCase(style.fontName, kFlagFont)) return FlagGlyph::None;
  if (text == kTicked) return FlagGlyph::Ticked;
  if (text == kEmpty) return FlagGlyph::Empty;
  return FlagGlyph::None;
}

// ---- GridItemModel ----

GridItemModel::GridItemModel(const forms::FlexGrid& grid, QObject* parent)
    : QAbstractTableModel(parent), grid_(&grid), rows_(grid.Rows() - 1), cols_(grid.Cols()) {}

int GridItemModel::rowCount(const QModelIndex& parent) const {
  return parent.isValid() ? 0 : rows_;
}

int GridItemModel::columnCount(const QModelIndex& parent) const {
  return parent.isValid() ? 0 : cols_;
}

Qt::ItemFlags GridItemModel::flags(const QModelIndex& index) const {
  return index.isValid() ? Qt::ItemIsEnabled : Qt::NoItemFlags;
}

QVariant GridItemModel::data(const QModelIndex& index, int role) const {
  if (!index.isValid()) return {};
  return CellData(index.row() + 1, index.column(), role);
}

QVariant GridItemModel::headerData(int section, Qt::Orientation orientation, int role) const {
  if (orientation != Qt::Horizontal) return {};
  return CellData(0, section, role);
}

QVariant GridItemModel::CellData(int row, int col, int role) const {
  if (!grid_ || row < 0 || col < 0 || row >= grid_->Rows() || col >= grid_->Cols()) return {};
  switch (role) {
  case Qt::DisplayRole:
    return ToQString(grid_->TextView(row, col));
  case Qt::ToolTipRole:
    if (grid_->ToolTipText().empty()) return {};
    return ToQString(grid_->ToolTipText());
  default:
    break;
  }
  const grid::CellStyle style = grid_->CellStyleAt(row, col);
  switch (role) {
  case Qt::BackgroundRole:
    return QBrush(ToQColor(style.backColor));
  case Qt::ForegroundRole:
    return QBrush(ToQColor(style.foreColor));
  case Qt::FontRole:
    return ToQFont(style.fontName, style.fontSize, style.fontBold, style.fontItalic);
  case Qt::TextAlignmentRole:
    return static_cast<int>(AlignmentOf(style.alignment, grid_->TextView(row, col)));
  case Qt::CheckStateRole:
    switch (FlagGlyphOf(style, grid_->TextView(row, col))) {
    case FlagGlyph::Ticked:
      return Qt::Checked;
    case FlagGlyph::Empty:
      return Qt::Unchecked;
    case FlagGlyph::None:
      return {};
    }
    return {};
  default:
    return {};
  }
}

void GridItemModel::Insert(int firstRow, int count) {
  const int first = firstRow - 1;
  if (!grid_) return;
  if (count <= 0 || first < 0 || first > rows_ || rows_ + count != grid_->Rows() - 1) {
    Reshape();
    return;
  }
  beginInsertRows({}, first, first + count - 1);
  rows_ += count;
  endInsertRows();
}

void GridItemModel::Remove(int firstRow, int count) {
  const int first = firstRow - 1;
  if (!grid_) return;
  if (count <= 0 || first < 0 || first + count > rows_ || rows_ - count != grid_->Rows() - 1) {
    Reshape();
    return;
  }
  beginRemoveRows({}, first, first + count - 1);
  rows_ -= count;
  endRemoveRows();
}

void GridItemModel::Changed(int firstRow, int firstCol, int lastRow, int lastCol) {
  firstCol = std::max(firstCol, 0);
  lastCol = std::min(lastCol, cols_ - 1);
  if (firstCol > lastCol) return;
  if (firstRow <= 0) emit headerDataChanged(Qt::Horizontal, firstCol, lastCol);
  const int first = std::max(firstRow, 1) - 1;
  const int last = std::min(lastRow - 1, rows_ - 1);
  if (first <= last) emit dataChanged(index(first, firstCol), index(last, lastCol));
}

void GridItemModel::Reshape() {
  if (!grid_) return;
  if (rows_ == grid_->Rows() - 1 && cols_ == grid_->Cols()) return;
  beginResetModel();
  rows_ = grid_->Rows() - 1;
  cols_ = grid_->Cols();
  endResetModel();
}

// ---- GridTable ----

void GridTable::updateGeometries() {
  QTableView::updateGeometries();
  if (onGeometries) onGeometries();
}

// The focus frame round the cells of a grid that has the keyboard, in the
// style's highlight colour as its focus frames on buttons are: drawn over
// the table's edge, letting the mouse through.
class GridFocusFrame : public QWidget {
public:
  explicit GridFocusFrame(QWidget* parent) : QWidget(parent) {
    setAttribute(Qt::WA_TransparentForMouseEvents);
    setFocusPolicy(Qt::NoFocus);
  }

protected:
  void paintEvent(QPaintEvent*) override {
    QPainter painter(this);
    QPen pen(palette().color(QPalette::Highlight));
    pen.setWidth(2);
    pen.setJoinStyle(Qt::MiterJoin);
    painter.setPen(pen);
    painter.setBrush(Qt::NoBrush);
    painter.drawRect(QRectF(rect()).adjusted(1, 1, -1, -1));
  }
};

// ---- GridView ----

GridView::GridView(FormWindow& window, forms::FlexGrid& grid, QWidget* parent)
    : ControlView(window, grid, new QWidget(parent)), grid_(grid) {
  QWidget* frame = Widget();
  table_ = new GridTable(frame);
  items_ = new GridItemModel(grid, this);
  auto* header = new GridHeader(*items_, table_);
  header->setSectionResizeMode(QHeaderView::Fixed);
  header->setMinimumSectionSize(0);
  header->setStretchLastSection(false);
  header->setSectionsClickable(false);
  header->setHighlightSections(false);
  table_->setHorizontalHeader(header);
  QHeaderView* rows = table_->verticalHeader();
  rows->setSectionResizeMode(QHeaderView::Fixed);
  rows->setMinimumSectionSize(0);
  rows->setDefaultSectionSize(GetScale().RowPixels());
  rows->hide();
  table_->setModel(items_);
  table_->setItemDelegate(new GridDelegate(*items_, table_));
  table_->setSelectionMode(QAbstractItemView::NoSelection);
  table_->setEditTriggers(QAbstractItemView::NoEditTriggers);
  table_->setTabKeyNavigation(false);
  table_->setAutoScroll(false);
  table_->setFrameShape(QFrame::NoFrame);
  table_->setWordWrap(false);
  table_->setCornerButtonEnabled(false);
  // The grid's own scroll bars stand beside the table; the table's never
  // show and never move: its offsets follow the model.
  table_->setVerticalScrollMode(QAbstractItemView::ScrollPerPixel);
  table_->setHorizontalScrollMode(QAbstractItemView::ScrollPerPixel);
  table_->setVerticalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
  table_->setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
  table_->setFocusPolicy(Qt::NoFocus);
  table_->viewport()->setMouseTracking(true);
  QPalette palette = table_->palette();
  palette.setColor(QPalette::Base, ToQColor(kBackgroundColor));
  table_->setPalette(palette);
  table_->setAttribute(Qt::WA_InputMethodEnabled, false);
  frame->setFocusProxy(table_);

  vbar_ = new QScrollBar(Qt::Vertical, frame);
  hbar_ = new QScrollBar(Qt::Horizontal, frame);
  for (QScrollBar* bar : {vbar_, hbar_}) {
    bar->setFocusPolicy(Qt::NoFocus);
    bar->hide();
    connect(bar, &QAbstractSlider::actionTriggered, this, [this](int) { UserScrolled(); });
  }
  corner_ = new QWidget(frame);
  corner_->setAutoFillBackground(true);
  corner_->hide();
  focusFrame_ = new GridFocusFrame(frame);
  focusFrame_->hide();

  Watch(table_);
  Watch(table_->viewport());
  Watch(header->viewport());
  table_->onGeometries = [this] { SyncScroll(); };

  // The model leaves room for the bars as thick as the style draws them.
  const int extent = vbar_->style()->pixelMetric(QStyle::PM_ScrollBarExtent, nullptr, vbar_);
  grid_.ScrollBarSize(GetScale().Twips(extent));
}

GridView::~GridView() {
  if (table_) table_->onGeometries = nullptr;
}

void GridView::SyncAll() {
  ControlView::SyncAll();
  items_->Reshape();
  ApplyColumns();
  ApplyRows();
  layout_ = Layout{};
  LayOut();
  SyncScroll();
  table_->setUpdatesEnabled(grid_.Redraw());
}

void GridView::ApplyColumns() {
  QHeaderView* header = table_->horizontalHeader();
  int x = WindowLeft();
  const int count = std::min(grid_.Cols(), header->count());
  for (int c = 0; c < count; ++c) {
    const int width = grid_.ColWidth(c);
    const int pixels = GetScale().Span(x, width);
    if (header->sectionSize(c) != pixels) header->resizeSection(c, pixels);
    x += width;
  }
}

void GridView::ApplyRows() {
  QHeaderView* header = table_->verticalHeader();
  const Scale& scale = GetScale();
  const int count = std::min(grid_.Rows() - 1, header->count());
  for (int r = 0; r < count; ++r) {
    const int height = grid_.RowHeight(r + 1);
    const int pixels = height == grid::kDefaultRowHeight ? scale.RowPixels() : scale.Pixels(height);
    if (header->sectionSize(r) != pixels) header->resizeSection(r, pixels);
  }
}

// Lays the table and the scroll bars out in the grid's rectangle: the
// table takes the room the model leaves beside the bars it shows.
void GridView::LayOut() {
  const Scale& scale = GetScale();
  const int left = WindowLeft();
  const int top = WindowTop();
  const bool vertical = grid_.VScrollBarShown();
  const bool horizontal = grid_.HScrollBarShown();
  const int bar = grid_.ScrollBarSize();
  const int roomWidth = std::max(0, grid_.Width() - (vertical ? bar : 0));
  const int roomHeight = std::max(0, grid_.Height() - (horizontal ? bar : 0));
  Layout next;
  next.tableWidth = scale.Span(left, roomWidth);
  next.tableHeight = scale.Span(top, roomHeight);
  next.width = scale.Span(left, grid_.Width());
  next.height = scale.Span(top, grid_.Height());
  next.vertical = vertical;
  next.horizontal = horizontal;

  const int headerHeight = scale.Span(top, grid_.RowHeight(0));
  QHeaderView* header = table_->horizontalHeader();
  if (header->height() != headerHeight || header->minimumHeight() != headerHeight) {
    header->setFixedHeight(headerHeight);
    header->setVisible(headerHeight > 0);
  }

  // The scroll ranges follow the rows and the room at every change.
  syncingScroll_ = true;
  vbar_->setRange(0, std::max(0, grid_.MaxTopRow() - 1));
  vbar_->setPageStep(std::max(1, (roomHeight - grid_.RowHeight(0)) / grid::kDefaultRowHeight));
  hbar_->setRange(0, grid_.MaxLeftCol());
  hbar_->setPageStep(1);
  syncingScroll_ = false;

  if (next == layout_) return;
  layout_ = next;
  table_->setGeometry(0, 0, next.tableWidth, next.tableHeight);
  vbar_->setGeometry(next.tableWidth, 0, next.width - next.tableWidth, next.tableHeight);
  hbar_->setGeometry(0, next.tableHeight, next.tableWidth, next.height - next.tableHeight);
  corner_->setGeometry(next.tableWidth, next.tableHeight, next.width - next.tableWidth,
                       next.height - next.tableHeight);
  vbar_->setVisible(vertical);
  hbar_->setVisible(horizontal);
  corner_->setVisible(vertical && horizontal);
  focusFrame_->setGeometry(0, 0, next.tableWidth, next.tableHeight);
}

// The table's offsets and the bars' values from the model's TopRow and
// LeftCol.
void GridView::SyncScroll() {
  if (!Alive() || !table_) return;
  QHeaderView* rows = table_->verticalHeader();
  QHeaderView* cols = table_->horizontalHeader();
  // Rows of the standard height (the usual case, and the one of big
  // catalogues) need no walk over the header's sections.
  const int rowOffset = uniformRows_ ? (grid_.TopRow() - 1) * GetScale().RowPixels()
                                     : SectionStart(*rows, grid_.TopRow() - 1);
  const int colOffset = SectionStart(*cols, grid_.LeftCol());
  if (rows->offset() != rowOffset || cols->offset() != colOffset) {
    rows->setOffset(rowOffset);
    cols->setOffset(colOffset);
    table_->viewport()->update();
  }
  syncingScroll_ = true;
  vbar_->setValue(grid_.TopRow() - 1);
  hbar_->setValue(grid_.LeftCol());
  syncingScroll_ = false;
}

// The user moved a scroll bar: the model scrolls (or refuses), the view
// follows the model.
void GridView::UserScrolled() {
  if (syncingScroll_ || !Alive()) return;
  forms::Input::Scroll(grid_, vbar_->sliderPosition() + 1, hbar_->sliderPosition());
  if (Alive()) SyncScroll();
}

void GridView::Wheel(QWheelEvent* event) {
  const QPoint delta = event->angleDelta();
  const bool sideways = std::abs(delta.x()) > std::abs(delta.y());
  wheelRemainder_ += sideways ? delta.x() : delta.y();
  const int steps = wheelRemainder_ / QWheelEvent::DefaultDeltasPerStep;
  wheelRemainder_ %= QWheelEvent::DefaultDeltasPerStep;
  if (steps == 0) return;
  if (sideways)
    forms::Input::Scroll(grid_, grid_.TopRow(), std::max(0, grid_.LeftCol() - steps));
  else
    forms::Input::Scroll(grid_,
                         std::max(1, grid_.TopRow() - steps * QApplication::wheelScrollLines()),
                         grid_.LeftCol());
  if (Alive()) SyncScroll();
}

void GridView::Repaint() {
  table_->viewport()->update();
  table_->horizontalHeader()->viewport()->update();
}

QRect GridView::CellRect(int row, int col) const {
  if (!Alive() || row < 0 || col < 0 || row >= grid_.Rows() || col >= grid_.Cols()) return {};
  if (row == 0) {
    const QHeaderView* header = table_->horizontalHeader();
    const QRect r(header->sectionViewportPosition(col), 0, header->sectionSize(col),
                  header->height());
    const QRect shown = r.intersected(header->viewport()->rect());
    return shown.translated(header->viewport()->mapTo(widget_, QPoint(0, 0)));
  }
  const QRect r(table_->columnViewportPosition(col), table_->rowViewportPosition(row - 1),
                table_->columnWidth(col), table_->rowHeight(row - 1));
  if (!table_->viewport()->rect().contains(r)) return {};
  return r.translated(table_->viewport()->mapTo(widget_, QPoint(0, 0)));
}

// A point of the table in twips: inside the cell the table shows there, so
// the model finds the same cell the user pointed at.
QPoint GridView::TwipsAt(QWidget* source, QPoint pixels) const {
  QPoint twips = ControlView::TwipsAt(source, pixels);
  int row = -1;
  int col = -1;
  if (source == table_->viewport()) {
    const QModelIndex index = table_->indexAt(pixels);
    if (index.isValid()) {
      row = index.row() + 1;
      col = index.column();
    }
  } else if (source == table_->horizontalHeader()->viewport()) {
    row = 0;
    col = table_->horizontalHeader()->logicalIndexAt(pixels.x());
  }
  if (row < 0 || col < 0 || row >= grid_.Rows() || col >= grid_.Cols()) return twips;
  const int left = grid_.ColPos(col);
  const int top = grid_.RowPos(row);
  twips.setX(std::clamp(twips.x(), left, left + std::max(0, grid_.ColWidth(col) - 1)));
  twips.setY(std::clamp(twips.y(), top, top + std::max(0, grid_.RowHeight(row) - 1)));
  return twips;
}

bool GridView::Other(QWidget* source, QEvent* event) {
  if (!table_) return false; // still being built
  const bool cells = source == table_->viewport();
  const bool header = source == table_->horizontalHeader()->viewport();
  if (!cells && !header) return false;
  switch (event->type()) {
  case QEvent::Wheel:
    Wheel(static_cast<QWheelEvent*>(event));
    return true;
  case QEvent::MouseMove: {
    const QPoint at = TwipsAt(source, static_cast<QMouseEvent*>(event)->position().toPoint());
    grid_.MouseMove(at.x(), at.y());
    return true;
  }
  case QEvent::ToolTip: {
    const auto* help = static_cast<QHelpEvent*>(event);
    const QPoint at = TwipsAt(source, help->pos());
    grid_.MouseMove(at.x(), at.y());
    if (grid_.ToolTipText().empty())
      QToolTip::hideText();
    else
      QToolTip::showText(help->globalPos(), ToQString(grid_.ToolTipText()), source);
    return true;
  }
  default:
    return false;
  }
}

void GridView::Sync(grid::Property property) {
  switch (property) {
  case grid::Property::Geometry:
    ApplyColumns();
    ApplyRows();
    LayOut();
    SyncScroll();
    break;
  case grid::Property::Redraw:
    table_->setUpdatesEnabled(grid_.Redraw());
    break;
  case grid::Property::Font:
  case grid::Property::BackColor:
  case grid::Property::ForeColor:
  case grid::Property::ToolTipText:
    Repaint();
    break;
  default:
    break;
  }
}

void GridView::CellsChanged(int firstRow, int firstCol, int lastRow, int lastCol) {
  if (Alive()) items_->Changed(firstRow, firstCol, lastRow, lastCol);
}

// Rows added below the top row leave the table's offset where it is (a
// catalogue filling row by row); rows above it move the top row's pixels.
void GridView::RowsInserted(int firstRow, int count) {
  if (!Alive()) return;
  items_->Insert(firstRow, count);
  LayOut();
  if (firstRow <= grid_.TopRow()) SyncScroll();
}

void GridView::RowsRemoved(int firstRow, int count) {
  if (!Alive()) return;
  items_->Remove(firstRow, count);
  LayOut();
  if (firstRow <= grid_.TopRow()) SyncScroll();
}

void GridView::LayoutChanged() {
  if (!Alive()) return;
  items_->Reshape();
  ApplyColumns();
  ApplyRows();
  LayOut();
  SyncScroll();
  Repaint();
}

void GridView::ScrollChanged(int, int) {
  if (Alive()) SyncScroll();
}

void GridView::CurrentCellChanged(int, int) {
  if (Alive()) table_->viewport()->update();
}

void GridView::FocusChanged(bool hasFocus) {
  ControlView::FocusChanged(hasFocus);
  if (!Alive()) return;
  table_->viewport()->update();
  focusFrame_->setVisible(hasFocus);
  if (hasFocus) focusFrame_->raise();
}

// The grid is going (its form is being destroyed): nothing reads it from
// now on, whatever Qt still asks of the table.
void GridView::ModelDestroyed() {
  if (items_) items_->Detach();
  if (table_) table_->onGeometries = nullptr;
  ControlView::ModelDestroyed();
}

void GridView::RepaintRequested() {
  if (!Alive()) return;
  table_->viewport()->repaint();
  table_->horizontalHeader()->viewport()->repaint();
}

} // namespace belvane::qt
