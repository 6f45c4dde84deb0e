#pragma once
// The catalogue data service over a catalogue in a PostgreSQL database, for
// a catalogue shared by many workstations. The session is read only and
// every call runs in a read-only transaction that is rolled back. The
// tables are those of docs/catalogue.md, created with lower-case names (see
// its "PostgreSQL" section), so that the editors' SQL texts run unchanged.
// Each instance has its own connection; Catalogue() gives every thread its
// own.

#include "data/catalogue.hpp"

#include <memory>
#include <string>

namespace belvane::data {

namespace postgres {
class Connection;
}

class PostgresCatalogue final : public CatalogueDataObject {
public:
  // Connects with a libpq connection string or URI ("host=/run/pg
  // dbname=catalogue", "postgresql://server/catalogue"). A server that
  // cannot be reached or a database that does not exist raises
  // err::kDataService naming the database and the server.
  explicit PostgresCatalogue(const std::string& conninfo);
  ~PostgresCatalogue() override;

  RecordsetPtr OpenRecordset(const std::string& sql, long cursorType = 0,
                             long lockType = 0) override;
  void GetLabourItems(RecordsetPtr& rs, long schedule, const std::string& firstId,
                      const std::string& secondId, const std::string& bodyId) override;
  void GetVehicleParts(RecordsetPtr& rs, const std::string& make, const std::string& catNo,
                       const std::string& bodyId, int16_t state) override;
  bool HasVehicleDiagram(const std::string& make) override;

private:
  // Runs `run` in a read-only transaction that is always rolled back, so
  // that nothing a statement does (not even a setting) outlives the call.
  template <class Fn> auto ReadOnly(Fn&& run);

  std::unique_ptr<postgres::Connection> db_;
};

} // namespace belvane::data
