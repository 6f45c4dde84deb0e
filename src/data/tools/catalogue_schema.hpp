#pragma once
// The tables of a catalogue database, as the catalogue tools create them and
// the SQLite catalogue service reads them (docs/catalogue.md).

#include <string>
#include <string_view>
#include <vector>

namespace belvane::data::sqlite {
class Database;
}

namespace belvane::data::tools {

struct ColumnDef {
  std::string name;
  std::string declaration; // type and constraints, as in CREATE TABLE
};

struct TableDef {
  std::string name;
  std::vector<ColumnDef> columns;
  std::string constraints;          // table constraints after the columns, or ""
  std::vector<std::string> indexes; // CREATE INDEX statements
};

// Every table of a catalogue, in the order the tools fill them.
const std::vector<TableDef>& CatalogueTables();
// The table of that name (without regard to case), or nullptr.
const TableDef* FindCatalogueTable(std::string_view name);

// The table that lists the enciphered columns: CIPHER_COLUMN(table_name,
// column_name, rule). rule "always": every value that is not blank is
// enciphered; "long": a value of 16 or more characters is enciphered and a
// shorter one is a plain number (the labour hours).
inline constexpr const char* kCipherColumnTable = "CIPHER_COLUMN";

enum class CipherRule { Always, Long };
struct CipherColumn {
  std::string table;
  std::string column;
  CipherRule rule;
};
// The enciphered columns of the standard tables.
const std::vector<CipherColumn>& StandardCipherColumns();
const char* CipherRuleName(CipherRule rule);

// Creates every table but those in `omit` (without indexes) and the list of
// enciphered columns.
void CreateCatalogueTables(sqlite::Database& db, const std::vector<std::string>& omit = {});
// Creates the indexes of the tables that exist; done after a bulk load,
// which is faster.
void CreateCatalogueIndexes(sqlite::Database& db);

// The CREATE TABLE statement of a table.
std::string CreateTableSql(const TableDef& table);
// A column name as an SQL identifier ("Group" needs quotes).
std::string QuoteName(std::string_view name);

} // namespace belvane::data::tools
