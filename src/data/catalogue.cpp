#include "data/catalogue.hpp"

#include "data/postgres/postgres_catalogue.hpp"
#include "data/sqlite/sqlite_catalogue.hpp"

#include <atomic>
#include <cstdlib>
#include <mutex>
#include <optional>
#include <string_view>

namespace belvane::data {

namespace {

// Hands every record of an open record set to `row`, its values in field
// order, until `row` asks to stop.
void EachRecord(Recordset& rs, const CatalogueDataObject::RowSink& row) {
  std::vector<Value> values(rs.Fields().Count());
  for (; !rs.Eof(); rs.MoveNext()) {
    for (size_t i = 0; i < values.size(); ++i)
      values[i] = rs.Fields(i).Value();
    if (!row(values)) return;
  }
}

} // namespace

void CatalogueDataObject::ForEachLabourItem(long schedule, const std::string& firstId,
                                            const std::string& secondId, const std::string& bodyId,
                                            const RowSink& row) {
  RecordsetPtr rs;
  GetLabourItems(rs, schedule, firstId, secondId, bodyId);
  EachRecord(*rs, row);
}

void CatalogueDataObject::ForEachVehiclePart(const std::string& make, const std::string& catNo,
                                             const std::string& bodyId, int16_t state,
                                             const RowSink& row) {
  RecordsetPtr rs;
  GetVehicleParts(rs, make, catNo, bodyId, state);
  EachRecord(*rs, row);
}

namespace {

std::mutex gLocationMutex;
std::optional<std::string> gLocation; // set by the host; guarded by gLocationMutex
// Bumped on every SetCatalogueLocation so that each thread notices that its
// instance was made over an older location.
std::atomic<unsigned> gLocationGeneration{0};

struct ThreadCatalogue {
  std::shared_ptr<CatalogueDataObject> object;
  bool handedOver = false; // the host's own object: kept whatever the location
  unsigned generation = 0;
};

ThreadCatalogue& ThisThread() {
  thread_local ThreadCatalogue state;
  return state;
}

const char* NonEmptyEnv(const char* name) {
  const char* v = std::getenv(name);
  return v && *v ? v : nullptr;
}

// The service over a location: a PostgreSQL URI ("postgresql://...",
// "postgres://...") or a connection string after "postgresql:" or
// "postgres:" names a PostgreSQL catalogue; anything else is an SQLite file.
std::shared_ptr<CatalogueDataObject> OpenCatalogue(const std::string& location) {
  for (const std::string_view prefix : {"postgresql:", "postgres:"}) {
    if (!location.starts_with(prefix)) continue;
    const std::string rest = location.substr(prefix.size());
    // A URI goes to libpq whole; otherwise the rest is a connection string.
    return std::make_shared<PostgresCatalogue>(rest.starts_with("//") ? location : rest);
  }
  return std::make_shared<SqliteCatalogue>(location);
}

} // namespace

std::string CatalogueLocation() {
  {
    std::lock_guard lock(gLocationMutex);
    if (gLocation) return *gLocation;
  }
  if (const char* env = NonEmptyEnv("BELVANE_CATALOGUE")) return env;
  if (const char* xdg = NonEmptyEnv("XDG_DATA_HOME"))
    return std::string(xdg) + "/belvane/catalogue.db";
  if (const char* home = NonEmptyEnv("HOME"))
    return std::string(home) + "/.local/share/belvane/catalogue.db";
  return "catalogue.db";
}

void SetCatalogueLocation(const std::string& path) {
  {
    std::lock_guard lock(gLocationMutex);
    if (path.empty())
      gLocation.reset();
    else
      gLocation = path;
  }
  ++gLocationGeneration;
}

void SetCatalogueDataObject(std::shared_ptr<CatalogueDataObject> object) {
  ThreadCatalogue& t = ThisThread();
  t.handedOver = object != nullptr;
  t.object = std::move(object);
  t.generation = gLocationGeneration.load();
}

std::shared_ptr<CatalogueDataObject> Catalogue() {
  ThreadCatalogue& t = ThisThread();
  if (t.handedOver) return t.object;
  const unsigned generation = gLocationGeneration.load();
  if (!t.object || t.generation != generation) {
    t.object.reset();
    // Construction opens the database; when it throws, nothing is kept and
    // the next call tries again.
    t.object = OpenCatalogue(CatalogueLocation());
    t.generation = generation;
  }
  return t.object;
}

} // namespace belvane::data
