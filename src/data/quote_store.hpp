#pragma once
// The quote store: where a host keeps its quotes and their items, in an
// SQLite database. A host loads a quote's items into a record set, hands the
// record set to the editors, and stores back exactly what changed (new,
// changed and deleted records) in one transaction: all of it or nothing.

#include "data/recordset.hpp"

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace belvane::data {

namespace sqlite {
class Database;
}

// The context of a quote that the editors are opened with.
struct QuoteHeader {
  std::string qtnno;
  std::string subquote = "0";
  std::string customer;
  std::string vehicle; // e.g. "2019 Ford Ranger XLT Dual Cab Ute"
  std::string make;
  std::string modelId;
  std::string bodyId;
  std::string schedType = "NRMA";
  std::string schedId;
  std::string mtaId;
  std::string thirdId;
  double rrRate = 0, raRate = 0, ptRate = 0;
  bool defaultSched = false;
  bool insurerChanged = false;
  double newMarkup = 0, usedMarkup = 0, recoreMarkup = 0, afterMarketMarkup = 0;
  double oldNewMarkup = 0, oldUsedMarkup = 0, oldRecoreMarkup = 0, oldAfterMarketMarkup = 0;
};

enum class ItemKind { Labour, Parts, All };

// What a save did.
struct SaveSummary {
  int inserted = 0;
  int updated = 0;
  int deleted = 0;
};

class QuoteStore {
public:
  // Opens (and creates when missing) the quote database at `path`.
  explicit QuoteStore(const std::string& path);
  ~QuoteStore();
  QuoteStore(const QuoteStore&) = delete;
  QuoteStore& operator=(const QuoteStore&) = delete;

  const std::string& Path() const { return path_; }

  std::vector<QuoteHeader> ListQuotes();
  std::optional<QuoteHeader> GetQuote(const std::string& qtnno);
  // Inserts the quote, or updates its header in place (its items stay).
  void SaveQuote(const QuoteHeader& header);

  // A new record set of the quote's items (labour: categories R&R, RA and
  // PAINT; parts: PRT), ordered by item number then id, all unchanged.
  RecordsetPtr LoadItems(const std::string& qtnno, ItemKind kind);

  // The empty record set of quote items, with every field typed.
  static RecordsetPtr NewItemRecordset();

  // Stores what changed in `items` for quote `qtnno` in one transaction:
  // new records are inserted (and get their ITEMID), changed ones updated,
  // deleted ones removed. On success the record set's changes are accepted.
  // On failure nothing is stored, the record set is left as it was and the
  // error says why.
  SaveSummary SaveItems(const std::string& qtnno, Recordset& items);

private:
  void Exec(const char* sql);
  void RenumberOutOfRangeIds(const std::string& qtnno);
  std::unique_ptr<sqlite::Database> db_;
  std::string path_;
};

} // namespace belvane::data
