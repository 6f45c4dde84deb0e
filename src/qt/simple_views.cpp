// The views of labels, text boxes, buttons, check boxes, option buttons and
// frames, and the choice of a view by the control's kind.
#include "forms/controls.hpp"
#include "forms/input.hpp"
#include "qt/form_window.hpp"
#include "qt/grid_view.hpp"
#include "qt/list_view.hpp"
#include "qt/views.hpp"
#include "qt/web_view.hpp"

#include "forms/simulated_user.hpp"

#include <QCheckBox>
#include <QGroupBox>
#include <QIcon>
#include <QInputMethodEvent>
#include <QLabel>
#include <QLineEdit>
#include <QMouseEvent>
#include <QPainter>
#include <QPushButton>
#include <QRadioButton>
#include <QStyle>

#include <limits>

namespace belvane::qt {

namespace {

Qt::Alignment Justify(int alignment) {
  switch (alignment) {
  case forms::kRightJustify:
    return Qt::AlignRight;
  case forms::kCenter:
    return Qt::AlignHCenter;
  default:
    return Qt::AlignLeft;
  }
}

// A button's caption with its access key underlined. The key itself is the
// forms' (Alt and the letter go to the form like any key), so Qt's own
// shortcut for the marked letter is taken off again.
void SetButtonCaption(QAbstractButton& button, const forms::Control& control,
                      const std::string& caption) {
  button.setText(WithAccessKey(caption, control.AccessKey()));
  button.setShortcut(QKeySequence());
}

// A label that underlines its access key: the text stays the caption as
// shown, and the painting marks the letter.
class CaptionLabel : public QLabel {
public:
  using QLabel::QLabel;
  void SetCaption(const std::string& caption, char32_t key) {
    marked_ = WithAccessKey(caption, key);
    setText(WithoutAccessKeys(caption));
    if (marked_ == QString(text()).replace(u'&', QStringLiteral("&&"))) marked_.clear();
    update();
  }

protected:
  void paintEvent(QPaintEvent* event) override {
    if (marked_.isEmpty()) {
      QLabel::paintEvent(event);
      return;
    }
    QPainter painter(this);
    drawFrame(&painter);
    style()->drawItemText(&painter, contentsRect(),
                          static_cast<int>(alignment()) | Qt::TextWordWrap | Qt::TextShowMnemonic,
                          palette(), isEnabled(), marked_, foregroundRole());
  }

private:
  QString marked_; // the caption with its "&" mark; empty when none
};

class LabelView : public ControlView {
public:
  LabelView(FormWindow& window, forms::Label& label, QWidget* parent)
      : ControlView(window, label, new CaptionLabel(parent)), label_(label),
        widget_(static_cast<CaptionLabel*>(Widget())) {
    widget_->setWordWrap(true);
    widget_->setTextFormat(Qt::PlainText);
  }
  void SyncAll() override {
    ControlView::SyncAll();
    Sync(grid::Property::Caption);
    Sync(grid::Property::Alignment);
  }

protected:
  void Sync(grid::Property property) override {
    if (property == grid::Property::Caption)
      widget_->SetCaption(label_.Caption(), label_.AccessKey());
    else if (property == grid::Property::Alignment)
      widget_->setAlignment(Justify(label_.Alignment()) | Qt::AlignTop);
  }
  void ApplyColors() override {
    ControlView::ApplyColors();
    // A label paints its own background only when given one.
    const bool own = label_.BackColor() != grid::kButtonFace;
    QPalette palette = widget_->palette();
    palette.setColor(QPalette::Window, ToQColor(label_.BackColor()));
    widget_->setPalette(palette);
    widget_->setAutoFillBackground(own);
  }

private:
  forms::Label& label_;
  CaptionLabel* widget_;
};

class CommandButtonView : public ControlView {
public:
  CommandButtonView(FormWindow& window, forms::CommandButton& button, QWidget* parent)
      : ControlView(window, button, new QPushButton(parent)), button_(button),
        widget_(static_cast<QPushButton*>(Widget())) {
    widget_->setAutoDefault(false);
    widget_->setDefault(false);
  }
  void SyncAll() override {
    ControlView::SyncAll();
    Sync(grid::Property::Caption);
    Sync(grid::Property::Picture);
  }

protected:
  void Sync(grid::Property property) override {
    if (property == grid::Property::Caption) {
      SetButtonCaption(*widget_, button_, button_.Caption());
    } else if (property == grid::Property::Picture) {
      widget_->setIcon(PictureIcon(button_.Picture()));
    }
  }
  // The picture a picture name stands for, from the style's own icons.
  QIcon PictureIcon(const std::string& name) const {
    QStyle* style = widget_->style();
    if (name == forms::CommandButton::kPictureSearch)
      return style->standardIcon(QStyle::SP_FileDialogContentsView);
    if (name == forms::CommandButton::kPictureBrowse)
      return style->standardIcon(QStyle::SP_FileDialogListView);
    if (name == forms::CommandButton::kPictureDropDown)
      return style->standardIcon(QStyle::SP_ArrowDown);
    return {};
  }
  // The button looks pressed while the mouse button is down on it.
  bool Mouse(QWidget* source, QMouseEvent* event) override {
    QPointer<QPushButton> button(widget_);
    const bool taken = ForwardMouse(source, event);
    if (button && event->button() == Qt::LeftButton) {
      if (event->type() == QEvent::MouseButtonPress)
        button->setDown(taken);
      else if (event->type() == QEvent::MouseButtonRelease)
        button->setDown(false);
    }
    return true;
  }

private:
  forms::CommandButton& button_;
  QPushButton* widget_;
};

class CheckBoxView : public ControlView {
public:
  CheckBoxView(FormWindow& window, forms::CheckBox& box, QWidget* parent)
      : ControlView(window, box, new QCheckBox(parent)), box_(box),
        widget_(static_cast<QCheckBox*>(Widget())) {}
  void SyncAll() override {
    ControlView::SyncAll();
    Sync(grid::Property::Caption);
    Sync(grid::Property::Value);
  }

protected:
  void Sync(grid::Property property) override {
    if (property == grid::Property::Caption) {
      SetButtonCaption(*widget_, box_, box_.Caption());
    } else if (property == grid::Property::Value) {
      widget_->setTristate(box_.Value() == forms::kGrayed);
      widget_->setCheckState(box_.Value() == forms::kChecked  ? Qt::Checked
                             : box_.Value() == forms::kGrayed ? Qt::PartiallyChecked
                                                              : Qt::Unchecked);
    }
  }

private:
  forms::CheckBox& box_;
  QCheckBox* widget_;
};

class OptionButtonView : public ControlView {
public:
  OptionButtonView(FormWindow& window, forms::OptionButton& option, QWidget* parent)
      : ControlView(window, option, new QRadioButton(parent)), option_(option),
        widget_(static_cast<QRadioButton*>(Widget())) {
    widget_->setAutoExclusive(false); // the model keeps the group
  }
  void SyncAll() override {
    ControlView::SyncAll();
    Sync(grid::Property::Caption);
    Sync(grid::Property::Value);
  }

protected:
  void Sync(grid::Property property) override {
    if (property == grid::Property::Caption)
      SetButtonCaption(*widget_, option_, option_.Caption());
    else if (property == grid::Property::Value)
      widget_->setChecked(option_.Value());
  }

private:
  forms::OptionButton& option_;
  QRadioButton* widget_;
};

// A frame draws its caption on its top border line, the controls it holds
// placed from its top-left corner as the model has them (a group box would
// put its border below the caption, through the controls near the top).
class FrameBox : public QGroupBox {
public:
  using QGroupBox::QGroupBox;

protected:
  void paintEvent(QPaintEvent*) override {
    QPainter painter(this);
    const QFontMetrics metrics(font());
    const int line = title().isEmpty() ? 0 : metrics.height() / 2;
    const QRect border = rect().adjusted(0, line, -1, -1);
    painter.setPen(palette().color(QPalette::Mid));
    painter.drawRect(border);
    painter.setPen(palette().color(QPalette::Light));
    painter.drawRect(border.adjusted(1, 1, 1, 1).intersected(rect().adjusted(0, 0, -1, -1)));
    if (title().isEmpty()) return;
    const QString text = metrics.elidedText(title(), Qt::ElideRight, width() - 16);
    const QRect caption(6, 0, metrics.horizontalAdvance(text) + 4, metrics.height());
    painter.fillRect(caption, palette().color(QPalette::Window));
    painter.setPen(
        palette().color(isEnabled() ? QPalette::Active : QPalette::Disabled, QPalette::WindowText));
    painter.drawText(caption, Qt::AlignCenter, text);
  }
};

class FrameView : public ControlView {
public:
  FrameView(FormWindow& window, forms::Frame& frame, QWidget* parent)
      : ControlView(window, frame, new FrameBox(parent)), frame_(frame),
        widget_(static_cast<QGroupBox*>(Widget())) {}
  void SyncAll() override {
    ControlView::SyncAll();
    Sync(grid::Property::Caption);
  }

protected:
  void Sync(grid::Property property) override {
    if (property == grid::Property::Caption) widget_->setTitle(ToQString(frame_.Caption()));
  }

private:
  forms::Frame& frame_;
  QGroupBox* widget_;
};

} // namespace

// ---- TextBoxView ----

int Utf16Index(const QString& text, int characters) {
  qsizetype i = 0;
  while (i < text.size() && characters > 0) {
    i += (text[i].isHighSurrogate() && i + 1 < text.size() && text[i + 1].isLowSurrogate()) ? 2 : 1;
    --characters;
  }
  return static_cast<int>(i);
}

int CharacterIndex(const QString& text, int utf16) {
  int characters = 0;
  qsizetype i = 0;
  while (i < text.size() && i < utf16) {
    i += (text[i].isHighSurrogate() && i + 1 < text.size() && text[i + 1].isLowSurrogate()) ? 2 : 1;
    ++characters;
  }
  return characters;
}

TextBoxView::TextBoxView(FormWindow& window, forms::TextBox& box, QWidget* parent)
    : ControlView(window, box, new QLineEdit(parent)), box_(box),
      edit_(static_cast<QLineEdit*>(Widget())) {
  // The model keeps MaxLength for what the user types; text set by code is
  // never cut, so the line edit takes any length.
  edit_->setMaxLength(std::numeric_limits<int>::max());
  edit_->setDragEnabled(false);
  connect(edit_, &QLineEdit::cursorPositionChanged, this, [this] { TakeUserSelection(); });
  connect(edit_, &QLineEdit::selectionChanged, this, [this] { TakeUserSelection(); });
  // The line edit never changes its text on its own; should anything slip
  // through, the model's text stands.
  connect(edit_, &QLineEdit::textEdited, this, [this] { SyncText(); });
}

void TextBoxView::SyncAll() {
  ControlView::SyncAll();
  SyncFrame();
  Sync(grid::Property::Alignment);
  Sync(grid::Property::Locked);
  SyncText();
}

void TextBoxView::Sync(grid::Property property) {
  switch (property) {
  case grid::Property::Text:
    SyncText();
    break;
  case grid::Property::Selection:
    SyncSelection();
    break;
  case grid::Property::Alignment:
    edit_->setAlignment(Justify(box_.Alignment()) | Qt::AlignVCenter);
    break;
  case grid::Property::Locked:
    edit_->setReadOnly(box_.Locked());
    break;
  case grid::Property::Geometry:
  case grid::Property::Font:
    SyncFrame();
    break;
  default:
    break;
  }
}

void TextBoxView::SyncText() {
  if (!Alive()) return;
  const QString text = ToQString(box_.Text());
  syncing_ = true;
  if (edit_->text() != text) edit_->setText(text);
  syncing_ = false;
  SyncSelection();
}

void TextBoxView::SyncSelection() {
  if (!Alive()) return;
  const QString text = edit_->text();
  const int start = Utf16Index(text, box_.SelStart());
  const int end = Utf16Index(text, box_.SelStart() + box_.SelLength());
  syncing_ = true;
  if (end > start)
    edit_->setSelection(start, end - start);
  else
    edit_->setCursorPosition(start);
  syncing_ = false;
}

// A text box too low for the line edit's frame (an editor laid over a grid
// cell) draws none, so its text has the cell's room.
void TextBoxView::SyncFrame() {
  edit_->setTextMargins(0, 0, 0, 0);
  edit_->setFrame(true);
  const bool framed = edit_->height() >= edit_->sizeHint().height();
  edit_->setFrame(framed);
  if (!framed) edit_->setTextMargins(1, 0, 1, 0);
}

void TextBoxView::TakeUserSelection() {
  if (syncing_ || !Alive()) return;
  const QString text = edit_->text();
  int start = edit_->cursorPosition();
  int length = 0;
  if (edit_->hasSelectedText()) {
    start = edit_->selectionStart();
    length = static_cast<int>(edit_->selectedText().size());
  }
  const int from = CharacterIndex(text, start);
  const int count = CharacterIndex(text, start + length) - from;
  syncing_ = true;
  box_.SelStart(from);
  box_.SelLength(count);
  syncing_ = false;
}

void TextBoxView::ApplyColors() {
  QPalette palette = edit_->palette();
  palette.setColor(QPalette::Base, ToQColor(box_.BackColor()));
  for (const auto group : {QPalette::Active, QPalette::Inactive})
    palette.setColor(group, QPalette::Text, ToQColor(box_.ForeColor()));
  edit_->setPalette(palette);
}

// The left button goes to the model first (MouseDown, focus, Click), then
// to the line edit, which places the caret or selects by dragging; the
// model takes the caret from it. Other buttons (a middle-button paste)
// never reach the line edit.
bool TextBoxView::Mouse(QWidget* source, QMouseEvent* event) {
  const bool taken = ForwardMouse(source, event);
  return !(taken && event->button() == Qt::LeftButton);
}

// Text from an input method is typed, character by character.
bool TextBoxView::Other(QWidget*, QEvent* event) {
  if (event->type() != QEvent::InputMethod) return false;
  const QString commit = static_cast<QInputMethodEvent*>(event)->commitString();
  if (!commit.isEmpty() && Alive() && box_.HasFocus()) forms::SimulatedUser().Type(ToUtf8(commit));
  return true;
}

// ---- the view of a control ----

ControlView* MakeControlView(FormWindow& window, forms::Control& control, QWidget* parent) {
  switch (control.Kind()) {
  case forms::ControlKind::Label:
    return new LabelView(window, static_cast<forms::Label&>(control), parent);
  case forms::ControlKind::TextBox:
    return new TextBoxView(window, static_cast<forms::TextBox&>(control), parent);
  case forms::ControlKind::CommandButton:
    return new CommandButtonView(window, static_cast<forms::CommandButton&>(control), parent);
  case forms::ControlKind::CheckBox:
    return new CheckBoxView(window, static_cast<forms::CheckBox&>(control), parent);
  case forms::ControlKind::OptionButton:
    return new OptionButtonView(window, static_cast<forms::OptionButton&>(control), parent);
  case forms::ControlKind::Frame:
    return new FrameView(window, static_cast<forms::Frame&>(control), parent);
  case forms::ControlKind::ListView:
    return new ListViewView(window, static_cast<forms::ListView&>(control), parent);
  case forms::ControlKind::WebBrowser:
    return new WebView(window, static_cast<forms::WebBrowser&>(control), parent);
  case forms::ControlKind::FlexGrid:
    return new GridView(window, static_cast<forms::FlexGrid&>(control), parent);
  }
  return nullptr;
}

} // namespace belvane::qt
