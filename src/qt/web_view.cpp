#include "qt/web_view.hpp"

#include "forms/controls.hpp"

#include <QDir>
#include <QWebEnginePage>
#include <QWebEngineProfile>
#include <QWebEngineSettings>
#include <QWebEngineUrlRequestInterceptor>
#include <QWebEngineView>

#include <memory>

namespace belvane::qt {

namespace {

bool IsLocal(const QUrl& url) {
  return url.isLocalFile() || url.scheme() == QLatin1String("about") ||
         url.scheme() == QLatin1String("data");
}

class LocalOnly : public QWebEngineUrlRequestInterceptor {
public:
  using QWebEngineUrlRequestInterceptor::QWebEngineUrlRequestInterceptor;
  void interceptRequest(QWebEngineUrlRequestInfo& info) override {
    if (!IsLocal(info.requestUrl())) info.block(true);
  }
};

class ConfinedPage : public QWebEnginePage {
public:
  using QWebEnginePage::QWebEnginePage;

protected:
  bool acceptNavigationRequest(const QUrl& url, NavigationType, bool) override {
    return IsLocal(url);
  }
  QWebEnginePage* createWindow(WebWindowType) override { return nullptr; }
};

} // namespace

WebView::WebView(FormWindow& window, forms::WebBrowser& browser, QWidget* parent)
    : ControlView(window, browser, new QWebEngineView(parent)), browser_(browser),
      view_(static_cast<QWebEngineView*>(Widget())) {
  auto* profile = new QWebEngineProfile(view_); // no storage name: off the record
  profile->setUrlRequestInterceptor(new LocalOnly(profile));
  auto* page = new ConfinedPage(profile, view_);
  page->settings()->setAttribute(QWebEngineSettings::LocalContentCanAccessRemoteUrls, false);
  page->settings()->setAttribute(QWebEngineSettings::JavascriptCanOpenWindows, false);
  view_->setPage(page);
  connect(view_, &QWebEngineView::loadFinished, this, [this](bool ok) { Loaded(ok); });
}

void WebView::SyncAll() {
  ControlView::SyncAll();
  Load();
}

void WebView::Sync(grid::Property property) {
  if (property == grid::Property::Location) Load();
}

void WebView::Load() {
  if (!Alive()) return;
  loading_ = browser_.LocationURL();
  if (loading_.empty()) {
    view_->setUrl(QUrl(QStringLiteral("about:blank")));
    return;
  }
  view_->load(QUrl::fromUserInput(ToQString(loading_), QDir::currentPath(), QUrl::AssumeLocalFile));
}

// The page has loaded: the model's navigation completes with a document of
// its own. A load of an address the model has since left is no concern.
void WebView::Loaded(bool /*ok*/) {
  if (!Alive() || loading_.empty() || loading_ != browser_.LocationURL() || !browser_.Busy())
    return;
  RunHandler(ControlName(browser_) + "_DocumentComplete",
             [this] { browser_.CompleteNavigation(std::make_shared<forms::HtmlDocument>()); });
}

} // namespace belvane::qt
