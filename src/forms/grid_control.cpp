// The grid as a control: the user's keys and clicks move its current cell.
#include "forms/controls.hpp"
#include "forms/keys.hpp"

namespace belvane::forms {

// ---- FlexGrid ----

FlexGrid::FlexGrid(Form& form, std::string name, int index)
    : ControlOf(form, std::move(name), index, ControlKind::FlexGrid) {}

void FlexGrid::ResetState() { Reset(); }

void FlexGrid::DefaultKeyDown(int keyCode, int shift) { NavigateByKey(keyCode, shift); }

void FlexGrid::PointerAt(int x, int y) { MouseMove(x, y); }

void FlexGrid::DefaultMouseDown(int button, int, int, int) {
  if (button != kLeftButton || MouseRow() < FixedRows() || MouseCol() < 0) return;
  SetCurrentCell(MouseRow(), MouseCol());
  EnsureVisible(Row(), Col());
}

} // namespace belvane::forms
