// The parts editor on the real widgets: opened through CForms with the Qt
// runtime over a small catalogue, driven by real keys and clicks (the
// search box, the grids, the in-cell editor, the part-type list from its
// drop-down button and from F2, Delete, Close, the close box), checked on
// what the widgets show and on the host's record set.
//
// With BELVANE_SCREENSHOTS set to a folder, the tests also save pictures of
// the editor there (docs/screenshots is made that way).

#include "../parts/parts_fixture.hpp"
#include "qt/grid_view.hpp"
#include "qt/list_view.hpp"
#include "qt/qt_runtime.hpp"
#include "qt_fixture.hpp"

#include <QAbstractItemModel>
#include <QApplication>
#include <QHeaderView>
#include <QImage>
#include <QLabel>
#include <QLineEdit>
#include <QMessageBox>
#include <QPushButton>
#include <QTableView>
#include <QTest>

#include <cstdlib>
#include <map>
#include <optional>

using namespace belvane;
using namespace belvane::qt;
using parts::frmParts;
namespace cat = parts::col::cat;
namespace sel = parts::col::sel;

namespace {

class PartsWindowTest : public test::PartsFixture, protected qt::testing::RealInput {
protected:
  void SetUp() override {
    PartsFixture::SetUp();
    QtRuntime::Application();
    qt_.emplace();
    qt_->ShowHandlerErrors(false);
    use_.emplace(*qt_);
  }
  void TearDown() override {
    EXPECT_TRUE(qt_->UnhandledErrors().empty())
        << "a handler failed: " << qt_->UnhandledErrors().front().where << ": "
        << qt_->UnhandledErrors().front().description;
    use_.reset();
    qt_.reset();
    PartsFixture::TearDown();
  }

  // Two stored parts: a new one and a used one.
  void TwoParts() {
    AddPart({1, "P100", "FRONT BUMPER BAR", "O", "", 1, 100.0, 130.0, "FB-1001"});
    AddPart({2, "P140", "HEADLAMP", "O", "U", 2, 300.0, 360.0, "HL-9"});
    Stored();
  }

  // Opens the editor through CForms; `estimator` plays the user once its
  // window is active.
  void OpenWindow(EQuoteEditMode mode, const std::function<void(frmParts&)>& estimator) {
    qt_->QueueModal([this, estimator](forms::Form& f) {
      auto& form = static_cast<frmParts&>(f);
      ASSERT_TRUE(QTest::qWaitForWindowActive(qt_->Window(form)));
      estimator(form);
    });
    forms.ShowPartsForm(quote, qtnNo, subQuoteNo, make, modelId, bodyId, newMarkup, usedMarkup,
                        recoreMarkup, afterMarketMarkup, oldNewMarkup, oldUsedMarkup,
                        oldRecoreMarkup, oldAfterMarketMarkup, mode);
  }

  QtRuntime& Qt() { return *qt_; }
  QtRuntime& InputRuntime() override { return *qt_; }
  QString Shown(const forms::FlexGrid& g, int row, int col) {
    return GridOf(g)->Table()->model()->index(row - 1, col).data().toString();
  }
  QLineEdit* Editor(const frmParts& form) { return qobject_cast<QLineEdit*>(qt_->Widget(form.T1)); }
  QTableView* List(const frmParts& form) {
    return dynamic_cast<ListViewView*>(qt_->View(form.LV1))->Table();
  }

  // A click on the list's item (1 to 5) where the list draws it.
  void ClickItem(const frmParts& form, int item) {
    QTableView* list = List(form);
    const QRect shown = list->visualRect(list->model()->index(item - 1, 0));
    ASSERT_TRUE(shown.isValid());
    QTest::mouseClick(list->viewport(), Qt::LeftButton, {}, shown.center());
  }

  // A widget's rectangle, and a grid cell's, in the window's pixels.
  static QRect InWindow(const QWidget* w) {
    return QRect(w->mapTo(w->window(), QPoint(0, 0)), w->size());
  }
  QRect CellInWindow(const forms::FlexGrid& g, int row, int col) {
    GridView* view = GridOf(g);
    const QRect cell = view->CellRect(row, col);
    return QRect(view->Widget()->mapTo(view->Widget()->window(), cell.topLeft()), cell.size());
  }

