#pragma once
// The controls the editors are built from. Each is a model (its properties,
// observable by a view) and a Control (focus, keys, clicks). Property
// setters that the desktop runtime answers with an event raise it here
// synchronously: TextBox Text -> Change, CheckBox Value -> Click,
// OptionButton Value = true -> Click, grid current cell -> LeaveCell and
// EnterCell.

#include "forms/control.hpp"
#include "grid/flex_grid.hpp"

#include <algorithm>
#include <array>
#include <cstddef>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace belvane::forms {

// Text alignment of text boxes and labels.
inline constexpr int kLeftJustify = 0;
inline constexpr int kRightJustify = 1;
inline constexpr int kCenter = 2;

// Check box values.
inline constexpr int kUnchecked = 0;
inline constexpr int kChecked = 1;
inline constexpr int kGrayed = 2;

// Error number of a list view index out of range.
inline constexpr long kIndexOutOfBounds = 35600;

class Label : public ControlOf<grid::ControlModel> {
public:
  Label(Form& form, std::string name, int index = -1);
  const std::string& Caption() const noexcept { return caption_; }
  void Caption(std::string caption);
  int Alignment() const noexcept { return alignment_; }
  void Alignment(int alignment);

protected:
  void ResetState() override;
  bool TakesFocus() const override { return false; }

private:
  std::string caption_;
  int alignment_ = kLeftJustify;
};

// A single-line text box. SelStart and SelLength count characters (not
// bytes) of the UTF-8 text. Setting Text to a different text fires Change
// and puts the caret at the start.
class TextBox : public ControlOf<grid::ControlModel> {
public:
  TextBox(Form& form, std::string name, int index = -1);

  const std::string& Text() const noexcept { return text_; }
  void Text(std::string_view text);
  int Length() const; // in characters
  int SelStart() const noexcept { return std::min(anchor_, caret_); }
  void SelStart(int start);
  int SelLength() const noexcept { return anchor_ > caret_ ? anchor_ - caret_ : caret_ - anchor_; }
  void SelLength(int length);
  std::string SelText() const;
  // Replaces the selection (or inserts at the caret); the caret ends after it.
  void SelText(std::string_view text);
  // Most characters the user can type in; 0 for no limit. Text set by code
  // is not cut.
  int MaxLength() const noexcept { return maxLength_; }
  void MaxLength(int length);
  int Alignment() const noexcept { return alignment_; }
  void Alignment(int alignment);
  bool Locked() const noexcept { return locked_; }
  void Locked(bool locked);

  std::function<void()> OnChange;

protected:
  void ResetState() override;
  void DefaultKeyDown(int keyCode, int shift) override;
  void DefaultKeyPress(int keyAscii) override;
  void TabbedInto() override;

private:
  void Replace(int from, int to, std::string_view text); // characters [from, to)
  void SetCaret(int anchor, int caret);

  std::string text_;
  int anchor_ = 0;
  int caret_ = 0;
  int maxLength_ = 0;
  int alignment_ = kLeftJustify;
  bool locked_ = false;
};

class CommandButton : public ControlOf<grid::ControlModel> {
public:
  CommandButton(Form& form, std::string name, int index = -1);
  const std::string& Caption() const noexcept { return caption_; }
  void Caption(std::string caption);
  // The name of the picture a picture button shows instead of (or beside)
  // its caption: one of the names below; "" for a plain button. Views draw
  // the picture that the name stands for.
  static constexpr const char* kPictureSearch = "search";
  static constexpr const char* kPictureBrowse = "browse";
  static constexpr const char* kPictureDropDown = "dropdown";
  const std::string& Picture() const noexcept { return picture_; }
  void Picture(std::string name);

protected:
  void ResetState() override;
  void DefaultKeyDown(int keyCode, int shift) override;
  void DefaultKeyPress(int keyAscii) override;
  void DefaultKeyUp(int keyCode, int shift) override;

private:
  std::string caption_;
  std::string picture_;
  bool spaceDown_ = false;
};

