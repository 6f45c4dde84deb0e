#include "quote_window.hpp"

#include "data/quote_store.hpp"
#include "data/sqlite/sqlite_db.hpp"
#include "entry/cforms.hpp"
#include "quote_summary.hpp"
#include "text/error.hpp"
#include "text/number.hpp"

#include <QAction>
#include <QFileDialog>
#include <QFileInfo>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QKeyEvent>
#include <QLabel>
#include <QMenuBar>
#include <QMessageBox>
#include <QPushButton>
#include <QSplitter>
#include <QStatusBar>
#include <QTableWidget>
#include <QVBoxLayout>

#include <filesystem>

#ifndef BELVANE_VERSION
#define BELVANE_VERSION ""
#endif

namespace belvane::quote {

namespace {

QString Q(const std::string& s) { return QString::fromStdString(s); }

constexpr const char* kAppName = "Belvane Quote";

// "quotes.db - Belvane Quote": the database in the caption, the program's
// name last (the window system adds it only when the caption lacks it).
QString Caption(const std::string& path) {
  return QFileInfo(Q(path)).fileName() + QString::fromUtf8(" \u2014 ") + kAppName;
}

QTableWidget* MakeTable(const QStringList& titles, QWidget* parent) {
  auto* table = new QTableWidget(0, static_cast<int>(titles.size()), parent);
  table->setHorizontalHeaderLabels(titles);
  table->verticalHeader()->hide();
  table->verticalHeader()->setSectionResizeMode(QHeaderView::Fixed);
  table->setEditTriggers(QAbstractItemView::NoEditTriggers);
  table->setSelectionBehavior(QAbstractItemView::SelectRows);
  table->setSelectionMode(QAbstractItemView::SingleSelection);
  table->setAlternatingRowColors(true);
  table->horizontalHeader()->setHighlightSections(false);
  table->verticalHeader()->setDefaultSectionSize(table->fontMetrics().height() + 8);
  return table;
}

QTableWidgetItem* Cell(const QString& text, bool number = false) {
  auto* item = new QTableWidgetItem(text);
  if (number) item->setTextAlignment(Qt::AlignRight | Qt::AlignVCenter);
  return item;
}

// The rows of the totals: the three labour categories, labour, the parts at
// cost and with markup, their margin, and the quote's total.
constexpr int kTotalRows = 8;

QLabel* Heading(const QString& text, QWidget* parent) {
  auto* label = new QLabel(text, parent);
  QFont font = label->font();
  font.setBold(true);
  label->setFont(font);
  return label;
}

} // namespace

struct QuoteWindow::State {
  CForms forms;
  std::vector<data::QuoteHeader> headers;
};

QuoteWindow::~QuoteWindow() = default;

QuoteWindow::QuoteWindow(data::QuoteStore& store, QWidget* parent)
    : QMainWindow(parent), store_(&store), state_(std::make_unique<State>()) {
  setObjectName("QuoteWindow");
  setWindowTitle(Caption(store.Path()));
  auto* splitter = new QSplitter(this);

  auto* left = new QWidget(splitter);
  auto* leftLayout = new QVBoxLayout(left);
  leftLayout->addWidget(Heading("Quotes", left));
  quotes_ = MakeTable({"Quote", "Customer", "Vehicle"}, left);
  quotes_->horizontalHeader()->setStretchLastSection(true);
  leftLayout->addWidget(quotes_);

  auto* right = new QWidget(splitter);
  auto* rightLayout = new QVBoxLayout(right);
  title_ = Heading("", right);
  QFont big = title_->font();
  big.setPointSizeF(big.pointSizeF() * 1.3);
  title_->setFont(big);
  vehicle_ = new QLabel(right);
  context_ = new QLabel(right);
  context_->setWordWrap(true);
  rightLayout->addWidget(title_);
  rightLayout->addWidget(vehicle_);
  rightLayout->addWidget(context_);

  auto* buttons = new QHBoxLayout;
  editLabour_ = new QPushButton("&Edit labour...", right);
  viewLabour_ = new QPushButton("&View labour...", right);
  editParts_ = new QPushButton("Edit &parts...", right);
  viewParts_ = new QPushButton("Vie&w parts...", right);
  editLabour_->setToolTip("Open the labour editor on this quote; what you change is stored "
                          "when you close it");
  viewLabour_->setToolTip("Open the labour editor to look at this quote's labour lines");
  editParts_->setToolTip("Open the parts editor on this quote; what you change is stored when "
                         "you close it");
  viewParts_->setToolTip("Open the parts editor to look at this quote's parts");
  for (QPushButton* b : {editLabour_, viewLabour_, editParts_, viewParts_})
    buttons->addWidget(b);
  buttons->addStretch();
  rightLayout->addLayout(buttons);

  rightLayout->addWidget(Heading("Labour lines", right));
  lines_ = MakeTable({"Item No", "Description", "Operation", "Hours", "Rate", "Amount"}, right);
  lines_->horizontalHeader()->setSectionResizeMode(1, QHeaderView::Stretch);
  lines_->setSelectionMode(QAbstractItemView::NoSelection);
  rightLayout->addWidget(lines_, 1);
  rightLayout->addWidget(Heading("Parts", right));
  parts_ = MakeTable({"Item No", "Description", "Type", "Qty", "Unit cost", "Price", "Line total"},
                     right);
  parts_->horizontalHeader()->setSectionResizeMode(QHeaderView::ResizeToContents);
  parts_->horizontalHeader()->setSectionResizeMode(1, QHeaderView::Stretch);
  parts_->setSelectionMode(QAbstractItemView::NoSelection);
  rightLayout->addWidget(parts_, 1);
  rightLayout->addWidget(Heading("Totals", right));
  totals_ = MakeTable({"Category", "Hours", "Amount"}, right);
  totals_->setSelectionMode(QAbstractItemView::NoSelection);
  totals_->horizontalHeader()->setSectionResizeMode(0, QHeaderView::Stretch);
  totals_->setRowCount(kTotalRows);
  totals_->setFixedHeight(totals_->horizontalHeader()->height() +
                          kTotalRows * totals_->verticalHeader()->defaultSectionSize() + 4);
  rightLayout->addWidget(totals_);

  splitter->addWidget(left);
  splitter->addWidget(right);
  splitter->setStretchFactor(0, 2);
  splitter->setStretchFactor(1, 3);
  splitter->setSizes({500, 640});
  setCentralWidget(splitter);
  resize(1140, 760);

  connect(quotes_, &QTableWidget::itemSelectionChanged, this, [this] { ShowQuote(); });
  connect(quotes_, &QTableWidget::cellDoubleClicked, this, [this] { OpenLabour(eEdit); });
  connect(editLabour_, &QPushButton::clicked, this, [this] { OpenLabour(eEdit); });
  connect(viewLabour_, &QPushButton::clicked, this, [this] { OpenLabour(eView); });
  connect(editParts_, &QPushButton::clicked, this, [this] { OpenParts(eEdit); });
  connect(viewParts_, &QPushButton::clicked, this, [this] { OpenParts(eView); });
  quotes_->installEventFilter(this);

  // The selected quote stays on the right of the status bar; the left is
  // for what the last editor session (or database change) did.
  quoteStatus_ = new QLabel(this);
  quoteStatus_->setObjectName("QuoteStatus");
  statusBar()->addPermanentWidget(quoteStatus_);
  // Menus show their items' tips in the status bar and clear it after; what
  // the last session did comes back then.
  connect(statusBar(), &QStatusBar::messageChanged, this, [this](const QString& message) {
    if (message.isEmpty() && !lastReport_.isEmpty()) statusBar()->showMessage(lastReport_);
  });
  MakeMenus();

  Reload();
  Report("Enter edits the selected quote's labour. F1 lists the keys.");
}

void QuoteWindow::MakeMenus() {
  QMenu* file = menuBar()->addMenu("&File");
  open_ = file->addAction("&Open quote database...", this, [this] { ChooseDatabase(); });
  open_->setShortcut(QKeySequence::Open);
  open_->setStatusTip("Show the quotes of another quote database");
  file->addSeparator();
  quit_ = file->addAction("&Quit", this, [this] { close(); });
  quit_->setShortcut(QKeySequence(Qt::CTRL | Qt::Key_Q));
  QMenu* help = menuBar()->addMenu("&Help");
  keys_ = help->addAction("&Keys", this, [this] { ShowKeys(); });
  keys_->setShortcut(QKeySequence(Qt::Key_F1));
  about_ = help->addAction("&About", this, [this] { ShowAbout(); });
}

bool QuoteWindow::eventFilter(QObject* watched, QEvent* event) {
  if (watched == quotes_ && event->type() == QEvent::KeyPress) {
    const auto* key = static_cast<QKeyEvent*>(event);
    const bool enter = key->key() == Qt::Key_Return || key->key() == Qt::Key_Enter;
    if (enter && (key->modifiers() & ~Qt::KeypadModifier) == Qt::NoModifier &&
        !CurrentQuote().empty()) {
      OpenLabour(eEdit);
      return true;
    }
  }
  return QMainWindow::eventFilter(watched, event);
}

void QuoteWindow::Reload() {
  const std::string selected = CurrentQuote();
  state_->headers = store_->ListQuotes();
  const QSignalBlocker quiet(quotes_);
  quotes_->setRowCount(static_cast<int>(state_->headers.size()));
  for (int r = 0; r < static_cast<int>(state_->headers.size()); ++r) {
    const auto& h = state_->headers[static_cast<size_t>(r)];
    quotes_->setItem(r, 0, Cell(Q(h.qtnno)));
    quotes_->setItem(r, 1, Cell(Q(h.customer)));
    quotes_->setItem(r, 2, Cell(Q(h.vehicle)));
  }
  if (!columnsSized_ && !state_->headers.empty()) {
    quotes_->resizeColumnsToContents();
    columnsSized_ = true;
  }
  if (selected.empty() || !SelectQuote(selected)) {
    if (!state_->headers.empty()) quotes_->selectRow(0);
  }
  ShowQuote();
}

bool QuoteWindow::SelectQuote(const std::string& qtnno) {
  for (int r = 0; r < static_cast<int>(state_->headers.size()); ++r)
    if (state_->headers[static_cast<size_t>(r)].qtnno == qtnno) {
      quotes_->selectRow(r);
      return true;
    }
  return false;
}

std::string QuoteWindow::CurrentQuote() const {
  const int row = quotes_->currentRow();
  if (row < 0 || row >= static_cast<int>(state_->headers.size())) return {};
  return state_->headers[static_cast<size_t>(row)].qtnno;
}

void QuoteWindow::ShowQuote() {
  const auto header = store_->GetQuote(CurrentQuote());
  for (QPushButton* b : {editLabour_, viewLabour_, editParts_, viewParts_})
    b->setEnabled(header.has_value());
  lines_->setRowCount(0);
  parts_->setRowCount(0);
  if (!header) {
    title_->setText("No quote selected");
    vehicle_->clear();
    context_->clear();
    quoteStatus_->setText(state_->headers.empty() ? "No quotes in this database"
                                                  : "No quote selected");
    return;
  }
  title_->setText(Q(header->qtnno + "  " + header->customer));
  vehicle_->setText(Q(header->vehicle));
  context_->setText(Q("Schedule " + header->schedType + "    Rates per hour: R&R " +
                      Hours(header->rrRate) + ", Repair " + Hours(header->raRate) + ", Paint " +
                      Hours(header->ptRate)));

  const QuoteSummary summary = StoredSummary(*store_, header->qtnno);
  lines_->setRowCount(static_cast<int>(summary.lines.size()));
  for (int r = 0; r < static_cast<int>(summary.lines.size()); ++r) {
    const SummaryLine& line = summary.lines[static_cast<size_t>(r)];
    lines_->setItem(r, 0, Cell(Q(line.itemNo)));
    lines_->setItem(r, 1, Cell(Q(line.description)));
    lines_->setItem(r, 2, Cell(kCategoryNames[line.category]));
    lines_->setItem(r, 3, Cell(Q(Hours(line.hours)), true));
    lines_->setItem(r, 4, Cell(Q(Hours(line.rate)), true));
    lines_->setItem(r, 5, Cell(line.reportOnly ? "report only" : Q(Hours(line.amount)), true));
  }
  lines_->resizeColumnToContents(0);
  for (int c = 0; c < 3; ++c) {
    totals_->setItem(c, 0, Cell(kCategoryNames[static_cast<size_t>(c)]));
    totals_->setItem(c, 1, Cell(Q(Hours(summary.hours[static_cast<size_t>(c)])), true));
    totals_->setItem(c, 2, Cell(Q(Hours(summary.amounts[static_cast<size_t>(c)])), true));
  }
  totals_->setItem(3, 0, Cell("Labour"));
  totals_->setItem(3, 1, Cell(Q(Hours(summary.TotalHours())), true));
  totals_->setItem(3, 2, Cell(Q(Hours(summary.TotalAmount())), true));

  const PartsSummary parts = StoredPartsSummary(*store_, header->qtnno);
  parts_->setRowCount(static_cast<int>(parts.lines.size()));
  for (int r = 0; r < static_cast<int>(parts.lines.size()); ++r) {
    const PartLine& part = parts.lines[static_cast<size_t>(r)];
    parts_->setItem(r, 0, Cell(Q(part.itemNo)));
    parts_->setItem(r, 1, Cell(Q(part.description)));
    parts_->setItem(r, 2, Cell(Q(part.type)));
    parts_->setItem(r, 3, Cell(QString::number(part.qty), true));
    parts_->setItem(r, 4, Cell(Q(Hours(part.unitCost)), true));
    parts_->setItem(r, 5, Cell(Q(text::FormatNumber(part.price, text::kPrice)), true));
    parts_->setItem(r, 6, Cell(part.reportOnly ? "report only" : Q(Hours(part.sell)), true));
  }
  const std::pair<const char*, double> partRows[] = {
      {"Parts at cost", parts.cost},
      {"Parts with markup", parts.sell},
      {"Parts margin", parts.Margin()},
      {"Quote total", summary.TotalAmount() + parts.sell}};
  int row = 4;
  for (const auto& [name, amount] : partRows) {
    totals_->setItem(row, 0, Cell(name));
    totals_->setItem(row, 1, Cell(""));
    totals_->setItem(row, 2, Cell(Q(Hours(amount)), true));
    ++row;
  }
  for (int r : {3, kTotalRows - 1})
    for (int c = 0; c < 3; ++c) {
      QFont bold = totals_->item(r, c)->font();
      bold.setBold(true);
      totals_->item(r, c)->setFont(bold);
    }

  const auto count = [](size_t n, const char* one, const char* many) {
    return std::to_string(n) + " " + (n == 1 ? one : many);
  };
  quoteStatus_->setText(Q(header->qtnno + "  " + header->vehicle + "    " +
                          count(summary.lines.size(), "labour line", "labour lines") + ", " +
                          count(parts.lines.size(), "part", "parts") + "    Total " +
                          Hours(summary.TotalAmount() + parts.sell)));
}

void QuoteWindow::ChooseDatabase() {
  const QString folder = QFileInfo(Q(store_->Path())).absolutePath();
  const QString path =
      QFileDialog::getOpenFileName(this, "Open quote database", folder,
                                   "Quote databases (*.db *.sqlite *.sqlite3);;All files (*)");
  if (!path.isEmpty()) OpenDatabase(path.toStdString());
}

bool QuoteWindow::OpenDatabase(const std::string& path) {
  const auto refuse = [this, &path](const std::string& why) {
    const QString name = QFileInfo(Q(path)).fileName();
    QMessageBox::warning(this, "Not a quote database",
                         name + " is not a quote database, so it was not opened.\n\n" + Q(why) +
                             "\n\nThe quotes of " + QFileInfo(Q(store_->Path())).fileName() +
                             " are still shown.");
    Report(path + " was not opened: it is not a quote database.");
    return false;
  };
  std::error_code ec;
  if (!std::filesystem::is_regular_file(path, ec)) return refuse("There is no such file.");
  std::unique_ptr<data::QuoteStore> store;
  try {
    // Looked at read-only first: opening a store creates its tables, and a
    // file that is something else (a catalogue, say) must stay as it is.
    {
      data::sqlite::Database probe(path, data::sqlite::Database::Mode::ReadOnly, "Quote database",
                                   "Belvane.Quote");
      if (!probe.HasTable("quotes") || !probe.HasTable("quote_items"))
        return refuse("It has no table of quotes and their items.");
      const data::RecordsetPtr items = data::QuoteStore::NewItemRecordset();
      std::string columns;
      for (size_t i = 0; i < items->Fields().Count(); ++i)
        columns += (i ? ", " : "") + items->Fields().Item(i).name;
      data::sqlite::Statement read(probe, "SELECT " + columns + " FROM quote_items LIMIT 0");
    }
    store = std::make_unique<data::QuoteStore>(path);
    store->ListQuotes(); // the quotes' columns are all there
  } catch (const Error& e) {
    return refuse(e.Description());
  }
  opened_ = std::move(store);
  store_ = opened_.get();
  setWindowTitle(Caption(path));
  Reload();
  const size_t n = state_->headers.size();
  Report("Opened " + path + ": " + std::to_string(n) + (n == 1 ? " quote." : " quotes."));
  return true;
}

QString QuoteWindow::KeysText() {
  return "<table cellspacing=4>"
         "<tr><td><b>Up</b>, <b>Down</b>, <b>Home</b>, <b>End</b></td>"
         "<td>choose a quote in the list</td></tr>"
         "<tr><td><b>Enter</b> or <b>double-click</b> on a quote</td>"
         "<td>edit its labour (as Edit labour)</td></tr>"
         "<tr><td><b>Alt+E</b>, Edit labour...</td><td>edit the quote's labour</td></tr>"
         "<tr><td><b>Alt+V</b>, View labour...</td>"
         "<td>look at the quote's labour, nothing is changed</td></tr>"
         "<tr><td><b>Alt+P</b>, Edit parts...</td><td>edit the quote's parts</td></tr>"
         "<tr><td><b>Alt+W</b>, View parts...</td>"
         "<td>look at the quote's parts, nothing is changed</td></tr>"
         "<tr><td><b>Tab</b>, <b>Shift+Tab</b></td>"
         "<td>move between the quote list, the buttons and the tables</td></tr>"
         "<tr><td><b>Ctrl+O</b></td><td>open another quote database</td></tr>"
         "<tr><td><b>Alt+F</b>, <b>Alt+H</b></td><td>the File and Help menus</td></tr>"
         "<tr><td><b>F1</b></td><td>this list</td></tr>"
         "<tr><td><b>Ctrl+Q</b></td><td>quit</td></tr>"
         "</table>"
         "<p>Closing an editor opened to edit stores what changed in the quote at once; the "
         "status bar says what was stored. An editor opened to look stores nothing.</p>";
}

void QuoteWindow::ShowKeys() {
  QMessageBox box(QMessageBox::Information, "Keys", KeysText(), QMessageBox::Ok, this);
  box.setTextFormat(Qt::RichText);
  box.exec();
}

void QuoteWindow::ShowAbout() {
  QMessageBox::about(
      this, QString("About ") + kAppName,
      QString("<p><b>%1</b> %2</p>"
              "<p>A desktop quoting application over a quote database: it lists the quotes with "
              "their vehicles, opens the Belvane labour and parts editors on a quote, and "
              "stores what changed.</p>")
          .arg(kAppName, BELVANE_VERSION));
}

void QuoteWindow::Report(const std::string& message) {
  lastReport_ = Q(message);
  statusBar()->showMessage(lastReport_);
}

std::string QuoteWindow::OpenLabour(EQuoteEditMode mode) {
  return OpenEditor(mode, data::ItemKind::Labour,
                    [this, mode](data::RecordsetPtr& items, data::QuoteHeader& header) {
                      std::string schedType = header.schedType;
                      state_->forms.ShowLabourForm(
                          items, schedType, header.qtnno, header.subquote, header.make,
                          header.modelId, header.bodyId, header.schedId, header.mtaId,
                          header.thirdId, header.rrRate, header.raRate, header.ptRate,
                          header.defaultSched, header.insurerChanged, mode);
                      if (mode != eEdit || schedType == header.schedType) return std::string();
                      header.schedType = schedType;
                      return " Schedule now " + schedType + ".";
                    });
}

std::string QuoteWindow::OpenParts(EQuoteEditMode mode) {
  return OpenEditor(mode, data::ItemKind::Parts,
                    [this, mode](data::RecordsetPtr& items, data::QuoteHeader& header) {
                      state_->forms.ShowPartsForm(
                          items, header.qtnno, header.subquote, header.make, header.modelId,
                          header.bodyId, header.newMarkup, header.usedMarkup, header.recoreMarkup,
                          header.afterMarketMarkup, header.oldNewMarkup, header.oldUsedMarkup,
                          header.oldRecoreMarkup, header.oldAfterMarketMarkup, mode);
                      return std::string();
                    });
}

std::string QuoteWindow::OpenEditor(EQuoteEditMode mode, data::ItemKind kind,
                                    const EditorCall& open) {
  auto header = store_->GetQuote(CurrentQuote());
  if (!header) return {};
  const std::string qtnno = header->qtnno;
  const std::string schedType = header->schedType;
  std::string message;
  try {
    data::RecordsetPtr items = store_->LoadItems(qtnno, kind);
    const std::string more = open(items, *header);
    if (mode == eEdit) {
      const data::SaveSummary saved = store_->SaveItems(qtnno, *items);
      message = qtnno + ": stored " + std::to_string(saved.inserted) + " new, " +
                std::to_string(saved.updated) + " changed and " + std::to_string(saved.deleted) +
                " deleted records." + more;
      if (header->schedType != schedType) store_->SaveQuote(*header);
    } else {
      message = qtnno + ": viewed, nothing to store.";
    }
  } catch (const Error& e) {
    message = qtnno + ": nothing stored. " + e.Description();
    QMessageBox::critical(this, "Quote not stored",
                          Q("The changes to quote " + qtnno + " were not stored.\n\n" +
                            e.Description() + "\n(error " + std::to_string(e.Number()) + ", " +
                            e.Source() + ")"));
  } catch (const std::exception& e) {
    message = qtnno + ": nothing stored. " + e.what();
    QMessageBox::critical(this, "Quote not stored",
                          Q("The changes to quote " + qtnno + " were not stored.\n\n" + e.what()));
  }
  Reload();
  Report(message);
  return message;
}

} // namespace belvane::quote
