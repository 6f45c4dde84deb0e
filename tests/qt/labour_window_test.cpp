// The labour editor on the real widgets: opened through CForms with the Qt
// runtime, driven by real keys and clicks, checked on what the widgets show
// and on the host's record set.

#include "../labour/labour_fixture.hpp"
#include "qt/grid_view.hpp"
#include "qt/qt_runtime.hpp"
#include "qt_fixture.hpp"

#include <QApplication>
#include <QLabel>
#include <QLineEdit>
#include <QMessageBox>
#include <QPushButton>
#include <QRadioButton>
#include <QTemporaryDir>
#include <QTest>

#include <cstdlib>
#include <map>
#include <optional>

using namespace belvane;
using namespace belvane::qt;
namespace col = belvane::labour::col;

namespace {

class LabourWindowTest : public test::LabourFixture, protected qt::testing::RealInput {
protected:
  void SetUp() override {
    LabourFixture::SetUp();
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
    LabourFixture::TearDown();
  }

  // Opens the editor through CForms; `user` plays the user once its window
  // is active.
  long OpenWindow(EQuoteEditMode mode, const std::function<void(labour::frmLabour&)>& estimator) {
    qt_->QueueModal([this, estimator](forms::Form& f) {
      auto& form = static_cast<labour::frmLabour&>(f);
      ASSERT_TRUE(QTest::qWaitForWindowActive(qt_->Window(form)));
      estimator(form);
    });
    return forms.ShowLabourForm(quote, schedType, quoteNo, subQuoteNo, make, modelId, bodyId,
                                schedId, mtaId, thirdId, rrRate, raRate, ptRate, defaultSched,
                                insurerChanged, mode);
  }

  QtRuntime& Qt() { return *qt_; }
  QtRuntime& InputRuntime() override { return *qt_; }
  QString Shown(const forms::FlexGrid& g, int row, int col) {
    return GridOf(g)->Table()->model()->index(row - 1, col).data().toString();
  }

  // Pictures for the documentation, with BELVANE_SCREENSHOTS set to a folder.
  static void PictureOf(QWidget& window, const char* name) {
    const char* folder = std::getenv("BELVANE_SCREENSHOTS");
    if (!folder || !*folder) return;
    QApplication::processEvents();
    EXPECT_TRUE(WindowPicture(window).save(QString::fromUtf8(folder) + "/" + name));
  }
  void Picture(const labour::frmLabour& form, const char* name) {
    PictureOf(*qt_->Window(form), name);
  }

  QLineEdit* Editor(const labour::frmLabour& form) {
    return qobject_cast<QLineEdit*>(qt_->Widget(form.T1));
  }

private:
  std::optional<QtRuntime> qt_;
  std::optional<forms::ScopedRuntime> use_;
};

} // namespace

