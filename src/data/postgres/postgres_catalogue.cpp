#include "data/postgres/postgres_catalogue.hpp"

#include "data/postgres/pg_db.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

namespace belvane::data {

namespace {

constexpr const char* kSessionSetUp = "SET SESSION CHARACTERISTICS AS TRANSACTION READ ONLY";
constexpr const char* kBegin = "BEGIN TRANSACTION READ ONLY";

// The fixed queries name their fields as the editors read them; the tables'
// columns are lower case. row_no keeps the catalogue order the rows were
// loaded in. An empty key is passed as Null, which matches nothing.
constexpr const char* kLabourItemsSql =
    "SELECT allow_tick, itemno AS \"ItemNo\", script AS \"Script\", rrhour, pthour"
    " FROM labour_item"
    " WHERE schedule = $1 AND sched_id = $2"
    " AND (body_id IS NULL OR body_id = '' OR body_id = $3)"
    " ORDER BY row_no";

constexpr const char* kVehiclePartsSql =
    "SELECT itemno AS \"ItemNo\", partname AS \"PARTNAME\", script AS \"Script\","
    " side AS \"SIDE\", qty AS \"QTY\", unitcost, partno, \"group\" AS \"Group\""
    " FROM vehicle_part"
    " WHERE cat_no = $1 AND lower(make) = lower($2)"
    " AND (body_id IS NULL OR body_id = '' OR body_id = $3)"
    " AND (state IS NULL OR state = 0 OR state = $4)"
    " ORDER BY row_no";

constexpr const char* kDiagramSql =
    "SELECT 1 FROM diagram_make WHERE lower(make) = lower($1) LIMIT 1";

postgres::Param Key(const std::string& key) {
  if (key.empty()) return std::nullopt;
  return key;
}

} // namespace

PostgresCatalogue::PostgresCatalogue(const std::string& conninfo)
    : db_(std::make_unique<postgres::Connection>(conninfo)) {
  db_->Exec(kSessionSetUp);
}

PostgresCatalogue::~PostgresCatalogue() = default;

template <class Fn> auto PostgresCatalogue::ReadOnly(Fn&& run) {
  db_->ReconnectIfLost(kSessionSetUp);
  try {
    db_->Exec(kBegin);
  } catch (const Error&) {
    // A connection that broke while idle (the server restarted, or ended
    // the session) shows here, before anything ran: connect again once.
    if (!db_->Lost()) throw;
    db_->ReconnectIfLost(kSessionSetUp);
    db_->Exec(kBegin);
  }
  try {
    auto result = run();
    db_->Exec("ROLLBACK");
    return result;
  } catch (...) {
    try {
      db_->Exec("ROLLBACK");
    } catch (const Error&) {
      // The connection is gone: the next call connects again.
    }
    throw;
  }
}

RecordsetPtr PostgresCatalogue::OpenRecordset(const std::string& sql, long, long) {
  return ReadOnly([&] {
    // The server prepares at most one statement: a second one (other than
    // blanks and comments after a semicolon) is refused here, before
    // anything runs.
    db_->Prepare(sql, "the SQL text cannot run: " + sql);
    if (db_->DescribePrepared().Columns() == 0)
      db_->Fail(err::kBadCommand, "only a read-only query may run on the catalogue: " + sql);
    // A query that would write (INSERT ... RETURNING, a locking clause) is
    // refused by the read-only transaction.
    return postgres::ReadRecordset(db_->ExecPrepared({}, sql));
  });
}

void PostgresCatalogue::GetLabourItems(RecordsetPtr& rs, long schedule, const std::string& firstId,
                                       const std::string& secondId, const std::string& bodyId) {
  if (schedule < kScheduleNrma || schedule > kScheduleCp)
    throw Error(err::kInvalidCall,
                "Invalid procedure call or argument: labour schedule " + std::to_string(schedule) +
                    " (0 to 3)",
                postgres::kSource);
  const std::string first = text::Trim(firstId), second = text::Trim(secondId),
                    body = text::Trim(bodyId);
  rs = ReadOnly([&] {
    auto items = [&](const std::string& id) {
      return postgres::ReadRecordset(db_->Exec(kLabourItemsSql,
                                               {std::to_string(schedule), Key(id), body},
                                               "labour items (LABOUR_ITEM)"));
    };
    RecordsetPtr result = items(first);
    if (result->RecordCount() == 0 && !second.empty()) result = items(second);
    return result;
  });
}

void PostgresCatalogue::GetVehicleParts(RecordsetPtr& rs, const std::string& make,
                                        const std::string& catNo, const std::string& bodyId,
                                        int16_t state) {
  rs = ReadOnly([&] {
    return postgres::ReadRecordset(db_->Exec(
        kVehiclePartsSql,
        {Key(text::Trim(catNo)), text::Trim(make), text::Trim(bodyId), std::to_string(state)},
        "vehicle parts (VEHICLE_PART)"));
  });
}

bool PostgresCatalogue::HasVehicleDiagram(const std::string& make) {
  const std::string trimmed = text::Trim(make);
  if (trimmed.empty()) return false;
  return ReadOnly([&] {
    return db_->Exec(kDiagramSql, {trimmed}, "vehicle diagrams (DIAGRAM_MAKE)").Rows() > 0;
  });
}

} // namespace belvane::data
