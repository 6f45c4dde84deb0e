// The demo host: sample quotes, lines and totals, an edit stored in one
// transaction and shown after it, a failed store that stores nothing; the
// keys, menus and status bar of a working day.

#include "../data/temp_dir.hpp"
#include "data/catalogue.hpp"
#include "data/quote_store.hpp"
#include "host/component_state.hpp"
#include "labour/frm_labour.hpp"
#include "parts/frm_parts.hpp"
#include "qt/grid_view.hpp"
#include "qt/qt_runtime.hpp"
#include "quote_summary.hpp"
#include "quote_window.hpp"
#include "sample_quotes.hpp"

#include <QAction>
#include <QApplication>
#include <QFileDialog>
#include <QHeaderView>
#include <QLabel>
#include <QMessageBox>
#include <QPushButton>
#include <QRegularExpression>
#include <QStatusBar>
#include <QStatusTipEvent>
#include <QTableWidget>
#include <QTest>
#include <QTimer>

#include <gtest/gtest.h>
#include <sqlite3.h>

#include <filesystem>
#include <fstream>
#include <functional>
#include <optional>
#include <set>
#include <sstream>

using namespace belvane;
namespace col = belvane::labour::col;

namespace {

class QuoteHostTest : public ::testing::Test {
protected:
  void SetUp() override {
    data::SetCatalogueLocation(BELVANE_SAMPLE_CATALOGUE);
    qt::QtRuntime::Application();
    runtime_.emplace();
    runtime_->ShowHandlerErrors(false);
    use_.emplace(*runtime_);
    ASSERT_EQ(quote::AddSampleQuotes(store), 4);
  }
  void TearDown() override {
    use_.reset();
    runtime_.reset();
    data::SetCatalogueLocation("");
  }

  // Adds the first catalogue item that is not on the quote, with `hours`
  // typed as its R&R hours, and closes the editor.
  void AddAnItem(labour::frmLabour& form, const QString& hours) {
    ASSERT_TRUE(QTest::qWaitForWindowActive(runtime_->Window(form)));
    forms::FlexGrid& list = form.FGLabourItems(0);
    int row = 0;
    for (int r = 1; r < list.Rows() && row == 0; ++r) {
      bool onQuote = false;
      for (int s = 1; s < form.FGSelectedLabour.Rows(); ++s)
        onQuote = onQuote || form.FGSelectedLabour.TextMatrix(s, 0) == list.TextMatrix(r, 0);
      if (!onQuote && list.CellStyleAt(r, 2).backColor != grid::kGrey) row = r;
    }
    ASSERT_GT(row, 0);
    added = list.TextMatrix(row, 0);
    auto* view = dynamic_cast<qt::GridView*>(runtime_->View(list));
    QWidget* cells = view->Table()->viewport();
    const QPoint at = cells->mapFrom(view->Widget(), view->CellRect(row, 2).center());
    QTest::mouseClick(cells, Qt::LeftButton, {}, at);
    QTest::mouseDClick(cells, Qt::LeftButton, {}, at);
    QTest::mouseRelease(cells, Qt::LeftButton, {}, at);
    for (const QChar c : hours)
      QTest::keyClick(QApplication::focusWidget(), c.toLatin1());
    QTest::keyClick(QApplication::focusWidget(), Qt::Key_Return);
    QTest::mouseClick(runtime_->Widget(form.cmdClose), Qt::LeftButton);
  }

  // Answers the modal windows the host opens while it lives: `answer` gets
  // each one and returns whether it closed it.
  struct Answer {
    explicit Answer(std::function<bool(QWidget*)> answer) {
      QObject::connect(&timer, &QTimer::timeout, [this, answer] {
        if (QWidget* modal = QApplication::activeModalWidget(); modal && answer(modal)) ++answered;
      });
      timer.start(10);
    }
    QTimer timer;
    int answered = 0;
  };

  // A shown, active window over `store`, the quote list with the keyboard.
  static void ShowActive(quote::QuoteWindow& window) {
    window.show();
    window.activateWindow();
    ASSERT_TRUE(QTest::qWaitForWindowActive(&window));
    window.QuoteList()->setFocus();
  }

