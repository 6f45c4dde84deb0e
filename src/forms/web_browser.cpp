// WebBrowser and the page stand-ins it holds.
#include "forms/controls.hpp"

namespace belvane::forms {

// ---- page stand-ins ----

HtmlElement::HtmlElement(std::string id, std::string tagName)
    : id_(std::move(id)), tagName_(std::move(tagName)) {}

bool HtmlElement::Click() { return OnClick ? OnClick() : true; }

HtmlElement& HtmlDocument::AddElement(std::string id, std::string tagName) {
  elements_.push_back(std::make_unique<HtmlElement>(std::move(id), std::move(tagName)));
  return *elements_.back();
}

HtmlElement* HtmlDocument::Find(std::string_view nameOrId) {
  for (auto& element : elements_)
    if (element->Id() == nameOrId) return element.get();
  return nullptr;
}

// ---- WebBrowser ----

WebBrowser::WebBrowser(Form& form, std::string name, int index)
    : ControlOf(form, std::move(name), index, ControlKind::WebBrowser) {
  SetDefaultSize(4815, 3615);
}

void WebBrowser::Navigate(std::string url) {
  url_ = std::move(url);
  busy_ = true;
  document_.reset();
  NotifyProperty(grid::Property::Location);
}

void WebBrowser::CompleteNavigation(std::shared_ptr<HtmlDocument> document) {
  document_ = std::move(document);
  busy_ = false;
  if (OnDownloadComplete) OnDownloadComplete();
  if (OnDocumentComplete) OnDocumentComplete(url_);
}

void WebBrowser::ResetState() {
  url_.clear();
  busy_ = false;
  document_.reset();
  ResetCommon();
  NotifyProperty(grid::Property::Location);
}

} // namespace belvane::forms
