// WebBrowser and the page stand-ins it holds.
#include "forms/controls.hpp"

#include <cctype>
#include <cstdint>

namespace belvane::forms {

// ---- page stand-ins ----

HtmlElement::HtmlElement(std::string id, std::string tagName)
    : id_(std::move(id)), tagName_(std::move(tagName)) {}

bool HtmlElement::Click() { return OnClick ? OnClick() : true; }

const std::string* HtmlElement::Attribute(std::string_view name) const {
  for (const auto& [n, v] : attributes_)
    if (n == name) return &v;
  return nullptr;
}

void HtmlElement::Attribute(std::string name, std::string value) {
  for (auto& [n, v] : attributes_)
    if (n == name) {
      v = std::move(value);
      return;
    }
  attributes_.emplace_back(std::move(name), std::move(value));
}

HtmlElement& HtmlDocument::AddElement(std::string id, std::string tagName) {
  elements_.push_back(std::make_unique<HtmlElement>(std::move(id), std::move(tagName)));
  return *elements_.back();
}

HtmlElement* HtmlDocument::Find(std::string_view nameOrId) {
  for (auto& element : elements_)
    if (element->Id() == nameOrId || element->Name() == nameOrId) return element.get();
  return nullptr;
}

// ---- reading a page ----

namespace {

// Most elements kept from one page; the rest of a bigger page is ignored.
constexpr std::size_t kMaxElements = 100000;

char Lower(char c) { return static_cast<char>(std::tolower(static_cast<unsigned char>(c))); }

std::string LowerAscii(std::string_view s) {
  std::string out(s);
  for (char& c : out)
    c = Lower(c);
  return out;
}

bool IsSpace(char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\f'; }

bool StartsWithNoCase(std::string_view s, std::size_t at, std::string_view prefix) {
  if (at > s.size() || s.size() - at < prefix.size()) return false;
  for (std::size_t i = 0; i < prefix.size(); ++i)
    if (Lower(s[at + i]) != prefix[i]) return false;
  return true;
}

// Where `needle` (lower case) next starts at or after `from`, without regard
// to case; npos for nowhere.
std::size_t FindNoCase(std::string_view s, std::size_t from, std::string_view needle) {
  for (std::size_t i = from; i < s.size(); ++i)
    if (StartsWithNoCase(s, i, needle)) return i;
  return std::string_view::npos;
}

void AppendUtf8(std::string& out, std::uint32_t cp) {
  if (cp == 0 || cp > 0x10FFFF || (cp >= 0xD800 && cp <= 0xDFFF)) cp = 0xFFFD;
  if (cp < 0x80) {
    out += static_cast<char>(cp);
  } else if (cp < 0x800) {
    out += static_cast<char>(0xC0 | (cp >> 6));
    out += static_cast<char>(0x80 | (cp & 0x3F));
  } else if (cp < 0x10000) {
    out += static_cast<char>(0xE0 | (cp >> 12));
    out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
    out += static_cast<char>(0x80 | (cp & 0x3F));
  } else {
    out += static_cast<char>(0xF0 | (cp >> 18));
    out += static_cast<char>(0x80 | ((cp >> 12) & 0x3F));
    out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
    out += static_cast<char>(0x80 | (cp & 0x3F));
  }
}

// Character references of attribute values and the title: the five named
// ones and numeric ones; anything else stays as written.
std::string DecodeEntities(std::string_view s) {
  std::string out;
  out.reserve(s.size());
  for (std::size_t i = 0; i < s.size();) {
    if (s[i] != '&') {
      out += s[i++];
      continue;
    }
    const std::size_t semi = s.find(';', i);
    if (semi == std::string_view::npos || semi - i > 12) {
      out += s[i++];
      continue;
    }
    const std::string_view ref = s.substr(i + 1, semi - i - 1);
    static constexpr std::pair<std::string_view, char> kNamed[] = {
        {"amp", '&'}, {"lt", '<'}, {"gt", '>'}, {"quot", '"'}, {"apos", '\''}};
    bool done = false;
    for (const auto& [name, ch] : kNamed)
      if (ref == name) {
        out += ch;
        done = true;
      }
    if (!done && ref.size() > 1 && ref[0] == '#') {
      const bool hex = ref[1] == 'x' || ref[1] == 'X';
      const std::string_view digits = ref.substr(hex ? 2 : 1);
      std::uint32_t cp = 0;
      bool ok = !digits.empty();
      for (const char c : digits) {
        int d = -1;
        if (c >= '0' && c <= '9')
          d = c - '0';
        else if (hex && c >= 'a' && c <= 'f')
          d = c - 'a' + 10;
        else if (hex && c >= 'A' && c <= 'F')
          d = c - 'A' + 10;
        if (d < 0 || cp > 0x10FFFF) {
          ok = false;
          break;
        }
        cp = cp * (hex ? 16u : 10u) + static_cast<std::uint32_t>(d);
      }
      if (ok) {
        AppendUtf8(out, cp);
        done = true;
      }
    }
    if (done) {
      i = semi + 1;
    } else {
      out += s[i++];
    }
  }
  return out;
}

struct Tag {
  std::string name;
  std::vector<std::pair<std::string, std::string>> attributes;
};

// Reads the start tag whose name begins at `i` (just after '<'); `i` ends
// after its '>' (or at the end of the text).
Tag ReadTag(std::string_view s, std::size_t& i) {
  Tag tag;
  const std::size_t start = i;
  while (i < s.size() && !IsSpace(s[i]) && s[i] != '>' && s[i] != '/')
    ++i;
  tag.name = LowerAscii(s.substr(start, i - start));
  while (i < s.size()) {
    while (i < s.size() && (IsSpace(s[i]) || s[i] == '/'))
      ++i;
    if (i >= s.size()) break;
    if (s[i] == '>') {
      ++i;
      break;
    }
    const std::size_t nameStart = i;
    while (i < s.size() && !IsSpace(s[i]) && s[i] != '>' && s[i] != '=' && s[i] != '/')
      ++i;
    if (i == nameStart) { // a stray '=': skip it
      ++i;
      continue;
    }
    std::string name = LowerAscii(s.substr(nameStart, i - nameStart));
    std::string value;
    std::size_t j = i;
    while (j < s.size() && IsSpace(s[j]))
      ++j;
    if (j < s.size() && s[j] == '=') {
      i = j + 1;
      while (i < s.size() && IsSpace(s[i]))
        ++i;
      if (i < s.size() && (s[i] == '"' || s[i] == '\'')) {
        const char quote = s[i++];
        const std::size_t end = s.find(quote, i);
        const std::size_t stop = end == std::string_view::npos ? s.size() : end;
        value = DecodeEntities(s.substr(i, stop - i));
        i = stop == s.size() ? stop : stop + 1;
      } else {
        const std::size_t valueStart = i;
        while (i < s.size() && !IsSpace(s[i]) && s[i] != '>')
          ++i;
        value = DecodeEntities(s.substr(valueStart, i - valueStart));
      }
    }
    tag.attributes.emplace_back(std::move(name), std::move(value));
  }
  return tag;
}

} // namespace

std::shared_ptr<HtmlDocument> HtmlDocument::FromHtml(std::string_view s) {
  auto document = std::make_shared<HtmlDocument>();
  std::size_t i = 0;
  while (i < s.size() && document->elements_.size() < kMaxElements) {
    const std::size_t lt = s.find('<', i);
    if (lt == std::string_view::npos) break;
    i = lt + 1;
    if (StartsWithNoCase(s, i, "!--")) {
      const std::size_t end = s.find("-->", i + 3);
      i = end == std::string_view::npos ? s.size() : end + 3;
      continue;
    }
    if (i < s.size() && (s[i] == '!' || s[i] == '?' || s[i] == '/')) {
      const std::size_t end = s.find('>', i);
      i = end == std::string_view::npos ? s.size() : end + 1;
      continue;
    }
    if (i >= s.size() || !std::isalpha(static_cast<unsigned char>(s[i]))) continue;
    Tag tag = ReadTag(s, i);
    // Raw text: nothing inside is markup.
    if (tag.name == "script" || tag.name == "style" || tag.name == "title" ||
        tag.name == "textarea") {
      const std::size_t end = FindNoCase(s, i, "</" + tag.name);
      const std::size_t stop = end == std::string_view::npos ? s.size() : end;
      if (tag.name == "title" && document->title_.empty())
        document->title_ = DecodeEntities(s.substr(i, stop - i));
      i = stop;
    }
    std::string id, name, value;
    bool kept = false;
    for (const auto& [attr, v] : tag.attributes) {
      if (attr == "id") id = v;
      if (attr == "name") name = v;
      if (attr == "value") value = v;
      if (attr == "id" || attr == "name" || attr.rfind("data-", 0) == 0) kept = true;
    }
    if (!kept) continue;
    HtmlElement& element = document->AddElement(id, tag.name);
    element.Name(name);
    element.Value(value);
    for (auto& [attr, v] : tag.attributes)
      if (!element.Attribute(attr)) element.Attribute(attr, v);
  }
  return document;
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
