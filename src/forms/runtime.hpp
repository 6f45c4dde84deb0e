#pragma once
// The seam between the component and a desktop. A Runtime runs modal
// forms, shows modeless ones, puts up message boxes, yields to the message
// loop and shows the mouse pointer. Each thread has its own runtime: the
// host installs one (the Qt runtime), and a thread that installs none uses
// its own HeadlessRuntime.
//
// The HeadlessRuntime plays scripted sessions: each queued script plays the
// user for the next modal Show; a form its script leaves open is closed as
// by the window's close box. Where its message loop would run (a modal
// session starting, DoEvents) it completes the pending page loads of web
// browsers through the page host (page_host.hpp). It records message boxes (answering queued
// answers, else the default button), mouse pointer changes, DoEvents calls
// and the errors that ended event handlers run by user input.

#include <cstddef>
#include <deque>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace belvane::forms {

class Form;
class Control;

// MsgBox styles (add one of each group) and results.
namespace msgbox {
inline constexpr int kOkOnly = 0;
inline constexpr int kOkCancel = 1;
inline constexpr int kAbortRetryIgnore = 2;
inline constexpr int kYesNoCancel = 3;
inline constexpr int kYesNo = 4;
inline constexpr int kRetryCancel = 5;
inline constexpr int kCritical = 16;
inline constexpr int kQuestion = 32;
inline constexpr int kExclamation = 48;
inline constexpr int kInformation = 64;
inline constexpr int kDefaultButton2 = 256;
inline constexpr int kDefaultButton3 = 512;

inline constexpr int kOk = 1;
inline constexpr int kCancel = 2;
inline constexpr int kAbort = 3;
inline constexpr int kRetry = 4;
inline constexpr int kIgnore = 5;
inline constexpr int kYes = 6;
inline constexpr int kNo = 7;

// The answer of the style's default button (what Enter would give).
int DefaultAnswer(int style);
} // namespace msgbox

// Mouse pointer values.
inline constexpr int kPointerDefault = 0;
inline constexpr int kPointerArrow = 1;
inline constexpr int kPointerHourglass = 11;

class Runtime {
public:
  virtual ~Runtime() = default;

  // Runs the user's session with a modal form that is already shown;
  // returns once the form is hidden or unloaded.
  virtual void RunModal(Form& form) = 0;
  // A form was shown modeless.
  virtual void ShowModeless(Form& /*form*/) {}
  virtual int MessageBox(const std::string& prompt, int style, const std::string& title) = 0;
  virtual void DoEvents() {}
  virtual void MousePointerChanged(int /*pointer*/) {}
  // An event handler run by user input failed; the handler ended there and
  // the session goes on. `where` names the handler (control_Event).
  virtual void UnhandledError(const std::string& where, long number,
                              const std::string& description) = 0;
};

class HeadlessRuntime : public Runtime {
public:
  using Script = std::function<void(Form&)>;

  struct Message {
    std::string prompt;
    int style = 0;
    std::string title;
    int answer = 0;
  };
  struct Session {
    std::string form; // the form's name
    bool scripted = false;
    bool closedByCloseBox = false; // the script left it open
  };
  struct HandlerError {
    std::string where;
    long number = 0;
    std::string description;
  };

  // The next modal Show runs `script` as the user.
  void QueueModal(Script script);
  std::size_t PendingScripts() const noexcept { return scripts_.size(); }
  const std::vector<Session>& Sessions() const noexcept { return sessions_; }

  // The next message box answers `answer`.
  void QueueAnswer(int answer);
  const std::vector<Message>& Messages() const noexcept { return messages_; }

  // Every value the mouse pointer was set to, in order.
  const std::vector<int>& MousePointerHistory() const noexcept { return pointers_; }
  int DoEventsCount() const noexcept { return doEvents_; }
  const std::vector<HandlerError>& UnhandledErrors() const noexcept { return errors_; }

  // Forgets queues and recordings.
  void Reset();

  void RunModal(Form& form) override;
  int MessageBox(const std::string& prompt, int style, const std::string& title) override;
  void DoEvents() override;
  void MousePointerChanged(int pointer) override { pointers_.push_back(pointer); }
  void UnhandledError(const std::string& where, long number,
                      const std::string& description) override;

private:
  std::deque<Script> scripts_;
  std::deque<int> answers_;
  std::vector<Session> sessions_;
  std::vector<Message> messages_;
  std::vector<int> pointers_;
  std::vector<HandlerError> errors_;
  int doEvents_ = 0;
};

// The runtime of the calling thread.
Runtime& CurrentRuntime();
// Installs a runtime for the calling thread (nullptr: back to the thread's
// own headless one); returns the one it replaces. Not owned.
Runtime* SetCurrentRuntime(Runtime* runtime);
// The calling thread's own headless runtime (the default).
HeadlessRuntime& ThreadHeadlessRuntime();

// Installs a runtime for a scope.
class ScopedRuntime {
public:
  explicit ScopedRuntime(Runtime& runtime) : previous_(SetCurrentRuntime(&runtime)) {}
  ~ScopedRuntime() { SetCurrentRuntime(previous_); }
  ScopedRuntime(const ScopedRuntime&) = delete;
  ScopedRuntime& operator=(const ScopedRuntime&) = delete;

private:
  Runtime* previous_;
};

// A message box through the thread's runtime; returns the button pressed.
int MsgBox(std::string_view prompt, int style = msgbox::kOkOnly, std::string_view title = {});
// Yields to the message loop; returns the number of shown forms.
int DoEvents();

// The screen: the mouse pointer and the active window of this thread.
class ScreenObject {
public:
  int MousePointer() const noexcept { return pointer_; }
  void MousePointer(int pointer);
  Form* ActiveForm() const;
  Control* ActiveControl() const;

private:
  int pointer_ = kPointerDefault;
};

inline thread_local ScreenObject Screen;

} // namespace belvane::forms
