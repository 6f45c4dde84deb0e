#include "data/quote_store.hpp"

#include "data/sqlite/sqlite_db.hpp"

#include "text/error.hpp"

#include <sqlite3.h>

#include <array>

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
  Statement st(*db_, std::string("INSERT OR REPLACE INTO quotes (") + kQuoteColumns +
                         ") VALUES (?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?,?)");
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

RecordsetPtr QuoteStore::LoadItems(const std::string& qtnno, ItemKind kind) {
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
  insertSql += ") VALUES (" + values + ")";
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
        st.Bind(static_cast<int>(i), v);
      }
    };
    for (size_t rec = 0; rec < items.StoredCount(); ++rec) {
      switch (items.StoredStatus(rec)) {
      case RecordStatus::Unchanged:
      case RecordStatus::Discarded:
        break;
      case RecordStatus::New:
        bindFields(insert, rec);
        insert.Step();
        insert.Reset();
        assigned.emplace_back(rec, static_cast<int32_t>(sqlite3_last_insert_rowid(db_->Handle())));
        ++summary.inserted;
        break;
      case RecordStatus::Modified: {
        Value id = items.StoredOriginal(rec, idField);
        if (id.IsNull()) id = items.StoredValue(rec, idField);
        if (id.IsNull()) { // changed but never stored: store it as new
          bindFields(insert, rec);
          insert.Step();
          insert.Reset();
          assigned.emplace_back(rec,
                                static_cast<int32_t>(sqlite3_last_insert_rowid(db_->Handle())));
          ++summary.inserted;
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
        remove.Reset();
        ++summary.deleted;
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
