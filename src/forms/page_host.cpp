#include "forms/page_host.hpp"

#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/input.hpp"
#include "forms/runtime.hpp"
#include "forms/windows.hpp"
#include "text/error.hpp"

#include <algorithm>
#include <cctype>
#include <fstream>
#include <vector>

namespace belvane::forms {

namespace {

int HexDigit(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

// Runs the page's handler of a click as the input paths run handlers: an
// error ends the handler and goes to the runtime.
bool RunClick(HtmlElement& element) {
  try {
    return element.Click();
  } catch (const Error& e) {
    CurrentRuntime().UnhandledError(element.Id() + "_onclick", e.Number(), e.Description());
  } catch (const std::exception& e) {
    CurrentRuntime().UnhandledError(element.Id() + "_onclick", 0, e.what());
  }
  return true;
}

// The page's script handing a text through the trap.
void HandThrough(HtmlDocument& document, const std::string& text) {
  HtmlElement* trap = document.Find(PageHost::kTrapName);
  if (!trap) return;
  trap->Value(text);
  RunClick(*trap);
}

} // namespace

std::string PageHost::LocalPath(std::string_view url) {
  constexpr std::string_view kFile = "file:";
  const bool isFile = url.size() >= kFile.size() && [&] {
    for (std::size_t i = 0; i < kFile.size(); ++i)
      if (std::tolower(static_cast<unsigned char>(url[i])) != kFile[i]) return false;
    return true;
  }();
  if (!isFile) {
    // Any other scheme ("http:", "about:") names no local file.
    const std::size_t colon = url.find(':');
    const std::size_t slash = url.find('/');
    if (colon != std::string_view::npos && (slash == std::string_view::npos || colon < slash))
      return {};
    return std::string(url);
  }
  std::string_view rest = url.substr(kFile.size());
  if (rest.rfind("//", 0) == 0) {
    rest.remove_prefix(2);
    const std::size_t slash = rest.find('/');
    const std::string_view host = rest.substr(0, slash);
    if (!host.empty() && host != "localhost") return {};
    rest = slash == std::string_view::npos ? std::string_view() : rest.substr(slash);
  }
  std::string path;
  for (std::size_t i = 0; i < rest.size(); ++i) {
    if (rest[i] == '%' && i + 2 < rest.size() && HexDigit(rest[i + 1]) >= 0 &&
        HexDigit(rest[i + 2]) >= 0) {
      path += static_cast<char>(HexDigit(rest[i + 1]) * 16 + HexDigit(rest[i + 2]));
      i += 2;
    } else if (rest[i] == '?' || rest[i] == '#') {
      break;
    } else {
      path += rest[i];
    }
  }
  return path;
}

void PageHost::Load(WebBrowser& browser) {
  const std::string url = browser.LocationURL();
  std::shared_ptr<HtmlDocument> document;
  if (url == "about:blank") {
    document = std::make_shared<HtmlDocument>();
  } else if (const std::string path = LocalPath(url); !path.empty()) {
    std::ifstream in(path, std::ios::binary);
    std::string html;
    bool read = static_cast<bool>(in);
    if (read) {
      char buffer[65536];
      while (in.read(buffer, sizeof buffer) || in.gcount() > 0) {
        html.append(buffer, static_cast<std::size_t>(in.gcount()));
        if (html.size() > kMaxPageBytes) break;
      }
      read = !in.bad() && html.size() <= kMaxPageBytes;
    }
    if (read) document = HtmlDocument::FromHtml(html);
  }
  if (!document) {
    document = std::make_shared<HtmlDocument>();
    document->Title("This page cannot be displayed");
    document->IsErrorPage(true);
  }
  browser.CompleteNavigation(std::move(document));
}

void PageHost::CompletePending() {
  // Handlers may show or hide forms: walk a copy, and look again at each.
  const std::vector<Form*> shown = detail::Windows().shown;
  for (Form* form : shown) {
    const auto& now = detail::Windows().shown;
    if (std::find(now.begin(), now.end(), form) == now.end()) continue;
    const std::vector<Control*> controls = form->Controls();
    for (Control* control : controls)
      if (control->Kind() == ControlKind::WebBrowser) {
        auto& browser = static_cast<WebBrowser&>(*control);
        if (browser.Busy()) Load(browser);
      }
  }
}

bool PageHost::Click(WebBrowser& browser, std::string_view nameOrId) {
  if (!Input::Accepts(browser) || browser.Busy()) return false;
  HtmlDocument* document = browser.Document();
  if (!document) return false;
  HtmlElement* element = document->Find(nameOrId);
  if (!element) return false;
  // Keep the page alive while its script runs: a handler may navigate.
  const std::shared_ptr<HtmlDocument> keep = browser.DocumentHandle();
  if (element->Id() == kTrapName || element->Name() == kTrapName) {
    RunClick(*element);
  } else if (const std::string* group = element->Attribute("data-group")) {
    HandThrough(*document, *group);
  } else if (element->Attribute("data-cancel")) {
    HandThrough(*document, "cancel");
  }
  return true;
}

bool PageHost::PickGroup(WebBrowser& browser, std::string_view group) {
  HtmlDocument* document = browser.Document();
  if (!document) return false;
  for (const auto& element : document->Elements())
    if (const std::string* g = element->Attribute("data-group"); g && *g == group) {
      if (!Input::Accepts(browser) || browser.Busy()) return false;
      const std::shared_ptr<HtmlDocument> keep = browser.DocumentHandle();
      HandThrough(*document, *g);
      return true;
    }
  return false;
}

bool PageHost::Cancel(WebBrowser& browser) {
  HtmlDocument* document = browser.Document();
  if (!document) return false;
  for (const auto& element : document->Elements())
    if (element->Attribute("data-cancel")) {
      if (!Input::Accepts(browser) || browser.Busy()) return false;
      const std::shared_ptr<HtmlDocument> keep = browser.DocumentHandle();
      HandThrough(*document, "cancel");
      return true;
    }
  return false;
}

} // namespace belvane::forms
