#include "scripted_demo.hpp"

#include "forms/controls.hpp"
#include "host/component_state.hpp"
#include "host/frm_status.hpp"
#include "labour/frm_labour.hpp"
#include "qt/grid_view.hpp"
#include "qt/qt_runtime.hpp"
#include "quote_summary.hpp"
#include "quote_window.hpp"

#include <QApplication>
#include <QMessageBox>
#include <QPushButton>
#include <QStatusBar>
#include <QTableWidget>
#include <QTest>

#include <filesystem>
#include <functional>

namespace belvane::quote {

namespace {

namespace col = labour::col;

// The user's hands: keys to the widget with the focus, clicks on widgets
// and on grid cells, as a person's would go.
class Hands {
public:
  explicit Hands(qt::QtRuntime& runtime) : runtime_(runtime) {}

  void Key(Qt::Key key, Qt::KeyboardModifiers modifiers = Qt::NoModifier) {
    if (QWidget* focused = QApplication::focusWidget()) QTest::keyClick(focused, key, modifiers);
  }
  void Type(const QString& text) {
    for (const QChar c : text)
      if (QWidget* focused = QApplication::focusWidget()) QTest::keyClick(focused, c.toLatin1());
  }
  void Click(const forms::Control& control) {
    QTest::mouseClick(runtime_.Widget(control), Qt::LeftButton);
  }
  bool ClickCell(const forms::FlexGrid& grid, int row, int col, bool twice = false) {
    auto* view = dynamic_cast<qt::GridView*>(runtime_.View(grid));
    if (!view) return false;
    const QRect cell = view->CellRect(row, col);
    if (!cell.isValid()) return false;
    QWidget* cells = view->Table()->viewport();
    const QPoint at = cells->mapFrom(view->Widget(), cell.center());
    QTest::mouseClick(cells, Qt::LeftButton, {}, at);
    if (twice) {
      QTest::mouseDClick(cells, Qt::LeftButton, {}, at);
      QTest::mouseRelease(cells, Qt::LeftButton, {}, at);
    }
    return true;
  }

private:
  qt::QtRuntime& runtime_;
};

class Demo {
public:
  Demo(QuoteWindow& window, qt::QtRuntime& runtime, std::string folder, std::ostream& out)
      : window_(window), runtime_(runtime), folder_(std::move(folder)), out_(out), hands_(runtime) {
  }

  int Run();

private:
  void Step(const std::string& what) { out_ << "  " << ++step_ << ". " << what << "\n"; }
  void Check(bool ok, const std::string& what) {
    if (!ok) {
      out_ << "  !! " << what << "\n";
      ++failures_;
    }
  }
  void Picture(QWidget* window, const std::string& name, const std::string& what) {
    if (!window) return;
    const std::string path = (std::filesystem::path(folder_) / name).string();
    if (qt::WindowPicture(*window).save(QString::fromStdString(path)))
      out_ << "     picture of " << what << ": " << path << "\n";
    else
      Check(false, "could not write " + path);
  }
  void PrintQuote(const std::string& when);
  void EditSession(labour::frmLabour& form);
  void ViewSession(labour::frmLabour& form);
  // Plays `session` in the labour editor the next button click opens.
  void OnLabourEditor(const std::function<void(labour::frmLabour&)>& session);

