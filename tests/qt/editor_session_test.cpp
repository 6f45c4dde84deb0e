// An editor session on the real widgets: a modal window, real keys and
// clicks going through the forms' input paths, and what the widgets and
// the form show afterwards.

#include "qt_fixture.hpp"
#include "sample_forms.hpp"

#include <QCheckBox>
#include <QClipboard>
#include <QLineEdit>

using namespace belvane::qt;
using namespace belvane::qt::testing;

namespace {

QLineEdit* LineEdit(QWidget* widget) { return qobject_cast<QLineEdit*>(widget); }

} // namespace

TEST_F(QtFormsTest, TheInCellEditorTakesRealKeysAndLiesExactlyOverItsCell) {
  frmLines form;
  RunModal(form, [&] {
    auto& grid = form.fgLines;
    QWidget* window = Runtime().Window(form);
    EXPECT_EQ(window->windowTitle(), "Lines");
    const Scale& scale = Runtime().GetScale();
    EXPECT_EQ(window->size(), QSize(scale.Pixels(7200), scale.Pixels(4200)));
    EXPECT_TRUE(GridOf(grid)->Table()->hasFocus()); // the first control of the tab order

    // A double click on the hours of line 3 opens the editor over the cell.
    DoubleClickCell(grid, 3, frmLines::kColHours);
    QLineEdit* editor = LineEdit(WidgetOf(form.T1));
    ASSERT_NE(editor, nullptr);
    ASSERT_TRUE(editor->isVisible());
    EXPECT_EQ(InWindow(editor, editor->rect()), CellInWindow(grid, 3, frmLines::kColHours));
    EXPECT_TRUE(editor->hasFocus());
    EXPECT_EQ(editor->selectedText(), "3.50");

    Type("2x.5"); // the form refuses the x
    EXPECT_EQ(grid.TextMatrix(3, frmLines::kColHours), "2.5");
    EXPECT_EQ(editor->text(), "2.5");
    Key(Qt::Key_Escape); // back to the text on entry, the editor stays
    EXPECT_EQ(editor->text(), "3.50");
    EXPECT_EQ(editor->cursorPosition(), 4);
    Key(Qt::Key_A, Qt::ControlModifier);
    Type("4");
    Key(Qt::Key_Return);
    // Hiding the focused editor moved the cell once, by the form's Enter only.
    EXPECT_FALSE(editor->isVisible());
    EXPECT_EQ(grid.TextMatrix(3, frmLines::kColHours), "4");
    EXPECT_EQ(grid.Row(), 3);
    EXPECT_EQ(grid.Col(), frmLines::kColFlag);
    EXPECT_TRUE(GridOf(grid)->Table()->hasFocus());

    // The space bar toggles a flag: the box shows empty, the tip says so.
    QAbstractItemModel* cells = GridOf(grid)->Table()->model();
    EXPECT_EQ(cells->index(2, frmLines::kColFlag).data(Qt::CheckStateRole), Qt::Checked);
    Key(Qt::Key_Space);
    EXPECT_EQ(grid.TextMatrix(3, frmLines::kColFlag), kEmpty);
    EXPECT_EQ(cells->index(2, frmLines::kColFlag).data(Qt::CheckStateRole), Qt::Unchecked);
    EXPECT_EQ(GridOf(grid)->Widget()->toolTip(), "No");
    EXPECT_EQ(cells->index(2, frmLines::kColFlag).data(Qt::ToolTipRole).toString(), "No");

    // Typing on a description starts the editor with that character; the
    // right arrow at the end of the text goes on to the next cell, the left
    // arrow at its start back to the one before.
    ClickCell(grid, 4, frmLines::kColDescription);
    Type("Rear door");
    ASSERT_TRUE(editor->isVisible());
    EXPECT_EQ(editor->text(), "Rear door");
    Key(Qt::Key_Right);
    EXPECT_FALSE(editor->isVisible());
    EXPECT_EQ(grid.TextMatrix(4, frmLines::kColDescription), "Rear door");
    EXPECT_EQ(grid.Col(), frmLines::kColHours);
    Key(Qt::Key_Left); // on the grid: one cell left
    EXPECT_EQ(grid.Col(), frmLines::kColDescription);
    DoubleClickCell(grid, 4, frmLines::kColDescription);
    ASSERT_TRUE(editor->isVisible());
    Key(Qt::Key_Left); // collapses the selection to the start
    EXPECT_TRUE(editor->isVisible());
    EXPECT_EQ(editor->cursorPosition(), 0);
    Key(Qt::Key_Left); // at the start: out to the item number
    EXPECT_FALSE(editor->isVisible());
    EXPECT_EQ(grid.Col(), frmLines::kColItem);

    // A click in a text box places the caret where the line edit puts it,
    // and the model takes it.
    QLineEdit* note = LineEdit(WidgetOf(form.txtNote));
    Click(form.txtNote);
    EXPECT_TRUE(note->hasFocus());
    EXPECT_EQ(note->palette().color(QPalette::Base), QColor(Qt::yellow));
    Type("bonnet");
    QTest::mouseClick(note, Qt::LeftButton, {}, QPoint(3, note->height() / 2));
    EXPECT_EQ(form.txtNote.SelStart(), 0);
    Type("Left ");
    EXPECT_EQ(form.txtNote.Text(), "Left bonnet");
    EXPECT_EQ(note->text(), "Left bonnet");

    // The check box: a click, then the space bar.
    auto* check = qobject_cast<QCheckBox*>(WidgetOf(form.chkAuto));
    Click(form.chkAuto);
    EXPECT_EQ(form.chkAuto.Value(), belvane::forms::kChecked);
    EXPECT_TRUE(check->isChecked());
    Key(Qt::Key_Space);
    EXPECT_FALSE(check->isChecked());

    Click(form.cmdClose);
  });
  EXPECT_FALSE(form.Loaded());
  EXPECT_FALSE(Runtime().Window(form)->isVisible());
  ASSERT_EQ(form.written.size(), 30u);
  EXPECT_EQ(form.written[2], "103\tPanel 3\t4\tNo");
  EXPECT_EQ(form.written[3], "104\tRear door\t0.50\tNo");
  EXPECT_TRUE(Runtime().UnhandledErrors().empty());
}