  test::TempDir dir{"quote-host"};
  data::QuoteStore store{dir.File("quotes.db")};
  std::optional<qt::QtRuntime> runtime_;
  std::optional<forms::ScopedRuntime> use_;
  std::string added;
};

} // namespace

TEST_F(QuoteHostTest, SampleQuotesComeOnceWithTheirLinesAndTotals) {
  EXPECT_EQ(quote::AddSampleQuotes(store), 0); // not twice
  const auto quotes = store.ListQuotes();
  ASSERT_EQ(quotes.size(), 4u);
  EXPECT_FALSE(quotes[0].vehicle.empty());
  EXPECT_FALSE(quotes[0].bodyId.empty());

  data::RecordsetPtr items = store.LoadItems("Q1001", data::ItemKind::Labour);
  quote::QuoteSummary summary = quote::Summarize(*items, quotes[0]);
  ASSERT_FALSE(summary.lines.empty());
  double amount = 0;
  for (const auto& line : summary.lines)
    amount += line.hours * line.rate;
  EXPECT_DOUBLE_EQ(summary.TotalAmount(), amount);

  // A report-only line is listed, not charged.
  items->MoveFirst();
  items->Collect("report_on", data::Value(int16_t(1)));
  const quote::QuoteSummary reported = quote::Summarize(*items, quotes[0]);
  EXPECT_TRUE(reported.lines[0].reportOnly);
  EXPECT_DOUBLE_EQ(reported.TotalAmount(), amount - summary.lines[0].amount);
  EXPECT_TRUE(quote::StoredSummary(store, "Q1003").lines.empty());
}

TEST_F(QuoteHostTest, AnEditIsStoredAndTheWindowShowsTheNewLinesAndTotals) {
  quote::QuoteWindow window(store);
  window.show();
  ASSERT_TRUE(window.SelectQuote("Q1001"));
  const quote::QuoteSummary before = quote::StoredSummary(store, "Q1001");

  runtime_->QueueModal(
      [this](forms::Form& f) { AddAnItem(static_cast<labour::frmLabour&>(f), "3"); });
  QTest::mouseClick(window.EditLabourButton(), Qt::LeftButton);

  const quote::QuoteSummary after = quote::StoredSummary(store, "Q1001");
  ASSERT_EQ(after.lines.size(), before.lines.size() + 1); // its R&R record, stored
  EXPECT_DOUBLE_EQ(after.hours[quote::kRemoveReplace], before.hours[quote::kRemoveReplace] + 3);
  EXPECT_EQ(window.statusBar()->currentMessage(),
            "Q1001: stored 1 new, 0 changed and 0 deleted records.");
  QTableWidget* lines = window.Lines();
  ASSERT_EQ(lines->rowCount(), static_cast<int>(after.lines.size()));
  bool shown = false;
  for (int r = 0; r < lines->rowCount(); ++r)
    shown = shown || (lines->item(r, 0)->text().toStdString() == added &&
                      lines->item(r, 3)->text() == "3.00");
  EXPECT_TRUE(shown);
  EXPECT_EQ(window.Totals()->item(3, 1)->text().toStdString(), quote::Hours(after.TotalHours()));
}

