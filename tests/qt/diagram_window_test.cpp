// The diagram window in the Qt runtime over the real pages in the browser
// engine: a panel clicked with the mouse, a group picked from the keyboard,
// Escape, the page for makes without a drawing, and what the page may not
// do (reach the trap's channel, leave its folder).
//
// With BELVANE_SCREENSHOTS set to a folder, the test also saves pictures of
// both pages in the window there (docs/screenshots is made that way).

#include "qt_fixture.hpp"

#include "../data/temp_dir.hpp"
#include "diagram/frm_butterfly.hpp"
#include "diagram/registry.hpp"
#include "qt/web_view.hpp"

#include <QWebEnginePage>
#include <QWebEngineView>

#include <cstdlib>
#include <optional>
#include <unistd.h>

using namespace belvane;
using namespace belvane::qt;
using namespace belvane::qt::testing;
using diagram::frmButterfly;

namespace {

class DiagramWindowTest : public QtFormsTest {
protected:
  void SetUp() override {
    // The browser engine refuses to start as root with its sandbox on; tests
    // here run as root, the application never turns it off.
    if (geteuid() == 0) qputenv("QTWEBENGINE_DISABLE_SANDBOX", "1");
    diagram::SetHiveFilePath(diagram::Hive::LocalMachine, dir_.File("machine.json"));
    diagram::SetHiveFilePath(diagram::Hive::CurrentUser, dir_.File("user.json"));
    QtFormsTest::SetUp();
  }
  void TearDown() override {
    QtFormsTest::TearDown();
    diagram::SetHiveFilePath(diagram::Hive::LocalMachine, "");
    diagram::SetHiveFilePath(diagram::Hive::CurrentUser, "");
  }

  WebView* ViewOf(frmButterfly& form) { return dynamic_cast<WebView*>(Runtime().View(form.wb1)); }

  // The page has loaded, the form has bound its trap and the page answers.
  bool WaitForPage(frmButterfly& form) {
    if (!QTest::qWaitFor([&] { return !form.wb1.Busy() && form.wb1.Document(); }, 30000))
      return false;
    return Evaluate(form, QStringLiteral("document.readyState")).toString() == "complete";
  }

  QVariant Evaluate(frmButterfly& form, const QString& script) {
    std::optional<QVariant> result;
    ViewOf(form)->Browser()->page()->runJavaScript(script, [&](const QVariant& v) { result = v; });
    (void)QTest::qWaitFor([&] { return result.has_value(); }, 10000);
    return result.value_or(QVariant());
  }

  // The centre of a page element, in the view's pixels.
  QPoint CentreOf(frmButterfly& form, const QString& selector) {
    const QVariantList xy =
        Evaluate(form, QStringLiteral("(function(){var r=document.querySelector('%1')"
                                      ".getBoundingClientRect();return [r.x+r.width/2,"
                                      "r.y+r.height/2];})()")
                           .arg(selector))
            .toList();
    if (xy.size() != 2) return {};
    return {qRound(xy[0].toDouble()), qRound(xy[1].toDouble())};
  }

  // Clicks with the mouse until the window goes (a click at once after a
  // load may be dropped by the engine).
  bool ClickUntilHidden(frmButterfly& form, const QString& selector) {
    QWidget* target = ViewOf(form)->Browser()->focusProxy();
    const QPoint at = CentreOf(form, selector);
    for (int attempt = 0; attempt < 5 && form.Visible(); ++attempt) {
      QTest::mouseClick(target, Qt::LeftButton, {}, at);
      (void)QTest::qWaitFor([&] { return !form.Visible(); }, 2000);
    }
    return !form.Visible();
  }

  void Picture(frmButterfly& form, const char* name) {
    const char* folder = std::getenv("BELVANE_SCREENSHOTS");
    if (!folder || !*folder) return;
    QWidget* window = Runtime().Window(form);
    QTest::qWait(300); // the engine paints the last change
    EXPECT_TRUE(WindowPicture(*window).save(QString::fromUtf8(folder) + "/" + name));
  }

  // Shows the window; `user` plays the user once the window is active.
  void Show(frmButterfly& form, bool drawing, const std::function<void()>& user) {
    Runtime().QueueModal([&, user](forms::Form&) {
      ASSERT_TRUE(QTest::qWaitForWindowActive(Runtime().Window(form)));
      user();
    });
    form.ShowForm(drawing);
  }

  test::TempDir dir_{"diagram-window"};
};

} // namespace

