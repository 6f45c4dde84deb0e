#include "editor/window_layout.hpp"

#include <algorithm>
#include <cmath>

namespace belvane::editor {

namespace {
int Share(int room, double share) {
  return static_cast<int>(std::lround(static_cast<double>(room) * share));
}
} // namespace

void WindowLayout::Capture(const forms::Form& form, std::vector<Stretch> stretches,
                           std::vector<WideningColumn> columns) {
  designWidth_ = form.ScaleWidth();
  designHeight_ = form.ScaleHeight();
  extraWidth_ = 0;
  extraHeight_ = 0;
  placed_.clear();
  for (const Stretch& s : stretches) {
    const grid::ControlModel& m = s.control->Model();
    placed_.push_back({s, m.Left(), m.Top(), m.Width(), m.Height()});
  }
  columns_ = std::move(columns);
}

void WindowLayout::Apply(const forms::Form& form) {
  const int dx = std::max(0, form.ScaleWidth() - designWidth_);
  const int dy = std::max(0, form.ScaleHeight() - designHeight_);
  // The widening columns take the change of width since the last layout:
  // a grid laid out again meanwhile fills its width as it is by then.
  const int widened = dx - extraWidth_;
  extraWidth_ = dx;
  extraHeight_ = dy;
  for (const Placed& p : placed_) {
    const Stretch& s = p.stretch;
    s.control->Model().Move(p.left + Share(dx, s.moveX), p.top + Share(dy, s.moveY),
                            p.width + Share(dx, s.growX), p.height + Share(dy, s.growY));
  }
  if (widened == 0) return;
  for (const WideningColumn& c : columns_)
    if (c.col < c.grid->Cols())
      c.grid->ColWidth(c.col, std::max(0, c.grid->ColWidth(c.col) + widened));
}

} // namespace belvane::editor
