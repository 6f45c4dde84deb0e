#pragma once
// The page host of the headless runtime: what a WebBrowser shows when no
// desktop view loads its pages. A navigation is pending until the message
// loop runs (a modal form's session starts, or DoEvents): then the page's
// file is read into the browser's document stand-ins and the navigation
// completes (DownloadComplete, DocumentComplete). An address that names no
// readable local file completes with the browser's error page, which has no
// elements.
//
// Headless there is no script engine; the user's clicks on a page play the
// page's script by the rules the diagram pages follow: an element with a
// data-group attribute hands that group through the page's "event_trap"
// input (sets its value, clicks it), an element with a data-cancel
// attribute hands "cancel" the same way, and a click on the trap itself
// clicks it as it is. A page without the trap does nothing.

#include <cstddef>
#include <string>
#include <string_view>

namespace belvane::forms {

class WebBrowser;

class PageHost {
public:
  // The element through which the pages hand back what the user picked.
  static constexpr std::string_view kTrapName = "event_trap";
  // The largest page file read; a larger one shows the error page.
  static constexpr std::size_t kMaxPageBytes = 8u << 20;

  // The local file an address names: a path as it stands, or the path of a
  // file: URL, percent-escapes decoded. Empty for any other scheme.
  static std::string LocalPath(std::string_view url);

  // Loads the browser's page now and completes its navigation.
  static void Load(WebBrowser& browser);
  // Completes the pending navigation of every browser on a shown form.
  static void CompletePending();

  // The user clicks the element with that id or name on the browser's page.
  // False when the input is refused (the browser takes no input, no page
  // is loaded, or the page has no such element).
  static bool Click(WebBrowser& browser, std::string_view nameOrId);
  // The user clicks the element whose data-group is `group` (exactly), or
  // the element carrying data-cancel.
  static bool PickGroup(WebBrowser& browser, std::string_view group);
  static bool Cancel(WebBrowser& browser);
};

} // namespace belvane::forms
