#pragma once
// The web browser's view: a QWebEngineView confined to local pages. It
// loads the model's address and, when the page has loaded, completes the
// model's navigation (DownloadComplete, DocumentComplete). The page may
// show local files and about: pages only: other navigations, new windows
// and requests for anything not local are refused, and the page runs in
// an off-the-record profile.

#include "qt/control_view.hpp"

class QWebEngineView;

namespace belvane::forms {
class WebBrowser;
}

namespace belvane::qt {

class WebView : public ControlView {
  Q_OBJECT
public:
  WebView(FormWindow& window, forms::WebBrowser& browser, QWidget* parent);
  void SyncAll() override;
  QWebEngineView* Browser() const noexcept { return view_; }

protected:
  void Sync(grid::Property property) override;

private:
  void Load();
  void Loaded(bool ok);

  forms::WebBrowser& browser_;
  QWebEngineView* view_;
  std::string loading_; // the address being loaded
};

} // namespace belvane::qt
