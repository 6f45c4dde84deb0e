#include "forms/control.hpp"

#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "text/error.hpp"

namespace belvane::forms {

Control::Control(Form& form, std::string name, int index, ControlKind kind,
                 grid::ControlModel& model)
    : form_(&form), name_(std::move(name)), index_(index), kind_(kind), model_(model),
      tabIndex_(static_cast<int>(form.Controls().size())) {
  form.Register(this);
}

Control::~Control() { form_->Unregister(this); }

void Control::Container(Frame* frame) {
  container_ = frame;
  AvailabilityChanged();
}

void Control::TabIndex(int index) { tabIndex_ = index; }

void Control::TabStop(bool tabStop) { tabStop_ = tabStop; }

namespace {

const std::string* CaptionOf(const Control& control) {
  switch (control.Kind()) {
  case ControlKind::Label:
    return &static_cast<const Label&>(control).Caption();
  case ControlKind::CommandButton:
    return &static_cast<const CommandButton&>(control).Caption();
  case ControlKind::CheckBox:
    return &static_cast<const CheckBox&>(control).Caption();
  case ControlKind::OptionButton:
    return &static_cast<const OptionButton&>(control).Caption();
  case ControlKind::Frame:
    return &static_cast<const Frame&>(control).Caption();
  default:
    return nullptr;
  }
}

char32_t KeyOf(char32_t c) {
  if (c >= 'a' && c <= 'z') return c - 'a' + 'A';
  if ((c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9')) return c;
  return 0;
}

} // namespace

char32_t Control::AccessKey() const {
  if (accessKey_ != 0) return accessKey_;
  const std::string* caption = CaptionOf(*this);
  if (!caption) return 0;
  // "&&" shows an ampersand; a single "&" marks the letter after it.
  for (std::size_t i = 0; i + 1 < caption->size(); ++i) {
    if ((*caption)[i] != '&') continue;
    if ((*caption)[i + 1] == '&') {
      ++i;
      continue;
    }
    return KeyOf(static_cast<unsigned char>((*caption)[i + 1]));
  }
  return 0;
}

void Control::AccessKey(char32_t key) {
  const char32_t normal = KeyOf(key);
  if (key != 0 && normal == 0) throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  accessKey_ = normal;
}

bool Control::IsShown() const { return model_.Visible() && (!container_ || container_->IsShown()); }

bool Control::IsEnabled() const {
  return model_.Enabled() && (!container_ || container_->IsEnabled());
}

bool Control::CanTakeFocus() const {
  return TakesFocus() && form_->Loaded() && form_->Visible() && IsShown() && IsEnabled();
}

bool Control::HasFocus() const noexcept { return form_->ActiveControl() == this; }

void Control::SetFocus() {
  if (HasFocus()) return;
  if (!CanTakeFocus())
    throw Error(err::kInvalidCall,
                "Invalid procedure call or argument: " + name_ + " cannot take the focus");
  form_->MoveFocus(this);
}

void Control::UserClick() { RaiseClick(); }

void Control::AvailabilityChanged() { form_->ControlAvailabilityChanged(*this); }

} // namespace belvane::forms