TEST_F(LabourWindowTest, AnEstimatorEditsTheQuoteWithKeysAndClicks) {
  AddRecord(1, "120", "L/H FRONT GUARD", "R&R", 1.0);
  AddRecord(2, "120", "L/H FRONT GUARD", "PAINT", 2.0);
  AddRecord(3, "140", "Roof panel", "R&R", 3.0);
  Stored();

  OpenWindow(eEdit, [&](labour::frmLabour& form) {
    // The NRMA list shows, its option on; the quote's lines are below.
    EXPECT_TRUE(qobject_cast<QRadioButton*>(Qt().Widget(form.optSchedule(0)))->isChecked());
    EXPECT_TRUE(Qt().Widget(form.FGLabourItems(0))->isVisible());
    EXPECT_FALSE(Qt().Widget(form.FGLabourItems(1))->isVisible());
    const auto& items = form.FGLabourItems(0);
    EXPECT_EQ(Shown(items, 1, col::kDescription), "BONNET R&I");
    EXPECT_EQ(Shown(items, 2, 2), "2.25"); // deciphered for display
    EXPECT_EQ(Shown(form.FGSelectedLabour, 1, col::kDescription), "L/H FRONT GUARD");
    EXPECT_EQ(Shown(form.FGSelectedLabour, 1, col::kPTHours), "2.00");

    // A double click on a catalogue item's R&R hours adds the line and
    // opens the editor over its R&R hours, exactly on the cell.
    DoubleClickCell(items, 1, 2);
    auto& sel = form.FGSelectedLabour;
    ASSERT_EQ(sel.Rows(), 4);
    QLineEdit* editor = Editor(form);
    ASSERT_TRUE(editor->isVisible());
    EXPECT_TRUE(editor->hasFocus());
    EXPECT_EQ(sel.Row(), 3);
    EXPECT_EQ(sel.Col(), col::kRRHours);
    const QRect cell = GridOf(sel)->CellRect(3, col::kRRHours);
    EXPECT_EQ(QRect(editor->mapTo(editor->window(), QPoint(0, 0)), editor->size()),
              QRect(GridOf(sel)->Widget()->mapTo(editor->window(), cell.topLeft()), cell.size()));
    EXPECT_EQ(editor->selectedText(), "1.50");
    Type("2.5");
    Key(Qt::Key_Return); // formatted, on to the report-only flag
    EXPECT_EQ(Shown(sel, 3, col::kRRHours), "2.50");
    EXPECT_FALSE(editor->isVisible());
    EXPECT_EQ(sel.Col(), col::kRRReport);

    // The space bar ticks the flag: the cell shows a ticked box.
    QAbstractItemModel* cells = GridOf(sel)->Table()->model();
    EXPECT_EQ(cells->index(2, col::kRRReport).data(Qt::CheckStateRole), Qt::Unchecked);
    Key(Qt::Key_Space);
    EXPECT_EQ(cells->index(2, col::kRRReport).data(Qt::CheckStateRole), Qt::Checked);
    EXPECT_EQ(GridOf(sel)->Widget()->toolTip(), "RR Report Only: Yes");

    // The arrows at the edges of the editor's text move between cells.
    DoubleClickCell(sel, 2, col::kDescription); // the description: caret at its end
    ASSERT_TRUE(editor->isVisible());
    EXPECT_EQ(editor->cursorPosition(), editor->text().size());
    Key(Qt::Key_Right);
    EXPECT_EQ(sel.Col(), col::kRRHours);
    EXPECT_FALSE(editor->isVisible());
    Key(Qt::Key_F2); // hours open selected
    ASSERT_TRUE(editor->isVisible());
    Key(Qt::Key_Home);
    Key(Qt::Key_Left); // at the start: back to the description
    EXPECT_EQ(sel.Col(), col::kDescription);

    // A search for "bumper" shows its results; a double click adds the item.
    Click(form.txtSearch);
    auto* search = qobject_cast<QLineEdit*>(Qt().Widget(form.txtSearch));
    EXPECT_EQ(search->palette().color(QPalette::Base), QColor(Qt::yellow));
    Type("bumper");
    Key(Qt::Key_Return);
    EXPECT_TRUE(Qt().Widget(form.fgSearch)->isVisible());
    EXPECT_EQ(qobject_cast<QLabel*>(Qt().Widget(form.Label1))->text(), "Labour Search Result");
    EXPECT_EQ(Shown(form.fgSearch, 1, col::kDescription), "FRONT BUMPER BAR");
    DoubleClickCell(form.fgSearch, 1, col::kDescription);
    EXPECT_EQ(sel.Rows(), 5);
    EXPECT_EQ(Shown(sel, 4, col::kDescription), "FRONT BUMPER BAR");
    Key(Qt::Key_Escape);
    Key(Qt::Key_Return);

    // Nothing found: a critical message box says so.
    QString said;
    Qt().QueueMessageBox([&said](QMessageBox& box) {
      said = box.windowTitle() + ": " + box.text();
      QTest::keyClick(&box, Qt::Key_Return);
    });
    Click(form.txtSearch);
    Type("zzz");
    Key(Qt::Key_Return);
    EXPECT_EQ(said, "Labour item search: No labour record found");

    // Delete the roof panel's line.
    ClickCell(sel, 2, col::kItemNo);
    EXPECT_EQ(Shown(sel, 2, col::kItemNo), "140");
    Click(form.cmdDelete);
    EXPECT_EQ(sel.Rows(), 4);
    EXPECT_NE(Shown(sel, 2, col::kItemNo), "140");

    Click(form.cmdClose);
  });

  EXPECT_FALSE(host::gbLabourFormLoaded);
  EXPECT_EQ(schedType, "NRMA");
  // The host's record set holds what the window showed: the guard as it
  // was, the roof panel gone, the bonnet and the bumper new.
  const std::vector<std::string> records = Records();
  EXPECT_NE(std::find(records.begin(), records.end(), "100 R&R 2.5"), records.end());
  EXPECT_NE(std::find(records.begin(), records.end(), "120 PAINT 2"), records.end());
  for (const std::string& r : records)
    EXPECT_EQ(r.rfind("140 ", 0), std::string::npos) << r;
  // What the host stores: the roof panel's record deleted, new records for
  // the bonnet and the bumper.
  std::map<data::RecordStatus, int> statuses;
  for (size_t i = 0; i < quote->StoredCount(); ++i)
    ++statuses[quote->StoredStatus(i)];
  EXPECT_EQ(statuses[data::RecordStatus::Deleted], 1);
  EXPECT_GE(statuses[data::RecordStatus::New], 2);
}

