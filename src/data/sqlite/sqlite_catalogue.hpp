#pragma once
// The catalogue data service over an SQLite catalogue database, opened read
// only. The tables it reads are described in docs/catalogue.md. Each
// instance has its own connection; Catalogue() gives every thread its own.

#include "data/catalogue.hpp"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace belvane::data {

namespace sqlite {
class Database;
class Statement;

// Reads every row of a prepared statement into a new open record set,
// positioned on the first record. A field takes the type its column is
// declared with (INT: 32-bit integer, SMALLINT/TINYINT: 16-bit, BOOL:
// Boolean, REAL/FLOAT/DOUBLE: Double, CHAR/TEXT/CLOB: text); a column
// without a usable declared type, or whose values do not fit that type,
// takes the type its values share, or Variant when they differ. A repeated
// column name gets "_2", "_3", ... appended.
RecordsetPtr ReadRecordset(Statement& st);
} // namespace sqlite

class SqliteCatalogue final : public CatalogueDataObject {
public:
  // Opens the catalogue database at `path` read only. A missing or
  // unreadable file, or one that is not a database, raises
  // err::kDataService naming the file.
  explicit SqliteCatalogue(const std::string& path);
  ~SqliteCatalogue() override;

  const std::string& Path() const;

  RecordsetPtr OpenRecordset(const std::string& sql, long cursorType = 0,
                             long lockType = 0) override;
  void GetLabourItems(RecordsetPtr& rs, long schedule, const std::string& firstId,
                      const std::string& secondId, const std::string& bodyId) override;
  void GetVehicleParts(RecordsetPtr& rs, const std::string& make, const std::string& catNo,
                       const std::string& bodyId, int16_t state) override;
  bool HasVehicleDiagram(const std::string& make) override;
  // Stepped straight from the queries, no record set held.
  void ForEachLabourItem(long schedule, const std::string& firstId, const std::string& secondId,
                         const std::string& bodyId, const RowSink& row) override;
  void ForEachVehiclePart(const std::string& make, const std::string& catNo,
                          const std::string& bodyId, int16_t state, const RowSink& row) override;

  // Runs one read-only query as OpenRecordset does, but hands the rows over
  // one at a time as they are read instead of holding them all: first the
  // column names to `header`, then each row's values to `row`, which
  // returns false to stop. Returns the rows handed over.
  long long StreamRows(const std::string& sql,
                       const std::function<void(const std::vector<std::string>&)>& header,
                       const std::function<bool(const std::vector<Value>&)>& row);

private:
  // The single read-only statement of `sql`, prepared.
  std::unique_ptr<sqlite::Statement> PrepareQuery(const std::string& sql);
  std::unique_ptr<sqlite::Database> db_;
};

} // namespace belvane::data
