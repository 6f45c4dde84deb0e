#include "data/tools/catalogue_schema.hpp"

#include "data/sqlite/sqlite_db.hpp"
#include "text/strings.hpp"

namespace belvane::data::tools {

namespace {

std::vector<TableDef> MakeTables() {
  return {
      {"ALLMODEL",
       {{"MODEL_ID", "INTEGER PRIMARY KEY"},
        {"MAKE", "TEXT NOT NULL COLLATE NOCASE"},
        {"MODEL", "TEXT NOT NULL"},
        {"SERIES", "TEXT"},
        {"YEAR_FROM", "SMALLINT"},
        {"YEAR_TO", "SMALLINT"},
        {"cat_no", "TEXT"},
        {"NRMA_ID", "TEXT"},
        {"MTA_ID", "TEXT"},
        {"THIRD_ID", "TEXT"}},
       "",
       {}},
      {"BODY",
       {{"BODY_ID", "TEXT PRIMARY KEY"},
        {"MODEL_ID", "INTEGER NOT NULL"},
        {"BODY", "TEXT NOT NULL"}},
       "",
       {"CREATE INDEX BODY_MODEL ON BODY (MODEL_ID)"}},
      {"cinfo", {{"State", "SMALLINT NOT NULL"}, {"NAME", "TEXT"}, {"ISSUED", "TEXT"}}, "", {}},
      {"ITEM_2",
       {{"ItemNo", "TEXT NOT NULL"},
        {"Script", "TEXT"},
        {"CATEGORY", "TEXT NOT NULL"},
        {"SIDE", "TEXT"},
        {"Group", "TEXT"}},
       "",
       {"CREATE INDEX ITEM_2_CATEGORY ON ITEM_2 (CATEGORY)"}},
      // rrhour and pthour have no declared type on purpose: a value keeps the
      // kind it was stored with, a plain number or enciphered text.
      {"LABOUR_ITEM",
       {{"schedule", "SMALLINT NOT NULL CHECK (schedule BETWEEN 0 AND 3)"},
        {"sched_id", "TEXT NOT NULL"},
        {"body_id", "TEXT"},
        {"ItemNo", "TEXT NOT NULL"},
        {"Script", "TEXT"},
        {"rrhour", ""},
        {"pthour", ""},
        {"allow_tick", "SMALLINT CHECK (allow_tick BETWEEN 0 AND 7)"}},
       "",
       {"CREATE INDEX LABOUR_ITEM_KEY ON LABOUR_ITEM (schedule, sched_id)"}},
      {"VEHICLE_PART",
       {{"make", "TEXT NOT NULL COLLATE NOCASE"},
        {"cat_no", "TEXT NOT NULL"},
        {"body_id", "TEXT"},
        {"state", "SMALLINT"},
        {"ItemNo", "TEXT NOT NULL"},
        {"PARTNAME", "TEXT"},
        {"Script", "TEXT"},
        {"SIDE", "TEXT"},
        {"QTY", "INTEGER"},
        {"unitcost", "REAL"},
        {"partno", "TEXT"},
        {"Group", "TEXT"}},
       "",
       {"CREATE INDEX VEHICLE_PART_KEY ON VEHICLE_PART (cat_no, make)"}},
      {"DIAGRAM_MAKE", {{"make", "TEXT PRIMARY KEY COLLATE NOCASE"}}, "", {}},
      {kCipherColumnTable,
       {{"table_name", "TEXT NOT NULL COLLATE NOCASE"},
        {"column_name", "TEXT NOT NULL COLLATE NOCASE"},
        {"rule", "TEXT NOT NULL CHECK (rule IN ('always', 'long'))"}},
       "PRIMARY KEY (table_name, column_name)",
       {}},
  };
}

} // namespace

const std::vector<TableDef>& CatalogueTables() {
  static const std::vector<TableDef> tables = MakeTables();
  return tables;
}

const TableDef* FindCatalogueTable(std::string_view name) {
  for (const TableDef& t : CatalogueTables())
    if (text::EqualsNoCase(t.name, name)) return &t;
  return nullptr;
}

const std::vector<CipherColumn>& StandardCipherColumns() {
  static const std::vector<CipherColumn> columns = {
      {"LABOUR_ITEM", "rrhour", CipherRule::Long},
      {"LABOUR_ITEM", "pthour", CipherRule::Long},
      {"VEHICLE_PART", "PARTNAME", CipherRule::Always},
      {"VEHICLE_PART", "partno", CipherRule::Always},
      {"VEHICLE_PART", "Group", CipherRule::Always},
  };
  return columns;
}

const char* CipherRuleName(CipherRule rule) { return rule == CipherRule::Long ? "long" : "always"; }

std::string QuoteName(std::string_view name) {
  std::string q = "\"";
  for (char c : name) {
    if (c == '"') q += '"';
    q += c;
  }
  return q + "\"";
}

std::string CreateTableSql(const TableDef& table) {
  std::string sql = "CREATE TABLE " + QuoteName(table.name) + " (";
  for (size_t i = 0; i < table.columns.size(); ++i) {
    if (i) sql += ", ";
    sql += QuoteName(table.columns[i].name);
    if (!table.columns[i].declaration.empty()) sql += " " + table.columns[i].declaration;
  }
  if (!table.constraints.empty()) sql += ", " + table.constraints;
  return sql + ")";
}

void CreateCatalogueTables(sqlite::Database& db, const std::vector<std::string>& omit) {
  auto omitted = [&omit](std::string_view name) {
    for (const std::string& o : omit)
      if (text::EqualsNoCase(o, name)) return true;
    return false;
  };
  for (const TableDef& t : CatalogueTables())
    if (!omitted(t.name)) db.Exec(CreateTableSql(t));
  if (omitted(kCipherColumnTable)) return;
  sqlite::Statement insert(db, "INSERT INTO CIPHER_COLUMN (table_name, column_name, rule) "
                               "VALUES (?1, ?2, ?3)");
  for (const CipherColumn& c : StandardCipherColumns()) {
    if (omitted(c.table)) continue;
    insert.BindText(1, c.table);
    insert.BindText(2, c.column);
    insert.BindText(3, CipherRuleName(c.rule));
    insert.Step();
    insert.Reset();
  }
}

void CreateCatalogueIndexes(sqlite::Database& db) {
  for (const TableDef& t : CatalogueTables())
    if (db.HasTable(t.name))
      for (const std::string& index : t.indexes)
        db.Exec(index);
}

} // namespace belvane::data::tools
