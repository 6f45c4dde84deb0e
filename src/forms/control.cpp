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
