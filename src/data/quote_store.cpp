#include "data/quote_store.hpp"

#include "data/sqlite/sqlite_db.hpp"

#include "text/error.hpp"
#include "text/strings.hpp"

#include <sqlite3.h>

#include <array>
#include <string_view>

namespace belvane::data {

namespace {

constexpr const char* kSource = "Belvane.QuoteStore";

struct ItemField {
  const char* name;
  DataType type;
  const char* sqlType;
};

// The quote item fields, in record set order. ITEMID is the table's key.
constexpr std::array<ItemField, 21> kItemFields{{
    {"ITEMID", DataType::Integer, "INTEGER PRIMARY KEY AUTOINCREMENT"},
    {"DELITEM", DataType::Boolean, "INTEGER NOT NULL DEFAULT 0"},
    {"tag", DataType::VarWChar, "TEXT"},
    {"qtnno", DataType::VarWChar, "TEXT NOT NULL"},
    {"subquote", DataType::VarWChar, "TEXT"},
    {"itemno", DataType::VarWChar, "TEXT"},
    {"script", DataType::VarWChar, "TEXT"},
    {"Category", DataType::VarWChar, "TEXT"},
    {"rrhour", DataType::Double, "REAL"},
    {"rahour", DataType::Double, "REAL"},
    {"pthour", DataType::Double, "REAL"},
    {"report_on", DataType::SmallInt, "INTEGER"},
    {"blend", DataType::SmallInt, "INTEGER"},
    {"allow_tick", DataType::VarWChar, "TEXT"},
    {"Rev", DataType::VarWChar, "TEXT"},
    {"rr_rate2", DataType::Double, "REAL"},
    {"partno", DataType::VarWChar, "TEXT"},
    {"side", DataType::VarWChar, "TEXT"},
    {"mark", DataType::VarWChar, "TEXT"},
    {"qty", DataType::Double, "REAL"},
    {"unitcost", DataType::Double, "REAL"},
}};

using sqlite::Statement;

constexpr size_t kDelItemField = 1;
constexpr size_t kAllowField = 13;

// Names a quote item in a message: its item number, description and kind.
std::string DescribeItem(const Recordset& items, size_t rec, const std::vector<size_t>& fieldOf) {
  auto text = [&](size_t i) { return items.StoredValue(rec, fieldOf[i]).ToText(); };
  std::string itemNo = text(5), script = text(6), category = text(7);
  std::string out = "Quote item " + (itemNo.empty() ? std::string("(no item number)") : itemNo);
  if (!script.empty()) out += " \"" + script + "\"";
  if (!category.empty()) out += " (" + category + ")";
  return out;
}

// The value stored for column `i`: converted to the column's type, so the
// database holds only what the loaders read back. A new record's DELITEM
// left Null is stored as False; the allow mask must be a whole number from
// 0 to 7 or Null.
Value StorableValue(const Value& v, size_t i) {
  if (i == kDelItemField && v.IsNull()) return Value(false);
  Value converted = v.ConvertTo(kItemFields[i].type);
  if (i == kAllowField && !converted.IsNull()) {
    int32_t mask = -1;
    try {
      mask = Value(converted).ToInt32();
    } catch (const Error&) {
    }
    if (mask < 0 || mask > 7 || text::Trim(converted.ToText()) != std::to_string(mask))
      throw Error(err::kTypeMismatch,
                  "the allowed operations must be a whole number from 0 to 7, not \"" +
                      converted.ToText() + "\"",
                  kSource);
  }
  return converted;
}

double DoubleAt(const Statement& st, int i) {
  Value v = st.Column(i);
  return v.IsNull() ? 0.0 : v.ToDouble();
}

constexpr const char* kQuoteColumns =
    "qtnno, subquote, customer, vehicle, make, model_id, body_id, sched_type, sched_id, mta_id, "
    "third_id, rr_rate, ra_rate, pt_rate, default_sched, insurer_changed, new_markup, "
    "used_markup, recore_markup, aftermarket_markup, old_new_markup, old_used_markup, "
    "old_recore_markup, old_aftermarket_markup";

QuoteHeader ReadHeader(const Statement& st) {
  QuoteHeader h;
  int i = 0;
  h.qtnno = st.Column(i++).ToText();
  h.subquote = st.Column(i++).ToText();
  h.customer = st.Column(i++).ToText();
  h.vehicle = st.Column(i++).ToText();
  h.make = st.Column(i++).ToText();
  h.modelId = st.Column(i++).ToText();
  h.bodyId = st.Column(i++).ToText();
  h.schedType = st.Column(i++).ToText();
  h.schedId = st.Column(i++).ToText();
  h.mtaId = st.Column(i++).ToText();
  h.thirdId = st.Column(i++).ToText();
  h.rrRate = DoubleAt(st, i++);
  h.raRate = DoubleAt(st, i++);
  h.ptRate = DoubleAt(st, i++);
  h.defaultSched = DoubleAt(st, i++) != 0;
  h.insurerChanged = DoubleAt(st, i++) != 0;
  h.newMarkup = DoubleAt(st, i++);
  h.usedMarkup = DoubleAt(st, i++);
  h.recoreMarkup = DoubleAt(st, i++);
  h.afterMarketMarkup = DoubleAt(st, i++);
  h.oldNewMarkup = DoubleAt(st, i++);
  h.oldUsedMarkup = DoubleAt(st, i++);
  h.oldRecoreMarkup = DoubleAt(st, i++);
  h.oldAfterMarketMarkup = DoubleAt(st, i++);
  return h;
}

} // namespace

QuoteStore::QuoteStore(const std::string& path)
    : db_(std::make_unique<sqlite::Database>(path, sqlite::Database::Mode::Create, "Quote database",
                                             kSource)),
      path_(path) {
  Exec("PRAGMA foreign_keys = ON");
  Exec("CREATE TABLE IF NOT EXISTS quotes ("
       "qtnno TEXT PRIMARY KEY, subquote TEXT, customer TEXT, vehicle TEXT, make TEXT, "
       "model_id TEXT, body_id TEXT, sched_type TEXT, sched_id TEXT, mta_id TEXT, third_id TEXT, "
       "rr_rate REAL, ra_rate REAL, pt_rate REAL, default_sched INTEGER, insurer_changed INTEGER, "
       "new_markup REAL, used_markup REAL, recore_markup REAL, aftermarket_markup REAL, "
       "old_new_markup REAL, old_used_markup REAL, old_recore_markup REAL, "
       "old_aftermarket_markup REAL)");
  std::string items = "CREATE TABLE IF NOT EXISTS quote_items (";
  for (size_t i = 0; i < kItemFields.size(); ++i) {
    if (i) items += ", ";
    items += std::string(kItemFields[i].name) + " " + kItemFields[i].sqlType;
  }
  items += ", FOREIGN KEY (qtnno) REFERENCES quotes(qtnno) ON DELETE CASCADE)";
  Exec(items.c_str());
  Exec("CREATE INDEX IF NOT EXISTS quote_items_qtnno ON quote_items(qtnno)");
}

QuoteStore::~QuoteStore() = default;

void QuoteStore::Exec(const char* sql) { db_->Exec(sql); }

std::vector<QuoteHeader> QuoteStore::ListQuotes() {
  Statement st(*db_, std::string("SELECT ") + kQuoteColumns + " FROM quotes ORDER BY qtnno");
  std::vector<QuoteHeader> out;
  while (st.Step())
    out.push_back(ReadHeader(st));
  return out;
}

std::optional<QuoteHeader> QuoteStore::GetQuote(const std::string& qtnno) {
  Statement st(*db_, std::string("SELECT ") + kQuoteColumns + " FROM quotes WHERE qtnno = ?");
  st.BindText(1, qtnno);
  if (!st.Step()) return std::nullopt;
  return ReadHeader(st);
}

void QuoteStore::SaveQuote(const QuoteHeader& h) {
  // The header is saved in place: replacing the row would delete it first,
  // and with it (through the items' foreign key) every item of the quote.
  std::string sql = std::string("INSERT INTO quotes (") + kQuoteColumns +
                    ") VALUES (?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?) "
                    "ON CONFLICT(qtnno) DO UPDATE SET ";
  {
    std::string_view columns(kQuoteColumns);
    bool first = true;
    while (!columns.empty()) {
      const size_t comma = columns.find(',');
      std::string_view name = columns.substr(0, comma);
      while (!name.empty() && name.front() == ' ')
        name.remove_prefix(1);
      if (name != "qtnno") {
        if (!first) sql += ", ";
        sql += std::string(name) + " = excluded." + std::string(name);
        first = false;
      }
      if (comma == std::string_view::npos) break;
      columns.remove_prefix(comma + 1);
    }
  }
  Statement st(*db_, sql);
  int i = 1;
  for (const std::string* s : {&h.qtnno, &h.subquote, &h.customer, &h.vehicle, &h.make, &h.modelId,
                               &h.bodyId, &h.schedType, &h.schedId, &h.mtaId, &h.thirdId})
    st.BindText(i++, *s);
  for (double d :
       {h.rrRate, h.raRate, h.ptRate, h.defaultSched ? 1.0 : 0.0, h.insurerChanged ? 1.0 : 0.0,
        h.newMarkup, h.usedMarkup, h.recoreMarkup, h.afterMarketMarkup, h.oldNewMarkup,
        h.oldUsedMarkup, h.oldRecoreMarkup, h.oldAfterMarketMarkup})
    st.Bind(i++, Value(d));
  st.Step();
}

RecordsetPtr QuoteStore::NewItemRecordset() {
  auto rs = std::make_shared<Recordset>();
  for (const auto& f : kItemFields)
    rs->Fields().Append(f.name, f.type);
  rs->Open();
  return rs;
}

void QuoteStore::RenumberOutOfRangeIds(const std::string& qtnno) {
  // Items stored with an id beyond the record set's 32-bit ITEMID (written
  // by another program) get the next free id that fits, so the quote opens
  // and its items can be found again by the editors.
  Statement outside(*db_, "SELECT ITEMID FROM quote_items WHERE qtnno = ? AND "
                          "(ITEMID > 2147483647 OR ITEMID < -2147483648)");
  outside.BindText(1, qtnno);
  std::vector<long long> ids;
  while (outside.Step())
    ids.push_back(outside.ColumnInt64(0));
  if (ids.empty()) return;
  Exec("BEGIN IMMEDIATE");
  try {
    Statement next(*db_, "SELECT COALESCE(MAX(ITEMID), 0) + 1 FROM quote_items "
                         "WHERE ITEMID <= 2147483647");
    Statement move(*db_, "UPDATE quote_items SET ITEMID = ? WHERE ITEMID = ?");
    for (long long old : ids) {
      next.Reset();
      next.Step();
      const long long id = next.ColumnInt64(0);
      if (id > 2147483647LL)
        throw Error(err::kOverflow, "The quote database has run out of item numbers", kSource);
      move.Reset();
      move.BindInt(1, id);
      move.BindInt(2, old);
      move.Step();
    }
    Exec("COMMIT");
  } catch (...) {
    sqlite3_exec(db_->Handle(), "ROLLBACK", nullptr, nullptr, nullptr);
    throw;
  }
}

RecordsetPtr QuoteStore::LoadItems(const std::string& qtnno, ItemKind kind) {
  RenumberOutOfRangeIds(qtnno);
  std::string sql = "SELECT ";
  for (size_t i = 0; i < kItemFields.size(); ++i) {
    if (i) sql += ", ";
    sql += kItemFields[i].name;
  }
  sql += " FROM quote_items WHERE qtnno = ?";
  if (kind == ItemKind::Labour) sql += " AND Category IN ('R&R', 'RA', 'PAINT')";
  if (kind == ItemKind::Parts) sql += " AND Category = 'PRT'";
  // A labour line's records stay together in R&R, RA, PAINT order.
  sql += " ORDER BY itemno, script, CASE Category WHEN 'R&R' THEN 0 WHEN 'RA' THEN 1 "
         "WHEN 'PAINT' THEN 2 ELSE 3 END, ITEMID";
  Statement st(*db_, sql);
  st.BindText(1, qtnno);
  auto rs = NewItemRecordset();
  while (st.Step()) {
    std::vector<Value> values;
    values.reserve(kItemFields.size());
    for (size_t i = 0; i < kItemFields.size(); ++i)
      values.push_back(st.Column(static_cast<int>(i)));
    rs->AppendLoaded(std::move(values));
  }
  rs->MoveFirst();
  return rs;
}

SaveSummary QuoteStore::SaveItems(const std::string& qtnno, Recordset& items) {
  // Map the record set's fields onto the table's columns by name; fields the
  // table lacks are an error rather than silently dropped data.
  std::vector<size_t> fieldOf(kItemFields.size());
  for (size_t i = 0; i < kItemFields.size(); ++i) {
    auto idx = items.Fields().IndexOf(kItemFields[i].name);
    if (!idx)
      throw Error(err::kItemNotFound,
                  std::string("The record set has no field \"") + kItemFields[i].name + "\"",
                  kSource);
    fieldOf[i] = *idx;
  }
  const size_t idField = fieldOf[0];

  std::string insertSql = "INSERT INTO quote_items (";
  std::string updateSql = "UPDATE quote_items SET ";
  std::string values;
  for (size_t i = 1; i < kItemFields.size(); ++i) {
    if (i > 1) {
      insertSql += ", ";
      values += ", ";
      updateSql += ", ";
    }
    insertSql += kItemFields[i].name;
    values += "?";
    updateSql += std::string(kItemFields[i].name) + " = ?";
  }
  insertSql += ", ITEMID) VALUES (" + values + ", ?)";
  updateSql += " WHERE ITEMID = ? AND qtnno = ?";

  SaveSummary summary;
  std::vector<std::pair<size_t, int32_t>> assigned;
  Exec("BEGIN IMMEDIATE");
  try {
    Statement insert(*db_, insertSql), update(*db_, updateSql);
    Statement remove(*db_, "DELETE FROM quote_items WHERE ITEMID = ? AND qtnno = ?");
    auto bindFields = [&](Statement& st, size_t rec) {
      for (size_t i = 1; i < kItemFields.size(); ++i) {
        Value v = items.StoredValue(rec, fieldOf[i]);
        if (i == 3) v = Value(qtnno); // the quote the items belong to
        try {
          st.Bind(static_cast<int>(i), StorableValue(v, i));
        } catch (const Error& e) {
          throw Error(e.Number(),
                      DescribeItem(items, rec, fieldOf) + ": \"" + v.ToText() +
                          "\" cannot be stored as its " + kItemFields[i].name + " (" +
                          e.Description() + "). Nothing was saved.",
                      kSource);
        }
      }
    };
    // A new record gets the next id that fits the record set's 32-bit
    // ITEMID; the store never hands out one that would be cut short.
    Statement nextId(*db_, "SELECT COALESCE(MAX(ITEMID), 0) + 1 FROM quote_items "
                           "WHERE ITEMID <= 2147483647");
    auto insertNew = [&](size_t rec) {
      nextId.Reset();
      nextId.Step();
      const double id = nextId.Column(0).ToDouble();
      if (id > 2147483647.0)
        throw Error(err::kOverflow,
                    "The quote database has run out of item numbers; nothing was saved", kSource);
      bindFields(insert, rec);
      insert.Bind(static_cast<int>(kItemFields.size()), Value(static_cast<int32_t>(id)));
      insert.Step();
      insert.Reset();
      assigned.emplace_back(rec, static_cast<int32_t>(id));
      ++summary.inserted;
    };
    for (size_t rec = 0; rec < items.StoredCount(); ++rec) {
      switch (items.StoredStatus(rec)) {
      case RecordStatus::Unchanged:
      case RecordStatus::Discarded:
        break;
      case RecordStatus::New:
        insertNew(rec);
        break;
      case RecordStatus::Modified: {
        Value id = items.StoredOriginal(rec, idField);
        if (id.IsNull()) id = items.StoredValue(rec, idField);
        if (id.IsNull()) { // changed but never stored: store it as new
          insertNew(rec);
          break;
        }
        bindFields(update, rec);
        update.Bind(static_cast<int>(kItemFields.size()), id);
        update.Bind(static_cast<int>(kItemFields.size()) + 1, Value(qtnno));
        update.Step();
        if (sqlite3_changes(db_->Handle()) != 1)
          throw Error(err::kDataService,
                      "Quote item " + id.ToText() + " of quote " + qtnno +
                          " is no longer in the database",
                      kSource);
        update.Reset();
        ++summary.updated;
        break;
      }
      case RecordStatus::Deleted: {
        Value id = items.StoredOriginal(rec, idField);
        if (id.IsNull()) break;
        remove.Bind(1, id);
        remove.Bind(2, Value(qtnno));
        remove.Step();
        summary.deleted += sqlite3_changes(db_->Handle());
        remove.Reset();
        break;
      }
      }
    }
    Exec("COMMIT");
  } catch (...) {
    sqlite3_exec(db_->Handle(), "ROLLBACK", nullptr, nullptr, nullptr);
    throw;
  }
  for (auto [rec, id] : assigned)
    items.StoredAssign(rec, idField, Value(id));
  items.AcceptChanges();
  return summary;
}

} // namespace belvane::data
