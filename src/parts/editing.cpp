// frmParts: editing the quote's parts in place. Text cells are edited
// through the text box T1 laid over the current cell, whose every change
// reaches the cell at once; the report tick toggles. Leaving a cell checks
// and formats it, lets the side follow the description, and reprices the
// row when its unit price or its part type was edited.

#include "editor/cell_editor.hpp"
#include "editor/grid_layout.hpp"
#include "forms/keys.hpp"
#include "forms/utf8.hpp"
#include "parts/frm_parts.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <string>

namespace belvane::parts {

namespace {

namespace keys = forms::keys;
namespace sel = col::sel;

// Columns the editor opens on: all but "Side" (it follows the description),
// the report tick and the columns beyond it.
bool IsEditable(int c) { return c >= sel::kItemNo && c <= sel::kPartNo && c != sel::kSide; }

bool IsDigit(int k) { return k >= '0' && k <= '9'; }

// The part-type letter of a key, for the letters the type column takes.
char PartTypeKey(int k) {
  switch (k) {
  case 'a':
  case 'A':
    return 'A';
  case 'c':
  case 'C':
    return 'C';
  case 'x':
  case 'X':
    return 'X';
  case 'u':
  case 'U':
    return 'U';
  default:
    return 0;
  }
}

bool EndsWithSide(const std::string& upper, char side) {
  if (upper.size() < 3) return false;
  const std::string tail = upper.substr(upper.size() - 3);
  return tail[0] == side && (tail[1] == '/' || tail[1] == '\\') && tail[2] == 'H';
}

bool BeginsWithSide(const std::string& upper, char side) {
  return upper.size() >= 4 && upper[0] == side && (upper[1] == '/' || upper[1] == '\\') &&
         upper[2] == 'H' && upper[3] == ' ';
}

} // namespace

std::optional<std::string> SideOfDescription(const std::string& description) {
  if (description.empty()) return std::nullopt;
  const std::string upper = text::UCase(description);
  // The side mark at the end, as the estimator types it ("GUARD L/H"), or
  // in front, as the catalogue puts it ("L/H FRONT GUARD").
  if (EndsWithSide(upper, 'L') || BeginsWithSide(upper, 'L')) return "L";
  if (EndsWithSide(upper, 'R') || BeginsWithSide(upper, 'R')) return "R";
  return "O";
}

double frmParts::MarkupOf(const std::string& letter) const {
  const std::string t = text::UCase(text::Trim(letter));
  if (t.empty()) return mdNewMarkup;
  if (t == "U" || t == "X") return mdUsedMarkup;
  if (t == "C") return mdRecoreMarkup;
  if (t == "A") return mdAfterMarketMarkup;
  return 0;
}

void frmParts::RepriceRow(int row) {
  grid::FlexGrid& g = FGSelectedParts;
  const double unitPrice = text::ParseNumber(g.TextMatrix(row, sel::kUnitPrice)).value_or(0);
  const double markup = MarkupOf(g.TextMatrix(row, sel::kType));
  g.TextMatrix(row, sel::kMarkup, text::FormatNumber(unitPrice * (1 + markup / 100), text::kPrice));
}

// ---- the in-cell editor ----

void frmParts::PlaceCellEditor() {
  grid::FlexGrid& g = FGSelectedParts;
  editor::PlaceOverCurrentCell(T1, g);
  // The drop-down button at the editor's right end, as high as the editor.
  CB1.Move(T1.Left() + T1.Width() - CB1.Width(), T1.Top(), CB1.Width(), T1.Height());
  // The list below the cell, right-aligned with it; above the cell where
  // the window has no room for it below.
  LV1.ColumnWidth(std::max(0, LV1.Width() - 300));
  int listTop = T1.Top() + T1.Height();
  if (listTop + LV1.Height() > ScaleHeight() - 60) listTop = T1.Top() - LV1.Height();
  LV1.Move(T1.Left() + T1.Width() - LV1.Width(), listTop);
  // In the type column the button stays visible beside the editor.
  if (g.Col() == sel::kType) T1.Width(T1.Width() - CB1.Width());
}

void frmParts::PlaceTypeButton() {
  grid::FlexGrid& g = FGSelectedParts;
  CB1.Move(g.Left() + g.CellLeft() + g.CellWidth() - CB1.Width(), g.Top() + g.CellTop(),
           CB1.Width(), g.CellHeight());
}

void frmParts::OpenCellEditor(bool selectAll) {
  if (!T1.Enabled()) return; // view mode
  grid::FlexGrid& g = FGSelectedParts;
  const int c = g.Col();

  PlaceCellEditor();
  T1.Visible(true);
  if (c == sel::kType) {
    T1.MaxLength(1);
    CB1.Visible(true);
  } else {
    T1.MaxLength(0);
  }
  T1.Text(g.Text());
  T1.Alignment(forms::kLeftJustify);
  if (c >= sel::kType && c <= sel::kMarkup) {
    T1.Alignment(forms::kRightJustify);
    editor::PlaceCaret(T1, selectAll);
  } else {
    if (c == sel::kPartNo) T1.Alignment(forms::kRightJustify);
    editor::PlaceCaret(T1, false);
  }
  T1.SetFocus();
}

void frmParts::T1_Change() {
  // The cell always shows what the editor shows, so however the cell is left
  // the typed text stays.
  FGSelectedParts.Text(T1.Text());
}

void frmParts::T1_KeyDown(int& keyCode, int /*shift*/) {
  if (keyCode == keys::kEscape) {
    // Back to the text the cell had when it was entered; the editor stays.
    T1.Text(FGSelectedParts.Tag());
    T1.SelStart(T1.Length());
    return;
  }
  editor::MoveAtTextEdges(T1, FGSelectedParts, keyCode);
}

void frmParts::T1_KeyPress(int& keyAscii) {
  if (meMode != eEdit) return;
  grid::FlexGrid& g = FGSelectedParts;
  mbCellEdited = true;
  switch (keyAscii) {
  case keys::kEnter:
    keyAscii = 0;
    g.Text(T1.Text());
    T1.Visible(false);
    if (FGSelectedParts.CanTakeFocus()) FGSelectedParts.SetFocus();
    MoveToNextCell();
    return;
  case keys::kBack:
  case keys::kTab:
  case keys::kEscape:
    return; // the text box's own handling
  default:
    break;
  }

  switch (g.Col()) {
  case sel::kType:
    // One letter; a space is a new part.
    if (!T1.Text().empty()) {
      keyAscii = 0;
    } else if (const char letter = PartTypeKey(keyAscii)) {
      keyAscii = letter;
    } else if (keyAscii == keys::kSpace) {
      g.Text("");
      T1.Text("");
    } else {
      keyAscii = 0;
    }
    break;
  case sel::kQty:
    if (!IsDigit(keyAscii) && keyAscii != keys::kSpace) keyAscii = 0;
    break;
  case sel::kUnitPrice:
  case sel::kMarkup:
    if (!IsDigit(keyAscii) && keyAscii != '.' && keyAscii != keys::kSpace) keyAscii = 0;
    break;
  default:
    break;
  }
}

// ---- moving ----

void frmParts::MoveToNextCell() {
  grid::FlexGrid& g = FGSelectedParts;
  editor::RedrawSuspended suspended(g);
  const int r = g.Row();
  const int c = g.Col();
  if (c < sel::kReport)
    g.Col(c + 1);
  else if (r < g.Rows() - 1)
    g.SetCurrentCell(r + 1, sel::kItemNo);
}

// ---- the grid's events ----

void frmParts::FGSelectedParts_EnterCell() {
  if (!Visible()) return;
  grid::FlexGrid& g = FGSelectedParts;
  T1.Visible(false);
  CB1.Visible(false);
  LV1.Visible(false);
  g.Tag(g.Text());
  const int r = g.Row();
  const int c = g.Col();
  if (r >= 1) {
    g.CellBackColor(grid::kYellow);
    if (c == sel::kReport)
      g.ToolTipText("Report Only: " + editor::FlagGlyphToYesNo(g.Text()));
    else
      g.ToolTipText(g.Text());
  }
  if (c == sel::kType) {
    g.CellAlignment(grid::kAlignLeftCenter);
    PlaceTypeButton();
    CB1.Visible(true);
  }
  if (FGSelectedParts.CanTakeFocus()) FGSelectedParts.SetFocus();
}

void frmParts::FGSelectedParts_LeaveCell() {
  grid::FlexGrid& g = FGSelectedParts;
  const int r = g.Row();
  const int c = g.Col();
  if (meMode == eEdit && Visible() && g.Visible() && r >= 1 &&
      !text::Trim(g.TextMatrix(r, sel::kItemNo)).empty()) {
    switch (c) {
    case sel::kDescription:
      if (auto side = SideOfDescription(g.TextMatrix(r, sel::kDescription)))
        g.TextMatrix(r, sel::kSide, *side);
      break;
    case sel::kType:
      if (mbCellEdited) RepriceRow(r);
      break;
    case sel::kQty:
      if (!text::IsNumeric(g.Text())) g.Text("0");
      break;
    case sel::kUnitPrice: {
      const std::string formatted = text::Format(g.Text(), text::kHours);
      g.Text(text::IsNumeric(formatted) ? formatted : "0.00");
      if (mbCellEdited) RepriceRow(r);
      break;
    }
    case sel::kMarkup: {
      const std::string formatted = text::Format(g.Text(), text::kPrice);
      g.Text(text::IsNumeric(formatted) ? formatted : "0.00");
      break;
    }
    default:
      break;
    }
  }
  if (r >= 1) {
    // The type cell was left-aligned for the drop-down button.
    if (c == sel::kType) g.CellAlignment(grid::kAlignRightCenter);
    g.CellBackColor(grid::kWhite);
  }
  mbCellEdited = false;
}

void frmParts::FGSelectedParts_GotFocus() {
  grid::FlexGrid& g = FGSelectedParts;
  if (g.Row() >= 1) g.CellBackColor(grid::kYellow);
}

void frmParts::FGSelectedParts_LostFocus() {
  grid::FlexGrid& g = FGSelectedParts;
  if (g.Row() >= 1) g.CellBackColor(grid::kWhite);
}

void frmParts::FGSelectedParts_Scroll() {
  T1.Visible(false);
  CB1.Visible(false);
  LV1.Visible(false);
  if (FGSelectedParts.CanTakeFocus()) FGSelectedParts.SetFocus();
}

void frmParts::ToggleReportFlag() {
  grid::FlexGrid& g = FGSelectedParts;
  g.Text(editor::ToggleFlagGlyph(g.Text()));
  FGSelectedParts_EnterCell(); // the tool tip follows the tick
}

void frmParts::FGSelectedParts_DblClick() {
  grid::FlexGrid& g = FGSelectedParts;
  if (meMode != eEdit || g.Row() < 1) return;
  const int c = g.Col();
  if (IsEditable(c)) {
    OpenCellEditor(true);
    if (T1.Enabled() && c == sel::kType) DropPartTypeList(T1.Text());
  } else if (c == sel::kReport) {
    ToggleReportFlag();
  }
}

void frmParts::FGSelectedParts_KeyDown(int& keyCode, int shift) {
  grid::FlexGrid& g = FGSelectedParts;
  if (shift & forms::kCtrlMask) return;
  if (meMode != eEdit || keyCode != keys::kF2 || g.Row() < 1 || !IsEditable(g.Col())) return;
  OpenCellEditor(false);
  if (g.Col() == sel::kType) DropPartTypeList(text::Trim(T1.Text()));
}

void frmParts::FGSelectedParts_KeyPress(int& keyAscii) {
  grid::FlexGrid& g = FGSelectedParts;
  if (meMode != eEdit || g.Row() < 1) return;
  const int c = g.Col();
  switch (keyAscii) {
  case keys::kBack:
    if (!IsEditable(c)) return;
    if (!g.Text().empty()) g.Text(editor::DropLastCharacter(g.Text()));
    OpenCellEditor(false);
    return;
  case keys::kTab:
  case keys::kEscape:
    return;
  case keys::kEnter:
    MoveToNextCell();
    return;
  default:
    break;
  }
  if (c == sel::kReport && keyAscii == keys::kSpace) {
    ToggleReportFlag();
    return;
  }
  if (!IsEditable(c)) return;

  // A typed character replaces the cell's text and the editor goes on from
  // it; a character the column does not take is dropped.
  mbCellEdited = true;
  auto typeAs = [&](const std::string& typed) {
    g.Text(typed);
    T1.Text(typed);
    OpenCellEditor(false);
  };
  switch (c) {
  case sel::kType:
    if (const char letter = PartTypeKey(keyAscii))
      typeAs(std::string(1, letter));
    else if (keyAscii == keys::kSpace)
      typeAs("");
    break;
  case sel::kQty:
  case sel::kUnitPrice:
  case sel::kMarkup:
    if (IsDigit(keyAscii) || (keyAscii == '.' && c != sel::kQty)) {
      typeAs(std::string(1, static_cast<char>(keyAscii)));
    } else if (keyAscii == keys::kSpace) {
      g.Text("");
      OpenCellEditor(false);
    }
    break;
  default:
    // Item number, description, part number: any character but a control
    // character.
    if (keyAscii < keys::kSpace || keyAscii == 127) return;
    typeAs(forms::utf8::Encode(static_cast<char32_t>(keyAscii)));
    break;
  }
}

void frmParts::FGSelectedParts_MouseDown(int button, int /*shift*/, int /*x*/, int /*y*/) {
  if (button != forms::kRightButton) return;
  grid::FlexGrid& g = FGSelectedParts;
  const int mr = g.MouseRow();
  const int mc = g.MouseCol();
  if (mr < 0 || mc < 0) return;
  // The header row or the item number column: the nearest data cell.
  if (mr == 0 || mc == 0) g.SetCurrentCell(mr == 0 ? 1 : mr, mc == 0 ? 1 : mc);
}

} // namespace belvane::parts
