#include "forms/runtime.hpp"

#include "forms/form.hpp"
#include "forms/input.hpp"
#include "forms/page_host.hpp"
#include "forms/windows.hpp"

#include <utility>

namespace belvane::forms {

namespace msgbox {
int DefaultAnswer(int style) {
  static constexpr int kButtons[6][3] = {
      {kOk, kOk, kOk},      {kOk, kCancel, kCancel}, {kAbort, kRetry, kIgnore},
      {kYes, kNo, kCancel}, {kYes, kNo, kNo},        {kRetry, kCancel, kCancel},
  };
  static constexpr int kCount[6] = {1, 2, 3, 3, 2, 2};
  const int group = style & 7;
  if (group > 5) return kOk;
  const int choice = std::min((style >> 8) & 3, kCount[group] - 1);
  return kButtons[group][choice];
}
} // namespace msgbox

// ---- the thread's runtime ----

namespace {
thread_local Runtime* installed = nullptr;
}

HeadlessRuntime& ThreadHeadlessRuntime() {
  thread_local HeadlessRuntime headless;
  return headless;
}

Runtime& CurrentRuntime() { return installed ? *installed : ThreadHeadlessRuntime(); }

Runtime* SetCurrentRuntime(Runtime* runtime) { return std::exchange(installed, runtime); }

int MsgBox(std::string_view prompt, int style, std::string_view title) {
  return CurrentRuntime().MessageBox(std::string(prompt), style, std::string(title));
}

int DoEvents() {
  CurrentRuntime().DoEvents();
  return static_cast<int>(detail::Windows().shown.size());
}

void ScreenObject::MousePointer(int pointer) {
  pointer_ = pointer;
  CurrentRuntime().MousePointerChanged(pointer);
}

Form* ScreenObject::ActiveForm() const { return Input::ActiveForm(); }

Control* ScreenObject::ActiveControl() const {
  Form* form = ActiveForm();
  return form ? form->ActiveControl() : nullptr;
}

// ---- HeadlessRuntime ----

void HeadlessRuntime::QueueModal(Script script) { scripts_.push_back(std::move(script)); }

void HeadlessRuntime::QueueAnswer(int answer) { answers_.push_back(answer); }

void HeadlessRuntime::Reset() {
  scripts_.clear();
  answers_.clear();
  sessions_.clear();
  messages_.clear();
  pointers_.clear();
  errors_.clear();
  doEvents_ = 0;
}

void HeadlessRuntime::RunModal(Form& form) {
  if (!form.Visible()) return;
  const std::size_t index = sessions_.size();
  sessions_.push_back(Session{form.Name(), false, false});
  // Closes a form the script left open, as the user's close box; a form that
  // refuses to close is hidden, which ends the modal call all the same.
  auto closeLeftOpen = [this, &form, index] {
    if (!form.Visible()) return;
    sessions_[index].closedByCloseBox = true;
    Input::CloseBox(form);
    if (form.Visible()) form.Hide();
  };
  // The message loop runs: pages the form started loading arrive.
  PageHost::CompletePending();
  if (!scripts_.empty()) {
    Script script = std::move(scripts_.front());
    scripts_.pop_front();
    sessions_[index].scripted = true;
    try {
      script(form);
    } catch (...) {
      closeLeftOpen();
      throw;
    }
  }
  closeLeftOpen();
}

void HeadlessRuntime::DoEvents() {
  ++doEvents_;
  PageHost::CompletePending();
}

int HeadlessRuntime::MessageBox(const std::string& prompt, int style, const std::string& title) {
  int answer = msgbox::DefaultAnswer(style);
  if (!answers_.empty()) {
    answer = answers_.front();
    answers_.pop_front();
  }
  messages_.push_back(Message{prompt, style, title, answer});
  return answer;
}

void HeadlessRuntime::UnhandledError(const std::string& where, long number,
                                     const std::string& description) {
  errors_.push_back(HandlerError{where, number, description});
}

} // namespace belvane::forms
