#include "qt/qt_runtime.hpp"

#include "forms/control.hpp"
#include "forms/form.hpp"
#include "forms/input.hpp"
#include "qt/control_view.hpp"
#include "qt/form_window.hpp"
#include "text/error.hpp"

#include <QAbstractButton>
#include <QApplication>
#include <QCursor>
#include <QGuiApplication>
#include <QMessageBox>
#include <QPointer>
#include <QPushButton>
#include <QStandardPaths>
#include <QThread>
#include <QTimer>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <mutex>
#include <unistd.h>
#include <utility>

namespace belvane::qt {

namespace {

constexpr const char* kSource = "Belvane.Qt";

// Every runtime alive, so their windows can go before a host's application.
std::mutex registryLock;
std::vector<QtRuntime*>& Registry() {
  static std::vector<QtRuntime*> runtimes;
  return runtimes;
}

bool OnMainThread() { return gettid() == getpid(); }

bool HasDisplay() {
  const char* platform = std::getenv("QT_QPA_PLATFORM");
  const std::string name = platform ? platform : "";
  const auto set = [](const char* variable) {
    const char* value = std::getenv(variable);
    return value && *value;
  };
  if (name.empty()) return set("DISPLAY") || set("WAYLAND_DISPLAY");
  if (name.rfind("xcb", 0) == 0) return set("DISPLAY");
  if (name.rfind("wayland", 0) == 0) return set("WAYLAND_DISPLAY");
  return true; // offscreen, minimal, vnc, ...
}

Qt::CursorShape CursorOf(int pointer) {
  switch (pointer) {
  case 2:
    return Qt::CrossCursor;
  case 3:
    return Qt::IBeamCursor;
  case 5:
  case 15:
    return Qt::SizeAllCursor;
  case 6:
    return Qt::SizeBDiagCursor;
  case 7:
    return Qt::SizeVerCursor;
  case 8:
    return Qt::SizeFDiagCursor;
  case 9:
    return Qt::SizeHorCursor;
  case 10:
    return Qt::UpArrowCursor;
  case forms::kPointerHourglass:
    return Qt::WaitCursor;
  case 12:
    return Qt::ForbiddenCursor;
  case 13:
    return Qt::BusyCursor;
  case 14:
    return Qt::WhatsThisCursor;
  default:
    return Qt::ArrowCursor;
  }
}

struct BoxButton {
  QMessageBox::StandardButton button;
  int answer;
};

std::vector<BoxButton> ButtonsOf(int style) {
  using forms::msgbox::kAbort, forms::msgbox::kCancel, forms::msgbox::kIgnore;
  using forms::msgbox::kNo, forms::msgbox::kOk, forms::msgbox::kRetry, forms::msgbox::kYes;
  switch (style & 7) {
  case forms::msgbox::kOkCancel:
    return {{QMessageBox::Ok, kOk}, {QMessageBox::Cancel, kCancel}};
  case forms::msgbox::kAbortRetryIgnore:
    return {
        {QMessageBox::Abort, kAbort}, {QMessageBox::Retry, kRetry}, {QMessageBox::Ignore, kIgnore}};
  case forms::msgbox::kYesNoCancel:
    return {{QMessageBox::Yes, kYes}, {QMessageBox::No, kNo}, {QMessageBox::Cancel, kCancel}};
  case forms::msgbox::kYesNo:
    return {{QMessageBox::Yes, kYes}, {QMessageBox::No, kNo}};
  case forms::msgbox::kRetryCancel:
    return {{QMessageBox::Retry, kRetry}, {QMessageBox::Cancel, kCancel}};
  default:
    return {{QMessageBox::Ok, kOk}};
  }
}

QMessageBox::Icon IconOf(int style) {
  switch (style & 0x70) {
  case forms::msgbox::kCritical:
    return QMessageBox::Critical;
  case forms::msgbox::kQuestion:
    return QMessageBox::Question;
  case forms::msgbox::kExclamation:
    return QMessageBox::Warning;
  case forms::msgbox::kInformation:
    return QMessageBox::Information;
  default:
    return QMessageBox::NoIcon;
  }
}

QWidget* FrontWindow() {
  if (QWidget* modal = QApplication::activeModalWidget()) return modal;
  return QApplication::activeWindow();
}

} // namespace

QtRuntime::QtRuntime() {
  std::lock_guard lock(registryLock);
  Registry().push_back(this);
}

QtRuntime::~QtRuntime() {
  {
    std::lock_guard lock(registryLock);
    auto& runtimes = Registry();
    runtimes.erase(std::remove(runtimes.begin(), runtimes.end(), this), runtimes.end());
  }
  const QCoreApplication* app = QCoreApplication::instance();
  if (!app || QThread::currentThread() != app->thread()) return;
  DropWindows();
  if (overriding_) QGuiApplication::restoreOverrideCursor();
}

// ---- the application and its thread ----

QApplication& QtRuntime::Application() {
  if (QCoreApplication* existing = QCoreApplication::instance()) {
    auto* app = qobject_cast<QApplication*>(existing);
    if (!app)
      throw Error(err::kInvalidCall,
                  "The host's Qt application has no widgets (a QApplication is needed)", kSource);
    return *app;
  }
  if (!OnMainThread())
    throw Error(err::kInvalidCall,
                "Windows need a QApplication; create it on the main thread before using the Qt "
                "runtime from another thread",
                kSource);
  if (!HasDisplay())
    throw Error(err::kInvalidCall,
                "No display to show windows on (set DISPLAY, or QT_QPA_PLATFORM=offscreen)",
                kSource);
  // A web view needs contexts shared before the application exists.
  QCoreApplication::setAttribute(Qt::AA_ShareOpenGLContexts);
  static int argc = 1;
  static char name[] = "belvane";
  static char* argv[] = {name, nullptr};
  // Kept for the life of the process: the host may show windows again at
  // any time, and an application deleted at exit would go after the
  // statics Qt needs for it.
  auto* app = new QApplication(argc, argv);
  QGuiApplication::setApplicationDisplayName(QStringLiteral("Belvane"));
  return *app;
}

void QtRuntime::Check() {
  const QApplication& app = Application();
  if (QThread::currentThread() != app.thread())
    throw Error(err::kInvalidCall,
                "The Qt runtime was called from a thread other than the GUI thread; forms can "
                "only be shown on the thread of the QApplication",
                kSource);
  static QPointer<QCoreApplication> cleanedUp;
  if (cleanedUp != &app) {
    cleanedUp = const_cast<QApplication*>(&app);
    qAddPostRoutine(&QtRuntime::DropAllWindows);
  }
}

const Scale& QtRuntime::GetScale() {
  if (!scale_) {
    Check();
    scale_ = ScreenScale();
  }
  return *scale_;
}

// ---- windows ----

std::string QtRuntime::DefaultWindowPlacesFile() {
  const QString folder = QStandardPaths::writableLocation(QStandardPaths::AppConfigLocation);
  return (folder + QStringLiteral("/windows.ini")).toStdString();
}

FormWindow& QtRuntime::WindowFor(forms::Form& form) {
  if (auto it = windows_.find(&form); it != windows_.end()) return *it->second;
  auto* window = new FormWindow(*this, form, GetScale());
  windows_[&form] = window;
  return *window;
}

void QtRuntime::Forget(const FormWindow& window) {
  for (auto it = windows_.begin(); it != windows_.end(); ++it)
    if (it->second == &window) {
      windows_.erase(it);
      return;
    }
}

void QtRuntime::DropWindows() {
  auto windows = std::exchange(windows_, {});
  for (auto& [form, window] : windows)
    delete window;
}

// The application is going: the windows go first, while it can still take
// them down.
void QtRuntime::DropAllWindows() {
  std::vector<QtRuntime*> runtimes;
  {
    std::lock_guard lock(registryLock);
    runtimes = Registry();
  }
  for (QtRuntime* runtime : runtimes)
    runtime->DropWindows();
}

QWidget* QtRuntime::Window(const forms::Form& form) const {
  const auto it = windows_.find(&form);
  return it == windows_.end() ? nullptr : it->second;
}

QWidget* QtRuntime::Widget(const forms::Control& control) const {
  const auto it = windows_.find(&control.Parent());
  return it == windows_.end() ? nullptr : it->second->WidgetOf(control);
}

ControlView* QtRuntime::View(const forms::Control& control) const {
  const auto it = windows_.find(&control.Parent());
  return it == windows_.end() ? nullptr : it->second->ViewOf(control);
}

// ---- the runtime seam ----

void QtRuntime::RunModal(forms::Form& form) {
  try {
    Check();
  } catch (...) {
    form.Hide(); // a refused session leaves no form marked shown
    throw;
  }
  FormWindow& window = WindowFor(form);
  Script script;
  if (!modalScripts_.empty()) {
    script = std::move(modalScripts_.front());
    modalScripts_.pop_front();
  }
  std::exception_ptr failure;
  std::function<void()> play;
  if (script) {
    play = [&script, &form, &failure] {
      try {
        script(form);
      } catch (...) {
        failure = std::current_exception();
      }
      // A form the script left open closes as by the close box; one that
      // refuses is hidden, which ends the session all the same.
      if (form.Visible()) forms::Input::CloseBox(form);
      if (form.Visible()) form.Hide();
    };
  }
  window.RunModal(play);
  if (failure) std::rethrow_exception(failure);
}

void QtRuntime::ShowModeless(forms::Form& form) {
  try {
    Check();
  } catch (...) {
    form.Hide();
    throw;
  }
  WindowFor(form).ShowModeless();
}

int QtRuntime::MessageBox(const std::string& prompt, int style, const std::string& title) {
  Check();
  QMessageBox box(FrontWindow());
  box.setWindowTitle(title.empty() ? QGuiApplication::applicationDisplayName() : ToQString(title));
  QString text = ToQString(prompt);
  text.replace(QStringLiteral("\r\n"), QStringLiteral("\n")).replace(u'\r', u'\n');
  box.setTextFormat(Qt::PlainText);
  box.setText(text);
  box.setIcon(IconOf(style));
  const std::vector<BoxButton> buttons = ButtonsOf(style);
  std::vector<std::pair<QPushButton*, int>> answers;
  for (const BoxButton& b : buttons)
    answers.emplace_back(box.addButton(b.button), b.answer);
  const std::size_t choice =
      std::min<std::size_t>(static_cast<std::size_t>((style >> 8) & 3), answers.size() - 1);
  box.setDefaultButton(answers[choice].first);
  for (const auto& [button, answer] : answers)
    if (answer == forms::msgbox::kCancel || answers.size() == 1) box.setEscapeButton(button);

  // Over a busy cursor, the box itself shows the arrow.
  if (overriding_) QGuiApplication::setOverrideCursor(Qt::ArrowCursor);
  std::exception_ptr failure;
  if (!boxScripts_.empty()) {
    MessageBoxScript script = std::move(boxScripts_.front());
    boxScripts_.pop_front();
    QTimer::singleShot(0, &box, [&box, script = std::move(script), &failure] {
      try {
        script(box);
      } catch (...) {
        failure = std::current_exception();
        box.reject();
      }
    });
  }
  box.exec();
  if (overriding_) QGuiApplication::restoreOverrideCursor();
  if (failure) std::rethrow_exception(failure);

  const QAbstractButton* pressed = box.clickedButton();
  for (const auto& [button, answer] : answers)
    if (button == pressed) return answer;
  // Closed with no button (the application quit): Cancel where there is one.
  for (const auto& [button, answer] : answers)
    if (answer == forms::msgbox::kCancel) return answer;
  return forms::msgbox::DefaultAnswer(style);
}

void QtRuntime::DoEvents() {
  Check();
  QCoreApplication::sendPostedEvents();
  QCoreApplication::processEvents(QEventLoop::AllEvents);
}

void QtRuntime::MousePointerChanged(int pointer) {
  Check();
  if (pointer == forms::kPointerDefault) {
    if (overriding_) QGuiApplication::restoreOverrideCursor();
    overriding_ = false;
    return;
  }
  const QCursor cursor(CursorOf(pointer));
  if (overriding_)
    QGuiApplication::changeOverrideCursor(cursor);
  else
    QGuiApplication::setOverrideCursor(cursor);
  overriding_ = true;
}

void QtRuntime::UnhandledError(const std::string& where, long number,
                               const std::string& description) {
  errors_.push_back(HandlerError{where, number, description});
  std::fprintf(stderr, "belvane: %s: error %ld: %s\n", where.c_str(), number, description.c_str());
  const QCoreApplication* app = QCoreApplication::instance();
  if (!showErrors_ || !app || QThread::currentThread() != app->thread()) return;
  MessageBox("Run-time error " + std::to_string(number) + ":\n\n" + description + "\n\n(" + where +
                 ")",
             forms::msgbox::kCritical, "");
}

void QtRuntime::QueueModal(Script script) { modalScripts_.push_back(std::move(script)); }

void QtRuntime::QueueMessageBox(MessageBoxScript script) {
  boxScripts_.push_back(std::move(script));
}

} // namespace belvane::qt