TEST_F(QtFormsTest, ThePastedTextIsTypedSoTheFormFiltersIt) {
  frmLines form;
  RunModal(form, [&] {
    DoubleClickCell(form.fgLines, 1, frmLines::kColHours);
    QGuiApplication::clipboard()->setText("12a.7\nsecond line");
    Key(Qt::Key_V, Qt::ControlModifier);
    EXPECT_EQ(form.fgLines.TextMatrix(1, frmLines::kColHours), "12.7");
    Key(Qt::Key_A, Qt::ControlModifier);
    Key(Qt::Key_X, Qt::ControlModifier); // cut: copied, and the text goes
    EXPECT_EQ(QGuiApplication::clipboard()->text(), "12.7");
    EXPECT_EQ(form.fgLines.TextMatrix(1, frmLines::kColHours), "");
  });
}

TEST_F(QtFormsTest, TheCloseBoxUnloadsTheFormAndEndsTheModalCall) {
  frmLines form;
  RunModal(form, [&] {
    Runtime().Window(form)->close();
    EXPECT_FALSE(form.Loaded());
  });
  EXPECT_TRUE(form.written.empty()); // only Close writes back
  EXPECT_FALSE(Runtime().Window(form)->isVisible());

  // The same window serves the next session, loaded afresh.
  RunModal(form, [&] {
    EXPECT_EQ(form.fgLines.TextMatrix(5, frmLines::kColDescription), "Panel 5");
    EXPECT_EQ(GridOf(form.fgLines)->Table()->model()->rowCount(), 30);
    Click(form.cmdClose);
  });
  EXPECT_EQ(form.written.size(), 30u);
}
