// The grid's view: what it draws from the model, and its scroll position
// kept in step with the model both ways.

#include "qt_fixture.hpp"
#include "sample_forms.hpp"

#include <QHeaderView>
#include <QPainter>
#include <QScrollBar>
#include <QStyleOptionButton>
#include <QWheelEvent>

using namespace belvane::qt;
using namespace belvane::qt::testing;

TEST_F(QtFormsTest, TheGridDrawsTheModelsTextsGeometryAndLook) {
  frmLines form;
  RunModal(form, [&] {
    auto& grid = form.fgLines;
    GridView* view = GridOf(grid);
    QTableView* table = view->Table();
    const Scale& scale = Runtime().GetScale();

    // Twips to pixels: the grid's rectangle, column widths from its left
    // edge, the header row and the data rows.
    EXPECT_EQ(view->Widget()->geometry(), scale.Rect(0, 0, 120, 120, 6000, 9 * 240));
    const int widths[] = {800, 2800, 1000, 600};
    int x = 120;
    for (int c = 0; c < 4; ++c) {
      EXPECT_EQ(table->horizontalHeader()->sectionSize(c), scale.Span(x, widths[c])) << c;
      x += widths[c];
    }
    EXPECT_EQ(table->horizontalHeader()->height(), scale.RowPixels());
    EXPECT_EQ(table->rowHeight(7), scale.RowPixels());
    EXPECT_EQ(table->verticalHeader()->sectionResizeMode(0), QHeaderView::Fixed);

    // Texts, header, alignment, fonts and colours as the model has them.
    QAbstractItemModel* cells = table->model();
    EXPECT_EQ(cells->rowCount(), 30);
    EXPECT_EQ(cells->headerData(1, Qt::Horizontal).toString(), "Description");
    EXPECT_TRUE(cells->headerData(1, Qt::Horizontal, Qt::FontRole).value<QFont>().bold());
    EXPECT_EQ(cells->index(0, 1).data().toString(), "Panel 1");
    EXPECT_EQ(cells->index(0, 2).data(Qt::TextAlignmentRole).toInt(),
              int(Qt::AlignRight | Qt::AlignVCenter));
    EXPECT_TRUE(cells->index(1, 1).data(Qt::FontRole).value<QFont>().italic());
    EXPECT_EQ(cells->index(1, 1).data(Qt::BackgroundRole).value<QBrush>().color(),
              QColor(0x80, 0x80, 0x80));
    EXPECT_EQ(cells->index(0, 1).data(Qt::BackgroundRole).value<QBrush>().color(),
              QColor(Qt::yellow)); // the focused grid's current cell

    // A label declared after the grid still lies beneath it: it shows only
    // where the grid is hidden.
    QWidget* loading = WidgetOf(form.lblLoading);
    const QPoint under = loading->mapTo(loading->window(), loading->rect().center());
    EXPECT_TRUE(view->Widget()->isAncestorOf(loading->window()->childAt(under)));
    grid.Visible(false);
    EXPECT_EQ(loading->window()->childAt(under), loading);
    grid.Visible(true);

    // A model change shows at once.
    grid.TextMatrix(5, 1, "Boot lid");
    EXPECT_EQ(cells->index(4, 1).data().toString(), "Boot lid");
    grid.AddItem("999\tSpoiler\t1.00\t" + std::string(kTicked), 2);
    EXPECT_EQ(cells->rowCount(), 31);
    EXPECT_EQ(cells->index(1, 1).data().toString(), "Spoiler");
    grid.RemoveItem(2);
    EXPECT_EQ(cells->index(1, 1).data().toString(), "Panel 2");

    // A flag cell shows the platform style's check box, ticked for "R" and
    // empty for "£", not the letter.
    const QImage shown = table->viewport()->grab().toImage();
    for (int row : {1, 2}) {
      const QRect cell = table->visualRect(cells->index(row - 1, frmLines::kColFlag));
      const QRect inner = cell; // the cell's drawing, without the grid line
      QImage expected(inner.size(), QImage::Format_ARGB32_Premultiplied);
      expected.fill(Qt::white);
      {
        QPainter painter(&expected);
        QStyleOptionButton box;
        box.initFrom(table->viewport());
        box.palette.setColor(QPalette::Base, Qt::white);
        const int side = std::min(
            {table->style()->pixelMetric(QStyle::PM_IndicatorWidth, nullptr, table->viewport()),
             inner.height() - 2});
        box.rect = QStyle::alignedRect(Qt::LeftToRight, Qt::AlignCenter, QSize(side, side),
                                       QRect(QPoint(0, 0), inner.size()).adjusted(2, 0, -2, 0));
        box.state = QStyle::State_Enabled | (row == 1 ? QStyle::State_On : QStyle::State_Off);
        table->style()->drawPrimitive(QStyle::PE_IndicatorCheckBox, &box, &painter,
                                      table->viewport());
      }
      EXPECT_EQ(shown.copy(inner).convertToFormat(QImage::Format_ARGB32_Premultiplied), expected)
          << "row " << row;
    }
    Click(form.cmdClose);
  });
}