TEST_F(LabourWindowTest, ViewModeShowsTheLinesAndTakesNoEdits) {
  AddRecord(1, "120", "L/H FRONT GUARD", "R&R", 1.0);
  Stored();
  OpenWindow(eView, [&](labour::frmLabour& form) {
    for (int i = 0; i < 4; ++i) {
      EXPECT_FALSE(qobject_cast<QRadioButton*>(Qt().Widget(form.optSchedule(i)))->isChecked());
      EXPECT_FALSE(Qt().Widget(form.optSchedule(i))->isEnabled());
    }
    EXPECT_FALSE(Qt().Widget(form.txtSearch)->isEnabled());
    EXPECT_FALSE(Qt().Widget(form.cmdDelete)->isEnabled());
    EXPECT_EQ(Shown(form.FGSelectedLabour, 1, col::kDescription), "L/H FRONT GUARD");
    DoubleClickCell(form.FGSelectedLabour, 1, col::kRRHours);
    EXPECT_FALSE(Editor(form)->isVisible());
    Click(form.cmdClose);
  });
  for (size_t i = 0; i < quote->StoredCount(); ++i)
    EXPECT_EQ(quote->StoredStatus(i), data::RecordStatus::Unchanged);
}

TEST_F(LabourWindowTest, TheWindowsCloseButtonAsksBeforeItDiscardsEdits) {
  AddRecord(1, "120", "L/H FRONT GUARD", "R&R", 1.0);
  Stored();
  QString asked;
  OpenWindow(eEdit, [&](labour::frmLabour& form) {
    ClickCell(form.FGSelectedLabour, 1, col::kRRHours);
    Type("4");
    Key(Qt::Key_Return);
    // Cancel keeps the window and the edit.
    Qt().QueueMessageBox([&asked](QMessageBox& box) {
      asked = box.text();
      box.button(QMessageBox::Cancel)->click();
    });
    Qt().Window(form)->close();
    EXPECT_EQ(asked, "Save the changes to this quote's labour lines?");
    ASSERT_TRUE(Qt().Window(form)->isVisible());
    EXPECT_EQ(Shown(form.FGSelectedLabour, 1, col::kRRHours), "4.00");
    // Yes writes back as Close does.
    Qt().QueueMessageBox([](QMessageBox& box) { box.button(QMessageBox::Yes)->click(); });
    Qt().Window(form)->close();
  });
  EXPECT_FALSE(host::gbLabourFormLoaded);
  EXPECT_EQ(Records(), (std::vector<std::string>{"120 R&R 4"}));
}

