#pragma once
// Writing a whole catalogue: the sample generator and the contract tests
// fill a catalogue through a CatalogueWriter, so that another backend can be
// filled from the same rows.

#include "data/value.hpp"

#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace belvane::data::sqlite {
class Database;
class Statement;
} // namespace belvane::data::sqlite

namespace belvane::data::tools {

class CatalogueWriter {
public:
  virtual ~CatalogueWriter() = default;
  // Appends a row to a catalogue table; the values stand in the order of the
  // table's columns in CatalogueTables().
  virtual void Insert(std::string_view table, const std::vector<Value>& row) = 0;
};

// Writes a new SQLite catalogue. The rows go to a temporary file beside
// `path`; Commit creates the indexes and puts the file in place, replacing
// any file there. Without Commit nothing appears at `path`.
class SqliteCatalogueWriter final : public CatalogueWriter {
public:
  // `omitTables`: tables not to create (tests of a catalogue that lacks
  // one); rows for them are dropped.
  explicit SqliteCatalogueWriter(std::string path, std::vector<std::string> omitTables = {});
  ~SqliteCatalogueWriter() override;

  void Insert(std::string_view table, const std::vector<Value>& row) override;
  void Commit();

private:
  std::string path_, partial_;
  std::unique_ptr<sqlite::Database> db_;
  std::map<std::string, std::unique_ptr<sqlite::Statement>, std::less<>> inserts_;
  std::vector<std::string> omit_;
};

} // namespace belvane::data::tools