class CheckBox : public ControlOf<grid::ControlModel> {
public:
  CheckBox(Form& form, std::string name, int index = -1);
  const std::string& Caption() const noexcept { return caption_; }
  void Caption(std::string caption);
  // kUnchecked, kChecked or kGrayed; a change fires Click.
  int Value() const noexcept { return value_; }
  void Value(int value);

protected:
  void ResetState() override;
  void UserClick() override;
  void DefaultKeyDown(int keyCode, int shift) override;
  void DefaultKeyUp(int keyCode, int shift) override;

private:
  std::string caption_;
  int value_ = kUnchecked;
  bool spaceDown_ = false;
};

// Option buttons in the same container (the form or one frame) form a
// group: turning one on turns the others off.
class OptionButton : public ControlOf<grid::ControlModel> {
public:
  OptionButton(Form& form, std::string name, int index = -1);
  const std::string& Caption() const noexcept { return caption_; }
  void Caption(std::string caption);
  // True turns the others of the group off and fires Click, when it was
  // off. False just turns it off.
  bool Value() const noexcept { return value_; }
  void Value(bool value);

protected:
  void ResetState() override;
  void UserClick() override;
  void DefaultKeyDown(int keyCode, int shift) override;
  void DefaultKeyUp(int keyCode, int shift) override;

private:
  std::string caption_;
  bool value_ = false;
  bool spaceDown_ = false;
};

// A frame: a captioned container. Hiding or disabling it hides or disables
// what it holds.
class Frame : public ControlOf<grid::ControlModel> {
public:
  Frame(Form& form, std::string name, int index = -1);
  const std::string& Caption() const noexcept { return caption_; }
  void Caption(std::string caption);

protected:
  void ResetState() override;
  bool TakesFocus() const override { return false; }

private:
  std::string caption_;
};

// A list view in report style with one column. Items are numbered from 1;
// SelectedIndex 0 means none selected.
class ListView : public ControlOf<grid::ControlModel> {
public:
  static constexpr int kHeaderHeight = 255;
  static constexpr int kItemHeight = 240;

  ListView(Form& form, std::string name, int index = -1);

  int AddItem(std::string text); // returns the new item's index
  void ClearItems();
  int ItemCount() const noexcept { return static_cast<int>(items_.size()); }
  const std::string& ItemText(int index) const; // error 35600 out of range
  int SelectedIndex() const noexcept { return selected_; }
  void SelectItem(int index); // 0 clears the selection
  const std::string& ColumnHeaderText() const noexcept { return header_; }
  void ColumnHeaderText(std::string text);
  int ColumnWidth() const noexcept { return columnWidth_; }
  void ColumnWidth(int width);
  // Item under a point of the list (0 for none), and an item's top edge.
  int HitTest(int x, int y) const;
  int ItemTop(int index) const;

  std::function<void(int index)> OnItemClick;

protected:
  void ResetState() override;
  void DefaultKeyDown(int keyCode, int shift) override;
  void DefaultMouseDown(int button, int shift, int x, int y) override;

private:
  std::vector<std::string> items_;
  int selected_ = 0;
  std::string header_;
  int columnWidth_ = 1440;
};

// The element and document stand-ins of a page shown in a WebBrowser: what
// the editors read and trap on a page. The desktop view fills them from the
// real page; headless, the page host (page_host.hpp) reads them from the
// page's file, or a test builds them.
class HtmlElement {
public:
  HtmlElement(std::string id, std::string tagName);
  const std::string& Id() const noexcept { return id_; }
  // The element's name attribute (empty for none).
  const std::string& Name() const noexcept { return name_; }
  void Name(std::string name) { name_ = std::move(name); }
  // In lower case ("input").
  const std::string& TagName() const noexcept { return tagName_; }
  const std::string& Value() const noexcept { return value_; }
  void Value(std::string value) { value_ = std::move(value); }
  // An attribute by its lower-case name; nullptr when the element has none.
  const std::string* Attribute(std::string_view name) const;
  void Attribute(std::string name, std::string value);
  // The page clicks the element: runs OnClick; false when the handler
  // cancelled the element's default action.
  bool Click();
  std::function<bool()> OnClick;

private:
  std::string id_;
  std::string name_;
  std::string tagName_;
  std::string value_;
  std::vector<std::pair<std::string, std::string>> attributes_;
};

