#include "forms/input.hpp"

#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"
#include "forms/windows.hpp"
#include "text/error.hpp"

#include <string>

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
  Control* target = form->ActiveControl();
  if (!target || !Accepts(*target)) return false;
  int code = keyCode;
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
  try {
    form.Close(kFormControlMenu);
  } catch (const Error& e) {
    CurrentRuntime().UnhandledError(form.Name() + "_Unload", e.Number(), e.Description());
  } catch (const std::exception& e) {
    CurrentRuntime().UnhandledError(form.Name() + "_Unload", 0, e.what());
  }
  return true;
}

} // namespace belvane::forms
