#include "data/tools/pg_catalogue_writer.hpp"

#include "data/catalogue.hpp"
#include "data/postgres/pg_db.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

namespace belvane::data::tools {

namespace {

// The tables whose rows the catalogue service reads in the order they were
// loaded.
bool KeepsLoadOrder(std::string_view table) {
  return text::EqualsNoCase(table, "LABOUR_ITEM") || text::EqualsNoCase(table, "VEHICLE_PART");
}

std::string LowerName(std::string_view name) { return QuoteName(text::LCase(std::string(name))); }

// A column declaration of the schema in PostgreSQL's terms: an untyped
// column (a value that is a number or enciphered text) is text, REAL is
// double precision, and NOCASE collation goes (the service compares the
// makes with lower()).
std::string Declaration(std::string decl) {
  if (decl.empty()) return "TEXT";
  for (std::string_view nocase : {" COLLATE NOCASE", "COLLATE NOCASE"})
    for (size_t at; (at = text::UCase(decl).find(nocase)) != std::string::npos;)
      decl.erase(at, nocase.size());
  if (text::UCase(decl).starts_with("REAL")) decl = "DOUBLE PRECISION" + decl.substr(4);
  return decl;
}

} // namespace

std::string PostgresCreateTableSql(const TableDef& table) {
  std::string sql = "CREATE TABLE " + LowerName(table.name) + " (";
  for (size_t i = 0; i < table.columns.size(); ++i) {
    if (i) sql += ", ";
    sql += LowerName(table.columns[i].name) + " " + Declaration(table.columns[i].declaration);
  }
  if (KeepsLoadOrder(table.name)) sql += ", row_no INTEGER GENERATED ALWAYS AS IDENTITY";
  if (!table.constraints.empty()) sql += ", " + table.constraints;
  return sql + ")";
}

PostgresCatalogueWriter::PostgresCatalogueWriter(const std::string& conninfo,
                                                 std::vector<std::string> omitTables)
    : db_(std::make_unique<postgres::Connection>(conninfo)), omit_(std::move(omitTables)) {
  db_->Exec("BEGIN");
  for (const TableDef& t : CatalogueTables())
    db_->Exec("DROP TABLE IF EXISTS " + LowerName(t.name));
  for (const TableDef& t : CatalogueTables())
    if (!Omitted(t.name)) db_->Exec(PostgresCreateTableSql(t));
  if (Omitted(kCipherColumnTable)) return;
  for (const CipherColumn& c : StandardCipherColumns())
    if (!Omitted(c.table))
      db_->Exec("INSERT INTO cipher_column (table_name, column_name, rule) VALUES ($1, $2, $3)",
                {c.table, c.column, std::string(CipherRuleName(c.rule))});
}

// Closing the connection without Commit rolls the transaction back.
PostgresCatalogueWriter::~PostgresCatalogueWriter() = default;

bool PostgresCatalogueWriter::Omitted(std::string_view table) const {
  for (const std::string& o : omit_)
    if (text::EqualsNoCase(o, table)) return true;
  return false;
}

void PostgresCatalogueWriter::Insert(std::string_view table, const std::vector<Value>& row) {
  if (Omitted(table)) return;
  auto it = inserts_.find(table);
  if (it == inserts_.end()) {
    const TableDef* def = FindCatalogueTable(table);
    if (!def) db_->Fail(err::kNoSuchTable, "no such catalogue table: " + std::string(table));
    std::string sql = "INSERT INTO " + LowerName(def->name) + " (";
    std::string values;
    for (size_t i = 0; i < def->columns.size(); ++i) {
      sql += (i ? ", " : "") + LowerName(def->columns[i].name);
      values += (i ? ", $" : "$") + std::to_string(i + 1);
    }
    sql += ") VALUES (" + values + ")";
    it = inserts_.emplace(std::string(table), std::make_pair(sql, def->columns.size())).first;
  }
  const auto& [sql, count] = it->second;
  if (row.size() != count)
    db_->Fail(err::kInvalidCall,
              "a row of " + std::string(table) + " has " + std::to_string(row.size()) + " values");
  std::vector<postgres::Param> params;
  params.reserve(row.size());
  for (const Value& v : row)
    params.push_back(postgres::ToParam(v));
  db_->Exec(sql, params, "a row of " + std::string(table));
}

void PostgresCatalogueWriter::Commit() {
  // The schema's index statements name tables and columns unquoted, so they
  // fold to the lower-case names as they are.
  for (const TableDef& t : CatalogueTables())
    if (!Omitted(t.name))
      for (const std::string& index : t.indexes)
        db_->Exec(index);
  db_->Exec("COMMIT");
  db_.reset();
}

} // namespace belvane::data::tools