TEST_F(QuoteHostTest, AFailedStoreStoresNothingAndSaysWhy) {
  // The database refuses new items, as a full disk or a locked file would.
  sqlite3* db = nullptr;
  ASSERT_EQ(sqlite3_open(dir.File("quotes.db").c_str(), &db), SQLITE_OK);
  ASSERT_EQ(sqlite3_exec(db,
                         "CREATE TRIGGER refuse BEFORE INSERT ON quote_items "
                         "BEGIN SELECT RAISE(ABORT, 'disk quota exceeded'); END",
                         nullptr, nullptr, nullptr),
            SQLITE_OK);
  sqlite3_close(db);

  quote::QuoteWindow window(store);
  window.show();
  ASSERT_TRUE(window.SelectQuote("Q1001"));
  const quote::QuoteSummary before = quote::StoredSummary(store, "Q1001");
  runtime_->QueueModal(
      [this](forms::Form& f) { AddAnItem(static_cast<labour::frmLabour&>(f), "3"); });
  QString said;
  QTimer answer;
  QObject::connect(&answer, &QTimer::timeout, [&said] {
    if (auto* box = qobject_cast<QMessageBox*>(QApplication::activeModalWidget())) {
      said = box->text();
      box->button(QMessageBox::Ok)->click();
    }
  });
  answer.start(10);
  QTest::mouseClick(window.EditLabourButton(), Qt::LeftButton);

  EXPECT_TRUE(said.contains("were not stored")) << said.toStdString();
  EXPECT_TRUE(said.contains("disk quota exceeded")) << said.toStdString();
  EXPECT_TRUE(window.statusBar()->currentMessage().startsWith("Q1001: nothing stored."));
  EXPECT_EQ(quote::StoredSummary(store, "Q1001").lines.size(), before.lines.size());
}

TEST_F(QuoteHostTest, AScheduleChangeKeepsTheQuotesLines) {
  quote::QuoteWindow window(store);
  window.show();
  ASSERT_TRUE(window.SelectQuote("Q1001"));
  const size_t before = quote::StoredSummary(store, "Q1001").lines.size();
  ASSERT_GT(before, 0u);
  runtime_->QueueModal([this](forms::Form& f) {
    auto& form = static_cast<labour::frmLabour&>(f);
    ASSERT_TRUE(QTest::qWaitForWindowActive(runtime_->Window(form)));
    QTest::mouseClick(runtime_->Widget(form.optSchedule(1)), Qt::LeftButton);
    QTest::mouseClick(runtime_->Widget(form.cmdClose), Qt::LeftButton);
  });
  QTest::mouseClick(window.EditLabourButton(), Qt::LeftButton);
  EXPECT_EQ(store.GetQuote("Q1001")->schedType, "MTA");
  EXPECT_EQ(quote::StoredSummary(store, "Q1001").lines.size(), before);
  EXPECT_EQ(window.Lines()->rowCount(), static_cast<int>(before));
}

TEST_F(QuoteHostTest, SampleQuotesCarryPartsOfEveryTypeAndTheTotalsAddThem) {
  const quote::PartsSummary parts = quote::StoredPartsSummary(store, "Q1001");
  ASSERT_EQ(parts.lines.size(), 5u);
  std::set<std::string> types;
  double cost = 0, sell = 0;
  for (const auto& p : parts.lines) {
    types.insert(p.type);
    cost += p.qty * p.unitCost;
    sell += p.qty * p.price;
  }
  EXPECT_EQ(types, (std::set<std::string>{"New", "Used", "Exchange", "Recore", "After market"}));
  EXPECT_DOUBLE_EQ(parts.cost, cost);
  EXPECT_DOUBLE_EQ(parts.sell, sell);

  quote::QuoteWindow window(store);
  ASSERT_TRUE(window.SelectQuote("Q1001"));
  EXPECT_EQ(window.Parts()->rowCount(), 5);
  const quote::QuoteSummary labour = quote::StoredSummary(store, "Q1001");
  QTableWidget* totals = window.Totals();
  EXPECT_EQ(totals->item(6, 0)->text(), "Parts margin");
  EXPECT_EQ(totals->item(6, 2)->text().toStdString(), quote::Hours(sell - cost));
  EXPECT_EQ(totals->item(7, 2)->text().toStdString(), quote::Hours(labour.TotalAmount() + sell));
}

