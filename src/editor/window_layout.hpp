#pragma once
// Laying a sizable editor window out for its size. At the design size every
// control keeps its design rectangle to the twip; a larger window shares out
// the room it gained: each control moves and grows by its own shares of the
// extra width and height, and each grid named as widening gives its extra
// width to one column (the description), so the other columns keep theirs.
// The window never lays out smaller than its design.

#include "forms/control.hpp"
#include "forms/form.hpp"
#include "grid/flex_grid.hpp"

#include <vector>

namespace belvane::editor {

// The shares of the extra width (x) and height (y) by which a control moves
// (its left or top edge) and grows.
struct Stretch {
  forms::Control* control;
  double moveX = 0;
  double moveY = 0;
  double growX = 0;
  double growY = 0;
};

// A grid that takes its extra width in one column.
struct WideningColumn {
  grid::FlexGrid* grid;
  int col;
};

class WindowLayout {
public:
  // Remembers the form's client size and each control's rectangle as they
  // are now: the design, so call it once the form has loaded.
  void Capture(const forms::Form& form, std::vector<Stretch> stretches,
               std::vector<WideningColumn> columns);
  // Lays the controls out for the form's client size.
  void Apply(const forms::Form& form);

  // The extra width and height the layout gives now (0 at the design size).
  int ExtraWidth() const noexcept { return extraWidth_; }
  int ExtraHeight() const noexcept { return extraHeight_; }

private:
  struct Placed {
    Stretch stretch;
    int left, top, width, height;
  };
  std::vector<Placed> placed_;
  std::vector<WideningColumn> columns_;
  int designWidth_ = 0;
  int designHeight_ = 0;
  int extraWidth_ = 0;
  int extraHeight_ = 0;
};

} // namespace belvane::editor
