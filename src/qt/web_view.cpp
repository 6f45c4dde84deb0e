#include "qt/web_view.hpp"

#include "forms/controls.hpp"
#include "qt/form_window.hpp"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QWebChannel>
#include <QWebEnginePage>
#include <QWebEngineProfile>
#include <QWebEngineScript>
#include <QWebEngineScriptCollection>
#include <QWebEngineSettings>
#include <QWebEngineUrlRequestInterceptor>
#include <QWebEngineView>

#include <memory>
#include <mutex>

namespace belvane::qt {

namespace {

// Runs in the isolated world of every document, from its creation: numbers
// the elements the model's document holds, and passes clicks on the ones a
// form traps to the web channel (queued until the channel is up).
constexpr const char* kTrapScript = R"JS(
(function () {
  'use strict';
  var elements = [];
  var watched = new Set();
  var generation = -1;
  var bridge = null;
  var queue = [];
  new QWebChannel(qt.webChannelTransport, function (channel) {
    bridge = channel.objects.belvanePage;
    queue.splice(0).forEach(function (c) { bridge.elementClicked(c[0], c[1], c[2]); });
  });
  window.belvaneCollect = function () {
    elements = Array.prototype.slice.call(document.querySelectorAll('[id],[name]'), 0, 10000);
    return elements.map(function (el) {
      var value = ('value' in el && el.value !== null && el.value !== undefined) ? String(el.value) : '';
      return [el.tagName.toLowerCase(), el.id || '', el.getAttribute('name') || '', value];
    });
  };
  window.belvaneWatch = function (g, indexes) {
    generation = g;
    watched = new Set(indexes);
  };
  document.addEventListener('click', function (e) {
    var i = elements.indexOf(e.target);
    if (i < 0 || !watched.has(i)) return;
    e.preventDefault();
    var call = [generation, i, String(e.target.value)];
    if (bridge) bridge.elementClicked(call[0], call[1], call[2]); else queue.push(call);
  }, true);
})();
)JS";

QString ChannelScript() {
  QFile file(QStringLiteral(":/qtwebchannel/qwebchannel.js"));
  if (!file.open(QIODevice::ReadOnly)) return {};
  return QString::fromUtf8(file.readAll());
}

// Whether a local file lies in the folder (a folder path with its trailing
// separator), compared on the cleaned absolute path, links resolved where
// the file exists.
bool InFolder(const QString& folder, const QUrl& url) {
  if (folder.isEmpty() || !url.isLocalFile()) return false;
  const QFileInfo info(url.toLocalFile());
  QString path =
      info.exists() ? info.canonicalFilePath() : QDir::cleanPath(info.absoluteFilePath());
  return path.startsWith(folder);
}

} // namespace

// The folder the page may use, shared with the request interceptor, which
// runs on the browser engine's own thread.
struct WebView::Confinement {
  std::mutex lock;
  QString folder;
  QString Folder() {
    std::lock_guard guard(lock);
    return folder;
  }
  void Folder(QString f) {
    std::lock_guard guard(lock);
    folder = std::move(f);
  }
  bool Allows(const QUrl& url) {
    if (url.scheme() == QLatin1String("about") || url.scheme() == QLatin1String("data") ||
        url.scheme() == QLatin1String("qrc"))
      return true;
    return InFolder(Folder(), url);
  }
};

namespace {

class FolderOnly : public QWebEngineUrlRequestInterceptor {
public:
  FolderOnly(std::shared_ptr<WebView::Confinement> confinement, QObject* parent)
      : QWebEngineUrlRequestInterceptor(parent), confinement_(std::move(confinement)) {}
  void interceptRequest(QWebEngineUrlRequestInfo& info) override {
    if (!confinement_->Allows(info.requestUrl())) info.block(true);
  }

private:
  std::shared_ptr<WebView::Confinement> confinement_;
};

class ConfinedPage : public QWebEnginePage {
public:
  ConfinedPage(std::shared_ptr<WebView::Confinement> confinement, QWebEngineProfile* profile,
               QObject* parent)
      : QWebEnginePage(profile, parent), confinement_(std::move(confinement)) {}

protected:
  bool acceptNavigationRequest(const QUrl& url, NavigationType, bool) override {
    if (url.scheme() == QLatin1String("about"))
      return url.toString() == QLatin1String("about:blank");
    return url.isLocalFile() && confinement_->Allows(url);
  }
  QWebEnginePage* createWindow(WebWindowType) override { return nullptr; }

private:
  std::shared_ptr<WebView::Confinement> confinement_;
};

} // namespace

// ---- the bridge ----

PageBridge::PageBridge(WebView& view) : QObject(&view), view_(view) {}

void PageBridge::elementClicked(int generation, int index, const QString& value) {
  view_.Clicked(generation, index, value);
}

// ---- the view ----