TEST_F(QuoteHostTest, ThePartsEditorOpensOverTheQuotesPartsAndItsEditIsStored) {
  quote::QuoteWindow window(store);
  window.show();
  ASSERT_TRUE(window.SelectQuote("Q1001"));
  const size_t before = quote::StoredPartsSummary(store, "Q1001").lines.size();
  std::string removed;
  runtime_->QueueModal([&](forms::Form& f) {
    auto& form = static_cast<parts::frmParts&>(f);
    ASSERT_TRUE(QTest::qWaitForWindowActive(runtime_->Window(form)));
    ASSERT_EQ(form.FGSelectedParts.Rows(), static_cast<int>(before) + 1);
    EXPECT_GT(form.FGParts.Rows(), 2); // the vehicle's catalogue
    removed = form.FGSelectedParts.TextMatrix(1, parts::col::sel::kItemId);
    form.FGSelectedParts.SetCurrentCell(1, 0);
    QTest::mouseClick(runtime_->Widget(form.cmdDelete), Qt::LeftButton);
    QTest::mouseClick(runtime_->Widget(form.cmdClose), Qt::LeftButton);
  });
  QTest::mouseClick(window.EditPartsButton(), Qt::LeftButton);
  EXPECT_EQ(quote::StoredPartsSummary(store, "Q1001").lines.size(), before - 1);
  EXPECT_EQ(window.Parts()->rowCount(), static_cast<int>(before) - 1);
  // The used part was priced with the markup before the current one: the
  // editor repriced it, and the write-back stored the new price.
  EXPECT_EQ(window.statusBar()->currentMessage(),
            "Q1001: stored 0 new, 1 changed and 1 deleted records.");

  // Viewing stores nothing.
  runtime_->QueueModal([&](forms::Form& f) {
    auto& form = static_cast<parts::frmParts&>(f);
    EXPECT_FALSE(form.cmdDelete.Enabled());
    QTest::mouseClick(runtime_->Widget(form.cmdClose), Qt::LeftButton);
  });
  QTest::mouseClick(window.ViewPartsButton(), Qt::LeftButton);
  EXPECT_EQ(window.statusBar()->currentMessage(), "Q1001: viewed, nothing to store.");
}

TEST_F(QuoteHostTest, EnterOnAQuoteEditsItsLabourAndTheStatusBarFollowsTheSelection) {
  quote::QuoteWindow window(store);
  ShowActive(window);
  ASSERT_EQ(window.CurrentQuote(), "Q1001");
  const QString firstVehicle = QString::fromStdString(store.GetQuote("Q1001")->vehicle);
  EXPECT_TRUE(window.QuoteStatus()->text().startsWith("Q1001  " + firstVehicle))
      << window.QuoteStatus()->text().toStdString();

  QTest::keyClick(window.QuoteList(), Qt::Key_Down);
  ASSERT_EQ(window.CurrentQuote(), "Q1002");
  const auto second = store.GetQuote("Q1002");
  const quote::QuoteSummary labour = quote::StoredSummary(store, "Q1002");
  const QString status = window.QuoteStatus()->text();
  EXPECT_TRUE(status.startsWith(QString::fromStdString("Q1002  " + second->vehicle)))
      << status.toStdString();
  EXPECT_TRUE(status.contains(QString::number(labour.lines.size()) + " labour lines"))
      << status.toStdString();

  QTest::keyClick(window.QuoteList(), Qt::Key_Up);
  ASSERT_EQ(window.CurrentQuote(), "Q1001");
  EXPECT_TRUE(window.QuoteStatus()->text().startsWith("Q1001  " + firstVehicle));

  // Return: the labour editor in edit mode on that quote; what it adds is
  // stored, and the status bar sums the quote up again.
  const quote::QuoteSummary first = quote::StoredSummary(store, "Q1001");
  std::optional<EQuoteEditMode> mode;
  runtime_->QueueModal([&](forms::Form& f) {
    auto& form = static_cast<labour::frmLabour&>(f);
    mode = form.Mode();
    AddAnItem(form, "2");
  });
  QTest::keyClick(window.QuoteList(), Qt::Key_Return);
  ASSERT_EQ(mode, eEdit);
  EXPECT_FALSE(host::gbLabourFormLoaded);
  EXPECT_EQ(window.CurrentQuote(), "Q1001");
  EXPECT_EQ(window.statusBar()->currentMessage().toStdString(),
            "Q1001: stored 1 new, 0 changed and 0 deleted records.");
  // A menu item's tip passes through the status bar; the result comes back.
  QStatusTipEvent tip("Show the quotes of another quote database");
  QApplication::sendEvent(&window, &tip);
  QStatusTipEvent gone("");
  QApplication::sendEvent(&window, &gone);
  EXPECT_EQ(window.statusBar()->currentMessage().toStdString(),
            "Q1001: stored 1 new, 0 changed and 0 deleted records.");
  const quote::QuoteSummary after = quote::StoredSummary(store, "Q1001");
  ASSERT_EQ(after.lines.size(), first.lines.size() + 1);
  const double total = after.TotalAmount() + quote::StoredPartsSummary(store, "Q1001").sell;
  EXPECT_TRUE(
      window.QuoteStatus()->text().endsWith(QString::fromStdString("Total " + quote::Hours(total))))
      << window.QuoteStatus()->text().toStdString();

  // The keypad's Enter does the same; with Ctrl held it does nothing.
  mode.reset();
  runtime_->QueueModal([&](forms::Form& f) {
    mode = static_cast<labour::frmLabour&>(f).Mode();
    QTest::mouseClick(runtime_->Widget(static_cast<labour::frmLabour&>(f).cmdClose),
                      Qt::LeftButton);
  });
  QTest::keyClick(window.QuoteList(), Qt::Key_Enter, Qt::KeypadModifier);
  EXPECT_EQ(mode, eEdit);
  mode.reset();
  QTest::keyClick(window.QuoteList(), Qt::Key_Return, Qt::ControlModifier);
  EXPECT_FALSE(mode.has_value());
}