  void Picture(const frmParts& form, const char* name) { Picture(*qt_->Window(form), name); }
  static void Picture(QWidget& window, const char* name) {
    const char* folder = std::getenv("BELVANE_SCREENSHOTS");
    if (!folder || !*folder) return;
    QApplication::processEvents();
    EXPECT_TRUE(WindowPicture(window).save(QString::fromUtf8(folder) + "/" + name));
  }

private:
  std::optional<QtRuntime> qt_;
  std::optional<forms::ScopedRuntime> use_;
};

TEST_F(PartsWindowTest, AnEstimatorAddsAnExchangePartWithKeysAndClicks) {
  TwoParts();
  const std::string headlamp = Records()[1];
  ASSERT_EQ(headlamp.substr(0, 5), "P140|");

  OpenWindow(eEdit, [&](frmParts& form) {
    auto& g = form.FGSelectedParts;
    // The catalogue and the quote's parts show; the picture buttons carry
    // their pictures.
    EXPECT_EQ(Shown(form.FGParts, 1, cat::kItemNo), "P100");
    EXPECT_EQ(Shown(g, 1, sel::kDescription), "FRONT BUMPER BAR");
    EXPECT_EQ(Shown(g, 2, sel::kMarkup), "360.000");
    for (const forms::CommandButton* b : {&form.cmdSearch(0), &form.cmdSearch(1), &form.CB1})
      EXPECT_FALSE(qobject_cast<QPushButton*>(Qt().Widget(*b))->icon().isNull()) << b->Name();
    Picture(form, "parts-edit.png");

    // A search for "bumper" with Enter in the search box.
    Click(form.txtSearch);
    Type("bumper");
    Key(Qt::Key_Return);
    ASSERT_TRUE(Qt().Widget(form.fgSearch)->isVisible());
    EXPECT_EQ(qobject_cast<QLabel*>(Qt().Widget(form.Label1))->text(), "Parts Search Result");
    EXPECT_EQ(Shown(form.fgSearch, 1, cat::kDescription), "FRONT BUMPER BAR");
    ASSERT_EQ(Shown(form.fgSearch, 2, cat::kItemNo), "P120");
    EXPECT_TRUE(Qt().Widget(form.cmdSearch(1))->isEnabled());
    Picture(form, "parts-search.png");

    // A double click adds the rear bumper and opens the editor on its unit
    // price, whole text selected, exactly over the cell.
    DoubleClickCell(form.fgSearch, 2, cat::kDescription);
    ASSERT_EQ(g.Rows(), 4);
    EXPECT_EQ(Shown(g, 3, sel::kDescription), "REAR BUMPER COVER");
    QLineEdit* editor = Editor(form);
    ASSERT_TRUE(editor->isVisible());
    EXPECT_TRUE(editor->hasFocus());
    EXPECT_EQ(g.Col(), sel::kUnitPrice);
    EXPECT_EQ(InWindow(editor), CellInWindow(g, 3, sel::kUnitPrice));
    EXPECT_EQ(editor->selectedText(), editor->text());
    Type("100");
    Key(Qt::Key_Return); // formatted and priced with the new-part markup
    EXPECT_FALSE(editor->isVisible());
    EXPECT_EQ(Shown(g, 3, sel::kUnitPrice), "100.00");
    EXPECT_EQ(Shown(g, 3, sel::kMarkup), "130.000");
    EXPECT_EQ(g.Col(), sel::kMarkup);

    // The part-type cell shows the drop-down button at its right end; a
    // click on it drops the list below the cell, right edges meeting.
    ClickCell(g, 3, sel::kType);
    QWidget* button = Qt().Widget(form.CB1);
    ASSERT_TRUE(button->isVisible());
    const QRect typeCell = CellInWindow(g, 3, sel::kType);
    EXPECT_EQ(InWindow(button).right(), typeCell.right());
    EXPECT_EQ(InWindow(button).top(), typeCell.top());
    EXPECT_EQ(InWindow(button).height(), typeCell.height());
    Click(form.CB1);
    QWidget* list = Qt().Widget(form.LV1);
    ASSERT_TRUE(list->isVisible());
    EXPECT_TRUE(list->hasFocus() || list->isAncestorOf(QApplication::focusWidget()));
    EXPECT_EQ(InWindow(list).top(), typeCell.bottom() + 1);
    EXPECT_EQ(InWindow(list).right(), typeCell.right());
    // The editor beside the button, both over the cell; the list in front.
    EXPECT_TRUE(editor->isVisible());
    EXPECT_EQ(InWindow(editor).right() + 1, InWindow(button).left());
    EXPECT_EQ(List(form)->model()->rowCount(), 5);
    EXPECT_EQ(List(form)->model()->index(2, 0).data().toString(), "eXchange(X)");
    // A line round the list sets it off from the grid and the window; the
    // items beneath it keep the model's heights and take the clicks.
    const QImage shown = list->grab().toImage();
    const QColor edge = list->palette().color(QPalette::Shadow);
    EXPECT_EQ(shown.pixelColor(0, shown.height() - 1).rgb(), edge.rgb());
    EXPECT_EQ(shown.pixelColor(shown.width() - 1, shown.height() / 2).rgb(), edge.rgb());
    EXPECT_EQ(List(form)->visualRect(List(form)->model()->index(4, 0)).height(),
              List(form)->verticalHeader()->defaultSectionSize());
    Picture(form, "parts-cell-editor.png");
    ClickItem(form, 3); // "eXchange(X)" with the mouse
    EXPECT_FALSE(list->isVisible());
    EXPECT_FALSE(editor->isVisible());
    EXPECT_EQ(Shown(g, 3, sel::kType), "X");
    EXPECT_EQ(Shown(g, 3, sel::kMarkup), "120.000"); // the used markup, 20
    EXPECT_TRUE(button->isVisible());

    // F2 on the cell opens the list on the cell's item; "u" picks used.
    Key(Qt::Key_F2);
    ASSERT_TRUE(list->isVisible());
    EXPECT_EQ(form.LV1.SelectedIndex(), 3);
    Type("u");
    EXPECT_FALSE(list->isVisible());
    EXPECT_EQ(Shown(g, 3, sel::kType), "U");
    // Escape closes the list and changes nothing; the editor has the keys.
    Key(Qt::Key_F2);
    ASSERT_TRUE(list->isVisible());
    Key(Qt::Key_Escape);
    EXPECT_FALSE(list->isVisible());
    EXPECT_TRUE(editor->hasFocus());
    EXPECT_EQ(Shown(g, 3, sel::kType), "U");
    Key(Qt::Key_Return); // the editor commits and moves on
    ClickCell(g, 3, sel::kType);
    // Down and Enter pick the next item: back to exchange.
    Key(Qt::Key_F2);
    ASSERT_TRUE(list->isVisible());
    EXPECT_EQ(form.LV1.SelectedIndex(), 2);
    Key(Qt::Key_Down);
    Key(Qt::Key_Return);
    EXPECT_FALSE(list->isVisible());
    EXPECT_EQ(Shown(g, 3, sel::kType), "X");
    EXPECT_EQ(Shown(g, 3, sel::kMarkup), "120.000");

    // The space bar ticks "Rpt".
    ClickCell(g, 3, sel::kReport);
    QAbstractItemModel* cells = GridOf(g)->Table()->model();
    EXPECT_EQ(cells->index(2, sel::kReport).data(Qt::CheckStateRole), Qt::Unchecked);
    Key(Qt::Key_Space);
    EXPECT_EQ(cells->index(2, sel::kReport).data(Qt::CheckStateRole), Qt::Checked);
    EXPECT_EQ(GridOf(g)->Widget()->toolTip(), "Report Only: Yes");

    // Delete the stored front bumper.
    ClickCell(g, 1, sel::kItemNo);
    Click(form.cmdDelete);
    EXPECT_EQ(g.Rows(), 3);
    EXPECT_EQ(Shown(g, 1, sel::kItemNo), "P140");

    Click(form.cmdClose);
  });

  EXPECT_FALSE(host::gbPartsFormLoaded);
  ASSERT_EQ(Records(), (std::vector<std::string>{
                           "P120|REAR BUMPER COVER|o|X|2|100|120||1|<Null>|1",
                           headlamp,
                       }));
  quote->Find("itemno = 'P120'", 0, data::adSearchForward, data::adBookmarkFirst);
  EXPECT_EQ(quote->Collect("Category").ToText(), "PRT");
  std::map<data::RecordStatus, int> statuses;
  for (size_t i = 0; i < quote->StoredCount(); ++i)
    ++statuses[quote->StoredStatus(i)];
  EXPECT_EQ(statuses[data::RecordStatus::Deleted], 1);
  EXPECT_EQ(statuses[data::RecordStatus::New], 1);
  EXPECT_EQ(statuses[data::RecordStatus::Unchanged], 1); // the headlamp
}

TEST_F(PartsWindowTest, TheListGoesAboveTheCellWhereThereIsNoRoomBelow) {
  for (int i = 1; i <= 8; ++i)
    AddPart({i, "P" + std::to_string(i), "PART " + std::to_string(i)});
  Stored();
  OpenWindow(eEdit, [&](frmParts& form) {
    auto& g = form.FGSelectedParts;
    QWidget* list = Qt().Widget(form.LV1);
    // The cell the editor starts on: Escape brings back its text.
    ASSERT_EQ(g.Col(), sel::kDescription);
    DoubleClickCell(g, 1, sel::kDescription);
    ASSERT_TRUE(Editor(form)->isVisible());
    Type("XY");
    EXPECT_EQ(Shown(g, 1, sel::kDescription), "PART 1XY");
    Key(Qt::Key_Escape);
    EXPECT_EQ(Editor(form)->text(), "PART 1");
    EXPECT_EQ(Shown(g, 1, sel::kDescription), "PART 1");
    Key(Qt::Key_Return);
    DoubleClickCell(g, 6, sel::kType);
    ASSERT_TRUE(list->isVisible());
    const QRect cell = CellInWindow(g, 6, sel::kType);
    EXPECT_EQ(InWindow(list).bottom(), cell.top() - 1);
    EXPECT_EQ(InWindow(list).right(), cell.right());
    EXPECT_LE(InWindow(list).bottom(), list->window()->height());
    // Every item shows whole, the list in front of the grid.
    QTableView* items = List(form);
    for (int i = 0; i < 5; ++i)
      EXPECT_LE(items->visualRect(items->model()->index(i, 0)).bottom(),
                items->viewport()->height())
          << i;
    Key(Qt::Key_Escape);
    EXPECT_FALSE(list->isVisible());
    Key(Qt::Key_Escape); // the editor: the cell's text back
    Key(Qt::Key_Return);
    Click(form.cmdClose);
  });
  for (size_t i = 0; i < quote->StoredCount(); ++i)
    EXPECT_EQ(quote->StoredStatus(i), data::RecordStatus::Unchanged);
}

TEST_F(PartsWindowTest, ViewModeShowsThePartsAndTakesNoEdits) {
  TwoParts();
  OpenWindow(eView, [&](frmParts& form) {
    auto& g = form.FGSelectedParts;
    EXPECT_EQ(Shown(g, 1, sel::kDescription), "FRONT BUMPER BAR");
    EXPECT_EQ(Shown(g, 2, sel::kType), "U");
    EXPECT_EQ(form.FGParts.Rows(), 2); // no catalogue
    for (const forms::Control* c : std::initializer_list<const forms::Control*>{
             &form.txtSearch, &form.FGParts, &form.cmdDelete, &form.cmdSearch(0)})
      EXPECT_FALSE(Qt().Widget(*c)->isEnabled()) << c->Name();
    EXPECT_TRUE(Qt().Widget(g)->isEnabled());
    EXPECT_TRUE(Qt().Widget(form.cmdClose)->isEnabled());
    Picture(form, "parts-view.png");
    DoubleClickCell(g, 1, sel::kUnitPrice);
    EXPECT_FALSE(Editor(form)->isVisible());
    ClickCell(g, 2, sel::kType);
    Key(Qt::Key_F2);
    Type("7x");
    EXPECT_FALSE(Qt().Widget(form.LV1)->isVisible());
    EXPECT_EQ(Shown(g, 2, sel::kType), "U");
    Click(form.cmdClose);
  });
  for (size_t i = 0; i < quote->StoredCount(); ++i)
    EXPECT_EQ(quote->StoredStatus(i), data::RecordStatus::Unchanged);
}

TEST_F(PartsWindowTest, TheWindowsCloseButtonAsksBeforeItDiscardsEdits) {
  TwoParts();
  const std::string headlamp = Records()[1];
  QString asked;
  OpenWindow(eEdit, [&](frmParts& form) {
    auto& g = form.FGSelectedParts;
    ClickCell(g, 1, sel::kQty);
    Type("3");
    // Cancel keeps the window and the edit.
    Qt().QueueMessageBox([&asked](QMessageBox& box) {
      asked = box.windowTitle() + ": " + box.text();
      box.button(QMessageBox::Cancel)->click();
    });
    Qt().Window(form)->close();
    EXPECT_EQ(asked, "Parts: Save the changes to this quote's parts?");
    ASSERT_TRUE(Qt().Window(form)->isVisible());
    EXPECT_EQ(Shown(g, 1, sel::kQty), "3");
    // Yes writes back as Close does.
    Qt().QueueMessageBox([](QMessageBox& box) { box.button(QMessageBox::Yes)->click(); });
    Qt().Window(form)->close();
  });
  EXPECT_FALSE(host::gbPartsFormLoaded);
  ASSERT_EQ(Records().size(), 2u);
  EXPECT_EQ(Records()[0].substr(0, 27), "P100|FRONT BUMPER BAR|O||3|");
  EXPECT_EQ(Records()[1], headlamp);
}

TEST_F(PartsWindowTest, NoClosesTheWindowWithoutWriting) {
  TwoParts();
  OpenWindow(eEdit, [&](frmParts& form) {
    Click(form.cmdDelete); // the first part, current on opening
    Qt().QueueMessageBox([](QMessageBox& box) { box.button(QMessageBox::No)->click(); });
    Qt().Window(form)->close();
  });
  EXPECT_FALSE(host::gbPartsFormLoaded);
  for (size_t i = 0; i < quote->StoredCount(); ++i)
    EXPECT_EQ(quote->StoredStatus(i), data::RecordStatus::Unchanged);
}

} // namespace