TEST_F(LabourWindowTest, TheTotalsStripFollowsTypedHours) {
  AddRecord(1, "120", "L/H FRONT GUARD", "R&R", 1.0);
  Stored();
  OpenWindow(eEdit, [&](labour::frmLabour& form) {
    auto* strip = Qt().Window(form)->findChild<QLabel*>("RunningTotals");
    ASSERT_NE(strip, nullptr);
    EXPECT_TRUE(strip->isVisible());
    EXPECT_TRUE(strip->text().startsWith("R&R 1.00 h  55.00")) << strip->text().toStdString();
    ClickCell(form.FGSelectedLabour, 1, col::kRRHours);
    Type("4");
    QApplication::processEvents();
    EXPECT_TRUE(strip->text().startsWith("R&R 4.00 h  220.00")) << strip->text().toStdString();
    // The strip lies under the design area, which keeps its size.
    EXPECT_EQ(strip->y(),
              GridOf(form.FGSelectedLabour)->Widget()->window()->height() - strip->height());
    Key(Qt::Key_Return);
    Click(form.cmdClose);
  });
}

// The whole road of an edit without the mouse: find an item, add it, type
// its hours, delete a line, take the deletion back and do it again, close.
TEST_F(LabourWindowTest, TheWholeEditByKeyboardAlone) {
  AddRecord(1, "120", "L/H FRONT GUARD", "R&R", 1.0);
  AddRecord(2, "140", "Roof panel", "R&R", 3.0);
  Stored();
  std::string added;
  OpenWindow(eEdit, [&](labour::frmLabour& form) {
    auto& sel = form.FGSelectedLabour;
    Key(Qt::Key_S, Qt::AltModifier);
    EXPECT_TRUE(Qt().Widget(form.txtSearch)->hasFocus());
    Type("BUMPER");
    Key(Qt::Key_Return);
    ASSERT_TRUE(Qt().Widget(form.fgSearch)->isVisible());
    Key(Qt::Key_A, Qt::AltModifier);
    ASSERT_TRUE(GridOf(form.fgSearch)->Table()->hasFocus());
    Key(Qt::Key_Return); // the first result, every operation of it
    ASSERT_EQ(sel.Rows(), 4);
    added = sel.TextMatrix(3, col::kItemNo);
    EXPECT_EQ(added, form.fgSearch.TextMatrix(1, 0));
    ASSERT_TRUE(Editor(form)->hasFocus()); // the editor opened on the new line
    Key(Qt::Key_Escape);
    // To its R&R hours by the arrows, and type them.
    for (int i = 0; i < 12 && sel.Col() > col::kRRHours; ++i)
      Key(Qt::Key_Left);
    for (int i = 0; i < 12 && sel.Col() < col::kRRHours; ++i)
      Key(Qt::Key_Right);
    ASSERT_EQ(sel.Col(), col::kRRHours);
    Type("2.5");
    Key(Qt::Key_Return);
    EXPECT_EQ(sel.TextMatrix(3, col::kRRHours), "2.50");

    // The roof panel's line: Alt+E, Up, Alt+D deletes it; Ctrl+Z brings it
    // back; Ctrl+Y deletes it again.
    Key(Qt::Key_E, Qt::AltModifier);
    EXPECT_TRUE(GridOf(sel)->Table()->hasFocus());
    Key(Qt::Key_Up);
    ASSERT_EQ(sel.TextMatrix(sel.Row(), col::kItemNo), "140");
    Key(Qt::Key_D, Qt::AltModifier);
    EXPECT_EQ(sel.Rows(), 3);
    Key(Qt::Key_Z, Qt::ControlModifier);
    ASSERT_EQ(sel.Rows(), 4);
    EXPECT_EQ(sel.TextMatrix(2, col::kItemNo), "140");
    Key(Qt::Key_Y, Qt::ControlModifier);
    EXPECT_EQ(sel.Rows(), 3);
    Key(Qt::Key_C, Qt::AltModifier);
  });
  EXPECT_FALSE(host::gbLabourFormLoaded);
  const std::vector<std::string> records = Records();
  EXPECT_NE(std::find(records.begin(), records.end(), "120 R&R 1"), records.end());
  EXPECT_NE(std::find(records.begin(), records.end(), added + " R&R 2.5"), records.end())
      << "the typed hours are stored";
  for (const std::string& r : records)
    EXPECT_EQ(r.rfind("140 ", 0), std::string::npos) << r;
}

