#include "qt/form_window.hpp"

#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/input.hpp"
#include "forms/simulated_user.hpp"
#include "qt/control_view.hpp"
#include "qt/keymap.hpp"
#include "qt/qt_runtime.hpp"
#include "qt/views.hpp"

#include <QApplication>
#include <QClipboard>
#include <QCloseEvent>
#include <QElapsedTimer>
#include <QEventLoop>
#include <QKeyEvent>
#include <QPointer>
#include <QRegularExpression>
#include <QScreen>
#include <QSettings>
#include <QTimer>
#include <QWindow>

#include <algorithm>
#include <vector>

namespace belvane::qt {

namespace {
// How long a modeless window may take to come on screen before the caller
// goes on regardless.
constexpr int kExposeWaitMs = 1000;
} // namespace

// Watches the form's grids for any change of their cells or rows.
class FormWindow::TotalsWatcher : public grid::ModelObserver {
public:
  explicit TotalsWatcher(FormWindow& window) : window_(window) {}
  ~TotalsWatcher() override {
    for (grid::Observable* grid : grids_)
      grid->RemoveObserver(this);
  }
  void Watch(grid::Observable& grid) {
    grids_.push_back(&grid);
    grid.AddObserver(this);
  }
  void CellsChanged(int, int, int, int) override { Changed(); }
  void LayoutChanged() override { Changed(); }
  void ModelDestroyed() override { grids_.clear(); }

private:
  void Changed() {
    if (window_.totalsPending_) return;
    window_.totalsPending_ = true;
    QTimer::singleShot(0, &window_, [w = &window_] { w->RefreshTotals(); });
  }
  FormWindow& window_;
  std::vector<grid::Observable*> grids_;
};

FormWindow::FormWindow(QtRuntime& runtime, forms::Form& form, const Scale& scale)
    : QDialog(nullptr, Qt::Dialog | Qt::WindowTitleHint | Qt::WindowSystemMenuHint |
                           Qt::WindowCloseButtonHint |
                           (form.Sizable() ? Qt::WindowMaximizeButtonHint
                                           : Qt::MSWindowsFixedSizeDialogHint)),
      runtime_(runtime), form_(&form), scale_(scale) {
  setObjectName(QString::fromStdString(form.Name()));
  setFocusPolicy(Qt::NoFocus);
  setContextMenuPolicy(Qt::NoContextMenu);
  setSizeGripEnabled(form.Sizable());
  installEventFilter(this);
  for (forms::Control* control : form.Controls())
    MakeView(*control);
  for (auto& [control, view] : views_)
    view->SyncAll();
  {
    // A form with running totals shows them in a strip under its design
    // area; the strip is hidden while the form has none.
    totals_ = new QLabel(this);
    totals_->setObjectName("RunningTotals");
    totals_->setFrameShape(QFrame::StyledPanel);
    totals_->setContentsMargins(6, 0, 6, 0);
    totalsWatcher_ = std::make_unique<TotalsWatcher>(*this);
    for (forms::Control* control : form.Controls())
      if (auto* grid = dynamic_cast<forms::FlexGrid*>(control))
        totalsWatcher_->Watch(static_cast<grid::FlexGrid&>(*grid));
  }
  ApplyGeometry();
  ApplyFont();
  setWindowTitle(ToQString(form.Caption()));
  Restack();
  FollowFocus();
  RefreshTotals();
  form.AddObserver(this);
}

void FormWindow::RefreshTotals() {
  totalsPending_ = false;
  if (!totals_ || !form_) return;
  const std::string line = form_->RunningTotals();
  const bool shown = !line.empty();
  totals_->setText(ToQString(line));
  const bool changed = totals_->isHidden() == shown;
  totals_->setVisible(shown);
  if (changed) SizeToForm();
}

FormWindow::~FormWindow() {
  totalsWatcher_.reset();
  if (form_) form_->RemoveObserver(this);
  if (loop_) loop_->quit();
}

ControlView* FormWindow::MakeView(forms::Control& control) {
  if (auto it = views_.find(&control); it != views_.end()) return it->second;
  if (control.Container()) MakeView(*control.Container());
  ControlView* view = MakeControlView(*this, control, ContainerWidget(control));
  views_[&control] = view;
  return view;
}

ControlView* FormWindow::ViewOf(const forms::Control& control) const {
  const auto it = views_.find(&control);
  return it == views_.end() ? nullptr : it->second;
}

QWidget* FormWindow::WidgetOf(const forms::Control& control) const {
  ControlView* view = ViewOf(control);
  return view ? view->Widget() : nullptr;
}

QWidget* FormWindow::ContainerWidget(const forms::Control& control) const {
  if (control.Container())
    if (QWidget* frame = WidgetOf(*control.Container())) return frame;
  return const_cast<FormWindow*>(this);
}

// ---- geometry and look ----

void FormWindow::ApplyGeometry() {
  if (!form_) return;
  if (resizing_) return; // the form takes the size the window has
  // A size given by code (the design, at load) is the smallest a sizable
  // window takes; a move keeps the size the user gave it.
  const QSize area(scale_.Pixels(form_->ScaleWidth()), scale_.Pixels(form_->ScaleHeight()));
  if (minimum_.isEmpty() || area != QSize(width(), height() - StripHeight())) minimum_ = area;
  SizeToForm();
  if (placed_ && (form_->Left() != 0 || form_->Top() != 0))
    move(scale_.Pixels(form_->Left()), scale_.Pixels(form_->Top()));
}

int FormWindow::StripHeight() const {
  return totals_ && !totals_->isHidden() ? totals_->sizeHint().height() + 4 : 0;
}

void FormWindow::SizeToForm() {
  if (!form_) return;
  const int strip = StripHeight();
  if (form_->Sizable() && (isMaximized() || isFullScreen())) {
    // The window keeps its size: the form's area is what the strip leaves.
    TakeWindowSize();
    return;
  }
  const int width = scale_.Pixels(form_->ScaleWidth());
  const int height = scale_.Pixels(form_->ScaleHeight());
  if (totals_) totals_->setGeometry(0, height, width, strip);
  if (!form_->Sizable()) {
    setFixedSize(width, height + strip);
    return;
  }
  setMinimumSize(minimum_.width(), minimum_.height() + strip);
  resizing_ = true;
  resize(width, height + strip);
  resizing_ = false;
}

void FormWindow::TakeWindowSize() {
  if (!form_) return;
  const int strip = StripHeight();
  const int height = std::max(0, this->height() - strip);
  if (totals_) totals_->setGeometry(0, height, width(), strip);
  if (scale_.Pixels(form_->ScaleWidth()) == width() &&
      scale_.Pixels(form_->ScaleHeight()) == height)
    return;
  resizing_ = true;
  forms::Input::Resize(*form_, scale_.Twips(width()), scale_.Twips(height));
  resizing_ = false;
}

void FormWindow::resizeEvent(QResizeEvent* event) {
  QDialog::resizeEvent(event);
  if (form_ && form_->Sizable() && !resizing_) TakeWindowSize();
}

void FormWindow::ApplyFont() {
  if (form_) setFont(ToQFont(form_->FontName(), form_->FontSize(), false, false));
}

// A form placed by its design goes there; one at the origin is centred over
// the window it belongs to, or on the screen.
void FormWindow::Place() {
  if (!form_) return;
  // The totals strip as the loaded form has it, before the window takes
  // its size.
  RefreshTotals();
  // A sizable window opens where, and as large as, it was last closed.
  if (RestorePlace()) {
    placed_ = true;
    return;
  }
  if (placed_) return;
  placed_ = true;
  if (form_->Left() != 0 || form_->Top() != 0) {
    move(scale_.Pixels(form_->Left()), scale_.Pixels(form_->Top()));
    return;
  }
  QRect area;
  if (const QWidget* over = QApplication::activeWindow(); over && over != this)
    area = over->frameGeometry();
  else if (const QScreen* screen = QGuiApplication::primaryScreen())
    area = screen->availableGeometry();
  if (area.isValid()) move(area.center() - QPoint(width() / 2, height() / 2));
}

namespace {
QString PlaceKey(const forms::Form& form) {
  return QString::fromStdString(form.Name()) + QStringLiteral("/geometry");
}
} // namespace

bool FormWindow::RestorePlace() {
  if (!form_ || !form_->Sizable() || runtime_.WindowPlacesFile().empty()) return false;
  const QSettings places(ToQString(runtime_.WindowPlacesFile()), QSettings::IniFormat);
  const QByteArray geometry = places.value(PlaceKey(*form_)).toByteArray();
  return !geometry.isEmpty() && restoreGeometry(geometry);
}

void FormWindow::RememberPlace() {
  if (!form_ || !form_->Sizable() || runtime_.WindowPlacesFile().empty()) return;
  QSettings places(ToQString(runtime_.WindowPlacesFile()), QSettings::IniFormat);
  places.setValue(PlaceKey(*form_), saveGeometry());
}

void FormWindow::Restack() {
  if (!form_) return;
  // Labels are drawn on their container itself, beneath every control that
  // has a window of its own (a label under a grid shows only while the grid
  // is hidden); among themselves, and among the others, siblings stack by
  // their models' z-order, equal keys in the order of declaration.
  std::vector<std::pair<forms::Control*, std::size_t>> order;
  const auto& controls = form_->Controls();
  for (std::size_t i = 0; i < controls.size(); ++i)
    order.emplace_back(controls[i], i);
  const auto layer = [](const forms::Control* c) {
    return c->Kind() == forms::ControlKind::Label ? 0 : 1;
  };
  std::stable_sort(order.begin(), order.end(), [&layer](const auto& a, const auto& b) {
    if (layer(a.first) != layer(b.first)) return layer(a.first) < layer(b.first);
    return a.first->Model().ZOrderKey() < b.first->Model().ZOrderKey();
  });
  for (const auto& [control, index] : order)
    if (QWidget* widget = WidgetOf(*control)) widget->raise();
}

// ---- focus ----

void FormWindow::ParkFocus() { setFocus(Qt::OtherFocusReason); }

void FormWindow::FollowFocus() {
  if (!form_) return;
  forms::Control* active = form_->ActiveControl();
  QWidget* widget = active ? WidgetOf(*active) : nullptr;
  if (widget && widget->isEnabled() && !widget->isHidden()) {
    if (!widget->hasFocus()) widget->setFocus(Qt::OtherFocusReason);
    // The style draws its focus frame only after keyboard focus changes;
    // here the focus always moves as the keyboard's work (the forms move
    // it, whatever the input), so the frame always shows.
    if (!testAttribute(Qt::WA_KeyboardFocusChange)) {
      setAttribute(Qt::WA_KeyboardFocusChange);
      widget->update();
    }
    return;
  }
  const QWidget* focused = focusWidget();
  if (focused && focused != this) ParkFocus();
}

// ---- showing ----

void FormWindow::ShowModeless() {
  Place();
  show();
  raise();
  activateWindow();
  // The window should paint before the caller goes on (a status box shown
  // while an editor loads): wait until the window system shows it.
  QElapsedTimer waited;
  waited.start();
  while (isVisible() && windowHandle() && !windowHandle()->isExposed() &&
         waited.elapsed() < kExposeWaitMs)
    QCoreApplication::processEvents(QEventLoop::ExcludeUserInputEvents, 10);
  if (isVisible()) repaint();
}

void FormWindow::RunModal(const std::function<void()>& shown) {
  Place();
  setWindowModality(Qt::ApplicationModal);
  // The window belongs to the window it opens over: the modal one in front,
  // else the host's active window (never a modeless form of ours, such as a
  // status box that goes away while this window is open).
  QWidget* over = QApplication::activeModalWidget();
  if (!over) {
    over = QApplication::activeWindow();
    if (auto* form = qobject_cast<FormWindow*>(over); form && !form->isModal()) over = nullptr;
  }
  if (over && over != this) {
    winId(); // the window's native handle, to name the window it belongs to
    if (over->windowHandle()) windowHandle()->setTransientParent(over->windowHandle());
  } else if (windowHandle()) {
    windowHandle()->setTransientParent(nullptr);
  }
  show();
  raise();
  activateWindow();
  QPointer<FormWindow> self(this);
  QEventLoop loop;
  loop_ = &loop;
  if (shown) QTimer::singleShot(0, &loop, shown);
  if (form_ && form_->Visible()) loop.exec(QEventLoop::DialogExec);
  if (!self) return;
  loop_ = nullptr;
  if (!isVisible()) setWindowModality(Qt::NonModal);
}

void FormWindow::FormHidden() {
  if (isVisible()) {
    RememberPlace();
    ParkFocus();
    hide();
  }
  setWindowModality(Qt::NonModal);
  if (loop_) loop_->quit();
}

// ---- the form's notices ----

void FormWindow::PropertyChanged(grid::Property property) {
  if (!form_) return;
  switch (property) {
  case grid::Property::Visible:
    if (!form_->Visible()) FormHidden();
    break;
  case grid::Property::Caption:
    setWindowTitle(ToQString(form_->Caption()));
    break;
  case grid::Property::Geometry:
    ApplyGeometry();
    break;
  case grid::Property::Font:
    ApplyFont();
    break;
  case grid::Property::ZOrder:
    if (isVisible()) raise();
    break;
  default:
    break;
  }
}

void FormWindow::RepaintRequested() {
  if (isVisible()) repaint();
}

void FormWindow::ModelDestroyed() {
  form_ = nullptr;
  runtime_.Forget(*this);
  if (loop_) loop_->quit();
  hide();
  deleteLater();
}

// ---- input ----

void FormWindow::closeEvent(QCloseEvent* event) {
  // The form decides: the close box unloads it (unless it cancels), and the
  // window hides when the form does.
  event->ignore();
  if (form_ && form_->Visible()) forms::Input::CloseBox(*form_);
}

bool FormWindow::eventFilter(QObject* watched, QEvent* event) {
  if (watched == this && (event->type() == QEvent::KeyPress || event->type() == QEvent::KeyRelease))
    return ForwardKey(static_cast<QKeyEvent*>(event));
  return QDialog::eventFilter(watched, event);
}

bool FormWindow::ForwardKey(QKeyEvent* event) {
  // Keys reach only the form that takes the keyboard now.
  if (!form_ || forms::Input::ActiveForm() != form_) return true;
  const KeyStroke key = FromQtKey(*event);
  if (event->type() == QEvent::KeyRelease) {
    if (!event->isAutoRepeat() && key.keyCode != 0) forms::Input::KeyUp(key.keyCode, key.shift);
    return true;
  }
  if (key.keyCode != 0) forms::Input::KeyDown(key.keyCode, key.shift, key.character);
  Clipboard(event);
  return true;
}

// The clipboard keys of a focused text box. Copy takes the model's
// selection; paste types the clipboard's first line as keys, so the form's
// key handlers see (and may refuse) each character, as they do typing.
bool FormWindow::Clipboard(QKeyEvent* event) {
  if (!form_) return false;
  auto* box = dynamic_cast<forms::TextBox*>(form_->ActiveControl());
  if (!box || !forms::Input::Accepts(*box)) return false;
  QClipboard* clipboard = QGuiApplication::clipboard();
  if (event->matches(QKeySequence::Copy)) {
    if (box->SelLength() > 0) clipboard->setText(ToQString(box->SelText()));
    return true;
  }
  if (event->matches(QKeySequence::Cut)) {
    if (box->SelLength() == 0) return true;
    clipboard->setText(ToQString(box->SelText()));
    if (!box->Locked()) RunHandler(ControlName(*box) + "_Change", [box] { box->SelText(""); });
    return true;
  }
  if (event->matches(QKeySequence::Paste)) {
    if (!box->Locked()) TypeText(clipboard->text());
    return true;
  }
  if (event->matches(QKeySequence::SelectAll)) {
    box->SelStart(0);
    box->SelLength(box->Length());
    return true;
  }
  return false;
}

void FormWindow::TypeText(const QString& text) {
  QString line = text.section(QRegularExpression(QStringLiteral("[\\r\\n]")), 0, 0);
  line.replace(u'\t', u' ');
  if (!line.isEmpty()) forms::SimulatedUser().Type(ToUtf8(line));
}

} // namespace belvane::qt