// The whole road of a parts edit without the mouse: search, add a result
// with Enter, price it, pick its type from the list, tick "Rpt", delete a
// part and take the deletion back, close; F1 shows the keys.
TEST_F(PartsWindowTest, TheWholeEditByKeyboardAlone) {
  TwoParts();
  const std::vector<std::string> before = Records();
  OpenWindow(eEdit, [&](frmParts& form) {
    auto& g = form.FGSelectedParts;
    Key(Qt::Key_S, Qt::AltModifier);
    EXPECT_TRUE(Qt().Widget(form.txtSearch)->hasFocus());
    Type("bumper");
    Key(Qt::Key_Return);
    ASSERT_TRUE(Qt().Widget(form.fgSearch)->isVisible());
    Key(Qt::Key_A, Qt::AltModifier);
    ASSERT_TRUE(GridOf(form.fgSearch)->Table()->hasFocus());
    Key(Qt::Key_Down);
    ASSERT_EQ(form.fgSearch.TextMatrix(form.fgSearch.Row(), cat::kItemNo), "P120");
    Key(Qt::Key_Return); // added; the editor opens on its unit price
    ASSERT_EQ(g.Rows(), 4);
    ASSERT_TRUE(Editor(form)->hasFocus());
    auto* strip = Qt().Window(form)->findChild<QLabel*>("RunningTotals");
    ASSERT_NE(strip, nullptr);
    EXPECT_TRUE(strip->text().startsWith("Parts at cost 700.00")) << strip->text().toStdString();
    Type("100");
    Key(Qt::Key_Return);
    EXPECT_EQ(Shown(g, 3, sel::kUnitPrice), "100.00");
    QApplication::processEvents();
    EXPECT_TRUE(strip->text().startsWith("Parts at cost 900.00")) << strip->text().toStdString();
    // Back to the type column; F2 drops the list; Down twice and Enter.
    for (int i = 0; i < 12 && g.Col() > sel::kType; ++i)
      Key(Qt::Key_Left);
    ASSERT_EQ(g.Col(), sel::kType);
    Key(Qt::Key_F2);
    ASSERT_TRUE(Qt().Widget(form.LV1)->isVisible());
    Type("x");
    EXPECT_EQ(Shown(g, 3, sel::kType), "X");
    Key(Qt::Key_Return);
    for (int i = 0; i < 12 && g.Col() < sel::kReport; ++i)
      Key(Qt::Key_Right);
    ASSERT_EQ(g.Col(), sel::kReport);
    Key(Qt::Key_Space);

    // The headlamp: up to it, Alt+D, Ctrl+Z brings it back, Alt+C closes.
    Key(Qt::Key_E, Qt::AltModifier);
    Key(Qt::Key_Up);
    ASSERT_EQ(g.TextMatrix(g.Row(), sel::kItemNo), "P140");
    Key(Qt::Key_D, Qt::AltModifier);
    EXPECT_EQ(g.Rows(), 3);
    Key(Qt::Key_Z, Qt::ControlModifier);
    EXPECT_EQ(g.Rows(), 4);

    QString help;
    Qt().QueueMessageBox([&](QMessageBox& box) {
      help = box.windowTitle();
      Picture(box, "parts-help.png");
      QTest::keyClick(&box, Qt::Key_Return);
    });
    Key(Qt::Key_F1);
    EXPECT_EQ(help, "Parts editor keys");
    QWidget* window = Qt().Window(form);
    window->activateWindow(); // the offscreen platform leaves none active
    ASSERT_TRUE(QTest::qWaitForWindowActive(window));
    Key(Qt::Key_C, Qt::AltModifier);
  });
  EXPECT_FALSE(host::gbPartsFormLoaded);
  ASSERT_EQ(Records(), (std::vector<std::string>{
                           before[0],
                           "P120|REAR BUMPER COVER|o|X|2|100|120||1|<Null>|1",
                           before[1],
                       }));
}