  QuoteWindow& window_;
  qt::QtRuntime& runtime_;
  std::string folder_;
  std::ostream& out_;
  Hands hands_;
  int step_ = 0;
  int failures_ = 0;
};

void Demo::PrintQuote(const std::string& when) {
  const QuoteSummary summary = StoredSummary(window_.Store(), window_.CurrentQuote());
  out_ << "\nQuote " << window_.CurrentQuote() << " " << when << ":\n";
  if (summary.lines.empty()) out_ << "  (no labour lines)\n";
  for (const SummaryLine& line : summary.lines)
    out_ << "  " << line.itemNo << "  " << line.description << "  " << kCategoryNames[line.category]
         << "  " << Hours(line.hours) << " h at " << Hours(line.rate) << "  "
         << (line.reportOnly ? "report only" : Hours(line.amount)) << "\n";
  for (size_t c = 0; c < 3; ++c)
    out_ << "  " << kCategoryNames[c] << ": " << Hours(summary.hours[c]) << " h, "
         << Hours(summary.amounts[c]) << "\n";
  out_ << "  Total: " << Hours(summary.TotalHours()) << " h, " << Hours(summary.TotalAmount())
       << "\n\n";
}

void Demo::OnLabourEditor(const std::function<void(labour::frmLabour&)>& session) {
  runtime_.QueueModal([this, session](forms::Form& form) {
    auto& labour = static_cast<labour::frmLabour&>(form);
    Check(QTest::qWaitForWindowActive(runtime_.Window(form)), "the labour editor is active");
    session(labour);
  });
}

void Demo::EditSession(labour::frmLabour& form) {
  Picture(runtime_.Window(host::StatusBox()), "status-box.png", "the status box");
  Step("The labour editor opened in edit mode on schedule " + form.SchedType() + ".");
  Picture(runtime_.Window(form), "labour-edit.png", "the labour editor");

  // The first catalogue item not on the quote yet whose R&R hours can be
  // taken.
  int schedule = 0;
  for (int i = 0; i < form.optSchedule.Count(); ++i)
    if (form.optSchedule(i).Value()) schedule = i;
  forms::FlexGrid& list = form.FGLabourItems(schedule);
  const forms::FlexGrid& lines = form.FGSelectedLabour;
  const auto onQuote = [&lines](const std::string& itemNo) {
    for (int r = 1; r < lines.Rows(); ++r)
      if (lines.TextMatrix(r, col::kItemNo) == itemNo) return true;
    return false;
  };
  int row = 0;
  for (int r = 1; r < list.Rows() && row == 0; ++r)
    if (list.CellStyleAt(r, 2).backColor != grid::kGrey && !list.TextMatrix(r, 2).empty() &&
        !onQuote(list.TextMatrix(r, 0)))
      row = r;
  Check(row > 0, "the catalogue has an item with R&R hours that is not on the quote");
  if (row == 0) return;
  const std::string item = list.TextMatrix(row, 0) + " " + list.TextMatrix(row, 1);
  Check(hands_.ClickCell(list, row, 2, true), "the catalogue item is in view");
  Step("Double-clicked the R&R hours of catalogue item " + item +
       ": a new line, with the editor open on its hours.");
  hands_.Type("2.5");
  Picture(runtime_.Window(form), "labour-cell-editor.png", "the in-cell editor");
  hands_.Key(Qt::Key_Return);
  const int line = form.FGSelectedLabour.Row();
  Step("Typed 2.5 and Enter: the hours read " +
       form.FGSelectedLabour.TextMatrix(line, col::kRRHours) + ".");
  Check(form.FGSelectedLabour.Col() == col::kRRReport, "Enter moved on to the report-only flag");
  hands_.Key(Qt::Key_Space);
  Step(std::string("Space on the R&R report-only flag: ") +
       (form.FGSelectedLabour.TextMatrix(line, col::kRRReport) == labour::kTicked ? "ticked"
                                                                                  : "not ticked") +
       ".");
  hands_.Key(Qt::Key_Space);
  Step("Space again: the line is charged again.");

  hands_.Click(form.txtSearch);
  hands_.Type("door");
  hands_.Key(Qt::Key_Return);
  Step("Searched the schedule for \"door\": " + std::to_string(form.fgSearch.Rows() - 1) +
       " items found.");
  Picture(runtime_.Window(form), "labour-search.png", "a search result");
  if (form.fgSearch.Rows() > 1 && !form.fgSearch.TextMatrix(1, 0).empty()) {
    hands_.ClickCell(form.fgSearch, 1, col::kDescription, true);
    Step("Double-clicked the first result, " + form.fgSearch.TextMatrix(1, 1) +
         ": added with its hours.");
    hands_.Key(Qt::Key_Escape);
    hands_.Key(Qt::Key_Return);
  }

  runtime_.QueueMessageBox([this](QMessageBox& box) {
    Picture(&box, "message-box.png", "a message box");
    Step("The editor said \"" + box.text().toStdString() + "\" (" +
         box.windowTitle().toStdString() + "); pressed OK.");
    QTest::keyClick(&box, Qt::Key_Return);
  });
  hands_.Click(form.txtSearch);
  hands_.Type("zzz");
  hands_.Key(Qt::Key_Return);

  if (form.FGSelectedLabour.Rows() > 2) {
    const std::string first = form.FGSelectedLabour.TextMatrix(1, col::kItemNo) + " " +
                              form.FGSelectedLabour.TextMatrix(1, col::kDescription);
    hands_.ClickCell(form.FGSelectedLabour, 1, col::kItemNo);
    hands_.Click(form.cmdDelete);
    Step("Deleted the line " + first + ".");
  }
  Step("Closed the editor: the lines are written into the quote's record set.");
  hands_.Click(form.cmdClose);
}

void Demo::ViewSession(labour::frmLabour& form) {
  Step("The labour editor opened in view mode: the lines only, nothing to change.");
  Picture(runtime_.Window(form), "labour-view.png", "the labour editor in view mode");
  hands_.Click(form.cmdClose);
}

int Demo::Run() {
  std::filesystem::create_directories(folder_);
  window_.show();
  Check(QTest::qWaitForWindowExposed(&window_), "the main window shows");
  const std::string quote = window_.CurrentQuote();
  out_ << "Belvane Quote, scripted demo on quote " << quote << "\n";
  PrintQuote("before");
  Picture(&window_, "quote-host.png", "the demo host");

  OnLabourEditor([this](labour::frmLabour& form) { EditSession(form); });
  Step("Clicked Edit labour on quote " + quote + ".");
  QTest::mouseClick(window_.EditLabourButton(), Qt::LeftButton);
  Step("Back in the host: " + window_.statusBar()->currentMessage().toStdString());
  Check(!host::gbLabourFormLoaded, "the labour editor is closed");
  Picture(&window_, "quote-host-after.png", "the demo host after the edit");

  OnLabourEditor([this](labour::frmLabour& form) { ViewSession(form); });
  Step("Clicked View labour.");
  QTest::mouseClick(window_.ViewLabourButton(), Qt::LeftButton);

  PrintQuote("after");
  out_ << "Pictures are in " << std::filesystem::absolute(folder_).string() << "\n";
  if (!runtime_.UnhandledErrors().empty()) {
    for (const auto& e : runtime_.UnhandledErrors())
      out_ << "  !! " << e.where << ": error " << e.number << ": " << e.description << "\n";
    ++failures_;
  }
  if (failures_) out_ << failures_ << " step(s) did not do what they should.\n";
  return failures_ == 0 ? 0 : 1;
}

} // namespace

int RunScriptedDemo(QuoteWindow& window, qt::QtRuntime& runtime, const std::string& folder,
                    std::ostream& out) {
  runtime.ShowHandlerErrors(false);
  Demo demo(window, runtime, folder, out);
  return demo.Run();
}

} // namespace belvane::quote
