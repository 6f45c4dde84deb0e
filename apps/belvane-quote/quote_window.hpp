#pragma once
// The demo host's main window: the quotes of the database with their
// vehicles, the selected quote's context, buttons that open the labour
// or parts editor in edit or view mode, and the quote's labour lines, parts and
// totals (labour, parts at cost and with markup, margin), read again from
// the database after each edit. A menu opens another quote database, quits,
// lists the keys and tells what the program is; the status bar sums up the
// selected quote and says what the last editor session did.
//
// An edit runs as a host does it: the quote's items are loaded into a
// record set, CForms opens the editor over it (blocking until the
// estimator closes it), and what changed is stored in one transaction. A
// failure stores nothing and says why.

#include "host/component_state.hpp"

#include <QMainWindow>
#include <QString>

#include <functional>
#include <memory>
#include <string>

class QAction;
class QLabel;
class QPushButton;
class QTableWidget;

namespace belvane::data {
class QuoteStore;
class Recordset;
struct QuoteHeader;
enum class ItemKind;
using RecordsetPtr = std::shared_ptr<Recordset>;
} // namespace belvane::data

namespace belvane::quote {

class QuoteWindow : public QMainWindow {
  Q_OBJECT
public:
  explicit QuoteWindow(data::QuoteStore& store, QWidget* parent = nullptr);
  ~QuoteWindow() override;

  // Reads the quote list again, keeping the selection where it can. The
  // columns are sized to their contents on the first fill only: widths the
  // estimator set stay.
  void Reload();
  bool SelectQuote(const std::string& qtnno);
  std::string CurrentQuote() const;
  // The labour editor over the selected quote; returns what was done (also
  // shown in the status bar).
  std::string OpenLabour(EQuoteEditMode mode);
  // The parts editor over the selected quote's parts, likewise.
  std::string OpenParts(EQuoteEditMode mode);
  data::QuoteStore& Store() const noexcept { return *store_; }
  // Shows the quotes of the quote database at `path` instead. A file that
  // is not a quote database is left untouched: a message box says why and
  // the current database stays. Returns whether the window switched.
  bool OpenDatabase(const std::string& path);
  // The reference of the host's keys and mouse actions (Help > Keys).
  static QString KeysText();

  QPushButton* EditLabourButton() const noexcept { return editLabour_; }
  QPushButton* ViewLabourButton() const noexcept { return viewLabour_; }
  QPushButton* EditPartsButton() const noexcept { return editParts_; }
  QPushButton* ViewPartsButton() const noexcept { return viewParts_; }
  QTableWidget* QuoteList() const noexcept { return quotes_; }
  QTableWidget* Lines() const noexcept { return lines_; }
  QTableWidget* Parts() const noexcept { return parts_; }
  QTableWidget* Totals() const noexcept { return totals_; }
  // The selected quote in the status bar.
  QLabel* QuoteStatus() const noexcept { return quoteStatus_; }
  QAction* OpenAction() const noexcept { return open_; }
  QAction* QuitAction() const noexcept { return quit_; }
  QAction* KeysAction() const noexcept { return keys_; }
  QAction* AboutAction() const noexcept { return about_; }

protected:
  // Enter or Return on the quote list opens the quote's labour to edit.
  bool eventFilter(QObject* watched, QEvent* event) override;

private:
  void MakeMenus();
  void ShowQuote();
  void ChooseDatabase(); // File > Open quote database...
  void ShowKeys();
  void ShowAbout();
  // Loads the quote's items of one kind, runs an editor over them (`open`
  // returns what more it has to report) and, in edit mode, stores what
  // changed; a failure stores nothing and says why.
  using EditorCall = std::function<std::string(data::RecordsetPtr&, data::QuoteHeader&)>;
  std::string OpenEditor(EQuoteEditMode mode, data::ItemKind kind, const EditorCall& open);
  void Report(const std::string& message);

  struct State;                              // the quote list and CForms
  data::QuoteStore* store_;                  // the database shown
  std::unique_ptr<data::QuoteStore> opened_; // one opened from the menu
  std::unique_ptr<State> state_;
  bool columnsSized_ = false;
  QTableWidget* quotes_;
  QLabel* title_;
  QLabel* vehicle_;
  QLabel* context_;
  QPushButton* editLabour_;
  QPushButton* viewLabour_;
  QPushButton* editParts_;
  QPushButton* viewParts_;
  QTableWidget* lines_;
  QTableWidget* parts_;
  QTableWidget* totals_;
  QLabel* quoteStatus_;
  QString lastReport_; // what the last editor session (or database change) did
  QAction* open_;
  QAction* quit_;
  QAction* keys_;
  QAction* about_;
};

} // namespace belvane::quote
