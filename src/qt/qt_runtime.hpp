#pragma once
// The Qt runtime: the component's forms as real Qt 6 Widgets windows. A
// host chooses it for its GUI thread:
//
//     belvane::qt::QtRuntime runtime;
//     belvane::forms::ScopedRuntime use(runtime);   // or SetCurrentRuntime
//
// From then on every form that thread shows is a window: a modal Show is
// an application-modal dialog whose call returns when the form is closed;
// a modeless form (the status box) is shown and painted before the call
// returns; MsgBox is a message box with the style's icon and buttons that
// returns the button pressed; mouse pointer 11 is the busy cursor.
//
// The windows need a QApplication. A host that has one gets its windows
// in it; without one, the runtime creates one on first use (with
// AA_ShareOpenGLContexts set first, so a web view works) and keeps it for
// the life of the process. Every call must come on the QApplication's
// thread: a call from any other thread is refused with a belvane::Error
// (number 5), as is a first use on a machine with no display to show
// windows on. When a host's QApplication goes before the runtime, the
// runtime's windows go with it.

#include "forms/runtime.hpp"
#include "qt/scale.hpp"

#include <QImage>

#include <deque>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

class QApplication;
class QMessageBox;
class QWidget;

namespace belvane::forms {
class Control;
class Form;
} // namespace belvane::forms

namespace belvane::qt {

class ControlView;
class FormWindow;

class QtRuntime final : public forms::Runtime {
public:
  // Plays the user once a modal form's window is on screen, inside its
  // event loop (as a test or a scripted session does, with real events). A
  // form the script leaves open is closed as by the window's close box.
  using Script = std::function<void(forms::Form&)>;
  // Plays the user once a message box is on screen; it presses a button.
  using MessageBoxScript = std::function<void(QMessageBox&)>;

  struct HandlerError {
    std::string where;
    long number = 0;
    std::string description;
  };

  QtRuntime();
  ~QtRuntime() override;
  QtRuntime(const QtRuntime&) = delete;
  QtRuntime& operator=(const QtRuntime&) = delete;

  // ---- the runtime seam ----
  void RunModal(forms::Form& form) override;
  void ShowModeless(forms::Form& form) override;
  int MessageBox(const std::string& prompt, int style, const std::string& title) override;
  void DoEvents() override;
  void MousePointerChanged(int pointer) override;
  // Recorded, written to the standard error and, unless turned off, shown
  // in a critical message box; the session goes on.
  void UnhandledError(const std::string& where, long number,
                      const std::string& description) override;

  // The application the windows live in, created if there is none. Raises
  // belvane::Error when it cannot be had on this thread.
  static QApplication& Application();

  // ---- scripted sessions ----
  void QueueModal(Script script);
  void QueueMessageBox(MessageBoxScript script);
  std::size_t PendingScripts() const noexcept { return modalScripts_.size(); }

  const std::vector<HandlerError>& UnhandledErrors() const noexcept { return errors_; }
  void ShowHandlerErrors(bool show) noexcept { showErrors_ = show; }

  // ---- windows ----
  // The window of a form (nullptr before the form was first shown here),
  // and the widget of a control.
  QWidget* Window(const forms::Form& form) const;
  QWidget* Widget(const forms::Control& control) const;
  // The view binding a control to its widget (tests reach the parts of a
  // grid through it).
  ControlView* View(const forms::Control& control) const;
  // The scale twips are drawn at.
  const Scale& GetScale();

  // Sizable windows (the editors) remember their size, place and maximised
  // state in this file (an INI file) when they close, and open so again.
  // Off (the design's size every time) until a host names a file; the
  // usual one is DefaultWindowPlacesFile().
  void RememberWindowPlaces(std::string file) { placesFile_ = std::move(file); }
  const std::string& WindowPlacesFile() const noexcept { return placesFile_; }
  // windows.ini in the user's configuration folder for the application.
  static std::string DefaultWindowPlacesFile();

private:
  friend class FormWindow;
  void Check(); // refuses a call off the GUI thread
  FormWindow& WindowFor(forms::Form& form);
  void Forget(const FormWindow& window);
  void DropWindows();
  static void DropAllWindows();

  std::map<const forms::Form*, FormWindow*> windows_;
  std::deque<Script> modalScripts_;
  std::deque<MessageBoxScript> boxScripts_;
  std::vector<HandlerError> errors_;
  std::optional<Scale> scale_;
  bool showErrors_ = true;
  std::string placesFile_;
  bool overriding_ = false; // the busy (or another) override cursor is ours
};

// A picture of a window as the user sees it: the client area under a title
// bar with the window's caption, in a thin frame (the window system's own
// decoration is not part of a widget's picture).
QImage WindowPicture(QWidget& window);

} // namespace belvane::qt
