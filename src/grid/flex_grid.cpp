#include "grid/flex_grid.hpp"

#include "text/error.hpp"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <limits>
#include <utility>

namespace belvane::grid {

// ---------------------------------------------------------------------------
// Packed row texts. A row's buffer is empty while all its cells are empty;
// otherwise it starts with one 32-bit end offset per column, followed by the
// cell texts one after the other. Cell k spans [end(k-1), end(k)) of the
// text part. One allocation per row, whatever the column count.
// ---------------------------------------------------------------------------
namespace {

constexpr std::size_t kOffsetBytes = sizeof(std::uint32_t);
constexpr std::size_t kMaxRowText = std::numeric_limits<std::uint32_t>::max();

std::uint32_t EndOf(const std::string& packed, int col) {
  std::uint32_t end;
  std::memcpy(&end, packed.data() + static_cast<std::size_t>(col) * kOffsetBytes, kOffsetBytes);
  return end;
}

void SetEndOf(std::string& packed, int col, std::uint32_t end) {
  std::memcpy(packed.data() + static_cast<std::size_t>(col) * kOffsetBytes, &end, kOffsetBytes);
}

std::size_t HeaderBytes(int cols) { return static_cast<std::size_t>(cols) * kOffsetBytes; }

std::string_view CellText(const std::string& packed, int col, int cols) {
  if (packed.empty()) return {};
  const std::uint32_t begin = col == 0 ? 0 : EndOf(packed, col - 1);
  const std::uint32_t end = EndOf(packed, col);
  return std::string_view(packed).substr(HeaderBytes(cols) + begin, end - begin);
}

void SetCellText(std::string& packed, int col, int cols, std::string_view text) {
  if (packed.empty()) {
    if (text.empty()) return;
    packed.assign(HeaderBytes(cols), '\0');
  }
  // The new text may be a view of this very buffer.
  std::string copy;
  if (!text.empty() && text.data() >= packed.data() &&
      text.data() < packed.data() + packed.size()) {
    copy.assign(text);
    text = copy;
  }
  const std::uint32_t begin = col == 0 ? 0 : EndOf(packed, col - 1);
  const std::uint32_t end = EndOf(packed, col);
  const std::size_t total = EndOf(packed, cols - 1);
  if (total - (end - begin) + text.size() > kMaxRowText)
    throw Error(err::kOverflow, "Overflow: row text too long");
  packed.replace(HeaderBytes(cols) + begin, end - begin, text);
  const std::int64_t delta =
      static_cast<std::int64_t>(text.size()) - static_cast<std::int64_t>(end - begin);
  for (int k = col; k < cols; ++k)
    SetEndOf(packed, k, static_cast<std::uint32_t>(EndOf(packed, k) + delta));
  if (EndOf(packed, cols - 1) == 0) std::string().swap(packed);
}

std::string Repack(const std::string& packed, int oldCols, int newCols) {
  if (packed.empty()) return {};
  std::string out(HeaderBytes(newCols), '\0');
  std::uint32_t end = 0;
  for (int k = 0; k < newCols; ++k) {
    if (k < oldCols) {
      std::string_view cell = CellText(packed, k, oldCols);
      out.append(cell);
      end += static_cast<std::uint32_t>(cell.size());
    }
    SetEndOf(out, k, end);
  }
  if (end == 0) return {};
  return out;
}

// Key codes the grid's own navigation understands.
constexpr int kKeyPageUp = 33;
constexpr int kKeyPageDown = 34;
constexpr int kKeyEnd = 35;
constexpr int kKeyHome = 36;
constexpr int kKeyLeft = 37;
constexpr int kKeyUp = 38;
constexpr int kKeyRight = 39;
constexpr int kKeyDown = 40;
constexpr int kCtrlMask = 2;

void CheckAlignment(int alignment) {
  if (alignment < kAlignLeftTop || alignment > kAlignGeneral)
    throw Error(kInvalidPropertyValue, "Invalid property value");
}

} // namespace

// ---------------------------------------------------------------------------
// Sparse cell formats: only cells given a format carry one, in their row.
// ---------------------------------------------------------------------------
struct FlexGrid::CellFormat {
  enum : std::uint8_t {
    kBack = 1,
    kFore = 2,
    kAlign = 4,
    kFont = 8,
    kSize = 16,
    kBold = 32,
    kItalic = 64,
  };
  std::uint8_t set = 0;
  std::uint8_t alignment = 0;
  std::uint16_t font = 0;
  bool bold = false;
  bool italic = false;
  Color back = 0;
  Color fore = 0;
  double size = 0;
};

struct FlexGrid::RowExtras {
  int height = -1;                               // -1: the default height
  std::vector<std::pair<int, CellFormat>> cells; // sorted by column
};

FlexGrid::FlexGrid() {
  SetDefaultSize(4800, 2400);
  SetDefaultColors(kWhite, kBlack);
  rows_.resize(2);
  colWidths_.assign(static_cast<std::size_t>(cols_), kDefaultColWidth);
  colAligns_.assign(static_cast<std::size_t>(cols_), kAlignGeneral);
}

FlexGrid::~FlexGrid() = default;

void FlexGrid::Reset() {
  rows_.clear();
  rows_.resize(2);
  cols_ = 2;
  colWidths_.assign(2, kDefaultColWidth);
  colAligns_.assign(2, kAlignGeneral);
  fontNames_.clear();
  row_ = 1;
  col_ = 0;
  topRow_ = 1;
  leftCol_ = 0;
  mouseRow_ = mouseCol_ = -1;
  redraw_ = true;
  ResetCommon();
  Notify([this](ModelObserver& o) {
    o.LayoutChanged();
    o.CellsChanged(0, 0, Rows() - 1, cols_ - 1);
    o.ScrollChanged(topRow_, leftCol_);
    o.CurrentCellChanged(row_, col_);
  });
}

// ---- checks ----

void FlexGrid::CheckRow(int row) const {
  if (row < 0 || row >= Rows()) throw Error(err::kInvalidRowValue, "Invalid Row value");
}

void FlexGrid::CheckCol(int col) const {
  if (col < 0 || col >= cols_) throw Error(err::kInvalidColValue, "Invalid Col value");
}

void FlexGrid::CheckCell(int row, int col) const {
  CheckRow(row);
  CheckCol(col);
}

// ---- notifications ----

void FlexGrid::CellChanged(int row, int col) {
  if (!redraw_) return;
  Notify([row, col](ModelObserver& o) { o.CellsChanged(row, col, row, col); });
}

void FlexGrid::AllCellsChanged() {
  if (!redraw_) return;
  Notify([this](ModelObserver& o) { o.CellsChanged(0, 0, Rows() - 1, cols_ - 1); });
}

// ---- shape ----

void FlexGrid::Rows(int count) {
  if (count < FixedRows()) throw Error(err::kInvalidRowValue, "Invalid Row value");
  const int old = Rows();
  if (count == old) return;
  rows_.resize(static_cast<std::size_t>(count));
  if (count > old)
    Notify([old, count](ModelObserver& o) { o.RowsInserted(old, count - old); });
  else
    Notify([old, count](ModelObserver& o) { o.RowsRemoved(count, old - count); });
  ClampCurrent();
}

void FlexGrid::Cols(int count) {
  if (count < 1) throw Error(err::kInvalidColValue, "Invalid Col value");
  if (count == cols_) return;
  for (RowData& row : rows_) {
    if (!row.cells.empty()) row.cells = Repack(row.cells, cols_, count);
    if (row.extras) {
      auto& cells = row.extras->cells;
      cells.erase(std::remove_if(cells.begin(), cells.end(),
                                 [count](const auto& entry) { return entry.first >= count; }),
                  cells.end());
    }
  }
  cols_ = count;
  colWidths_.resize(static_cast<std::size_t>(count), kDefaultColWidth);
  colAligns_.resize(static_cast<std::size_t>(count), kAlignGeneral);
  Notify([](ModelObserver& o) { o.LayoutChanged(); });
  AllCellsChanged();
  ClampCurrent();
}

void FlexGrid::ClampCurrent() {
  const int row = std::min(row_, Rows() - 1);
  const int col = std::min(col_, cols_ - 1);
  if (row != row_ || col != col_) {
    row_ = row;
    col_ = col;
    Notify([row, col](ModelObserver& o) { o.CurrentCellChanged(row, col); });
  }
  const int top = std::clamp(topRow_, 1, MaxTopRow());
  const int left = std::clamp(leftCol_, 0, MaxLeftCol());
  if (top != topRow_ || left != leftCol_) {
    topRow_ = top;
    leftCol_ = left;
    Notify([top, left](ModelObserver& o) { o.ScrollChanged(top, left); });
  }
}

// ---- current cell ----

void FlexGrid::Row(int row) {
  CheckRow(row);
  MoveTo(row, col_);
}

void FlexGrid::Col(int col) {
  CheckCol(col);
  MoveTo(row_, col);
}

void FlexGrid::SetCurrentCell(int row, int col) {
  CheckCell(row, col);
  MoveTo(row, col);
}

void FlexGrid::MoveTo(int row, int col) {
  if (row == row_ && col == col_) return;
  if (OnLeaveCell) OnLeaveCell();
  // The handler may have reshaped the grid or moved the cell itself.
  CheckCell(row, col);
  if (row == row_ && col == col_) return;
  row_ = row;
  col_ = col;
  Notify([row, col](ModelObserver& o) { o.CurrentCellChanged(row, col); });
  if (OnEnterCell) OnEnterCell();
}

// ---- texts ----

std::string FlexGrid::TextMatrix(int row, int col) const { return std::string(TextView(row, col)); }

void FlexGrid::TextMatrix(int row, int col, std::string_view text) {
  CheckCell(row, col);
  SetCellText(rows_[static_cast<std::size_t>(row)].cells, col, cols_, text);
  CellChanged(row, col);
}

void FlexGrid::FillRow(RowData& row, std::string_view item) const {
  if (item.empty()) return;
  if (item.size() > kMaxRowText) throw Error(err::kOverflow, "Overflow: row text too long");
  std::string packed;
  packed.reserve(HeaderBytes(cols_) + item.size());
  packed.resize(HeaderBytes(cols_));
  std::size_t pos = 0;
  std::uint32_t end = 0;
  for (int k = 0; k < cols_; ++k) {
    if (pos != std::string_view::npos) {
      const std::size_t tab = item.find('\t', pos);
      const std::string_view field =
          item.substr(pos, tab == std::string_view::npos ? std::string_view::npos : tab - pos);
      packed.append(field);
      end += static_cast<std::uint32_t>(field.size());
      pos = tab == std::string_view::npos ? tab : tab + 1;
    }
    SetEndOf(packed, k, end);
  }
  if (end != 0) row.cells = std::move(packed);
}

void FlexGrid::AddItem(std::string_view item) {
  RowData row;
  FillRow(row, item);
  rows_.push_back(std::move(row));
  const int index = Rows() - 1;
  Notify([index](ModelObserver& o) { o.RowsInserted(index, 1); });
}

void FlexGrid::AddItemFrom(const FlexGrid& source, int sourceRow, int count, std::string_view next,
                           bool withFormats) {
  source.CheckRow(sourceRow);
  if (count < 0 || count > source.cols_) throw Error(err::kInvalidColValue, "Invalid Col value");
  const int copied = std::min(count, cols_);
  const std::string& from = source.rows_[static_cast<std::size_t>(sourceRow)].cells;
  const std::uint32_t copiedBytes = from.empty() || copied == 0 ? 0 : EndOf(from, copied - 1);
  const std::size_t nextBytes = copied < cols_ ? next.size() : 0;
  const std::size_t total = copiedBytes + nextBytes;
  if (total > kMaxRowText) throw Error(err::kOverflow, "Overflow: row text too long");
  RowData row;
  if (total != 0) {
    // The copied cells keep their end offsets; the next cell and every
    // empty one after it end where the texts end.
    std::string packed(HeaderBytes(cols_) + total, '\0');
    if (!from.empty()) std::memcpy(packed.data(), from.data(), HeaderBytes(copied));
    for (int k = copied; k < cols_; ++k)
      SetEndOf(packed, k, static_cast<std::uint32_t>(total));
    char* texts = packed.data() + HeaderBytes(cols_);
    if (copiedBytes != 0) std::memcpy(texts, from.data() + HeaderBytes(source.cols_), copiedBytes);
    if (nextBytes != 0) std::memcpy(texts + copiedBytes, next.data(), nextBytes);
    row.cells = std::move(packed);
  }
  const auto& fromExtras = source.rows_[static_cast<std::size_t>(sourceRow)].extras;
  if (withFormats && fromExtras) {
    const auto& cells = fromExtras->cells; // sorted by column
    const auto end = std::lower_bound(cells.begin(), cells.end(), copied,
                                      [](const auto& entry, int c) { return entry.first < c; });
    if (end != cells.begin()) {
      row.extras = std::make_unique<RowExtras>();
      row.extras->cells.assign(cells.begin(), end);
    }
  }
  rows_.push_back(std::move(row));
  const int index = Rows() - 1;
  Notify([index](ModelObserver& o) { o.RowsInserted(index, 1); });
}

void FlexGrid::AddItem(std::string_view item, int index) {
  if (index < FixedRows() || index > Rows())
    throw Error(err::kInvalidRowValue, "Invalid Row value");
  RowData row;
  FillRow(row, item);
  rows_.insert(rows_.begin() + index, std::move(row));
  Notify([index](ModelObserver& o) { o.RowsInserted(index, 1); });
  ClampCurrent();
}

void FlexGrid::RemoveItem(int index) {
  if (index < FixedRows() || index >= Rows())
    throw Error(err::kInvalidRowValue, "Invalid Row value");
  rows_.erase(rows_.begin() + index);
  Notify([index](ModelObserver& o) { o.RowsRemoved(index, 1); });
  ClampCurrent();
}

void FlexGrid::Clear() {
  for (RowData& row : rows_) {
    std::string().swap(row.cells);
    if (row.extras) {
      if (row.extras->height < 0)
        row.extras.reset();
      else
        row.extras->cells.clear();
    }
  }
  AllCellsChanged();
}

// ---- cell formats ----

const FlexGrid::CellFormat* FlexGrid::FindFormat(int row, int col) const {
  const auto& extras = rows_[static_cast<std::size_t>(row)].extras;
  if (!extras) return nullptr;
  for (const auto& [c, format] : extras->cells)
    if (c == col) return &format;
  return nullptr;
}

FlexGrid::CellFormat& FlexGrid::EditFormat(int row, int col) {
  auto& extras = rows_[static_cast<std::size_t>(row)].extras;
  if (!extras) extras = std::make_unique<RowExtras>();
  auto& cells = extras->cells;
  auto it = std::lower_bound(cells.begin(), cells.end(), col,
                             [](const auto& entry, int c) { return entry.first < c; });
  if (it == cells.end() || it->first != col) it = cells.insert(it, {col, CellFormat{}});
  return it->second;
}

std::uint16_t FlexGrid::FontIndex(std::string_view name) {
  for (std::size_t i = 0; i < fontNames_.size(); ++i)
    if (fontNames_[i] == name) return static_cast<std::uint16_t>(i);
  if (fontNames_.size() > std::numeric_limits<std::uint16_t>::max())
    throw Error(kInvalidPropertyValue, "Invalid property value: too many cell fonts");
  fontNames_.emplace_back(name);
  return static_cast<std::uint16_t>(fontNames_.size() - 1);
}

CellStyle FlexGrid::CellStyleAt(int row, int col) const {
  CheckCell(row, col);
  CellStyle style;
  style.backColor = row < FixedRows() ? kFixedBackColor : BackColor();
  style.foreColor = ForeColor();
  style.alignment = colAligns_[static_cast<std::size_t>(col)];
  style.fontName = FontName();
  style.fontSize = FontSize();
  style.fontBold = FontBold();
  style.fontItalic = FontItalic();
  if (const CellFormat* f = FindFormat(row, col)) {
    if (f->set & CellFormat::kBack) style.backColor = f->back;
    if (f->set & CellFormat::kFore) style.foreColor = f->fore;
    if (f->set & CellFormat::kAlign) style.alignment = f->alignment;
    if (f->set & CellFormat::kFont) style.fontName = fontNames_[f->font];
    if (f->set & CellFormat::kSize) style.fontSize = f->size;
    if (f->set & CellFormat::kBold) style.fontBold = f->bold;
    if (f->set & CellFormat::kItalic) style.fontItalic = f->italic;
  }
  return style;
}

Color FlexGrid::CellBackColor() const { return CellStyleAt(row_, col_).backColor; }
void FlexGrid::CellBackColorAt(int row, int col, Color color) {
  CheckCell(row, col);
  CellFormat& f = EditFormat(row, col);
  f.back = color;
  f.set |= CellFormat::kBack;
  CellChanged(row, col);
}
void FlexGrid::CellBackColor(Color color) { CellBackColorAt(row_, col_, color); }

Color FlexGrid::CellForeColor() const { return CellStyleAt(row_, col_).foreColor; }
void FlexGrid::CellForeColorAt(int row, int col, Color color) {
  CheckCell(row, col);
  CellFormat& f = EditFormat(row, col);
  f.fore = color;
  f.set |= CellFormat::kFore;
  CellChanged(row, col);
}
void FlexGrid::CellForeColor(Color color) { CellForeColorAt(row_, col_, color); }

int FlexGrid::CellAlignment() const { return CellStyleAt(row_, col_).alignment; }
void FlexGrid::CellAlignmentAt(int row, int col, int alignment) {
  CheckCell(row, col);
  CheckAlignment(alignment);
  CellFormat& f = EditFormat(row, col);
  f.alignment = static_cast<std::uint8_t>(alignment);
  f.set |= CellFormat::kAlign;
  CellChanged(row, col);
}
void FlexGrid::CellAlignment(int alignment) { CellAlignmentAt(row_, col_, alignment); }

std::string FlexGrid::CellFontName() const { return CellStyleAt(row_, col_).fontName; }
void FlexGrid::CellFontNameAt(int row, int col, std::string_view name) {
  CheckCell(row, col);
  const std::uint16_t index = FontIndex(name);
  CellFormat& f = EditFormat(row, col);
  f.font = index;
  f.set |= CellFormat::kFont;
  CellChanged(row, col);
}
void FlexGrid::CellFontName(std::string_view name) { CellFontNameAt(row_, col_, name); }

double FlexGrid::CellFontSize() const { return CellStyleAt(row_, col_).fontSize; }
void FlexGrid::CellFontSizeAt(int row, int col, double points) {
  CheckCell(row, col);
  if (!(points > 0)) throw Error(kInvalidPropertyValue, "Invalid property value");
  CellFormat& f = EditFormat(row, col);
  f.size = points;
  f.set |= CellFormat::kSize;
  CellChanged(row, col);
}
void FlexGrid::CellFontSize(double points) { CellFontSizeAt(row_, col_, points); }

bool FlexGrid::CellFontBold() const { return CellStyleAt(row_, col_).fontBold; }
void FlexGrid::CellFontBoldAt(int row, int col, bool bold) {
  CheckCell(row, col);
  CellFormat& f = EditFormat(row, col);
  f.bold = bold;
  f.set |= CellFormat::kBold;
  CellChanged(row, col);
}
void FlexGrid::CellFontBold(bool bold) { CellFontBoldAt(row_, col_, bold); }

bool FlexGrid::CellFontItalic() const { return CellStyleAt(row_, col_).fontItalic; }
void FlexGrid::CellFontItalicAt(int row, int col, bool italic) {
  CheckCell(row, col);
  CellFormat& f = EditFormat(row, col);
  f.italic = italic;
  f.set |= CellFormat::kItalic;
  CellChanged(row, col);
}
void FlexGrid::CellFontItalic(bool italic) { CellFontItalicAt(row_, col_, italic); }

// ---- columns and rows ----

int FlexGrid::ColWidth(int col) const {
  CheckCol(col);
  return colWidths_[static_cast<std::size_t>(col)];
}

void FlexGrid::ColWidth(int col, int width) {
  CheckCol(col);
  if (width < -1) throw Error(kInvalidPropertyValue, "Invalid property value");
  colWidths_[static_cast<std::size_t>(col)] = width == -1 ? kDefaultColWidth : width;
  Notify([](ModelObserver& o) { o.LayoutChanged(); });
}

int FlexGrid::ColAlignment(int col) const {
  CheckCol(col);
  return colAligns_[static_cast<std::size_t>(col)];
}

void FlexGrid::ColAlignment(int col, int alignment) {
  CheckCol(col);
  CheckAlignment(alignment);
  colAligns_[static_cast<std::size_t>(col)] = alignment;
  Notify([](ModelObserver& o) { o.LayoutChanged(); });
  AllCellsChanged();
}

int FlexGrid::RowHeight(int row) const {
  CheckRow(row);
  const auto& extras = rows_[static_cast<std::size_t>(row)].extras;
  return extras && extras->height >= 0 ? extras->height : kDefaultRowHeight;
}

void FlexGrid::RowHeight(int row, int height) {
  CheckRow(row);
  if (height < -1) throw Error(kInvalidPropertyValue, "Invalid property value");
  auto& extras = rows_[static_cast<std::size_t>(row)].extras;
  if (!extras) {
    if (height == -1) return;
    extras = std::make_unique<RowExtras>();
  }
  extras->height = height;
  Notify([](ModelObserver& o) { o.LayoutChanged(); });
}

// ---- scrolling and geometry ----

int FlexGrid::FixedHeight() const { return RowHeight(0); }

int FlexGrid::MaxTopRow() const {
  if (Rows() <= FixedRows()) return 1;
  const int room = RoomHeight() - FixedHeight();
  int top = Rows() - 1;
  int used = RowHeight(top);
  while (top > FixedRows() && used + RowHeight(top - 1) <= room) {
    --top;
    used += RowHeight(top);
  }
  return top;
}

int FlexGrid::MaxLeftCol() const {
  int left = cols_ - 1;
  int used = colWidths_[static_cast<std::size_t>(left)];
  while (left > 0 && used + colWidths_[static_cast<std::size_t>(left - 1)] <= RoomWidth()) {
    --left;
    used += colWidths_[static_cast<std::size_t>(left)];
  }
  return left;
}

// ---- scroll bars ----

void FlexGrid::ScrollBarSize(int twips) {
  if (twips < 0) throw Error(kInvalidPropertyValue, "Invalid property value");
  if (twips == scrollBarSize_) return;
  scrollBarSize_ = twips;
  Notify([](ModelObserver& o) { o.LayoutChanged(); });
  ClampCurrent();
}

bool FlexGrid::RowsExceed(int room) const {
  int used = 0;
  for (int r = 0; r < Rows(); ++r) {
    used += RowHeight(r);
    if (used > room) return true;
  }
  return false;
}

bool FlexGrid::ColsExceed(int room) const {
  int used = 0;
  for (int w : colWidths_) {
    used += w;
    if (used > room) return true;
  }
  return false;
}

void FlexGrid::ScrollBars(bool& vertical, bool& horizontal) const {
  const bool tall = RowsExceed(Height());
  const bool wide = ColsExceed(Width());
  horizontal = wide || (tall && ColsExceed(Width() - scrollBarSize_));
  vertical = tall || (horizontal && RowsExceed(Height() - scrollBarSize_));
}

bool FlexGrid::VScrollBarShown() const {
  bool vertical = false;
  bool horizontal = false;
  ScrollBars(vertical, horizontal);
  return vertical;
}

bool FlexGrid::HScrollBarShown() const {
  bool vertical = false;
  bool horizontal = false;
  ScrollBars(vertical, horizontal);
  return horizontal;
}

int FlexGrid::RoomWidth() const {
  if (scrollBarSize_ == 0) return Width();
  return std::max(0, Width() - (VScrollBarShown() ? scrollBarSize_ : 0));
}

int FlexGrid::RoomHeight() const {
  if (scrollBarSize_ == 0) return Height();
  return std::max(0, Height() - (HScrollBarShown() ? scrollBarSize_ : 0));
}

void FlexGrid::ScrollTo(int topRow, int leftCol) {
  topRow = std::clamp(topRow, 1, MaxTopRow());
  leftCol = std::clamp(leftCol, 0, MaxLeftCol());
  if (topRow == topRow_ && leftCol == leftCol_) return;
  topRow_ = topRow;
  leftCol_ = leftCol;
  Notify([topRow, leftCol](ModelObserver& o) { o.ScrollChanged(topRow, leftCol); });
  if (OnScroll) OnScroll();
}

void FlexGrid::TopRow(int row) {
  if (row < FixedRows() || (row >= Rows() && !(Rows() == FixedRows() && row == 1)))
    throw Error(err::kInvalidRowValue, "Invalid Row value");
  ScrollTo(row, leftCol_);
}

void FlexGrid::LeftCol(int col) {
  CheckCol(col);
  ScrollTo(topRow_, col);
}

bool FlexGrid::IsCellVisible(int row, int col) const {
  CheckCell(row, col);
  bool rowShown = row < FixedRows() || row == topRow_;
  if (!rowShown && row > topRow_) {
    const int room = RoomHeight();
    int bottom = FixedHeight();
    rowShown = true;
    for (int r = topRow_; r <= row && rowShown; ++r) {
      bottom += RowHeight(r);
      rowShown = bottom <= room;
    }
  }
  bool colShown = col == leftCol_;
  if (!colShown && col > leftCol_) {
    const int room = RoomWidth();
    int right = 0;
    colShown = true;
    for (int c = leftCol_; c <= col && colShown; ++c) {
      right += colWidths_[static_cast<std::size_t>(c)];
      colShown = right <= room;
    }
  }
  return rowShown && colShown;
}

void FlexGrid::EnsureVisible(int row, int col) {
  CheckCell(row, col);
  int top = topRow_;
  int left = leftCol_;
  if (row >= FixedRows() && !IsCellVisible(row, leftCol_)) {
    if (row < topRow_) {
      top = row;
    } else {
      const int room = RoomHeight() - FixedHeight();
      top = row;
      int used = RowHeight(row);
      while (top > FixedRows() && used + RowHeight(top - 1) <= room) {
        --top;
        used += RowHeight(top);
      }
    }
  }
  if (col < leftCol_) {
    left = col;
  } else if (col > leftCol_) {
    int right = 0;
    for (int c = leftCol_; c <= col; ++c)
      right += colWidths_[static_cast<std::size_t>(c)];
    const int room = RoomWidth();
    if (right > room) {
      left = col;
      int used = colWidths_[static_cast<std::size_t>(col)];
      while (left > 0 && used + colWidths_[static_cast<std::size_t>(left - 1)] <= room) {
        --left;
        used += colWidths_[static_cast<std::size_t>(left)];
      }
    }
  }
  ScrollTo(top, left);
}

int FlexGrid::RowPos(int row) const {
  CheckRow(row);
  if (row < FixedRows()) return 0;
  int pos = FixedHeight();
  if (row >= topRow_) {
    for (int r = topRow_; r < row; ++r)
      pos += RowHeight(r);
  } else {
    for (int r = row; r < topRow_; ++r)
      pos -= RowHeight(r);
  }
  return pos;
}

int FlexGrid::ColPos(int col) const {
  CheckCol(col);
  int pos = 0;
  if (col >= leftCol_) {
    for (int c = leftCol_; c < col; ++c)
      pos += colWidths_[static_cast<std::size_t>(c)];
  } else {
    for (int c = col; c < leftCol_; ++c)
      pos -= colWidths_[static_cast<std::size_t>(c)];
  }
  return pos;
}

int FlexGrid::CellLeft() {
  EnsureVisible(row_, col_);
  return ColPos(col_);
}

int FlexGrid::CellTop() {
  EnsureVisible(row_, col_);
  return RowPos(row_);
}

int FlexGrid::CellWidth() {
  EnsureVisible(row_, col_);
  return ColWidth(col_);
}

int FlexGrid::CellHeight() {
  EnsureVisible(row_, col_);
  return RowHeight(row_);
}

void FlexGrid::HitTest(int x, int y, int& row, int& col) const {
  row = -1;
  col = -1;
  if (y >= 0 && y < RoomHeight()) {
    int bottom = FixedHeight();
    if (y < bottom) {
      row = 0;
    } else {
      for (int r = topRow_; r < Rows() && bottom <= y; ++r) {
        bottom += RowHeight(r);
        if (y < bottom) row = r;
      }
    }
  }
  if (x >= 0 && x < RoomWidth()) {
    int right = 0;
    for (int c = leftCol_; c < cols_ && right <= x; ++c) {
      right += colWidths_[static_cast<std::size_t>(c)];
      if (x < right) col = c;
    }
  }
}

void FlexGrid::MouseMove(int x, int y) { HitTest(x, y, mouseRow_, mouseCol_); }

// ---- painting ----

void FlexGrid::Redraw(bool redraw) {
  if (redraw == redraw_) return;
  redraw_ = redraw;
  NotifyProperty(Property::Redraw);
  if (redraw_) {
    AllCellsChanged();
    Notify([](ModelObserver& o) { o.RepaintRequested(); });
  }
}

// ---- keyboard navigation ----

bool FlexGrid::NavigateByKey(int keyCode, int shift) {
  const bool ctrl = (shift & kCtrlMask) != 0;
  const int last = Rows() - 1;
  int row = row_;
  int col = col_;
  int page = 0;
  if (keyCode == kKeyPageUp || keyCode == kKeyPageDown) {
    page = 1;
    const int room = RoomHeight();
    int bottom = FixedHeight();
    for (int r = topRow_ + 1; r <= last; ++r) {
      bottom += RowHeight(r - 1);
      if (bottom + RowHeight(r) > room) break;
      ++page;
    }
  }
  switch (keyCode) {
  case kKeyLeft:
    col = std::max(0, col - 1);
    break;
  case kKeyRight:
    col = std::min(cols_ - 1, col + 1);
    break;
  case kKeyUp:
    row = std::max(FixedRows(), row - 1);
    break;
  case kKeyDown:
    row = std::min(last, row + 1);
    break;
  case kKeyHome:
    col = 0;
    if (ctrl) row = FixedRows();
    break;
  case kKeyEnd:
    col = cols_ - 1;
    if (ctrl) row = last;
    break;
  case kKeyPageUp:
    row = std::max(FixedRows(), row - page);
    break;
  case kKeyPageDown:
    row = std::min(last, row + page);
    break;
  default:
    return false;
  }
  if (last < FixedRows()) return true; // no data row to move to
  row = std::clamp(row, FixedRows(), last);
  SetCurrentCell(row, col);
  EnsureVisible(row_, col_);
  return true;
}

} // namespace belvane::grid