// A larger window: the description columns take the extra width, the other
// columns keep theirs, the buttons keep to the corner; F1 shows the keys;
// the window opens again as large as it was closed.
TEST_F(LabourWindowTest, TheWindowGrowsIntoTheDescriptionsAndRemembersItsSize) {
  AddRecord(1, "120", "L/H FRONT GUARD", "R&R", 1.0);
  AddRecord(2, "120", "L/H FRONT GUARD", "PAINT", 2.0);
  Stored();
  QTemporaryDir folder;
  ASSERT_TRUE(folder.isValid());
  Qt().RememberWindowPlaces(folder.filePath("windows.ini").toStdString());
  QSize closedAt;
  OpenWindow(eEdit, [&](labour::frmLabour& form) {
    QWidget* window = Qt().Window(form);
    auto& sel = form.FGSelectedLabour;
    const QSize design = window->size();
    const int description = GridOf(sel)->CellRect(1, col::kDescription).width();
    const int hours = GridOf(sel)->CellRect(1, col::kRRHours).width();
    const QPoint close = Qt().Widget(form.cmdClose)->pos();

    window->resize(design + QSize(300, 120));
    QApplication::processEvents();
    EXPECT_EQ(GridOf(sel)->CellRect(1, col::kDescription).width(), description + 300);
    EXPECT_EQ(GridOf(sel)->CellRect(1, col::kRRHours).width(), hours);
    EXPECT_EQ(Qt().Widget(form.cmdClose)->pos(), close + QPoint(300, 120));
    auto* strip = window->findChild<QLabel*>("RunningTotals");
    ASSERT_NE(strip, nullptr);
    EXPECT_EQ(strip->geometry().bottom(), window->height() - 1);
    EXPECT_EQ(strip->width(), window->width());

    // Never smaller than the design.
    window->resize(design - QSize(200, 200));
    QApplication::processEvents();
    EXPECT_EQ(window->size(), design);
    EXPECT_EQ(GridOf(sel)->CellRect(1, col::kDescription).width(), description);

    window->showMaximized();
    QTest::qWait(50);
    EXPECT_GT(GridOf(sel)->CellRect(1, col::kDescription).width(), description);
    Picture(form, "labour-maximised.png");

    QString help;
    Qt().QueueMessageBox([&](QMessageBox& box) {
      help = box.windowTitle() + "\n" + box.text();
      PictureOf(box, "labour-help.png");
      QTest::keyClick(&box, Qt::Key_Return);
    });
    Key(Qt::Key_F1);
    EXPECT_TRUE(help.startsWith("Labour editor keys\n")) << help.toStdString();
    EXPECT_TRUE(help.contains("Enter or Insert")) << help.toStdString();

    window->showNormal();
    window->activateWindow(); // the offscreen platform leaves none active
    ASSERT_TRUE(QTest::qWaitForWindowActive(window));
    window->resize(design + QSize(100, 50));
    QApplication::processEvents();
    closedAt = window->size();
    Key(Qt::Key_C, Qt::AltModifier);
  });
  OpenWindow(eView, [&](labour::frmLabour& form) {
    EXPECT_EQ(Qt().Window(form)->size(), closedAt);
    EXPECT_EQ(form.ScaleWidth(), 10710 + Qt().GetScale().Twips(100));
    Key(Qt::Key_C, Qt::AltModifier);
  });
}

// The control with the keyboard shows it: the style's focus frame on a
// button, the check box, an option button and round a grid's cells.
TEST_F(LabourWindowTest, TheFocusedControlShowsTheFocusFrame) {
  OpenWindow(eEdit, [&](labour::frmLabour& form) {
    for (const forms::Control* control : std::initializer_list<const forms::Control*>{
             &form.cmdDelete, &form.AutoReturn, &form.optSchedule(1), &form.FGLabourItems(0)}) {
      QWidget* widget = Qt().Widget(*control);
      const QImage before = widget->grab().toImage();
      const_cast<forms::Control*>(control)->SetFocus();
      QApplication::processEvents();
      EXPECT_TRUE(widget->hasFocus()) << control->Name();
      EXPECT_NE(widget->grab().toImage(), before) << control->Name() << " looks the same focused";
    }
    form.cmdClose.SetFocus();
    Key(Qt::Key_Return);
  });
}
