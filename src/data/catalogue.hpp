#pragma once
// The catalogue data service: every catalogue record set the editors read
// (vehicle models, the catalogue's state, the labour schedules, the vehicle
// parts and the general parts items) comes from a CatalogueDataObject.
// Values come back as they are stored; enciphered values are deciphered by
// the editors, never here.
//
// Each thread has one instance, created on first use from the configured
// catalogue location and kept; a host may hand over its own object instead.

#include "data/recordset.hpp"

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace belvane {
namespace err {
// Catalogue data service failures, numbered as the errors a host's data
// access reports, so that callers can tell them apart:
//   kDataService (3709): the catalogue cannot be opened (missing file, not
//     readable, not a catalogue database);
inline constexpr long kNoSuchTable =
    -2147217865; // 0x80040E37: a table the text names does not exist
inline constexpr long kBadCommand = -2147217900; // 0x80040E14: the text cannot run: a syntax error,
                                                 // a missing column, or not one read-only statement
} // namespace err
} // namespace belvane

namespace belvane::data {

// Schedule numbers of the labour schedules.
enum LabourSchedule : long {
  kScheduleNrma = 0,
  kScheduleMta = 1,
  kScheduleThird = 2,
  kScheduleCp = 3
};

class CatalogueDataObject {
public:
  virtual ~CatalogueDataObject() = default;

  // Runs one read-only SQL statement and returns an open record set on its
  // rows, positioned on the first. The two numbers are accepted for the
  // callers' sake (they pass 0, 0) and do not change the result: the record
  // set is always a snapshot that reads forwards and backwards. A text that
  // is not exactly one read-only statement is refused (kBadCommand).
  virtual RecordsetPtr OpenRecordset(const std::string& sql, long cursorType = 0,
                                     long lockType = 0) = 0;

  // Sets `rs` to an open record set of the labour items of schedule
  // `schedule` (0 to 3) for the vehicle, with the fields allow_tick, ItemNo,
  // Script, rrhour and pthour, in catalogue order. The items filed under
  // `firstId` for the body are taken; when there are none (or `firstId` is
  // empty), those filed under `secondId`. No items give an open, empty
  // record set. A schedule outside 0 to 3 raises error 5.
  virtual void GetLabourItems(RecordsetPtr& rs, long schedule, const std::string& firstId,
                              const std::string& secondId, const std::string& bodyId) = 0;

  // Sets `rs` to an open record set of the vehicle's parts, with the fields
  // ItemNo, PARTNAME, Script, SIDE, QTY, unitcost, partno and Group, in
  // catalogue order: the parts of catalogue number `catNo` and make `make`
  // (without regard to case) that fit every body or the body `bodyId`, and
  // are sold in every state or in state `state`. An empty catalogue number
  // gives an open, empty record set.
  virtual void GetVehicleParts(RecordsetPtr& rs, const std::string& make, const std::string& catNo,
                               const std::string& bodyId, int16_t state) = 0;

  // True when the make (without regard to case or surrounding blanks) has a
  // clickable vehicle diagram.
  virtual bool HasVehicleDiagram(const std::string& make) = 0;

  // The rows GetLabourItems and GetVehicleParts give, with the same
  // arguments and errors, handed to `row` one at a time as they are read
  // (the values in the order of the fields named there) instead of being
  // held in a record set: for a loader that reads each row once. `row`
  // returns false to stop early. The values are those a record set would
  // hold before converting them to a field type. These defaults read the
  // record sets; a service that can stream its rows does so.
  using RowSink = std::function<bool(const std::vector<Value>& row)>;
  virtual void ForEachLabourItem(long schedule, const std::string& firstId,
                                 const std::string& secondId, const std::string& bodyId,
                                 const RowSink& row);
  virtual void ForEachVehiclePart(const std::string& make, const std::string& catNo,
                                  const std::string& bodyId, int16_t state, const RowSink& row);
};

// The calling thread's catalogue data service: the object handed over with
// SetCatalogueDataObject, else one created on first use over the catalogue
// at CatalogueLocation() and kept for later calls: a PostgreSQL catalogue
// for a location beginning "postgresql:" or "postgres:" (a URI, or a
// connection string after the prefix), else an SQLite catalogue file. When
// it cannot be created (for example the file is missing) the error is
// raised and the next call tries again.
std::shared_ptr<CatalogueDataObject> Catalogue();

// Sets the catalogue database used by every thread from now on; the empty
// text goes back to the default location. Each thread's instance over the
// earlier location is replaced on its next Catalogue() call; an object
// handed over with SetCatalogueDataObject stays.
void SetCatalogueLocation(const std::string& path);

// The catalogue database location in force: the one set with
// SetCatalogueLocation; else the environment variable BELVANE_CATALOGUE;
// else $XDG_DATA_HOME/belvane/catalogue.db (XDG_DATA_HOME defaulting to
// $HOME/.local/share); else "catalogue.db" in the working folder.
std::string CatalogueLocation();

// Hands the calling thread a catalogue data service of the host's own (any
// backend). An empty pointer goes back to the one made from the location.
void SetCatalogueDataObject(std::shared_ptr<CatalogueDataObject> object);

} // namespace belvane::data