TEST_F(QuoteHostTest, TheQuoteListKeepsTheEstimatorsColumnWidths) {
  quote::QuoteWindow window(store);
  ShowActive(window);
  QTableWidget* list = window.QuoteList();
  // The first fill sizes the columns to what they hold.
  EXPECT_GE(list->columnWidth(1), list->fontMetrics().horizontalAdvance("Harbour Fleet Services"));

  list->horizontalHeader()->resizeSection(0, 140); // as a drag on the header would
  list->horizontalHeader()->resizeSection(1, 70);
  const auto widths = [list] { return std::pair(list->columnWidth(0), list->columnWidth(1)); };
  const auto set = std::pair(140, 70);

  window.Reload();
  EXPECT_EQ(widths(), set);
  runtime_->QueueModal([&](forms::Form& f) {
    QTest::mouseClick(runtime_->Widget(static_cast<labour::frmLabour&>(f).cmdClose),
                      Qt::LeftButton);
  });
  QTest::mouseClick(window.EditLabourButton(), Qt::LeftButton);
  EXPECT_EQ(widths(), set) << "after an editor closed";

  data::QuoteStore other(dir.File("other.db"));
  ASSERT_EQ(quote::AddSampleQuotes(other), 4);
  ASSERT_TRUE(window.OpenDatabase(dir.File("other.db")));
  EXPECT_EQ(widths(), set) << "after another database was opened";
}

