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
#include <QTest>

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
