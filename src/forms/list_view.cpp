#include "forms/controls.hpp"
#include "forms/keys.hpp"
#include "text/error.hpp"

namespace belvane::forms {

// ---- ListView ----

ListView::ListView(Form& form, std::string name, int index)
    : ControlOf(form, std::move(name), index, ControlKind::ListView) {
  SetDefaultSize(1815, 1455);
  SetDefaultColors(grid::kWhite, grid::kBlack);
}

int ListView::AddItem(std::string text) {
  items_.push_back(std::move(text));
  NotifyProperty(grid::Property::Items);
  return ItemCount();
}

void ListView::ClearItems() {
  items_.clear();
  selected_ = 0;
  NotifyProperty(grid::Property::Items);
  NotifyProperty(grid::Property::SelectedItem);
}

const std::string& ListView::ItemText(int index) const {
  if (index < 1 || index > ItemCount()) throw Error(kIndexOutOfBounds, "Index out of bounds");
  return items_[static_cast<std::size_t>(index - 1)];
}

void ListView::SelectItem(int index) {
  if (index < 0 || index > ItemCount()) throw Error(kIndexOutOfBounds, "Index out of bounds");
  if (index == selected_) return;
  selected_ = index;
  NotifyProperty(grid::Property::SelectedItem);
}

void ListView::ColumnHeaderText(std::string text) {
  header_ = std::move(text);
  NotifyProperty(grid::Property::ColumnHeader);
}

void ListView::ColumnWidth(int width) {
  if (width < 0) throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  columnWidth_ = width;
  NotifyProperty(grid::Property::ColumnHeader);
}

int ListView::HitTest(int x, int y) const {
  if (x < 0 || x >= Width() || y < kHeaderHeight || y >= Height()) return 0;
  const int index = (y - kHeaderHeight) / kItemHeight + 1;
  return index <= ItemCount() ? index : 0;
}

int ListView::ItemTop(int index) const {
  ItemText(index); // checks the index
  return kHeaderHeight + (index - 1) * kItemHeight;
}

void ListView::ResetState() {
  items_.clear();
  selected_ = 0;
  header_.clear();
  columnWidth_ = 1440;
  ResetCommon();
  NotifyProperty(grid::Property::Items);
  NotifyProperty(grid::Property::SelectedItem);
  NotifyProperty(grid::Property::ColumnHeader);
}

void ListView::DefaultKeyDown(int keyCode, int) {
  if (items_.empty()) return;
  switch (keyCode) {
  case keys::kUp:
    SelectItem(selected_ <= 1 ? 1 : selected_ - 1);
    break;
  case keys::kDown:
    SelectItem(std::min(ItemCount(), selected_ + 1));
    break;
  case keys::kHome:
    SelectItem(1);
    break;
  case keys::kEnd:
    SelectItem(ItemCount());
    break;
  default:
    break;
  }
}

void ListView::DefaultMouseDown(int button, int, int x, int y) {
  if (button != kLeftButton) return;
  const int index = HitTest(x, y);
  if (index == 0) return;
  SelectItem(index);
  if (OnItemClick) OnItemClick(index);
}

} // namespace belvane::forms
