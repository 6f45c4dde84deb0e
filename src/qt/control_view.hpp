#pragma once
// ControlView: the Qt widget of one control, bound to its model both ways.
// Model changes reach the widget at once (the view observes the model);
// the user's keys, clicks, double clicks and scrolling on the widget go
// into forms::Input, the paths the simulated user takes, and come back to
// the widget as model changes. A widget never changes its own state from
// input: the model is the one truth.
//
// Geometry: a control's twip rectangle is converted at the window's scale
// from its position inside the window, so neighbouring controls and the
// cells of a grid round to the same pixel edges.

#include "grid/observable.hpp"
#include "qt/scale.hpp"

#include <QColor>
#include <QFont>
#include <QObject>
#include <QPointer>
#include <QString>

#include <functional>
#include <string>
#include <string_view>

class QMouseEvent;
class QWidget;

namespace belvane::grid {
class ControlModel;
}
namespace belvane::forms {
class Control;
}

namespace belvane::qt {

class FormWindow;

class ControlView : public QObject, public grid::ModelObserver {
  Q_OBJECT
public:
  ControlView(FormWindow& window, forms::Control& control, QWidget* widget);
  ~ControlView() override;

  forms::Control* Control() const noexcept { return control_; }
  QWidget* Widget() const noexcept { return widget_; }
  FormWindow& Window() const noexcept { return window_; }

  // Brings every property of the widget in line with the model.
  virtual void SyncAll();
  // Puts the widget under the widget of its container (the form or a frame).
  void Reparent();

  void PropertyChanged(grid::Property property) override;
  void FocusChanged(bool hasFocus) override;
  void ModelDestroyed() override;

protected:
  bool eventFilter(QObject* watched, QEvent* event) override;

  // A property of the control's own kind changed.
  virtual void Sync(grid::Property /*property*/) {}
  // A mouse button event on `source` (the widget or one of its parts).
  // Returns whether the event is eaten; the default forwards it to Input
  // and eats it.
  virtual bool Mouse(QWidget* source, QMouseEvent* event);
  // The point of the control, in twips, under a point of `source`.
  virtual QPoint TwipsAt(QWidget* source, QPoint pixels) const;
  // Any other event of a watched part; returns whether it is eaten.
  virtual bool Other(QWidget* /*source*/, QEvent* /*event*/) { return false; }
  // Forwards one mouse button event; false when the input was refused.
  bool ForwardMouse(QWidget* source, QMouseEvent* event);

  // Routes the input events of a part of the widget through this view.
  void Watch(QWidget* part);

  // Absolute position of the control inside the window, in twips.
  int WindowLeft() const;
  int WindowTop() const;

  const Scale& GetScale() const;
  grid::ControlModel& Model() const { return *model_; }
  bool Alive() const noexcept { return control_ != nullptr; }

  void ApplyGeometry();
  void ApplyVisible();
  void ApplyEnabled();
  virtual void ApplyFont();
  virtual void ApplyColors();
  void ApplyToolTip();

  FormWindow& window_;
  forms::Control* control_;
  grid::ControlModel* model_;
  QPointer<QWidget> widget_;
};

// Model colours are blue-green-red values; system colours (the high bit set)
// map to the palette's.
QColor ToQColor(std::uint32_t color);
QFont ToQFont(const std::string& name, double points, bool bold, bool italic);
QString ToQString(std::string_view utf8);
std::string ToUtf8(const QString& text);
// A caption with its access-key marks: "&&" shows "&", a single "&" nothing.
QString WithoutAccessKeys(const std::string& caption);
// A caption as a Qt button shows it, with the control's access key (the
// first letter of the caption that matches it) underlined.
QString WithAccessKey(const std::string& caption, char32_t key);
// The name of a control as handlers are named ("optSchedule(2)").
std::string ControlName(const forms::Control& control);
// Runs code that may raise form events from a view, outside any input path:
// an error ends it and goes to the runtime's UnhandledError, as an error in
// a handler run by input does.
void RunHandler(const std::string& where, const std::function<void()>& code);

} // namespace belvane::qt
