#include "forms/input.hpp"

#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"
#include "forms/windows.hpp"
#include "text/error.hpp"

#include <algorithm>
#include <string>
#include <vector>

namespace belvane::forms {

namespace {

// The control a mouse button went down on, to pair the release with it.
thread_local const Control* pressedControl = nullptr;
thread_local int pressedButton = 0;

std::string Where(const Control& control, const char* event) {
  std::string where = control.Name();
  if (control.Index() >= 0) where += "(" + std::to_string(control.Index()) + ")";
  return where + "_" + event;
}

// Runs one step of user input. An error ends the step, not the input.
template <class F> void Step(const Control& control, const char* event, F&& step) {
  try {
    step();
  } catch (const Error& e) {
    CurrentRuntime().UnhandledError(Where(control, event), e.Number(), e.Description());
  } catch (const std::exception& e) {
    CurrentRuntime().UnhandledError(Where(control, event), 0, e.what());
  }
}

// The same for a step the form itself takes (its key preview, close box,
// resizing).
template <class F> void FormStep(const Form& form, const char* event, F&& step) {
  try {
    step();
  } catch (const Error& e) {
    CurrentRuntime().UnhandledError(form.Name() + "_" + event, e.Number(), e.Description());
  } catch (const std::exception& e) {
    CurrentRuntime().UnhandledError(form.Name() + "_" + event, 0, e.what());
  }
}

} // namespace

Form* Input::ActiveForm() {
  const auto& windows = detail::Windows();
  if (!windows.modal.empty()) return windows.modal.back();
  return windows.shown.empty() ? nullptr : windows.shown.back();
}

bool Input::Accepts(const Control& control) {
  return control.Parent().AcceptsInput() && control.IsShown() && control.IsEnabled();
}

bool Input::KeyDown(int keyCode, int shift, char32_t character) {
  Form* form = ActiveForm();
  if (!form || !form->AcceptsInput()) return false;
  if (keyCode == keys::kTab && (shift & (kCtrlMask | kAltMask)) == 0) {
    try {
      form->TabFocus((shift & kShiftMask) != 0);
    } catch (const Error& e) {
      CurrentRuntime().UnhandledError(form->Name() + "_Tab", e.Number(), e.Description());
    }
    return true;
  }
  if ((shift & kAltMask) != 0 && (shift & kCtrlMask) == 0 && AccessKeyDown(*form, keyCode))
    return true;
  int code = keyCode;
  if (form->KeyPreview()) {
    FormStep(*form, "KeyDown", [&] { form->Form_KeyDown(code, shift); });
    if (code == 0) return true;
  }
  Control* target = form->ActiveControl();
  if (!target || !Accepts(*target)) return false;
  Step(*target, "KeyDown", [&] {
    if (target->OnKeyDown) target->OnKeyDown(code, shift);
  });
  if (code == 0) return true; // consumed by the handler
  if (Accepts(*target)) Step(*target, "KeyDown", [&] { target->DefaultKeyDown(code, shift); });
  if (character == 0 || !Accepts(*target)) return true;
  int ascii = static_cast<int>(character);
  Step(*target, "KeyPress", [&] {
    if (target->OnKeyPress) target->OnKeyPress(ascii);
  });
  if (ascii != 0 && Accepts(*target))
    Step(*target, "KeyPress", [&] { target->DefaultKeyPress(ascii); });
  return true;
}

// The control of the form whose access key this is, shown and enabled.
// Works it as the key says and returns true; false when no control has
// that key.
bool Input::AccessKeyDown(Form& form, int keyCode) {
  if (keyCode <= 0) return false;
  const auto key = static_cast<char32_t>(keyCode);
  Control* owner = nullptr;
  for (Control* c : form.Controls())
    if (c->AccessKey() == key && c->IsShown() && c->IsEnabled()) {
      owner = c;
      break;
    }
  if (!owner) return false;
  const ControlKind kind = owner->Kind();
  if (kind == ControlKind::Label || kind == ControlKind::Frame) {
    // The control it names: the next in the tab order that takes the focus.
    std::vector<Control*> order = form.Controls();
    std::stable_sort(order.begin(), order.end(), [](const Control* a, const Control* b) {
      return a->TabIndex() < b->TabIndex();
    });
    auto it = std::find(order.begin(), order.end(), owner);
    for (++it; it != order.end(); ++it) {
      Control* next = *it;
      if (!next->TabStop() || !next->CanTakeFocus()) continue;
      // A control shown over it in the same place (a list of results laid
      // over the list it stands for) is the one the user sees.
      const auto& place = next->Model();
      for (Control* c : order)
        if (c != next && c->Container() == next->Container() && c->TabStop() && c->CanTakeFocus() &&
            c->Model().Left() == place.Left() && c->Model().Top() == place.Top() &&
            c->Model().Width() == place.Width() && c->Model().Height() == place.Height() &&
            c->Model().ZOrderKey() > next->Model().ZOrderKey())
          next = c;
      Step(*next, "GotFocus", [&] { form.MoveFocus(next); });
      if (form.ActiveControl() == next) Step(*next, "GotFocus", [&] { next->TabbedInto(); });
      break;
    }
    return true;
  }
  if (owner->CanTakeFocus() && !owner->HasFocus())
    Step(*owner, "GotFocus", [&] { form.MoveFocus(owner); });
  if (Accepts(*owner)) Step(*owner, "Click", [&] { owner->UserClick(); });
  return true;
}

bool Input::KeyUp(int keyCode, int shift) {
  Form* form = ActiveForm();
  if (!form || !form->AcceptsInput()) return false;
  Control* target = form->ActiveControl();
  if (!target || !Accepts(*target)) return false;
  int code = keyCode;
  Step(*target, "KeyUp", [&] {
    if (target->OnKeyUp) target->OnKeyUp(code, shift);
  });
  if (code != 0 && Accepts(*target))
    Step(*target, "KeyUp", [&] { target->DefaultKeyUp(code, shift); });
  return true;
}

bool Input::MouseDown(Control& control, int button, int shift, int x, int y) {
  if (!Accepts(control)) return false;
  control.PointerAt(x, y);
  Step(control, "MouseDown", [&] {
    if (control.OnMouseDown) control.OnMouseDown(button, shift, x, y);
  });
  if (button == kLeftButton && Accepts(control) && control.CanTakeFocus() && !control.HasFocus())
    Step(control, "GotFocus", [&] { control.Parent().MoveFocus(&control); });
  if (Accepts(control))
    Step(control, "MouseDown", [&] { control.DefaultMouseDown(button, shift, x, y); });
  pressedControl = &control;
  pressedButton = button;
  return true;
}

bool Input::MouseUp(Control& control, int button, int shift, int x, int y) {
  const bool click = pressedControl == &control && pressedButton == button && button == kLeftButton;
  pressedControl = nullptr;
  pressedButton = 0;
  if (!Accepts(control)) return false;
  control.PointerAt(x, y);
  if (click) Step(control, "Click", [&] { control.UserClick(); });
  if (Accepts(control))
    Step(control, "MouseUp", [&] {
      if (control.OnMouseUp) control.OnMouseUp(button, shift, x, y);
    });
  return true;
}

bool Input::DoubleClick(Control& control, int button, int /*shift*/, int x, int y) {
  if (!Accepts(control) || button != kLeftButton) return false;
  control.PointerAt(x, y);
  Step(control, "DblClick", [&] {
    if (control.OnDblClick) control.OnDblClick();
  });
  return true;
}

bool Input::Scroll(FlexGrid& grid, int topRow, int leftCol) {
  if (!Accepts(grid)) return false;
  Step(grid, "Scroll", [&] { grid.ScrollTo(topRow, leftCol); });
  return true;
}

bool Input::ScrollIntoView(FlexGrid& grid, int row, int col) {
  if (!Accepts(grid)) return false;
  Step(grid, "Scroll", [&] { grid.EnsureVisible(row, col); });
  return true;
}

bool Input::CloseBox(Form& form) {
  if (!form.AcceptsInput()) return false;
  FormStep(form, "Unload", [&] { form.Close(kFormControlMenu); });
  return true;
}

bool Input::Resize(Form& form, int scaleWidth, int scaleHeight) {
  if (!form.Loaded() || !form.Sizable()) return false;
  form.state_.clientWidth = std::max(0, scaleWidth);
  form.state_.clientHeight = std::max(0, scaleHeight);
  form.NotifyProperty(grid::Property::Geometry);
  FormStep(form, "Resize", [&] { form.Form_Resize(); });
  return true;
}

} // namespace belvane::forms
