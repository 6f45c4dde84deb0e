// frmLabour: editing the selected lines in place. Hours, description and
// rate cells are edited through the text box T1 laid over the current cell;
// flag cells toggle between their two glyphs. Leaving a cell formats it, the
// Enter key moves to the next cell that can be edited, and Delete removes a
// line (remembering the ids of its stored records for the writer).

#include "editor/cell_editor.hpp"
#include "editor/deletion_history.hpp"
#include "editor/grid_layout.hpp"
#include "editor/quote_items.hpp"
#include "forms/keys.hpp"
#include "forms/utf8.hpp"
#include "labour/frm_labour.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <string>
#include <vector>

namespace belvane::labour {

namespace {

namespace keys = forms::keys;

bool IsFlagColumn(int c) {
  return c == col::kRRReport || c == col::kRAReport || c == col::kPTReport || c == col::kBlend ||
         c == col::kMechanical;
}

bool IsHoursColumn(int c) { return c == col::kRRHours || c == col::kRAHours || c == col::kPTHours; }

// The hours column whose value a flag needs before it can be toggled.
int HoursOfFlag(int flagCol) {
  switch (flagCol) {
  case col::kRRReport:
  case col::kMechanical:
    return col::kRRHours;
  case col::kRAReport:
    return col::kRAHours;
  default:
    return col::kPTHours; // paint report only, blend
  }
}

// The tool tip caption of a flag column.
const char* FlagCaption(int flagCol) {
  switch (flagCol) {
  case col::kRRReport:
    return "RR Report Only: ";
  case col::kRAReport:
    return "RA Report Only: ";
  case col::kPTReport:
    return "PT Report Only: ";
  case col::kBlend:
    return "PT Blend: ";
  default:
    return "Mechanical Item: ";
  }
}

// A character that may go into an hours or rate cell: a digit, the point,
// the minus sign and blank. The decimal separator of the estimator's locale
// is taken too, so a fraction of an hour can be typed where it is not the
// point.
bool IsNumberKey(int keyAscii) {
  if ((keyAscii >= '0' && keyAscii <= '9') || keyAscii == '.' || keyAscii == '-' ||
      keyAscii == keys::kSpace)
    return true;
  const std::string& decimal = text::CurrentNumberLocale().decimal;
  return decimal.size() == 1 && keyAscii == static_cast<unsigned char>(decimal[0]);
}

} // namespace

// ---- the in-cell editor ----

void frmLabour::OpenCellEditor(bool selectAll) {
  grid::FlexGrid& g = FGSelectedLabour;
  if (!T1.Enabled()) return; // view mode
  const int r = g.Row();
  const int c = g.Col();
  // Only the text cells of a data row take the editor; never a grey cell or
  // a rate that has no R&R operation.
  if (r < 1 || !(c <= col::kDescription || IsHoursColumn(c) || c == col::kRate)) return;
  if (IsGrey(g, r, c) || g.Text() == kNoRate) return;

  editor::PlaceOverCurrentCell(T1, g);

  const std::string cellText = g.Text();
  T1.Text(cellText == kDefaultRate ? DefaultRateText() : cellText);
  T1.Alignment(forms::kLeftJustify);
  T1.Visible(true);
  if (IsHoursColumn(c) || c == col::kRate) {
    T1.Alignment(forms::kRightJustify);
    editor::PlaceCaret(T1, selectAll);
  } else {
    editor::PlaceCaret(T1, false);
  }
  T1.SetFocus();
}

void frmLabour::T1_Change() {
  // The cell always shows what the editor shows, so however the cell is left
  // the typed text stays.
  FGSelectedLabour.Text(T1.Text());
}

void frmLabour::T1_KeyDown(int& keyCode, int /*shift*/) {
  if (keyCode == keys::kEscape) {
    // Back to the text the cell had when it was entered; the editor stays.
    const std::string& onEntry = FGSelectedLabour.Tag();
    T1.Text(onEntry == kDefaultRate ? DefaultRateText() : onEntry);
    T1.SelStart(T1.Length());
    return;
  }
  editor::MoveAtTextEdges(T1, FGSelectedLabour, keyCode);
}

void frmLabour::T1_KeyPress(int& keyAscii) {
  if (meMode != eEdit) return;
  grid::FlexGrid& g = FGSelectedLabour;
  const int r = g.Row();
  const int c = g.Col();

  if (keyAscii == keys::kEnter) {
    keyAscii = 0;
    g.Text(T1.Text());
    const bool empty = text::Trim(T1.Text()).empty();
    if ((c == col::kRRHours || c == col::kRAHours) && empty) {
      // No hours, so the operation cannot be report only.
      g.TextMatrix(r, c + 1, kUnticked);
    } else if (c == col::kPTHours && empty) {
      g.TextMatrix(r, col::kPTReport, kUnticked);
      g.TextMatrix(r, col::kBlend, kUnticked);
    } else if (c == col::kRate) {
      ApplyRateRule(r);
    }
    T1.Visible(false);
    FGSelectedLabour.SetFocus();
    MoveToNextCell();
    return;
  }

  if (IsHoursColumn(c) && keyAscii != keys::kBack && keyAscii != keys::kEscape &&
      !IsNumberKey(keyAscii))
    keyAscii = 0; // hours take numbers only
}

// ---- formatting the cell that is left ----

void frmLabour::ApplyRateRule(int row) {
  grid::FlexGrid& g = FGSelectedLabour;
  const std::string rate = g.TextMatrix(row, col::kRate);
  if (rate == kNoRate || rate == kDefaultRate) {
    // The markers keep their text; they are always shown in italics.
    g.CellFontItalicAt(row, col::kRate, true);
    return;
  }
  const std::string formatted = text::Format(rate, text::kHours);
  if (text::Trim(rate).empty() || formatted == DefaultRateText()) {
    g.TextMatrix(row, col::kRate, kDefaultRate);
    g.CellFontItalicAt(row, col::kRate, true);
  } else {
    g.TextMatrix(row, col::kRate, formatted);
    g.CellFontItalicAt(row, col::kRate, false);
  }
}

void frmLabour::CommitCellText() {
  grid::FlexGrid& g = FGSelectedLabour;
  const int r = g.Row();
  const int c = g.Col();
  if (r < 1) return;
  if (IsHoursColumn(c)) {
    const std::string trimmed = text::Trim(g.Text());
    const std::string hours = trimmed.empty() ? trimmed : text::Format(trimmed, text::kHours);
    g.Text(hours);
    if (c == col::kRRHours) {
      // R&R hours make the line's rate apply; no R&R hours, no rate.
      if (hours.empty()) {
        g.TextMatrix(r, col::kRate, kNoRate);
        g.CellFontItalicAt(r, col::kRate, true);
      } else if (const std::string rate = g.TextMatrix(r, col::kRate);
                 rate == kNoRate || text::Trim(rate).empty()) {
        // R&R hours on a line without a rate (one typed by hand) take the
        // session's rate, which is what the write-back stores.
        g.TextMatrix(r, col::kRate, kDefaultRate);
        g.CellFontItalicAt(r, col::kRate, true);
      }
    }
  } else if (c == col::kRate) {
    ApplyRateRule(r);
  }
}

// ---- moving ----

void frmLabour::MoveToNextCell() {
  grid::FlexGrid& g = FGSelectedLabour;
  editor::RedrawSuspended suspended(g);
  const int r = g.Row();
  const int c = g.Col();
  const int lastRow = g.Rows() - 1;
  if (c < col::kAllow) {
    int next = c + 1;
    while (next < col::kAllow && IsGrey(g, r, next))
      ++next;
    if (next < col::kAllow)
      g.Col(next);
    else if (r < lastRow)
      g.SetCurrentCell(r + 1, col::kItemNo);
    else
      g.Col(col::kAllow); // the last row ends on "Allow"
  } else if (r < lastRow) {
    g.SetCurrentCell(r + 1, col::kItemNo);
  }
}

// ---- the grid's events ----

void frmLabour::FGSelectedLabour_EnterCell() {
  if (!Visible()) return;
  grid::FlexGrid& g = FGSelectedLabour;
  T1.Visible(false);
  g.Tag(g.Text());
  const int r = g.Row();
  const int c = g.Col();
  if (IsGrey(g, r, c)) {
    // Hiding the editor took the focus away; the grid keeps it.
    if (!ActiveControl() && FGSelectedLabour.CanTakeFocus()) FGSelectedLabour.SetFocus();
    return;
  }
  if (r >= 1) {
    g.CellBackColor(grid::kYellow);
    if (IsFlagColumn(c))
      g.ToolTipText(FlagCaption(c) + editor::FlagGlyphToYesNo(g.Text()));
    else
      g.ToolTipText(g.Text());
  }
  if (FGSelectedLabour.CanTakeFocus()) FGSelectedLabour.SetFocus();
}

void frmLabour::FGSelectedLabour_LeaveCell() {
  if (!Visible()) return;
  grid::FlexGrid& g = FGSelectedLabour;
  CommitCellText();
  if (g.Row() >= 1 && !IsGrey(g, g.Row(), g.Col())) g.CellBackColor(grid::kWhite);
}

void frmLabour::FGSelectedLabour_LostFocus() {
  grid::FlexGrid& g = FGSelectedLabour;
  if (g.Row() >= 1 && !IsGrey(g, g.Row(), g.Col())) g.CellBackColor(grid::kWhite);
  // The focus going to the editor laid over this very cell does not leave
  // the cell: its text is formatted when the editor closes, not before the
  // estimator has typed.
  if (ActiveControl() == &T1) return;
  FGSelectedLabour_LeaveCell();
}

void frmLabour::FGSelectedLabour_GotFocus() {
  grid::FlexGrid& g = FGSelectedLabour;
  if (g.Row() >= 1 && !IsGrey(g, g.Row(), g.Col())) g.CellBackColor(grid::kYellow);
}

void frmLabour::FGSelectedLabour_Scroll() {
  T1.Visible(false);
  if (FGSelectedLabour.CanTakeFocus()) FGSelectedLabour.SetFocus();
}

void frmLabour::FGSelectedLabour_DblClick() {
  grid::FlexGrid& g = FGSelectedLabour;
  const int r = g.Row();
  const int c = g.Col();
  if (meMode != eEdit || r < 1 || c > col::kMechanical || IsGrey(g, r, c)) return;
  if (IsFlagColumn(c)) {
    if (text::IsNumeric(g.TextMatrix(r, HoursOfFlag(c)))) {
      g.Text(editor::ToggleFlagGlyph(g.Text()));
      FGSelectedLabour_EnterCell();
    }
    return;
  }
  OpenCellEditor(true);
}

void frmLabour::FGSelectedLabour_KeyDown(int& keyCode, int shift) {
  grid::FlexGrid& g = FGSelectedLabour;
  const int r = g.Row();
  const int c = g.Col();
  if (meMode != eEdit || (shift & forms::kCtrlMask)) return;
  if (keyCode != keys::kF2) return;
  if (r < 1 || c > col::kMechanical || IsGrey(g, r, c) || IsFlagColumn(c)) return;
  OpenCellEditor(IsHoursColumn(c));
}

void frmLabour::FGSelectedLabour_KeyPress(int& keyAscii) {
  grid::FlexGrid& g = FGSelectedLabour;
  const int r = g.Row();
  const int c = g.Col();
  if (meMode != eEdit || r < 1 || IsGrey(g, r, c)) return;

  switch (keyAscii) {
  case keys::kBack: {
    if (c > col::kMechanical || IsFlagColumn(c)) return;
    const std::string cellText = g.Text();
    if (cellText == kNoRate) return; // no R&R operation, nothing to edit
    // The default rate is edited as its number.
    const std::string value = cellText == kDefaultRate ? DefaultRateText() : cellText;
    if (!value.empty()) g.Text(editor::DropLastCharacter(value));
    OpenCellEditor(false);
    return;
  }
  case keys::kTab:
  case keys::kEscape:
    return;
  case keys::kEnter:
    MoveToNextCell();
    return;
  default:
    break;
  }

  if (c == col::kItemNo || c == col::kDescription) {
    // A typed character starts the text afresh; control characters type
    // nothing.
    if (keyAscii < keys::kSpace || keyAscii == 127) return;
    g.Text(forms::utf8::Encode(static_cast<char32_t>(keyAscii)));
    OpenCellEditor(false);
  } else if (IsHoursColumn(c) || (c == col::kRate && g.Text() != kNoRate)) {
    if (!IsNumberKey(keyAscii)) return;
    const std::string typed(1, static_cast<char>(keyAscii));
    g.Text(typed);
    T1.Text(typed);
    OpenCellEditor(false);
  } else if (IsFlagColumn(c) && keyAscii == keys::kSpace) {
    if (!text::IsNumeric(g.TextMatrix(r, HoursOfFlag(c)))) return;
    g.Text(editor::ToggleFlagGlyph(g.Text()));
    FGSelectedLabour_EnterCell();
  }
}

// ---- buttons ----

void frmLabour::cmdDelete_Click() {
  if (meMode != eEdit || !mrsDeletedItems || FGSelectedLabour.Row() < 1) return;
  mHistory.Deleted(DeleteCurrentLine());
}

editor::DeletedRow frmLabour::DeleteCurrentLine() {
  grid::FlexGrid& g = FGSelectedLabour;
  const int r = g.Row();

  // The row's stored records are deleted by the writer; every id is checked
  // before any is recorded, so a bad id records none of them.
  std::vector<std::string> ids;
  for (int c : {col::kItemId1, col::kItemId2, col::kItemId3}) {
    const std::string id = g.TextMatrix(r, c);
    if (id.empty()) continue;
    (void)data::Value(id).ConvertTo(data::DataType::Integer);
    ids.push_back(id);
  }
  for (const std::string& id : ids)
    editor::AddRemovedItem(*mrsDeletedItems, id);

  const bool onlyLine = r <= 1 && g.Rows() < 3;
  editor::DeletedRow deleted = editor::SnapshotRow(g, r, ids, onlyLine);
  if (onlyLine) {
    // The only item: its row stays as the empty placeholder.
    for (int c = 0; c < g.Cols(); ++c)
      g.TextMatrix(1, c, "");
  } else {
    g.RemoveItem(r);
    if (g.Rows() == 11)
      g.ColWidth(col::kDescription, g.ColWidth(col::kDescription) + editor::kRowStepTwips);
  }
  // The cell now current was not entered by a move: take its text as the one
  // Escape restores, its tool tip and highlight, as on entering it.
  FGSelectedLabour_EnterCell();
  if (FGSelectedLabour.CanTakeFocus()) FGSelectedLabour.SetFocus();
  return deleted;
}

void frmLabour::UndoDeletion() {
  if (!mHistory.CanUndo() || !mrsDeletedItems) return;
  grid::FlexGrid& g = FGSelectedLabour;
  T1.Visible(false);
  const editor::DeletedRow line = mHistory.Undo();
  editor::RestoreRow(g, line);
  if (!line.blanked && g.Rows() == 12)
    g.ColWidth(col::kDescription, g.ColWidth(col::kDescription) - editor::kRowStepTwips);
  editor::ForgetRemovedItems(*mrsDeletedItems, line.ids);
  g.SetCurrentCell(line.row, col::kItemNo);
  FGSelectedLabour_EnterCell();
}

void frmLabour::RedoDeletion() {
  if (!mHistory.CanRedo() || !mrsDeletedItems) return;
  T1.Visible(false);
  const editor::DeletedRow line = mHistory.Redo();
  FGSelectedLabour.SetCurrentCell(line.row, col::kItemNo);
  mHistory.Redone(DeleteCurrentLine());
}

void frmLabour::HideEditorOnFocus() {
  T1.Visible(false);
  // The editor may have been closed without its cell being left (the focus
  // went straight from T1 to a button, or a schedule change hid it): format
  // that cell now, so what Close writes back is what the estimator sees.
  if (Visible()) CommitCellText();
}

} // namespace belvane::labour
