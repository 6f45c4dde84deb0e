#pragma once
// FormWindow: the Qt window of one form. It builds a view for each of the
// form's controls (frames first, as the parents of what they hold), stacks
// siblings by their z-order, follows the form's caption, size, font and
// visibility, forwards keys to the forms runtime, and turns the window's
// close box into the form's. The form decides when the window shows and
// hides: a modal session runs an event loop until the form is hidden.

#include "grid/observable.hpp"
#include "qt/scale.hpp"

#include <QDialog>
#include <QLabel>

#include <functional>
#include <map>
#include <memory>

class QEventLoop;
class QKeyEvent;
class QResizeEvent;

namespace belvane::forms {
class Control;
class Form;
} // namespace belvane::forms

namespace belvane::qt {

class ControlView;
class QtRuntime;

class FormWindow : public QDialog, public grid::ModelObserver {
  Q_OBJECT
public:
  FormWindow(QtRuntime& runtime, forms::Form& form, const Scale& scale);
  ~FormWindow() override;

  forms::Form* Form() const noexcept { return form_; }
  QtRuntime& Runtime() const noexcept { return runtime_; }
  const Scale& GetScale() const noexcept { return scale_; }

  // Shows the window modeless, in front, and waits (briefly) until the
  // window system shows it so it can paint before the caller goes on.
  void ShowModeless();
  // Shows the window application-modal and returns when the form is hidden
  // (or the application quits). `shown` runs once inside the loop.
  void RunModal(const std::function<void()>& shown);

  ControlView* ViewOf(const forms::Control& control) const;
  QWidget* WidgetOf(const forms::Control& control) const;
  // The widget a control's widget belongs in: its frame's, or the window.
  QWidget* ContainerWidget(const forms::Control& control) const;
  // Stacks the sibling widgets by the z-order of their models.
  void Restack();
  // Takes the keyboard focus off every control widget (onto the window),
  // as a focused widget is about to be hidden or disabled: Qt would
  // otherwise pass the focus on as if Tab had been pressed.
  void ParkFocus();
  // Gives the Qt focus to the widget of the form's focused control.
  void FollowFocus();
  // A key from any widget of the window: to the forms runtime. Returns
  // whether it was taken.
  bool ForwardKey(QKeyEvent* event);

  void PropertyChanged(grid::Property property) override;
  void RepaintRequested() override;
  void ModelDestroyed() override;

protected:
  void closeEvent(QCloseEvent* event) override;
  // A sizable form takes the window's new client area (less the totals
  // strip) and lays itself out for it.
  void resizeEvent(QResizeEvent* event) override;
  void reject() override {}
  bool eventFilter(QObject* watched, QEvent* event) override;

private:
  ControlView* MakeView(forms::Control& control);
  // The model's size or place changed.
  void ApplyGeometry();
  // The window's size from the form's client area and the totals strip.
  void SizeToForm();
  int StripHeight() const;
  // Gives the form the window's client area (the user resized it).
  void TakeWindowSize();
  void ApplyFont();
  void Place();
  // The remembered size and place of a sizable window, in the runtime's
  // places file; false when there is none.
  bool RestorePlace();
  void RememberPlace();
  bool Clipboard(QKeyEvent* event);
  void TypeText(const QString& text);
  void FormHidden();

  // The running totals under the window, for forms that have them: asked
  // again (once per turn of the event loop) whenever one of its grids
  // changes.
  class TotalsWatcher;
  void RefreshTotals();
  QLabel* totals_ = nullptr;
  std::unique_ptr<TotalsWatcher> totalsWatcher_;
  bool totalsPending_ = false;

  QtRuntime& runtime_;
  forms::Form* form_;
  Scale scale_;
  std::map<const forms::Control*, ControlView*> views_;
  QEventLoop* loop_ = nullptr;
  bool placed_ = false;
  // A sizable window never gets smaller than the size code gave its form.
  QSize minimum_;
  bool resizing_ = false; // the form is taking the window's size
};

} // namespace belvane::qt
