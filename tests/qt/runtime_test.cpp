// The Qt runtime's side of the seam: message boxes, the busy cursor,
// modeless windows that paint before the caller goes on, DoEvents, handler
// errors, threads and the application made on first use.

#include "qt_fixture.hpp"
#include "sample_forms.hpp"

#include "text/error.hpp"

#include <QCursor>
#include <QLabel>
#include <QMessageBox>
#include <QPushButton>
#include <QTimer>
#include <QWindow>

#include <thread>

using namespace belvane::qt;
using namespace belvane::qt::testing;
namespace msgbox = belvane::forms::msgbox;

namespace {

struct Shown {
  QString title;
  QString text;
  QMessageBox::Icon icon = QMessageBox::NoIcon;
  QMessageBox::StandardButtons buttons;
  QMessageBox::StandardButton defaultButton = QMessageBox::NoButton;
};

// Counts the paints of one window's widgets.
class PaintCounter : public QObject {
public:
  explicit PaintCounter(QString window) : window_(std::move(window)) {}
  int paints = 0;

protected:
  bool eventFilter(QObject* watched, QEvent* event) override {
    auto* widget = qobject_cast<QWidget*>(watched);
    if (event->type() == QEvent::Paint && widget && widget->window()->objectName() == window_)
      ++paints;
    return false;
  }

private:
  QString window_;
};

class frmFaulty : public belvane::forms::Form {
public:
  belvane::forms::CommandButton cmdGo{*this, "cmdGo"};
  frmFaulty() : Form("frmFaulty") {
    cmdGo.OnClick = [] { throw belvane::Error(3021, "No current record"); };
  }

protected:
  void Design() override { cmdGo.Caption("Go"); }
};

} // namespace

TEST_F(QtFormsTest, AMessageBoxShowsItsStyleAndAnswersWithTheButtonPressed) {
  struct Case {
    int style;
    QMessageBox::Icon icon;
    QMessageBox::StandardButtons buttons;
    std::function<void(QMessageBox&)> press;
    int answer;
  };
  const Case cases[] = {
      {msgbox::kCritical, QMessageBox::Critical, QMessageBox::Ok,
       [](QMessageBox& box) { QTest::mouseClick(box.button(QMessageBox::Ok), Qt::LeftButton); },
       msgbox::kOk},
      {msgbox::kQuestion + msgbox::kYesNo, QMessageBox::Question,
       QMessageBox::Yes | QMessageBox::No,
       [](QMessageBox& box) { QTest::mouseClick(box.button(QMessageBox::No), Qt::LeftButton); },
       msgbox::kNo},
      {msgbox::kExclamation + msgbox::kOkCancel, QMessageBox::Warning,
       QMessageBox::Ok | QMessageBox::Cancel,
       [](QMessageBox& box) { QTest::keyClick(&box, Qt::Key_Escape); }, msgbox::kCancel},
      {msgbox::kInformation + msgbox::kYesNoCancel + msgbox::kDefaultButton2,
       QMessageBox::Information, QMessageBox::Yes | QMessageBox::No | QMessageBox::Cancel,
       [](QMessageBox& box) { QTest::keyClick(&box, Qt::Key_Return); }, msgbox::kNo},
  };
  for (const Case& c : cases) {
    Shown shown;
    Runtime().QueueMessageBox([&](QMessageBox& box) {
      shown = {box.windowTitle(), box.text(), box.icon(), box.standardButtons(),
               box.standardButton(box.defaultButton())};
      c.press(box);
    });
    const int answer =
        belvane::forms::MsgBox("Error No: 5\r\nDescription: Invalid call", c.style, "Labour form");
    EXPECT_EQ(answer, c.answer) << c.style;
    EXPECT_EQ(shown.title, "Labour form");
    EXPECT_EQ(shown.text, "Error No: 5\nDescription: Invalid call");
    EXPECT_EQ(shown.icon, c.icon) << c.style;
    EXPECT_EQ(shown.buttons, c.buttons) << c.style;
  }
}

TEST_F(QtFormsTest, TheStatusBoxPaintsBeforeTheCallerGoesOnUnderTheBusyCursor) {
  PaintCounter counter("frmBusy");
  qApp->installEventFilter(&counter);
  frmBusy box;
  box.ShowStatusBox("Opening Labour...");
  // Back from the call: the window is on screen and has painted, without
  // the caller running an event loop.
  QWidget* window = Runtime().Window(box);
  ASSERT_NE(window, nullptr);
  EXPECT_TRUE(window->isVisible());
  EXPECT_TRUE(window->windowHandle()->isExposed());
  EXPECT_GT(counter.paints, 0);
  qApp->removeEventFilter(&counter);
  auto* label = qobject_cast<QLabel*>(WidgetOf(box.lblMsg));
  EXPECT_EQ(label->text(), "Opening Labour...");
  EXPECT_EQ(label->parentWidget(), WidgetOf(box.frStatus)); // inside its frame
  ASSERT_NE(QGuiApplication::overrideCursor(), nullptr);
  EXPECT_EQ(QGuiApplication::overrideCursor()->shape(), Qt::WaitCursor);

  box.ShowStatusBox("Opening Parts..."); // shown already: the first text stays
  EXPECT_EQ(label->text(), "Opening Labour...");

  const QImage picture = WindowPicture(*window);
  EXPECT_EQ(picture.width(), window->width() + 2);
  EXPECT_GT(picture.height(), window->height());

  box.Unload();
  EXPECT_FALSE(window->isVisible());
  EXPECT_EQ(QGuiApplication::overrideCursor(), nullptr);
}

