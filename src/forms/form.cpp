#include "forms/form.hpp"

#include "forms/control.hpp"
#include "forms/runtime.hpp"
#include "forms/windows.hpp"
#include "text/error.hpp"

#include <algorithm>

namespace belvane::forms {

namespace detail {
WindowList& Windows() {
  thread_local WindowList windows;
  return windows;
}
void Erase(std::vector<Form*>& list, const Form* form) {
  list.erase(std::remove(list.begin(), list.end(), form), list.end());
}
} // namespace detail

namespace {
// Activation of a form that comes to the front again is no caller's
// business: a failure there ends the handler, as for user input.
template <class F> void Reported(const std::string& where, F&& f) {
  try {
    f();
  } catch (const Error& e) {
    CurrentRuntime().UnhandledError(where, e.Number(), e.Description());
  } catch (const std::exception& e) {
    CurrentRuntime().UnhandledError(where, 0, e.what());
  }
}
} // namespace

Form::Form(std::string name) : name_(std::move(name)) { state_.caption = name_; }

Form::~Form() {
  auto& windows = detail::Windows();
  detail::Erase(windows.shown, this);
  detail::Erase(windows.modal, this);
}

void Form::Register(Control* control) { controls_.push_back(control); }

void Form::Unregister(Control* control) {
  controls_.erase(std::remove(controls_.begin(), controls_.end(), control), controls_.end());
  if (active_ == control) active_ = nullptr;
}

Control* Form::FindControl(std::string_view name, int index) const {
  for (Control* c : controls_)
    if (c->Name() == name && c->Index() == index) return c;
  return nullptr;
}

// ---- lifecycle ----

void Form::Load() {
  if (loaded_) return;
  loaded_ = true;
  loading_ = true;
  try {
    Design();
    Form_Load();
  } catch (...) {
    loading_ = false;
    // Unload what was loaded so the next Show starts afresh; the load's
    // own error is what the caller hears of.
    if (loaded_) {
      try {
        int cancel = 0;
        Form_Unload(cancel);
      } catch (...) {
      }
      DropState();
    }
    throw;
  }
  loading_ = false;
}

void Form::Show(ShowStyle style) {
  if (style == ShowStyle::Modal && visible_)
    throw Error(kFormAlreadyDisplayed, "Form already displayed; can't show modally");
  Load();
  if (!loaded_) return; // Form_Load unloaded it
  auto& windows = detail::Windows();
  if (!visible_) {
    visible_ = true;
    windows.shown.push_back(this);
    NotifyProperty(grid::Property::Visible);
    Form_Activate();
    if (visible_ && (!active_ || !active_->CanTakeFocus())) FocusFirst();
  } else {
    ZOrder(0);
  }
  if (style == ShowStyle::Modal) {
    modal_ = true;
    windows.modal.push_back(this);
    struct EndModal {
      Form* form;
      ~EndModal() {
        detail::Erase(detail::Windows().modal, form);
        form->modal_ = false;
      }
    } endModal{this};
    CurrentRuntime().RunModal(*this);
    if (visible_) // a modal Show always ends with the form hidden
      HideWindow();
  } else {
    CurrentRuntime().ShowModeless(*this);
  }
}

void Form::Hide() { HideWindow(); }

void Form::Visible(bool visible) {
  if (visible)
    Show();
  else
    Hide();
}

void Form::HideWindow() {
  if (!visible_) return;
  auto& shown = detail::Windows().shown;
  const bool wasFront = !shown.empty() && shown.back() == this;
  visible_ = false;
  detail::Erase(shown, this);
  NotifyProperty(grid::Property::Visible);
  if (wasFront && !shown.empty()) {
    Form* next = shown.back();
    Reported(next->Name() + "_Activate", [next] { next->Form_Activate(); });
  }
}

void Form::Unload() { Close(kFormCode); }

bool Form::Close(int unloadMode) {
  if (!loaded_ || unloading_) return true;
  unloading_ = true;
  struct Done {
    bool& flag;
    ~Done() { flag = false; }
  } done{unloading_};
  int cancel = 0;
  Form_QueryUnload(cancel, unloadMode);
  if (cancel != 0) return false;
  Form_Unload(cancel);
  if (cancel != 0) return false;
  DropState();
  return true;
}

void Form::DropState() {
  HideWindow();
  if (Control* old = active_) {
    active_ = nullptr;
    old->Model().AnnounceFocus(false);
  }
  for (Control* c : controls_)
    c->ResetState();
  state_ = State{};
  state_.caption = name_;
  loaded_ = false;
  Notify([](grid::ModelObserver& o) {
    o.PropertyChanged(grid::Property::Caption);
    o.PropertyChanged(grid::Property::Enabled);
    o.PropertyChanged(grid::Property::Geometry);
    o.PropertyChanged(grid::Property::Font);
  });
}

// ---- properties ----

void Form::Caption(std::string caption) {
  state_.caption = std::move(caption);
  NotifyProperty(grid::Property::Caption);
}

void Form::Enabled(bool enabled) {
  if (enabled == state_.enabled) return;
  state_.enabled = enabled;
  NotifyProperty(grid::Property::Enabled);
}

void Form::Move(int left, int top) {
  state_.left = left;
  state_.top = top;
  NotifyProperty(grid::Property::Geometry);
}

void Form::Width(int width) { ScaleWidth(width - kFrameWidth); }
void Form::Height(int height) { ScaleHeight(height - kFrameHeight); }

void Form::ScaleWidth(int width) {
  if (width < 0) throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  state_.clientWidth = width;
  NotifyProperty(grid::Property::Geometry);
}

void Form::ScaleHeight(int height) {
  if (height < 0) throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  state_.clientHeight = height;
  NotifyProperty(grid::Property::Geometry);
}

void Form::FontName(std::string name) {
  state_.fontName = std::move(name);
  NotifyProperty(grid::Property::Font);
}

void Form::FontSize(double points) {
  if (!(points > 0)) throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  state_.fontSize = points;
  NotifyProperty(grid::Property::Font);
}

void Form::Refresh() {
  Notify([](grid::ModelObserver& o) { o.RepaintRequested(); });
}

void Form::ZOrder(int position) {
  if (position != 0 && position != 1)
    throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  if (!visible_) return;
  auto& shown = detail::Windows().shown;
  const bool wasFront = shown.back() == this;
  detail::Erase(shown, this);
  if (position == 0) {
    shown.push_back(this);
    if (!wasFront) Reported(name_ + "_Activate", [this] { Form_Activate(); });
  } else {
    shown.insert(shown.begin(), this);
    if (wasFront && shown.back() != this) {
      Form* next = shown.back();
      Reported(next->Name() + "_Activate", [next] { next->Form_Activate(); });
    }
  }
  NotifyProperty(grid::Property::ZOrder);
}

// ---- focus ----

void Form::MoveFocus(Control* target) {
  if (target == active_) return;
  Control* old = active_;
  active_ = target;
  if (old) {
    old->Model().AnnounceFocus(false);
    if (old->OnLostFocus) old->OnLostFocus();
  }
  if (!target || active_ != target) return; // a LostFocus handler moved the focus elsewhere
  target->Model().AnnounceFocus(true);
  if (target->OnGotFocus) target->OnGotFocus();
}

void Form::ControlAvailabilityChanged(Control&) {
  if (active_ && !(active_->IsShown() && active_->IsEnabled())) MoveFocus(nullptr);
}

std::vector<Control*> Form::TabOrder() const {
  std::vector<Control*> order;
  for (Control* c : controls_)
    if (c->TabStop() && c->CanTakeFocus()) order.push_back(c);
  std::stable_sort(order.begin(), order.end(), [](const Control* a, const Control* b) {
    return a->TabIndex() < b->TabIndex();
  });
  return order;
}

void Form::FocusFirst() {
  const auto order = TabOrder();
  if (!order.empty()) MoveFocus(order.front());
}

void Form::TabFocus(bool backward) {
  const auto order = TabOrder();
  if (order.empty()) return;
  const auto size = static_cast<std::ptrdiff_t>(order.size());
  const auto it = std::find(order.begin(), order.end(), active_);
  std::ptrdiff_t next = 0;
  if (it == order.end())
    next = backward ? size - 1 : 0;
  else
    next = ((it - order.begin()) + (backward ? size - 1 : 1)) % size;
  Control* target = order[static_cast<std::size_t>(next)];
  MoveFocus(target);
  if (active_ == target) target->TabbedInto();
}

bool Form::AcceptsInput() const {
  const auto& modal = detail::Windows().modal;
  return loaded_ && visible_ && state_.enabled && (modal.empty() || modal.back() == this);
}

} // namespace belvane::forms
