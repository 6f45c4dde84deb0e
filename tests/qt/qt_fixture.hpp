#pragma once
// What the Qt tests share: a Qt runtime installed for the test, and real
// input on the real widgets (QTest events sent where a person's would go).

#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/runtime.hpp"
#include "qt/grid_view.hpp"
#include "qt/qt_runtime.hpp"

#include <QApplication>
#include <QTableView>
#include <QTest>
#include <QWidget>

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <optional>

namespace belvane::qt::testing {

// Real input on the real widgets of a runtime's windows: QTest events sent
// where a person's would go. A fixture mixes it in and names its runtime.
class RealInput {
protected:
  virtual ~RealInput() = default;
  virtual QtRuntime& InputRuntime() = 0;

  GridView* GridOf(const forms::FlexGrid& grid) {
    return dynamic_cast<GridView*>(InputRuntime().View(grid));
  }

  // Keys go to whatever widget Qt gives the keyboard, as a person's do: the
  // focused widget, else the active window.
  static void Key(Qt::Key key, Qt::KeyboardModifiers modifiers = Qt::NoModifier) {
    QWidget* focused = QApplication::focusWidget();
    if (!focused) focused = QApplication::activeWindow();
    ASSERT_NE(focused, nullptr) << "no window has the keyboard";
    QTest::keyClick(focused, key, modifiers);
  }
  // Each character to the widget that has the focus when it is typed.
  static void Type(const QString& text) {
    for (const QChar c : text) {
      QWidget* focused = QApplication::focusWidget();
      ASSERT_NE(focused, nullptr) << "no widget has the keyboard focus";
      QTest::keyClick(focused, c.toLatin1());
    }
  }

  // A cell's centre in the grid's cell area, and clicks on it.
  QPoint CellCentre(const forms::FlexGrid& grid, int row, int col) {
    GridView* view = GridOf(grid);
    const QRect cell = view->CellRect(row, col);
    EXPECT_TRUE(cell.isValid()) << "cell " << row << "," << col << " is not in view";
    return view->Table()->viewport()->mapFrom(view->Widget(), cell.center());
  }
  void ClickCell(const forms::FlexGrid& grid, int row, int col) {
    QTest::mouseClick(GridOf(grid)->Table()->viewport(), Qt::LeftButton, {},
                      CellCentre(grid, row, col));
  }
  // A double click as the window system delivers one: press, release,
  // double-click press, release.
  void DoubleClickCell(const forms::FlexGrid& grid, int row, int col) {
    QWidget* cells = GridOf(grid)->Table()->viewport();
    const QPoint at = CellCentre(grid, row, col);
    QTest::mouseClick(cells, Qt::LeftButton, {}, at);
    QTest::mouseDClick(cells, Qt::LeftButton, {}, at);
    QTest::mouseRelease(cells, Qt::LeftButton, {}, at);
  }
  void Click(const forms::Control& control) {
    QTest::mouseClick(InputRuntime().Widget(control), Qt::LeftButton);
  }
};

class QtFormsTest : public ::testing::Test, protected RealInput {
protected:
  void SetUp() override {
    QtRuntime::Application();
    runtime_ = std::make_unique<QtRuntime>();
    runtime_->ShowHandlerErrors(false);
    use_.emplace(*runtime_);
  }
  void TearDown() override {
    use_.reset();
    runtime_.reset();
  }

  QtRuntime& Runtime() { return *runtime_; }
  QtRuntime& InputRuntime() override { return *runtime_; }

  // Shows a form modally; `user` plays the user once its window is active.
  void RunModal(forms::Form& form, const std::function<void()>& user) {
    runtime_->QueueModal([this, &form, user](forms::Form&) {
      QWidget* window = runtime_->Window(form);
      ASSERT_NE(window, nullptr);
      ASSERT_TRUE(QTest::qWaitForWindowActive(window));
      user();
    });
    form.Show(forms::ShowStyle::Modal);
  }

  QWidget* WidgetOf(const forms::Control& control) { return runtime_->Widget(control); }

  // The pixel rectangle of a widget, or of a grid cell, in its window.
  static QRect InWindow(const QWidget* widget, QRect rect) {
    return QRect(widget->mapTo(widget->window(), rect.topLeft()), rect.size());
  }
  QRect CellInWindow(const forms::FlexGrid& grid, int row, int col) {
    GridView* view = GridOf(grid);
    return InWindow(view->Widget(), view->CellRect(row, col));
  }

private:
  std::unique_ptr<QtRuntime> runtime_;
  std::optional<forms::ScopedRuntime> use_;
};

} // namespace belvane::qt::testing