class HtmlDocument {
public:
  HtmlElement& AddElement(std::string id, std::string tagName = "input");
  // The document's `all` collection: the first element whose id or name is
  // `nameOrId`.
  HtmlElement* Find(std::string_view nameOrId);
  const std::vector<std::unique_ptr<HtmlElement>>& Elements() const noexcept { return elements_; }
  const std::string& Title() const noexcept { return title_; }
  void Title(std::string title) { title_ = std::move(title); }
  // The browser's own page telling that the address could not be shown.
  bool IsErrorPage() const noexcept { return errorPage_; }
  void IsErrorPage(bool error) { errorPage_ = error; }

  // The stand-ins of a page from its HTML text: every element that has an
  // id, a name or data- attributes, with its tag, attributes and the value
  // attribute as its value, and the page's title. Script and style contents
  // and comments are skipped. Any text is read without failing; what is not
  // HTML yields no elements.
  static std::shared_ptr<HtmlDocument> FromHtml(std::string_view html);

private:
  std::vector<std::unique_ptr<HtmlElement>> elements_;
  std::string title_;
  bool errorPage_ = false;
};

class WebBrowser : public ControlOf<grid::ControlModel> {
public:
  WebBrowser(Form& form, std::string name, int index = -1);
  // Starts loading a page: the address changes at once (views load it), the
  // document goes until the load completes.
  void Navigate(std::string url);
  const std::string& LocationURL() const noexcept { return url_; }
  bool Busy() const noexcept { return busy_; }
  HtmlDocument* Document() const noexcept { return document_.get(); }
  // The document, shared: kept alive while a caller works on it.
  std::shared_ptr<HtmlDocument> DocumentHandle() const noexcept { return document_; }
  // The page finished loading (called by the view, or by a test headless):
  // the document becomes current, then DownloadComplete and
  // DocumentComplete fire.
  void CompleteNavigation(std::shared_ptr<HtmlDocument> document);

  std::function<void()> OnDownloadComplete;
  std::function<void(const std::string& url)> OnDocumentComplete;

protected:
  void ResetState() override;

private:
  std::string url_;
  bool busy_ = false;
  std::shared_ptr<HtmlDocument> document_;
};

// The grid as a control on a form: the grid model, plus focus, keys and
// clicks. The user's arrows and clicks move its current cell and bring the
// cell into view.
class FlexGrid : public ControlOf<grid::FlexGrid> {
public:
  FlexGrid(Form& form, std::string name, int index = -1);

protected:
  void ResetState() override;
  void DefaultKeyDown(int keyCode, int shift) override;
  void PointerAt(int x, int y) override;
  void DefaultMouseDown(int button, int shift, int x, int y) override;
};

// A control array: controls sharing a name, told apart by index 0 to N-1
// (`optSchedule(2)`). An index out of range raises error 9.
template <class T, std::size_t N> class ControlArray {
public:
  ControlArray(Form& form, const std::string& name)
      : items_(Make(form, name, std::make_index_sequence<N>{})) {}

  T& operator()(int index) { return items_[Checked(index)]; }
  const T& operator()(int index) const { return items_[Checked(index)]; }
  T& operator[](int index) { return items_[Checked(index)]; }
  static constexpr int Count() noexcept { return static_cast<int>(N); }
  static constexpr int LBound() noexcept { return 0; }
  static constexpr int UBound() noexcept { return static_cast<int>(N) - 1; }
  auto begin() noexcept { return items_.begin(); }
  auto end() noexcept { return items_.end(); }
  auto begin() const noexcept { return items_.begin(); }
  auto end() const noexcept { return items_.end(); }

private:
  static std::size_t Checked(int index);
  template <std::size_t... I>
  static std::array<T, N> Make(Form& form, const std::string& name, std::index_sequence<I...>) {
    return {{T(form, name, static_cast<int>(I))...}};
  }
  std::array<T, N> items_;
};

[[noreturn]] void ThrowSubscriptOutOfRange();

template <class T, std::size_t N> std::size_t ControlArray<T, N>::Checked(int index) {
  if (index < 0 || static_cast<std::size_t>(index) >= N) ThrowSubscriptOutOfRange();
  return static_cast<std::size_t>(index);
}

} // namespace belvane::forms