TEST_F(QuoteHostTest, OpenQuoteDatabaseSwitchesAndABadFileKeepsTheCurrentOne) {
  // Another database, told apart by its customer; edits go to it once open.
  const std::string otherPath = dir.File("other.db");
  data::QuoteStore other(otherPath);
  ASSERT_EQ(quote::AddSampleQuotes(other), 4);
  data::QuoteHeader renamed = *other.GetQuote("Q1003");
  renamed.customer = "Other Motors";
  other.SaveQuote(renamed);

  quote::QuoteWindow window(store);
  ShowActive(window);
  ASSERT_TRUE(window.SelectQuote("Q1003"));
  Answer pick([&](QWidget* modal) {
    auto* dialog = qobject_cast<QFileDialog*>(modal);
    if (!dialog) return false;
    dialog->selectFile(QString::fromStdString(otherPath));
    static_cast<QDialog*>(dialog)->accept(); // its Open button
    return true;
  });
  QTest::keyClick(&window, Qt::Key_O, Qt::ControlModifier); // File > Open quote database...
  ASSERT_EQ(pick.answered, 1);
  EXPECT_EQ(window.Store().Path(), otherPath);
  EXPECT_TRUE(window.windowTitle().startsWith("other.db"));
  EXPECT_EQ(window.CurrentQuote(), "Q1003");
  EXPECT_EQ(window.QuoteList()->item(2, 1)->text(), "Other Motors");
  EXPECT_EQ(window.statusBar()->currentMessage().toStdString(),
            "Opened " + otherPath + ": 4 quotes.");

  runtime_->QueueModal(
      [this](forms::Form& f) { AddAnItem(static_cast<labour::frmLabour&>(f), "1"); });
  const size_t first = quote::StoredSummary(store, "Q1003").lines.size();
  const size_t before = quote::StoredSummary(other, "Q1003").lines.size();
  QTest::keyClick(window.QuoteList(), Qt::Key_Return);
  EXPECT_EQ(quote::StoredSummary(other, "Q1003").lines.size(), before + 1);
  EXPECT_EQ(quote::StoredSummary(store, "Q1003").lines.size(), first);

  // Files that are not quote databases: plain text, a copy of the catalogue
  // (an SQLite database of another kind, which must stay as it was), tables
  // of the right names with the wrong columns, and no file at all.
  const std::string text = dir.File("notes.txt");
  std::ofstream(text) << "Not a database\n";
  const std::string catalogue = dir.File("catalogue.db");
  std::filesystem::copy_file(BELVANE_SAMPLE_CATALOGUE, catalogue);
  const auto bytes = [](const std::string& path) {
    std::ostringstream all;
    all << std::ifstream(path, std::ios::binary).rdbuf();
    return all.str();
  };
  const std::string catalogueBytes = bytes(catalogue);
  const std::string wrong = dir.File("wrong.db");
  sqlite3* db = nullptr;
  ASSERT_EQ(sqlite3_open(wrong.c_str(), &db), SQLITE_OK);
  ASSERT_EQ(sqlite3_exec(db, "CREATE TABLE quotes (qtnno TEXT); CREATE TABLE quote_items (x)",
                         nullptr, nullptr, nullptr),
            SQLITE_OK);
  sqlite3_close(db);

  for (const std::string& bad : {text, catalogue, wrong, dir.File("missing.db")}) {
    SCOPED_TRACE(bad);
    QString said;
    Answer ok([&said](QWidget* modal) {
      auto* box = qobject_cast<QMessageBox*>(modal);
      if (!box) return false;
      said = box->text();
      box->button(QMessageBox::Ok)->click();
      return true;
    });
    EXPECT_FALSE(window.OpenDatabase(bad));
    EXPECT_EQ(ok.answered, 1);
    EXPECT_TRUE(said.contains("is not a quote database")) << said.toStdString();
    EXPECT_TRUE(said.contains("The quotes of other.db are still shown")) << said.toStdString();
    EXPECT_EQ(window.Store().Path(), otherPath);
    EXPECT_EQ(window.QuoteList()->rowCount(), 4);
    EXPECT_EQ(window.CurrentQuote(), "Q1003");
  }
  EXPECT_EQ(bytes(catalogue), catalogueBytes);
}

TEST_F(QuoteHostTest, TheMenusOpenTheKeysTheAboutBoxAndQuit) {
  quote::QuoteWindow window(store);
  ShowActive(window);
  QStringList said;
  Answer ok([&said](QWidget* modal) {
    auto* box = qobject_cast<QMessageBox*>(modal);
    if (!box) return false;
    said << box->windowTitle() + ": " + box->text();
    box->accept();
    return true;
  });
  QTest::keyClick(&window, Qt::Key_F1);
  window.AboutAction()->trigger();
  ASSERT_EQ(said.size(), 2);
  EXPECT_TRUE(said[0].startsWith("Keys: ") && said[0].contains("<b>Enter</b>"))
      << said[0].toStdString();
  EXPECT_TRUE(said[1].contains(QRegularExpression("Belvane Quote</b> \\d+\\.\\d+\\.\\d+")))
      << said[1].toStdString();

  window.activateWindow(); // back from the boxes
  ASSERT_TRUE(QTest::qWaitForWindowActive(&window));
  QTest::keyClick(&window, Qt::Key_Q, Qt::ControlModifier);
  EXPECT_FALSE(window.isVisible());
}