WebView::WebView(FormWindow& window, forms::WebBrowser& browser, QWidget* parent)
    : ControlView(window, browser, new QWebEngineView(parent)), browser_(browser),
      view_(static_cast<QWebEngineView*>(Widget())), channel_(new QWebChannel(this)),
      confinement_(std::make_shared<Confinement>()) {
  // No storage name: off the record. The profile must outlive its page, so
  // it goes once the page has gone.
  auto* profile = new QWebEngineProfile();
  profile->setUrlRequestInterceptor(new FolderOnly(confinement_, profile));
  auto* page = new ConfinedPage(confinement_, profile, view_);
  connect(page, &QObject::destroyed, profile, &QObject::deleteLater);
  page->settings()->setAttribute(QWebEngineSettings::LocalContentCanAccessRemoteUrls, false);
  page->settings()->setAttribute(QWebEngineSettings::JavascriptCanOpenWindows, false);
  page->settings()->setAttribute(QWebEngineSettings::FocusOnNavigationEnabled, true);

  channel_->registerObject(QStringLiteral("belvanePage"), new PageBridge(*this));
  page->setWebChannel(channel_, kTrapWorld);
  QWebEngineScript trap;
  trap.setName(QStringLiteral("belvane-trap"));
  trap.setInjectionPoint(QWebEngineScript::DocumentCreation);
  trap.setWorldId(kTrapWorld);
  trap.setRunsOnSubFrames(false);
  trap.setSourceCode(ChannelScript() + QString::fromUtf8(kTrapScript));
  page->scripts().insert(trap);

  view_->setPage(page);
  connect(view_, &QWebEngineView::loadFinished, this, [this](bool ok) { Loaded(ok); });
}

WebView::~WebView() = default;

QString WebView::AllowedFolder() const { return confinement_->Folder(); }

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
  elements_.clear();
  document_.reset();
  if (loading_.empty()) {
    confinement_->Folder({});
    view_->setUrl(QUrl(QStringLiteral("about:blank")));
    return;
  }
  const QUrl url =
      QUrl::fromUserInput(ToQString(loading_), QDir::currentPath(), QUrl::AssumeLocalFile);
  QString folder;
  if (url.isLocalFile()) {
    const QFileInfo info(url.toLocalFile());
    const QFileInfo dir(info.absolutePath());
    folder = dir.exists() ? dir.canonicalFilePath() : QDir::cleanPath(dir.absoluteFilePath());
    if (!folder.endsWith(u'/')) folder += u'/';
  }
  confinement_->Folder(folder);
  view_->load(url);
}

// The page has loaded: its elements are numbered in the isolated world and
// the model's navigation completes with them. A load of an address the
// model has since left is no concern.
void WebView::Loaded(bool ok) {
  if (!Alive() || loading_.empty() || loading_ != browser_.LocationURL() || !browser_.Busy())
    return;
  if (!ok) {
    auto document = std::make_shared<forms::HtmlDocument>();
    document->IsErrorPage(true);
    document->Title(ToUtf8(view_->title()));
    Complete(std::move(document), {});
    return;
  }
  const std::string address = loading_;
  QPointer<WebView> self(this);
  view_->page()->runJavaScript(
      QStringLiteral("belvaneCollect()"), kTrapWorld, [self, address](const QVariant& result) {
        if (!self || !self->Alive() || address != self->browser_.LocationURL() ||
            !self->browser_.Busy())
          return;
        auto document = std::make_shared<forms::HtmlDocument>();
        document->Title(ToUtf8(self->view_->title()));
        std::vector<forms::HtmlElement*> elements;
        for (const QVariant& item : result.toList()) {
          const QVariantList e = item.toList();
          if (e.size() != 4) continue;
          forms::HtmlElement& element =
              document->AddElement(ToUtf8(e[1].toString()), ToUtf8(e[0].toString()));
          element.Name(ToUtf8(e[2].toString()));
          element.Value(ToUtf8(e[3].toString()));
          elements.push_back(&element);
        }
        self->Complete(std::move(document), std::move(elements));
      });
}

void WebView::Complete(std::shared_ptr<forms::HtmlDocument> document,
                       std::vector<forms::HtmlElement*> elements) {
  ++generation_;
  document_ = document;
  elements_ = std::move(elements);
  RunHandler(ControlName(browser_) + "_DocumentComplete",
             [this, &document] { browser_.CompleteNavigation(document); });
  if (!Alive() || browser_.DocumentHandle() != document) return;
  // The engine's own widget (the view's focus proxy) comes with the first
  // page: a browser that has the focus gives it the keyboard now.
  if (browser_.HasFocus()) window_.FollowFocus();
  // The page's script learns which elements the form now traps.
  QStringList trapped;
  for (std::size_t i = 0; i < elements_.size(); ++i)
    if (elements_[i]->OnClick) trapped << QString::number(i);
  view_->page()->runJavaScript(
      QStringLiteral("belvaneWatch(%1, [%2])").arg(generation_).arg(trapped.join(QLatin1Char(','))),
      kTrapWorld);
}

void WebView::Clicked(int generation, int index, const QString& value) {
  if (!Alive() || generation != generation_ || index < 0 ||
      static_cast<std::size_t>(index) >= elements_.size())
    return;
  const std::shared_ptr<forms::HtmlDocument> document = document_.lock();
  if (!document || browser_.DocumentHandle() != document) return;
  forms::HtmlElement* element = elements_[static_cast<std::size_t>(index)];
  if (!element->OnClick) return;
  element->Value(ToUtf8(value));
  RunHandler(element->Id() + "_onclick", [element] { element->Click(); });
}

} // namespace belvane::qt
