#pragma once
// Control: what makes a model a control on a form. It belongs to one form,
// has a name (and an index in a control array), may sit in a Frame, takes
// part in the focus and tab order, and raises the user-input events. The
// properties shared with the grid (position, Visible, Enabled, Tag, ...)
// come from grid::ControlModel; every concrete control is both.
//
// Event handlers are plain callbacks. Key handlers get their code by
// reference: a KeyDown handler that sets KeyCode to 0 consumes the key (no
// default processing, no KeyPress); a KeyPress handler may change KeyAscii
// or set it to 0 to swallow the character.

#include "grid/control_model.hpp"

#include <functional>
#include <string>

namespace belvane::forms {

class Form;
class Frame;
class Input;

enum class ControlKind {
  Label,
  TextBox,
  CommandButton,
  CheckBox,
  OptionButton,
  Frame,
  ListView,
  WebBrowser,
  FlexGrid,
};

class Control {
public:
  Control(const Control&) = delete;
  Control& operator=(const Control&) = delete;
  virtual ~Control();

  Form& Parent() const noexcept { return *form_; }
  const std::string& Name() const noexcept { return name_; }
  // Position in its control array; -1 for a control that is not in one.
  int Index() const noexcept { return index_; }
  ControlKind Kind() const noexcept { return kind_; }
  grid::ControlModel& Model() noexcept { return model_; }
  const grid::ControlModel& Model() const noexcept { return model_; }

  // The frame the control sits in (nullptr: the form itself). Part of the
  // design: set once when the form is built; it survives unloading.
  Frame* Container() const noexcept { return container_; }
  void Container(Frame* frame);

  // Tab order: by TabIndex, then by declaration. Controls with TabStop off
  // are skipped by Tab but can still take the focus.
  int TabIndex() const noexcept { return tabIndex_; }
  void TabIndex(int index);
  bool TabStop() const noexcept { return tabStop_; }
  void TabStop(bool tabStop);

  // The letter that works the control from the keyboard with Alt (0 for
  // none): the one the form gave, else the letter marked with "&" in the
  // caption. An upper-case letter or a digit. Part of the form's make: it
  // survives unloading.
  char32_t AccessKey() const;
  void AccessKey(char32_t key);

  // Gives the control the focus: LostFocus on the control that had it, then
  // GotFocus here. Nothing happens when it has the focus already. Raises
  // error 5 when the control cannot take the focus (a label or frame, a
  // hidden or disabled control, a form that is not shown).
  void SetFocus();
  bool HasFocus() const noexcept;
  // Visible, enabled, of a kind that takes focus, in a shown form.
  bool CanTakeFocus() const;
  // Visible (enabled) itself and in every frame around it.
  bool IsShown() const;
  bool IsEnabled() const;

  std::function<void()> OnGotFocus;
  std::function<void()> OnLostFocus;
  std::function<void()> OnClick;
  std::function<void()> OnDblClick;
  std::function<void(int& keyCode, int shift)> OnKeyDown;
  std::function<void(int& keyCode, int shift)> OnKeyUp;
  std::function<void(int& keyAscii)> OnKeyPress;
  std::function<void(int button, int shift, int x, int y)> OnMouseDown;
  std::function<void(int button, int shift, int x, int y)> OnMouseUp;

protected:
  Control(Form& form, std::string name, int index, ControlKind kind, grid::ControlModel& model);

  // Back to the state the control had when constructed, silently (the form
  // is unloading). Handlers, name, container and tab order stay.
  virtual void ResetState() = 0;
  virtual bool TakesFocus() const { return true; }

  // The control's own reaction to input, after the matching event.
  virtual void DefaultKeyDown(int /*keyCode*/, int /*shift*/) {}
  virtual void DefaultKeyPress(int /*keyAscii*/) {}
  virtual void DefaultKeyUp(int /*keyCode*/, int /*shift*/) {}
  // After MouseDown and the focus move: a grid moves its current cell, a
  // list view selects the item under the pointer.
  virtual void DefaultMouseDown(int /*button*/, int /*shift*/, int /*x*/, int /*y*/) {}
  // The pointer is at (x, y) inside the control (before a mouse event).
  virtual void PointerAt(int /*x*/, int /*y*/) {}
  // A click by the user: a check box toggles, an option button turns on;
  // either way the Click event follows. The default raises Click.
  virtual void UserClick();
  // Called once the focus moved here by the Tab key.
  virtual void TabbedInto() {}

  // Visibility or enabled state changed (of this control or its frame).
  void AvailabilityChanged();
  void RaiseClick() {
    if (OnClick) OnClick();
  }

private:
  friend class Form;
  friend class Input;

  Form* form_;
  std::string name_;
  int index_;
  ControlKind kind_;
  grid::ControlModel& model_;
  Frame* container_ = nullptr;
  int tabIndex_;
  bool tabStop_ = true;
  char32_t accessKey_ = 0;
};

// Joins a model to Control. Concrete controls derive from ControlOf<Model>.
template <class ModelType> class ControlOf : public ModelType, public Control {
protected:
  ControlOf(Form& form, std::string name, int index, ControlKind kind)
      : ModelType(), Control(form, std::move(name), index, kind, *this) {}
  void VisibleChanged() override { AvailabilityChanged(); }
  void EnabledChanged() override { AvailabilityChanged(); }
};

} // namespace belvane::forms
