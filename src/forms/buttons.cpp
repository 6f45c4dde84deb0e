// Label, CommandButton, CheckBox, OptionButton and Frame.
#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/keys.hpp"
#include "text/error.hpp"

namespace belvane::forms {

namespace {
void CheckJustify(int alignment) {
  if (alignment < kLeftJustify || alignment > kCenter)
    throw Error(grid::kInvalidPropertyValue, "Invalid property value");
}
} // namespace

// ---- Label ----

Label::Label(Form& form, std::string name, int index)
    : ControlOf(form, std::move(name), index, ControlKind::Label) {
  SetDefaultSize(1215, 255);
  SetDefaultColors(grid::kButtonFace, grid::kBlack);
}

void Label::Caption(std::string caption) {
  caption_ = std::move(caption);
  NotifyProperty(grid::Property::Caption);
}

void Label::Alignment(int alignment) {
  CheckJustify(alignment);
  alignment_ = alignment;
  NotifyProperty(grid::Property::Alignment);
}

void Label::ResetState() {
  caption_.clear();
  alignment_ = kLeftJustify;
  ResetCommon();
  NotifyProperty(grid::Property::Caption);
  NotifyProperty(grid::Property::Alignment);
}

// ---- CommandButton ----

CommandButton::CommandButton(Form& form, std::string name, int index)
    : ControlOf(form, std::move(name), index, ControlKind::CommandButton) {
  SetDefaultSize(1215, 375);
  SetDefaultColors(grid::kButtonFace, grid::kBlack);
}

void CommandButton::Caption(std::string caption) {
  caption_ = std::move(caption);
  NotifyProperty(grid::Property::Caption);
}

void CommandButton::Picture(std::string name) {
  picture_ = std::move(name);
  NotifyProperty(grid::Property::Picture);
}

void CommandButton::ResetState() {
  caption_.clear();
  picture_.clear();
  NotifyProperty(grid::Property::Picture);
  spaceDown_ = false;
  ResetCommon();
  NotifyProperty(grid::Property::Caption);
}

// A button is pressed by Space (on release) and by Enter.
void CommandButton::DefaultKeyDown(int keyCode, int) {
  if (keyCode == keys::kSpace) spaceDown_ = true;
}

void CommandButton::DefaultKeyPress(int keyAscii) {
  if (keyAscii == keys::kEnter) UserClick();
}

void CommandButton::DefaultKeyUp(int keyCode, int) {
  if (keyCode == keys::kSpace && spaceDown_) {
    spaceDown_ = false;
    UserClick();
  }
}

// ---- CheckBox ----

CheckBox::CheckBox(Form& form, std::string name, int index)
    : ControlOf(form, std::move(name), index, ControlKind::CheckBox) {
  SetDefaultSize(1215, 255);
  SetDefaultColors(grid::kButtonFace, grid::kBlack);
}

void CheckBox::Caption(std::string caption) {
  caption_ = std::move(caption);
  NotifyProperty(grid::Property::Caption);
}

void CheckBox::Value(int value) {
  if (value < kUnchecked || value > kGrayed)
    throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  if (value == value_) return;
  value_ = value;
  NotifyProperty(grid::Property::Value);
  RaiseClick();
}

void CheckBox::ResetState() {
  caption_.clear();
  value_ = kUnchecked;
  spaceDown_ = false;
  ResetCommon();
  NotifyProperty(grid::Property::Caption);
  NotifyProperty(grid::Property::Value);
}

void CheckBox::UserClick() { Value(value_ == kChecked ? kUnchecked : kChecked); }

void CheckBox::DefaultKeyDown(int keyCode, int) {
  if (keyCode == keys::kSpace) spaceDown_ = true;
}

void CheckBox::DefaultKeyUp(int keyCode, int) {
  if (keyCode == keys::kSpace && spaceDown_) {
    spaceDown_ = false;
    UserClick();
  }
}

// ---- OptionButton ----

OptionButton::OptionButton(Form& form, std::string name, int index)
    : ControlOf(form, std::move(name), index, ControlKind::OptionButton) {
  SetDefaultSize(1215, 255);
  SetDefaultColors(grid::kButtonFace, grid::kBlack);
}

void OptionButton::Caption(std::string caption) {
  caption_ = std::move(caption);
  NotifyProperty(grid::Property::Caption);
}

void OptionButton::Value(bool value) {
  if (value == value_) return;
  if (value) {
    for (Control* c : Parent().Controls()) {
      if (c == this || c->Kind() != ControlKind::OptionButton || c->Container() != Container())
        continue;
      auto* other = static_cast<OptionButton*>(c);
      if (other->value_) {
        other->value_ = false;
        other->NotifyProperty(grid::Property::Value);
      }
    }
  }
  value_ = value;
  NotifyProperty(grid::Property::Value);
  if (value_) RaiseClick();
}

void OptionButton::ResetState() {
  caption_.clear();
  value_ = false;
  spaceDown_ = false;
  ResetCommon();
  NotifyProperty(grid::Property::Caption);
  NotifyProperty(grid::Property::Value);
}

// Clicking the option that is on already still clicks it.
void OptionButton::UserClick() {
  if (value_)
    RaiseClick();
  else
    Value(true);
}

void OptionButton::DefaultKeyDown(int keyCode, int) {
  if (keyCode == keys::kSpace) spaceDown_ = true;
}

void OptionButton::DefaultKeyUp(int keyCode, int) {
  if (keyCode == keys::kSpace && spaceDown_) {
    spaceDown_ = false;
    UserClick();
  }
}

// ---- Frame ----

Frame::Frame(Form& form, std::string name, int index)
    : ControlOf(form, std::move(name), index, ControlKind::Frame) {
  SetDefaultSize(2415, 1335);
  SetDefaultColors(grid::kButtonFace, grid::kBlack);
}

void Frame::Caption(std::string caption) {
  caption_ = std::move(caption);
  NotifyProperty(grid::Property::Caption);
}

void Frame::ResetState() {
  caption_.clear();
  ResetCommon();
  NotifyProperty(grid::Property::Caption);
}

void ThrowSubscriptOutOfRange() { throw Error(err::kSubscript, "Subscript out of range"); }

} // namespace belvane::forms
