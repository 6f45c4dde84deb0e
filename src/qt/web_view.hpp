#pragma once
// The web browser's view: a QWebEngineView confined to the folder of the
// page the model navigated to. It loads the model's address and, when the
// page has loaded, completes the model's navigation with the page's
// elements (every element with an id or a name: its tag, id, name and
// value), so a form can find and trap them; a page that fails to load
// completes with the error page, which has none. The page may show files of
// its own folder (and below) and about:blank only: other navigations, new
// windows and requests for anything else are refused, and the page runs in
// an off-the-record profile.
//
// Clicks on an element that a form traps (an HtmlElement with an OnClick
// handler) reach the form through a script injected into an isolated world
// when each document is created, which listens for clicks on the trapped
// elements, cancels their default action in the page and passes the
// element's value over a QWebChannel known only to that world. The page's
// own scripts can neither see that script nor reach the channel; they can
// only click the element, which is the contract.

#include "qt/control_view.hpp"

#include <QString>
#include <QVariantList>

#include <memory>
#include <string>
#include <vector>

class QWebEngineView;
class QWebChannel;

namespace belvane::forms {
class WebBrowser;
class HtmlDocument;
class HtmlElement;
} // namespace belvane::forms

namespace belvane::qt {

class WebView;

// The object the isolated script calls over the web channel.
class PageBridge : public QObject {
  Q_OBJECT
public:
  explicit PageBridge(WebView& view);

public slots:
  // A trapped element of the document `generation` was clicked; `value` is
  // its value at the click.
  void elementClicked(int generation, int index, const QString& value);

private:
  WebView& view_;
};

class WebView : public ControlView {
  Q_OBJECT
public:
  // The isolated world of the script that traps clicks.
  static constexpr unsigned kTrapWorld = 1;
  // The folder the page may use (web_view.cpp).
  struct Confinement;

  WebView(FormWindow& window, forms::WebBrowser& browser, QWidget* parent);
  ~WebView() override;
  void SyncAll() override;
  QWebEngineView* Browser() const noexcept { return view_; }
  // The folder (with a trailing separator) the page is confined to; empty
  // when the model's address names no local file.
  QString AllowedFolder() const;

protected:
  void Sync(grid::Property property) override;

private:
  friend class PageBridge;
  void Load();
  void Loaded(bool ok);
  void Complete(std::shared_ptr<forms::HtmlDocument> document,
                std::vector<forms::HtmlElement*> elements);
  void Clicked(int generation, int index, const QString& value);

  forms::WebBrowser& browser_;
  QWebEngineView* view_;
  QWebChannel* channel_;
  std::string loading_; // the address being loaded
  int generation_ = 0;  // counts completed documents
  std::weak_ptr<forms::HtmlDocument> document_;
  std::vector<forms::HtmlElement*> elements_; // by the index the script uses
  std::shared_ptr<Confinement> confinement_;
};

} // namespace belvane::qt