TEST_F(QtFormsTest, TheScrollPositionFollowsTheModelAndTheUsersBarsAndWheel) {
  frmLines form;
  RunModal(form, [&] {
    auto& grid = form.fgLines;
    GridView* view = GridOf(grid);
    QScrollBar* bar = view->VerticalBar();
    EXPECT_TRUE(bar->isVisible()); // 30 rows in a grid of 8
    EXPECT_FALSE(view->HorizontalBar()->isVisible());
    EXPECT_EQ(bar->maximum(), grid.MaxTopRow() - 1);

    // The user's arrows: the current cell stays in view, the model scrolls
    // as little as needed and the view goes with it.
    for (int i = 0; i < 10; ++i)
      Key(Qt::Key_Down);
    EXPECT_EQ(grid.Row(), 11);
    EXPECT_EQ(grid.TopRow(), 4);
    EXPECT_EQ(bar->value(), 3);
    const QRect current = view->CellRect(11, 1);
    ASSERT_TRUE(current.isValid());
    EXPECT_EQ(current.top(),
              view->CellRect(0, 1).bottom() + 1 + 7 * Runtime().GetScale().RowPixels());

    // The model scrolled by code.
    grid.TopRow(20);
    EXPECT_EQ(bar->value(), 19);
    EXPECT_EQ(view->CellRect(20, 1).top(), view->CellRect(0, 1).bottom() + 1);

    // The user's scroll bar and wheel scroll the model, with its Scroll event.
    form.events.clear();
    bar->triggerAction(QAbstractSlider::SliderToMinimum);
    EXPECT_EQ(grid.TopRow(), 1);
    EXPECT_EQ(form.events, std::vector<std::string>{"Scroll"});
    QWidget* cells = view->Table()->viewport();
    const QPoint at = cells->rect().center();
    QWheelEvent down(at, cells->mapToGlobal(at), {}, {0, -QWheelEvent::DefaultDeltasPerStep},
                     Qt::NoButton, Qt::NoModifier, Qt::NoScrollPhase, false);
    QApplication::sendEvent(cells, &down);
    EXPECT_EQ(grid.TopRow(), 1 + QApplication::wheelScrollLines());
    EXPECT_EQ(bar->value(), grid.TopRow() - 1);

    // At the furthest scroll the last row shows whole, right at the bottom
    // of what the model has in view.
    bar->triggerAction(QAbstractSlider::SliderToMaximum);
    EXPECT_EQ(grid.TopRow(), 23);
    const QRect last = view->CellRect(30, 1);
    ASSERT_TRUE(last.isValid());
    EXPECT_EQ(last.top(), view->CellRect(0, 1).bottom() + 1 + 7 * Runtime().GetScale().RowPixels());

    // A click lands on the cell drawn under the pointer.
    ClickCell(grid, 25, frmLines::kColHours);
    EXPECT_EQ(grid.Row(), 25);
    EXPECT_EQ(grid.Col(), frmLines::kColHours);

    // Input the form refuses (a disabled form) leaves model and view alone.
    form.Enabled(false);
    bar->triggerAction(QAbstractSlider::SliderToMinimum);
    EXPECT_EQ(grid.TopRow(), 23);
    EXPECT_EQ(bar->value(), 22);
    form.Enabled(true);
    Click(form.cmdClose);
  });
}