TEST_F(DiagramWindowTest, APanelClickedOnTheDrawingHandsItsGroupBackAndTheKeyboardWorksToo) {
  frmButterfly form;
  Show(form, true, [&] {
    ASSERT_TRUE(WaitForPage(form));
    EXPECT_EQ(form.wb1.LocationURL(), diagram::DefaultGraphicsFolder() + "butterfly.html");
    EXPECT_EQ(form.Caption(), "Search Parts");
    // Hovering names the panel.
    QTest::mouseMove(ViewOf(form)->Browser()->focusProxy(),
                     CentreOf(form, "[data-group=\"L/H FRONT DOOR\"]"));
    EXPECT_TRUE(QTest::qWaitFor(
        [&] {
          return Evaluate(form, "document.getElementById('panel-name').textContent")
              .toString()
              .startsWith("L/H front door");
        },
        5000));
    Picture(form, "diagram-butterfly.png");
    EXPECT_TRUE(ClickUntilHidden(form, "[data-group=\"L/H FRONT DOOR\"]"));
  });
  EXPECT_TRUE(form.mbSearchGroup);
  EXPECT_EQ(form.msSearchStr, "L/H FRONT DOOR");

  // Shown again, the page is the one already loaded, the clicked panel
  // still focused: Tab moves on to the next panel, Enter picks it.
  const auto* first = form.wb1.Document();
  QString tabbedTo;
  Show(form, true, [&] {
    EXPECT_EQ(form.wb1.Document(), first);
    EXPECT_FALSE(form.mbSearchGroup); // cleared as the window came up
    QWidget* page = ViewOf(form)->Browser()->focusProxy();
    QTest::keyClick(page, Qt::Key_Tab);
    ASSERT_TRUE(QTest::qWaitFor(
        [&] {
          tabbedTo = Evaluate(form, "document.activeElement.getAttribute('data-group')").toString();
          return !tabbedTo.isEmpty() && tabbedTo != "L/H FRONT DOOR";
        },
        5000));
    EXPECT_TRUE(QTest::qWaitFor(
        [&] {
          return Evaluate(form, "document.getElementById('panel-name').textContent")
              .toString()
              .contains(tabbedTo);
        },
        5000)); // focus names the panel too
    QTest::keyClick(page, Qt::Key_Return);
    EXPECT_TRUE(QTest::qWaitFor([&] { return !form.Visible(); }, 5000));
  });
  EXPECT_TRUE(form.mbSearchGroup);
  EXPECT_EQ(form.msSearchStr, tabbedTo.toStdString());

  // Escape is the page's cancel.
  Show(form, true, [&] {
    QWidget* page = ViewOf(form)->Browser()->focusProxy();
    for (int attempt = 0; attempt < 5 && form.Visible(); ++attempt) {
      QTest::keyClick(page, Qt::Key_Escape);
      (void)QTest::qWaitFor([&] { return !form.Visible(); }, 2000);
    }
    EXPECT_FALSE(form.Visible());
  });
  EXPECT_FALSE(form.mbSearchGroup);
  EXPECT_EQ(form.msSearchStr, "");
}

TEST_F(DiagramWindowTest, TheGroupButtonsOfTheNoDrawingPageAndItsCancelButton) {
  frmButterfly form;
  Show(form, false, [&] {
    ASSERT_TRUE(WaitForPage(form));
    EXPECT_EQ(form.wb1.LocationURL(), diagram::DefaultGraphicsFolder() + "nobutterfly.html");
    QTest::mouseMove(ViewOf(form)->Browser()->focusProxy(),
                     CentreOf(form, "[data-group=\"R/H QUARTER PANEL\"]"));
    QTest::qWait(200);
    Picture(form, "diagram-nobutterfly.png");
    EXPECT_TRUE(ClickUntilHidden(form, "[data-group=\"ROOF\"]"));
  });
  EXPECT_TRUE(form.mbSearchGroup);
  EXPECT_EQ(form.msSearchStr, "ROOF");

  Show(form, false, [&] { EXPECT_TRUE(ClickUntilHidden(form, "#cancel")); });
  EXPECT_FALSE(form.mbSearchGroup);
  EXPECT_EQ(form.msSearchStr, "");
}

TEST_F(DiagramWindowTest, ThePageCannotReachTheTrapsChannelNorLeaveItsFolder) {
  frmButterfly form;
  Show(form, true, [&] {
    ASSERT_TRUE(WaitForPage(form));
    // The page's own world has neither the channel nor the trap's script.
    EXPECT_EQ(Evaluate(form, "typeof qt + ',' + typeof QWebChannel + ',' + typeof belvaneWatch")
                  .toString(),
              "undefined,undefined,undefined");
    const QUrl page = ViewOf(form)->Browser()->url();
    // A navigation out of the graphics folder is refused; the page stays.
    Evaluate(form, "location.href = 'file:///etc/hostname'; 1");
    QTest::qWait(500);
    EXPECT_EQ(ViewOf(form)->Browser()->url(), page);
    EXPECT_TRUE(form.Visible());
    // A click the page makes on its trap is still a pick: that is the
    // contract, and nothing else reaches the form.
    Evaluate(form, "var t=document.getElementById('event_trap'); t.value='Front Bumper'; "
                   "t.click(); 1");
    EXPECT_TRUE(QTest::qWaitFor([&] { return !form.Visible(); }, 5000));
  });
  EXPECT_TRUE(form.mbSearchGroup);
  EXPECT_EQ(form.msSearchStr, "Front Bumper");
}

TEST_F(DiagramWindowTest, AMissingPageShowsTheErrorPageAndClosingGivesNoGroup) {
  const std::string empty = dir_.File("empty") + "/";
  std::filesystem::create_directories(empty);
  diagram::CreateRegKey(diagram::Hive::LocalMachine, "SOFTWARE\\tessik\\frmsplash");
  ASSERT_TRUE(diagram::WriteRegValue(diagram::Hive::LocalMachine, "SOFTWARE\\tessik\\frmsplash",
                                     "GraphicsPath", empty));
  frmButterfly form;
  Show(form, true, [&] {
    ASSERT_TRUE(QTest::qWaitFor([&] { return !form.wb1.Busy() && form.wb1.Document(); }, 30000));
    EXPECT_EQ(form.wb1.LocationURL(), empty + "butterfly.html");
    EXPECT_TRUE(form.wb1.Document()->IsErrorPage());
    Runtime().Window(form)->close();
  });
  EXPECT_FALSE(form.mbSearchGroup);
  EXPECT_EQ(form.msSearchStr, "");
}
