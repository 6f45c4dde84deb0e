#pragma once
// Writing a whole catalogue into a PostgreSQL database, for the PostgreSQL
// catalogue service. The tables are made with lower-case names (see the
// "PostgreSQL" section of docs/catalogue.md).

#include "data/tools/catalogue_schema.hpp"
#include "data/tools/catalogue_writer.hpp"

#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace belvane::data::postgres {
class Connection;
}

namespace belvane::data::tools {

// The CREATE TABLE statement of a catalogue table in PostgreSQL: names in
// lower case, the types PostgreSQL has, and on the tables read in catalogue
// order a row_no column numbering the rows as they were loaded.
std::string PostgresCreateTableSql(const TableDef& table);

// Replaces the catalogue in the database (the first schema of its search
// path) in one transaction: the catalogue tables there are dropped and made
// again, and the rows go in. Commit creates the indexes and commits; without
// Commit the database keeps the catalogue it had.
class PostgresCatalogueWriter final : public CatalogueWriter {
public:
  // `conninfo`: a libpq connection string or URI. `omitTables`: tables not
  // to create (tests of a catalogue that lacks one); rows for them are
  // dropped.
  explicit PostgresCatalogueWriter(const std::string& conninfo,
                                   std::vector<std::string> omitTables = {});
  ~PostgresCatalogueWriter() override;

  void Insert(std::string_view table, const std::vector<Value>& row) override;
  void Commit();

private:
  bool Omitted(std::string_view table) const;

  std::unique_ptr<postgres::Connection> db_;
  // The INSERT statement of each table, by name as given.
  std::map<std::string, std::pair<std::string, size_t>, std::less<>> inserts_;
  std::vector<std::string> omit_;
};

} // namespace belvane::data::tools
