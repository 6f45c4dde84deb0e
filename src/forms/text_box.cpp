#include "forms/controls.hpp"
#include "forms/keys.hpp"
#include "forms/utf8.hpp"
#include "text/error.hpp"

namespace belvane::forms {

TextBox::TextBox(Form& form, std::string name, int index)
    : ControlOf(form, std::move(name), index, ControlKind::TextBox) {
  SetDefaultSize(1215, 285);
  SetDefaultColors(grid::kWhite, grid::kBlack);
}

void TextBox::ResetState() {
  text_.clear();
  anchor_ = caret_ = 0;
  maxLength_ = 0;
  alignment_ = kLeftJustify;
  locked_ = false;
  ResetCommon();
  Notify([](grid::ModelObserver& o) {
    for (auto p : {grid::Property::Text, grid::Property::Selection, grid::Property::MaxLength,
                   grid::Property::Alignment, grid::Property::Locked})
      o.PropertyChanged(p);
  });
}

int TextBox::Length() const { return utf8::CharCount(text_); }

void TextBox::Text(std::string_view text) {
  if (text == text_) return;
  text_.assign(text);
  anchor_ = caret_ = 0;
  NotifyProperty(grid::Property::Text);
  NotifyProperty(grid::Property::Selection);
  if (OnChange) OnChange();
}

void TextBox::SetCaret(int anchor, int caret) {
  if (anchor == anchor_ && caret == caret_) return;
  anchor_ = anchor;
  caret_ = caret;
  NotifyProperty(grid::Property::Selection);
}

void TextBox::SelStart(int start) {
  if (start < 0) throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  start = std::min(start, Length());
  SetCaret(start, start);
}

void TextBox::SelLength(int length) {
  if (length < 0) throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  const int start = SelStart();
  SetCaret(start, start + std::min(length, Length() - start));
}

std::string TextBox::SelText() const {
  const std::size_t from = utf8::ByteOffset(text_, SelStart());
  const std::size_t to = utf8::ByteOffset(text_, SelStart() + SelLength());
  return text_.substr(from, to - from);
}

void TextBox::SelText(std::string_view text) {
  Replace(SelStart(), SelStart() + SelLength(), text);
}

void TextBox::Replace(int from, int to, std::string_view text) {
  const std::size_t begin = utf8::ByteOffset(text_, from);
  const std::size_t end = utf8::ByteOffset(text_, to);
  const bool changed = text_.compare(begin, end - begin, text) != 0;
  text_.replace(begin, end - begin, text);
  const int caret = from + utf8::CharCount(text);
  anchor_ = caret_ = -1; // force the selection notice
  SetCaret(caret, caret);
  if (changed) {
    NotifyProperty(grid::Property::Text);
    if (OnChange) OnChange();
  }
}

void TextBox::MaxLength(int length) {
  if (length < 0) throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  maxLength_ = length;
  NotifyProperty(grid::Property::MaxLength);
}

void TextBox::Alignment(int alignment) {
  if (alignment < kLeftJustify || alignment > kCenter)
    throw Error(grid::kInvalidPropertyValue, "Invalid property value");
  alignment_ = alignment;
  NotifyProperty(grid::Property::Alignment);
}

void TextBox::Locked(bool locked) {
  locked_ = locked;
  NotifyProperty(grid::Property::Locked);
}

void TextBox::DefaultKeyDown(int keyCode, int shift) {
  const bool extend = (shift & kShiftMask) != 0;
  const int length = Length();
  const int start = SelStart();
  const int end = start + SelLength();
  switch (keyCode) {
  case keys::kLeft:
    if (extend)
      SetCaret(anchor_, std::max(0, caret_ - 1));
    else if (start != end)
      SetCaret(start, start);
    else
      SetCaret(std::max(0, caret_ - 1), std::max(0, caret_ - 1));
    break;
  case keys::kRight:
    if (extend)
      SetCaret(anchor_, std::min(length, caret_ + 1));
    else if (start != end)
      SetCaret(end, end);
    else
      SetCaret(std::min(length, caret_ + 1), std::min(length, caret_ + 1));
    break;
  case keys::kHome:
    SetCaret(extend ? anchor_ : 0, 0);
    break;
  case keys::kEnd:
    SetCaret(extend ? anchor_ : length, length);
    break;
  case keys::kDelete:
    if (locked_) break;
    if (start != end)
      Replace(start, end, {});
    else if (caret_ < length)
      Replace(caret_, caret_ + 1, {});
    break;
  default:
    break;
  }
}

void TextBox::DefaultKeyPress(int keyAscii) {
  if (locked_) return;
  const int start = SelStart();
  const int end = start + SelLength();
  if (keyAscii == keys::kBack) {
    if (start != end)
      Replace(start, end, {});
    else if (caret_ > 0)
      Replace(caret_ - 1, caret_, {});
    return;
  }
  if (keyAscii < 32 || keyAscii == 127) return; // Enter, Escape and control characters type nothing
  if (maxLength_ > 0 && Length() - (end - start) + 1 > maxLength_) return;
  Replace(start, end, utf8::Encode(static_cast<char32_t>(keyAscii)));
}

void TextBox::TabbedInto() { SetCaret(0, Length()); }

} // namespace belvane::forms
