#include "grid/control_model.hpp"

#include "text/error.hpp"

#include <utility>

namespace belvane::grid {

namespace {
// Stacking keys grow per thread: the models of one thread's forms are only
// ever compared with each other.
thread_local long long zCounter = 0;

void CheckSize(int value) {
  if (value < 0) throw Error(kInvalidPropertyValue, "Invalid property value");
}
} // namespace

ControlModel::ControlModel() = default;

void ControlModel::Left(int left) { Move(left, state_.top); }
void ControlModel::Top(int top) { Move(state_.left, top); }
void ControlModel::Width(int width) {
  CheckSize(width);
  Move(state_.left, state_.top, width);
}
void ControlModel::Height(int height) {
  CheckSize(height);
  Move(state_.left, state_.top, state_.width, height);
}

void ControlModel::Move(int left, int top, int width, int height) {
  if (width < 0) width = state_.width;
  if (height < 0) height = state_.height;
  if (left == state_.left && top == state_.top && width == state_.width && height == state_.height)
    return;
  state_.left = left;
  state_.top = top;
  state_.width = width;
  state_.height = height;
  NotifyProperty(Property::Geometry);
}

void ControlModel::Visible(bool visible) {
  if (visible == state_.visible) return;
  state_.visible = visible;
  NotifyProperty(Property::Visible);
  VisibleChanged();
}

void ControlModel::Enabled(bool enabled) {
  if (enabled == state_.enabled) return;
  state_.enabled = enabled;
  NotifyProperty(Property::Enabled);
  EnabledChanged();
}

void ControlModel::Tag(std::string tag) {
  state_.tag = std::move(tag);
  NotifyProperty(Property::Tag);
}

void ControlModel::ToolTipText(std::string text) {
  if (text == state_.toolTip) return;
  state_.toolTip = std::move(text);
  NotifyProperty(Property::ToolTipText);
}

void ControlModel::FontName(std::string name) {
  state_.fontName = std::move(name);
  NotifyProperty(Property::Font);
}
void ControlModel::FontSize(double points) {
  if (!(points > 0)) throw Error(kInvalidPropertyValue, "Invalid property value");
  state_.fontSize = points;
  NotifyProperty(Property::Font);
}
void ControlModel::FontBold(bool bold) {
  state_.fontBold = bold;
  NotifyProperty(Property::Font);
}
void ControlModel::FontItalic(bool italic) {
  state_.fontItalic = italic;
  NotifyProperty(Property::Font);
}

void ControlModel::BackColor(Color color) {
  if (color == state_.backColor) return;
  state_.backColor = color;
  NotifyProperty(Property::BackColor);
}
void ControlModel::ForeColor(Color color) {
  if (color == state_.foreColor) return;
  state_.foreColor = color;
  NotifyProperty(Property::ForeColor);
}

void ControlModel::ZOrder(int position) {
  if (position != 0 && position != 1) throw Error(kInvalidPropertyValue, "Invalid property value");
  ++zCounter;
  state_.zKey = position == 0 ? zCounter : -zCounter;
  NotifyProperty(Property::ZOrder);
}

void ControlModel::AnnounceFocus(bool hasFocus) {
  Notify([hasFocus](ModelObserver& o) { o.FocusChanged(hasFocus); });
}

void ControlModel::SetDefaultSize(int width, int height) {
  defaults_.width = width;
  defaults_.height = height;
  state_.width = width;
  state_.height = height;
}

void ControlModel::SetDefaultColors(Color back, Color fore) {
  defaults_.backColor = back;
  defaults_.foreColor = fore;
  state_.backColor = back;
  state_.foreColor = fore;
}

void ControlModel::ResetCommon() {
  const bool wasVisible = state_.visible;
  const bool wasEnabled = state_.enabled;
  state_ = defaults_;
  Notify([](ModelObserver& o) {
    for (Property p :
         {Property::Visible, Property::Enabled, Property::Geometry, Property::ZOrder, Property::Tag,
          Property::ToolTipText, Property::Font, Property::BackColor, Property::ForeColor})
      o.PropertyChanged(p);
  });
  if (wasVisible != state_.visible) VisibleChanged();
  if (wasEnabled != state_.enabled) EnabledChanged();
}

} // namespace belvane::grid
