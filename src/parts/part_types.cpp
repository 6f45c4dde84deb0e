// frmParts: the part-type list LV1 with its drop-down button CB1, from
// which the estimator picks new, used, exchange, recore or after-market for
// the current part (repricing it with that type's markup), and the Delete
// button, which removes a part and remembers its stored record for the
// writer.

#include "editor/deletion_history.hpp"
#include "editor/grid_layout.hpp"
#include "editor/quote_items.hpp"
#include "forms/keys.hpp"
#include "parts/frm_parts.hpp"
#include "text/number.hpp"
#include "text/strings.hpp"

#include <string>

namespace belvane::parts {

namespace sel = col::sel;

int PartTypeItem(const std::string& letter) {
  for (int i = 0; i < kPartTypeCount; ++i)
    if (letter == kPartTypeLetters[i]) return i + 1;
  return 0;
}

void frmParts::DropPartTypeList(const std::string& letter) {
  LV1.SelectItem(PartTypeItem(letter));
  LV1.Visible(true);
  LV1.SetFocus();
}

void frmParts::CB1_Click() {
  // The cell's text is the editor's whenever the editor is shown; the cell
  // is read so that a hidden editor's old text never picks the item.
  const std::string letter = FGSelectedParts.Text();
  if (!LV1.Visible() && !letter.empty()) LV1.SelectItem(PartTypeItem(letter));
  LV1.Visible(!LV1.Visible());
  OpenCellEditor(false);
  if (LV1.Visible() && LV1.CanTakeFocus())
    LV1.SetFocus();
  else if (T1.Visible() && T1.CanTakeFocus())
    T1.SetFocus();
}

void frmParts::CommitPartType() {
  grid::FlexGrid& g = FGSelectedParts;
  const int i = LV1.SelectedIndex();
  if (i >= 1 && i <= kPartTypeCount) {
    const std::string letter = kPartTypeLetters[i - 1];
    T1.Text(letter);
    // The chosen type's markup applies whether or not the price was edited.
    const int r = g.Row();
    const double unitPrice = text::ParseNumber(g.TextMatrix(r, sel::kUnitPrice)).value_or(0);
    g.TextMatrix(r, sel::kMarkup,
                 text::FormatNumber(unitPrice * (1 + MarkupOf(letter) / 100), text::kPrice));
  }
  g.Text(T1.Text());
  // The grid takes the focus before the editor and the list go, so the
  // keyboard stays on the part; the current cell (and CB1) stay.
  if (FGSelectedParts.CanTakeFocus()) FGSelectedParts.SetFocus();
  T1.Visible(false);
  LV1.Visible(false);
}

void frmParts::LV1_KeyPress(int& keyAscii) {
  int item = 0;
  switch (keyAscii) {
  case forms::keys::kEnter:
    keyAscii = 0;
    CommitPartType();
    return;
  case forms::keys::kEscape:
    keyAscii = 0;
    LV1.Visible(false);
    if (T1.CanTakeFocus()) T1.SetFocus();
    return;
  case forms::keys::kSpace:
    item = 1;
    break;
  case 'U':
  case 'u':
    item = 2;
    break;
  case 'X':
  case 'x':
    item = 3;
    break;
  case 'C':
  case 'c':
    item = 4;
    break;
  case 'A':
  case 'a':
    item = 5;
    break;
  default:
    keyAscii = 0; // a key the list does not know
    return;
  }
  keyAscii = 0;
  LV1.SelectItem(item);
  CommitPartType();
}

void frmParts::cmdDelete_Click() {
  if (meMode != eEdit || !mrsDeletedItems || FGSelectedParts.Row() < 1) return;
  mHistory.Deleted(DeleteCurrentPart());
}

editor::DeletedRow frmParts::DeleteCurrentPart() {
  grid::FlexGrid& g = FGSelectedParts;
  const int r = g.Row();
  // The writer deletes the stored record of a removed part.
  const std::string id = g.TextMatrix(r, sel::kItemId);
  if (!id.empty()) editor::AddRemovedItem(*mrsDeletedItems, id);
  const bool onlyPart = !(r > 1 || g.Rows() > 2);
  editor::DeletedRow deleted = editor::SnapshotRow(
      g, r, id.empty() ? std::vector<std::string>{} : std::vector{id}, onlyPart);
  if (!onlyPart) {
    g.RemoveItem(r);
    // Left with exactly eleven rows (ten parts), the description takes back
    // the scroll bar's room, as the labour editor's delete does.
    if (g.Rows() == 11)
      g.ColWidth(sel::kDescription, g.ColWidth(sel::kDescription) + editor::kRowStepTwips);
  } else {
    // The only part: its row stays as the empty placeholder.
    for (int c = 0; c < g.Cols(); ++c)
      g.TextMatrix(1, c, "");
  }
  mbCellEdited = false; // what was typed went with the row
  // The cell now current was not entered by a move: take its text as the
  // one Escape restores, its tool tip and highlight, as on entering it.
  FGSelectedParts_EnterCell();
  if (FGSelectedParts.CanTakeFocus()) FGSelectedParts.SetFocus();
  return deleted;
}

void frmParts::UndoDeletion() {
  if (!mHistory.CanUndo() || !mrsDeletedItems) return;
  grid::FlexGrid& g = FGSelectedParts;
  T1.Visible(false);
  const editor::DeletedRow part = mHistory.Undo();
  editor::RestoreRow(g, part);
  if (!part.blanked && g.Rows() == 12)
    g.ColWidth(sel::kDescription, g.ColWidth(sel::kDescription) - editor::kRowStepTwips);
  editor::ForgetRemovedItems(*mrsDeletedItems, part.ids);
  g.SetCurrentCell(part.row, sel::kItemNo);
  FGSelectedParts_EnterCell();
}

void frmParts::RedoDeletion() {
  if (!mHistory.CanRedo() || !mrsDeletedItems) return;
  T1.Visible(false);
  const editor::DeletedRow part = mHistory.Redo();
  FGSelectedParts.SetCurrentCell(part.row, sel::kItemNo);
  mHistory.Redone(DeleteCurrentPart());
}

void frmParts::cmdDelete_GotFocus() { T1.Visible(false); }

} // namespace belvane::parts
