#include "qt/control_view.hpp"

#include "forms/controls.hpp"
#include "forms/input.hpp"
#include "forms/runtime.hpp"
#include "qt/form_window.hpp"
#include "qt/keymap.hpp"
#include "text/error.hpp"

#include <QApplication>
#include <QGuiApplication>
#include <QMouseEvent>
#include <QPalette>
#include <QWidget>

#include <algorithm>

namespace belvane::qt {

// ---- conversions ----

QColor ToQColor(std::uint32_t color) {
  if (color & 0x80000000u) {
    // A system colour: the index of the desktop's colour table.
    const QPalette palette = QGuiApplication::palette();
    switch (color & 0xFFu) {
    case 5: // window background
      return palette.color(QPalette::Base);
    case 8:  // window text
    case 18: // button text
      return palette.color(QPalette::Text);
    case 13: // highlight
      return palette.color(QPalette::Highlight);
    case 14: // highlighted text
      return palette.color(QPalette::HighlightedText);
    case 17: // grey text
      return palette.color(QPalette::Disabled, QPalette::Text);
    default: // 15 button face and the rest
      return palette.color(QPalette::Button);
    }
  }
  return QColor(static_cast<int>(color & 0xFFu), static_cast<int>((color >> 8) & 0xFFu),
                static_cast<int>((color >> 16) & 0xFFu));
}

QFont ToQFont(const std::string& name, double points, bool bold, bool italic) {
  QFont font(QString::fromStdString(name));
  if (points > 0) font.setPointSizeF(points);
  font.setBold(bold);
  font.setItalic(italic);
  return font;
}

QString ToQString(std::string_view utf8) {
  return QString::fromUtf8(utf8.data(), static_cast<qsizetype>(utf8.size()));
}

std::string ToUtf8(const QString& text) { return text.toUtf8().toStdString(); }

QString WithoutAccessKeys(const std::string& caption) {
  QString out;
  const QString text = ToQString(caption);
  for (qsizetype i = 0; i < text.size(); ++i) {
    if (text[i] == u'&') {
      if (i + 1 < text.size() && text[i + 1] == u'&') {
        out += u'&';
        ++i;
      }
      continue;
    }
    out += text[i];
  }
  return out;
}

QString WithAccessKey(const std::string& caption, char32_t key) {
  const QString plain = WithoutAccessKeys(caption);
  QString escaped = plain;
  escaped.replace(u'&', QStringLiteral("&&"));
  if (key == 0) return escaped;
  const QString letter = QString(QChar(static_cast<char16_t>(key)));
  const qsizetype at = plain.indexOf(letter, 0, Qt::CaseInsensitive);
  if (at < 0) return escaped;
  // Each "&" before the letter became two.
  const qsizetype before = plain.left(at).count(u'&');
  escaped.insert(at + before, u'&');
  return escaped;
}

std::string ControlName(const forms::Control& control) {
  std::string name = control.Name();
  if (control.Index() >= 0) name += "(" + std::to_string(control.Index()) + ")";
  return name;
}

void RunHandler(const std::string& where, const std::function<void()>& code) {
  try {
    code();
  } catch (const Error& e) {
    forms::CurrentRuntime().UnhandledError(where, e.Number(), e.Description());
  } catch (const std::exception& e) {
    forms::CurrentRuntime().UnhandledError(where, 0, e.what());
  }
}

// ---- ControlView ----

ControlView::ControlView(FormWindow& window, forms::Control& control, QWidget* widget)
    : QObject(widget), window_(window), control_(&control), model_(&control.Model()),
      widget_(widget) {
  widget->setObjectName(QString::fromStdString(ControlName(control)));
  widget->setFocusPolicy(Qt::NoFocus);
  widget->setContextMenuPolicy(Qt::NoContextMenu);
  widget->setAcceptDrops(false);
  Watch(widget);
  model_->AddObserver(this);
}

ControlView::~ControlView() {
  if (model_) model_->RemoveObserver(this);
}

// The control is going with its form; the window goes next and takes the
// widget with it. Nothing is done to the widget here: it must not raise Qt
// events while the model is half destroyed.
void ControlView::ModelDestroyed() {
  control_ = nullptr;
  model_ = nullptr;
}

const Scale& ControlView::GetScale() const { return window_.GetScale(); }

void ControlView::Watch(QWidget* part) {
  part->installEventFilter(this);
  part->setContextMenuPolicy(Qt::NoContextMenu);
}

int ControlView::WindowLeft() const {
  int left = model_->Left();
  for (const forms::Frame* f = control_->Container(); f; f = f->Container())
    left += f->Left();
  return left;
}

int ControlView::WindowTop() const {
  int top = model_->Top();
  for (const forms::Frame* f = control_->Container(); f; f = f->Container())
    top += f->Top();
  return top;
}

void ControlView::Reparent() {
  if (!Alive() || !widget_) return;
  QWidget* parent = window_.ContainerWidget(*control_);
  if (widget_->parentWidget() != parent) {
    const bool visible = model_->Visible();
    widget_->setParent(parent);
    widget_->setVisible(visible);
  }
}

void ControlView::SyncAll() {
  if (!Alive() || !widget_) return;
  ApplyGeometry();
  ApplyFont();
  ApplyColors();
  ApplyToolTip();
  ApplyEnabled();
  ApplyVisible();
}

void ControlView::ApplyGeometry() {
  Reparent();
  const int left = WindowLeft();
  const int top = WindowTop();
  const int originX = left - model_->Left();
  const int originY = top - model_->Top();
  widget_->setGeometry(GetScale().Rect(originX, originY, model_->Left(), model_->Top(),
                                       model_->Width(), model_->Height()));
}

void ControlView::ApplyVisible() {
  const bool visible = model_->Visible();
  if (!visible && widget_->isVisible()) {
    const QWidget* focused = QApplication::focusWidget();
    if (focused && (focused == widget_ || widget_->isAncestorOf(focused))) window_.ParkFocus();
  }
  widget_->setVisible(visible);
}

void ControlView::ApplyEnabled() {
  const bool enabled = model_->Enabled();
  if (!enabled && widget_->isEnabled()) {
    const QWidget* focused = QApplication::focusWidget();
    if (focused && (focused == widget_ || widget_->isAncestorOf(focused))) window_.ParkFocus();
  }
  widget_->setEnabled(enabled);
}

void ControlView::ApplyFont() {
  widget_->setFont(
      ToQFont(model_->FontName(), model_->FontSize(), model_->FontBold(), model_->FontItalic()));
}

void ControlView::ApplyColors() {
  // The model's fore colour for an enabled control; a disabled one keeps the
  // style's grey.
  QPalette palette = widget_->palette();
  const QColor fore = ToQColor(model_->ForeColor());
  for (const auto group : {QPalette::Active, QPalette::Inactive})
    for (const auto role : {QPalette::WindowText, QPalette::Text, QPalette::ButtonText})
      palette.setColor(group, role, fore);
  widget_->setPalette(palette);
}

void ControlView::ApplyToolTip() { widget_->setToolTip(ToQString(model_->ToolTipText())); }

void ControlView::PropertyChanged(grid::Property property) {
  if (!Alive() || !widget_) return;
  switch (property) {
  case grid::Property::Visible:
    ApplyVisible();
    break;
  case grid::Property::Enabled:
    ApplyEnabled();
    break;
  case grid::Property::Geometry:
    ApplyGeometry();
    break;
  case grid::Property::ZOrder:
    window_.Restack();
    break;
  case grid::Property::ToolTipText:
    ApplyToolTip();
    break;
  case grid::Property::Font:
    ApplyFont();
    break;
  case grid::Property::BackColor:
  case grid::Property::ForeColor:
    ApplyColors();
    break;
  default:
    break;
  }
  Sync(property);
}

void ControlView::FocusChanged(bool /*hasFocus*/) {
  if (Alive()) window_.FollowFocus();
}

bool ControlView::eventFilter(QObject* watched, QEvent* event) {
  if (!Alive()) return false;
  auto* source = qobject_cast<QWidget*>(watched);
  switch (event->type()) {
  case QEvent::KeyPress:
  case QEvent::KeyRelease:
    return window_.ForwardKey(static_cast<QKeyEvent*>(event));
  case QEvent::MouseButtonPress:
  case QEvent::MouseButtonRelease:
  case QEvent::MouseButtonDblClick:
    return source && Mouse(source, static_cast<QMouseEvent*>(event));
  case QEvent::ContextMenu:
  case QEvent::Drop:
  case QEvent::DragEnter:
    return true;
  default:
    return source && Other(source, event);
  }
}

bool ControlView::Mouse(QWidget* source, QMouseEvent* event) {
  ForwardMouse(source, event);
  return true;
}

QPoint ControlView::TwipsAt(QWidget* source, QPoint pixels) const {
  const QPoint p = source == widget_ ? pixels : source->mapTo(widget_, pixels);
  const Scale& scale = GetScale();
  const int x = std::clamp(scale.Twips(p.x()), 0, std::max(0, model_->Width() - 1));
  const int y = std::clamp(scale.Twips(p.y()), 0, std::max(0, model_->Height() - 1));
  return {x, y};
}

bool ControlView::ForwardMouse(QWidget* source, QMouseEvent* event) {
  const int button = ButtonOf(event->button());
  if (button == 0 || !Alive()) return false;
  const QPoint at = TwipsAt(source, event->position().toPoint());
  const int shift = ShiftOf(event->modifiers());
  switch (event->type()) {
  case QEvent::MouseButtonPress:
    return forms::Input::MouseDown(*control_, button, shift, at.x(), at.y());
  case QEvent::MouseButtonRelease:
    return forms::Input::MouseUp(*control_, button, shift, at.x(), at.y());
  case QEvent::MouseButtonDblClick:
    return forms::Input::DoubleClick(*control_, button, shift, at.x(), at.y());
  default:
    return false;
  }
}

} // namespace belvane::qt
