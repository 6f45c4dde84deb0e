#pragma once
// Form: a window of the component. An editor derives from Form, declares
// its controls as members (they register themselves), connects their
// handlers in its constructor, and overrides the hooks:
//
//   Design()        the design-time state: captions, sizes, positions,
//                   grid shapes. Runs at every load, so an unloaded form
//                   comes back exactly as designed.
//   Form_Load()     after Design, when the form loads.
//   Form_Activate() each time the form becomes the active window.
//   Form_KeyDown(keyCode, shift)
//                   with KeyPreview on: each key before the focused
//                   control sees it; setting keyCode to 0 consumes it.
//   Form_Resize()   after the user resized a sizable window (Sizable):
//                   the client size (ScaleWidth, ScaleHeight) is the new
//                   one and the form lays its controls out for it.
//   Form_QueryUnload(cancel, mode), Form_Unload(cancel)
//                   before unloading; a non-zero cancel keeps the form.
//
// Lifecycle: not loaded -> Load (Design, Form_Load) -> Show (visible,
// Form_Activate, focus to the first control that takes it) -> Hide / Unload.
// Show modal returns only when the form is hidden or unloaded. Unload runs
// the unload hooks, hides the form and puts every control back to its
// construction state; the form object lives on and the next Show loads it
// afresh.
//
// An error in Form_Load propagates to the caller of Load or Show, and the
// form is unloaded first, so a failed load never leaves a half-loaded form
// for the next Show.

#include "grid/observable.hpp"

#include <string>
#include <string_view>
#include <vector>

namespace belvane::forms {

class Control;
class Input;

enum class ShowStyle { Modeless = 0, Modal = 1 };

// The unloadMode argument of Form_QueryUnload.
inline constexpr int kFormControlMenu = 0; // the window's close box
inline constexpr int kFormCode = 1;        // Unload called by code

// Raised by Show modal on a form that is already shown.
inline constexpr long kFormAlreadyDisplayed = 400;

class Form : public grid::Observable {
public:
  explicit Form(std::string name);
  ~Form() override;

  const std::string& Name() const noexcept { return name_; }

  void Load();
  void Show(ShowStyle style = ShowStyle::Modeless);
  void Hide();
  // Unload as code does it (Form_QueryUnload sees kFormCode).
  void Unload();
  bool Loaded() const noexcept { return loaded_; }
  bool Visible() const noexcept { return visible_; }
  void Visible(bool visible); // true shows modeless, false hides
  bool IsModal() const noexcept { return modal_; }

  const std::string& Caption() const noexcept { return state_.caption; }
  void Caption(std::string caption);
  // A disabled form takes no input; its controls keep their own state.
  bool Enabled() const noexcept { return state_.enabled; }
  void Enabled(bool enabled);

  // Outer position and size in twips, and the client area (ScaleWidth,
  // ScaleHeight) that the controls are laid out in. Setting one size sets
  // the other: the frame takes kFrameWidth and kFrameHeight.
  static constexpr int kFrameWidth = 120;
  static constexpr int kFrameHeight = 480;
  int Left() const noexcept { return state_.left; }
  int Top() const noexcept { return state_.top; }
  int Width() const noexcept { return state_.clientWidth + kFrameWidth; }
  int Height() const noexcept { return state_.clientHeight + kFrameHeight; }
  int ScaleWidth() const noexcept { return state_.clientWidth; }
  int ScaleHeight() const noexcept { return state_.clientHeight; }
  void Move(int left, int top);
  void Width(int width);
  void Height(int height);
  void ScaleWidth(int width);
  void ScaleHeight(int height);

  // Whether the user may resize and maximise the window. Part of the form's
  // make, like its controls' handlers: it survives unloading.
  bool Sizable() const noexcept { return sizable_; }
  void Sizable(bool sizable) { sizable_ = sizable; }
  // Whether Form_KeyDown sees every key first. Part of the form's make.
  bool KeyPreview() const noexcept { return keyPreview_; }
  void KeyPreview(bool preview) { keyPreview_ = preview; }

  const std::string& FontName() const noexcept { return state_.fontName; }
  void FontName(std::string name);
  double FontSize() const noexcept { return state_.fontSize; }
  void FontSize(double points);
  const std::string& Tag() const noexcept { return state_.tag; }
  void Tag(std::string tag) { state_.tag = std::move(tag); }

  // Asks the views to paint the form now.
  void Refresh();
  // Brings the window in front of the component's other windows.
  void ZOrder(int position = 0);

  // A line of running totals that a desktop shows under the window while
  // the estimator works (empty: the form has none). Worked out from the
  // form's grids, so a view asks again whenever a grid changes.
  virtual std::string RunningTotals() const { return {}; }

  // The control with the focus inside this form (nullptr for none).
  Control* ActiveControl() const noexcept { return active_; }
  // Every control, in declaration order.
  const std::vector<Control*>& Controls() const noexcept { return controls_; }
  Control* FindControl(std::string_view name, int index = -1) const;

protected:
  virtual void Design() {}
  virtual void Form_Load() {}
  virtual void Form_Activate() {}
  virtual void Form_KeyDown(int& /*keyCode*/, int /*shift*/) {}
  virtual void Form_Resize() {}
  virtual void Form_QueryUnload(int& /*cancel*/, int /*unloadMode*/) {}
  virtual void Form_Unload(int& /*cancel*/) {}

private:
  friend class Control;
  friend class Input;
  friend class OptionButton;

  struct State {
    std::string caption;
    bool enabled = true;
    int left = 0;
    int top = 0;
    int clientWidth = 4680;
    int clientHeight = 3195;
    std::string fontName = "Tahoma";
    double fontSize = 8.25;
    std::string tag;
  };

  void Register(Control* control);
  void Unregister(Control* control);
  // Moves the focus inside the form: LostFocus on the old control, then
  // GotFocus on the new one (nullptr: no control keeps the focus).
  void MoveFocus(Control* target);
  void ControlAvailabilityChanged(Control& control);
  void FocusFirst();
  void TabFocus(bool backward);
  std::vector<Control*> TabOrder() const;
  // Takes input: loaded, shown, enabled and not below a modal window.
  bool AcceptsInput() const;
  // Unload with the given mode; false when a hook cancelled it.
  bool Close(int unloadMode);
  void HideWindow();
  // Hides the form and puts it and its controls back to construction state.
  void DropState();

  std::string name_;
  State state_;
  std::vector<Control*> controls_;
  Control* active_ = nullptr;
  bool loaded_ = false;
  bool visible_ = false;
  bool modal_ = false;
  bool loading_ = false;
  bool unloading_ = false;
  bool sizable_ = false;
  bool keyPreview_ = false;
};

} // namespace belvane::forms
