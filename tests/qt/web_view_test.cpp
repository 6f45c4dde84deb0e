// The web browser's view: a local page loads and completes the model's
// navigation; a remote address is never fetched.

#include "qt_fixture.hpp"

#include "../data/temp_dir.hpp"
#include "qt/web_view.hpp"

#include <QWebEngineView>

#include <fstream>
#include <unistd.h>

using namespace belvane::qt;
using namespace belvane::qt::testing;

namespace {

class frmPage : public belvane::forms::Form {
public:
  belvane::forms::WebBrowser wb1{*this, "wb1"};
  std::vector<std::string> completed;
  frmPage() : Form("frmPage") {
    wb1.OnDocumentComplete = [this](const std::string& url) { completed.push_back(url); };
  }

protected:
  void Design() override {
    ScaleWidth(6000);
    ScaleHeight(4000);
    wb1.Move(120, 120, 5700, 3700);
  }
};

} // namespace

TEST_F(QtFormsTest, ALocalPageLoadsAndCompletesTheNavigation) {
  // The browser engine refuses to start as root with its sandbox on; tests
  // here run as root, the application never turns it off.
  if (geteuid() == 0) qputenv("QTWEBENGINE_DISABLE_SANDBOX", "1");
  belvane::test::TempDir dir("web-view");
  const std::string page = dir.File("page.html");
  std::ofstream(page) << "<html><body><p id='event_trap'>Front bumper</p></body></html>";

  frmPage form;
  RunModal(form, [&] {
    form.wb1.Navigate(page);
    EXPECT_TRUE(form.wb1.Busy());
    ASSERT_TRUE(QTest::qWaitFor([&] { return !form.completed.empty(); }, 30000));
    EXPECT_EQ(form.completed, std::vector<std::string>{page});
    EXPECT_FALSE(form.wb1.Busy());
    auto* view = dynamic_cast<WebView*>(Runtime().View(form.wb1));
    ASSERT_NE(view, nullptr);
    EXPECT_TRUE(view->Browser()->url().isLocalFile());

    // A page of another site is refused: it never shows.
    form.wb1.Navigate("http://example.com/diagram.html");
    QTest::qWait(300);
    EXPECT_NE(view->Browser()->url().host(), "example.com");
    Runtime().Window(form)->close();
  });
}