TEST_F(QtFormsTest, TheBusyCursorRestoresOnlyWhatTheRuntimeSet) {
  QGuiApplication::setOverrideCursor(Qt::CrossCursor); // the host's own
  belvane::forms::Screen.MousePointer(belvane::forms::kPointerHourglass);
  EXPECT_EQ(QGuiApplication::overrideCursor()->shape(), Qt::WaitCursor);
  belvane::forms::Screen.MousePointer(belvane::forms::kPointerHourglass);
  belvane::forms::Screen.MousePointer(belvane::forms::kPointerDefault);
  EXPECT_EQ(QGuiApplication::overrideCursor()->shape(), Qt::CrossCursor);
  belvane::forms::Screen.MousePointer(belvane::forms::kPointerDefault); // nothing of ours left
  EXPECT_EQ(QGuiApplication::overrideCursor()->shape(), Qt::CrossCursor);
  QGuiApplication::restoreOverrideCursor();
}

TEST_F(QtFormsTest, DoEventsRunsWhatIsWaiting) {
  bool ran = false;
  QTimer::singleShot(0, [&ran] { ran = true; });
  belvane::forms::DoEvents();
  EXPECT_TRUE(ran);
}

TEST_F(QtFormsTest, AFailingHandlerIsReportedAndTheSessionGoesOn) {
  Runtime().ShowHandlerErrors(true);
  frmFaulty form;
  QString reported;
  RunModal(form, [&] {
    Runtime().QueueMessageBox([&](QMessageBox& box) {
      reported = box.text();
      box.button(QMessageBox::Ok)->click();
    });
    Click(form.cmdGo);
    EXPECT_TRUE(form.Visible()); // the session goes on
  });
  ASSERT_EQ(Runtime().UnhandledErrors().size(), 1u);
  EXPECT_EQ(Runtime().UnhandledErrors()[0].where, "cmdGo_Click");
  EXPECT_EQ(Runtime().UnhandledErrors()[0].number, 3021);
  EXPECT_TRUE(reported.contains("No current record"));
}

TEST_F(QtFormsTest, ACallFromAnotherThreadIsRefusedWithAClearError) {
  frmBusy form;
  long number = 0;
  std::string description;
  bool refusedShow = false;
  std::thread worker([&] {
    belvane::forms::ScopedRuntime use(Runtime());
    try {
      belvane::forms::MsgBox("from a worker");
    } catch (const belvane::Error& e) {
      number = e.Number();
      description = e.Description();
    }
    try {
      form.Show(belvane::forms::ShowStyle::Modal);
    } catch (const belvane::Error&) {
      refusedShow = !form.Visible(); // refused, and not left marked shown
    }
  });
  worker.join();
  EXPECT_EQ(number, 5);
  EXPECT_NE(description.find("GUI thread"), std::string::npos) << description;
  EXPECT_TRUE(refusedShow);
  EXPECT_EQ(Runtime().Window(form), nullptr);
}

// Run on its own (as ctest does), the test starts with no application.
TEST(QtApplication, IsCreatedOnFirstUseWhenTheHostHasNone) {
  if (QCoreApplication::instance()) GTEST_SKIP() << "an application exists already";
  QtRuntime runtime;
  belvane::forms::ScopedRuntime use(runtime);
  bool answered = false;
  runtime.QueueMessageBox([&](QMessageBox& box) {
    answered = true;
    box.button(QMessageBox::Ok)->click();
  });
  EXPECT_EQ(belvane::forms::MsgBox("first use"), msgbox::kOk);
  EXPECT_TRUE(answered);
  ASSERT_NE(qobject_cast<QApplication*>(QCoreApplication::instance()), nullptr);
  EXPECT_TRUE(QCoreApplication::testAttribute(Qt::AA_ShareOpenGLContexts));
}

// Run on its own: with nowhere to show windows, the first use is refused
// with an error instead of the process aborting.
TEST(QtApplication, IsRefusedWithAClearErrorWhereThereIsNoDisplay) {
  if (QCoreApplication::instance()) GTEST_SKIP() << "an application exists already";
  const QByteArray platform = qgetenv("QT_QPA_PLATFORM");
  const QByteArray display = qgetenv("DISPLAY");
  const QByteArray wayland = qgetenv("WAYLAND_DISPLAY");
  qunsetenv("QT_QPA_PLATFORM");
  qunsetenv("DISPLAY");
  qunsetenv("WAYLAND_DISPLAY");
  QtRuntime runtime;
  belvane::forms::ScopedRuntime use(runtime);
  long number = 0;
  std::string description;
  try {
    belvane::forms::MsgBox("no display");
  } catch (const belvane::Error& e) {
    number = e.Number();
    description = e.Description();
  }
  qputenv("QT_QPA_PLATFORM", platform);
  if (!display.isEmpty()) qputenv("DISPLAY", display);
  if (!wayland.isEmpty()) qputenv("WAYLAND_DISPLAY", wayland);
  EXPECT_EQ(number, 5);
  EXPECT_NE(description.find("No display"), std::string::npos) << description;
  EXPECT_EQ(QCoreApplication::instance(), nullptr);
}
