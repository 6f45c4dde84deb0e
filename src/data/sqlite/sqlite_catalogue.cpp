#include "data/sqlite/sqlite_catalogue.hpp"

#include "data/sqlite/sqlite_db.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <limits>
#include <optional>
#include <unordered_set>
#include <vector>

namespace belvane::data {

namespace sqlite {

namespace {

// What the values of one result column turned out to be.
struct ColumnValues {
  bool anyInt32 = false, anyReal = false, anyText = false;
  bool allSmall = true;   // every integer fits 16 bits
  bool allBoolean = true; // every integer is 0 or 1
  long longestText = 0;

  void Add(const Value& v) {
    switch (v.Type()) {
    case ValueType::Null:
      return;
    case ValueType::Integer:
    case ValueType::Long:
    case ValueType::Boolean: {
      const int32_t n = v.ToInt32();
      anyInt32 = true;
      if (n < std::numeric_limits<int16_t>::min() || n > std::numeric_limits<int16_t>::max())
        allSmall = false;
      if (n != 0 && n != 1) allBoolean = false;
      return;
    }
    case ValueType::Double: {
      // Whole numbers beyond 32 bits arrive as Double (see Statement::Column),
      // as do real numbers.
      anyReal = true;
      return;
    }
    case ValueType::Text:
      anyText = true;
      longestText = std::max(longestText, static_cast<long>(v.TextIf()->size()));
      return;
    }
  }

  bool Numeric() const { return !anyText; }

  // The type the values share.
  DataType Inferred() const {
    if (anyText) return anyInt32 || anyReal ? DataType::Variant : DataType::VarWChar;
    if (anyReal) return DataType::Double;
    if (anyInt32) return DataType::Integer;
    return DataType::Variant; // nothing but Nulls: any value would do
  }
};

// The type a declared column type names, or nothing when it names none the
// record set has (BLOB, NUMERIC, DATE, or no type at all).
std::optional<DataType> DeclaredDataType(const std::string& declared) {
  const std::string t = text::UCase(declared);
  auto has = [&t](const char* s) { return t.find(s) != std::string::npos; };
  if (has("BOOL") || t == "BIT") return DataType::Boolean;
  if (has("SMALLINT") || has("TINYINT")) return DataType::SmallInt;
  if (has("INT")) return DataType::Integer;
  if (has("CHAR") || has("CLOB") || has("TEXT")) return DataType::VarWChar;
  if (has("REAL") || has("FLOA") || has("DOUB")) return DataType::Double;
  return std::nullopt;
}

DataType FieldType(const std::string& declared, const ColumnValues& values) {
  std::optional<DataType> type = DeclaredDataType(declared);
  if (!type) return values.Inferred();
  // SQLite lets any value into any column: fall back to what the values
  // share when they do not fit the declared type.
  switch (*type) {
  case DataType::Boolean:
    return values.Numeric() && !values.anyReal && values.allBoolean ? *type : values.Inferred();
  case DataType::SmallInt:
    if (values.Numeric() && !values.anyReal && values.allSmall) return *type;
    return values.Inferred();
  case DataType::Integer:
    return values.Numeric() && !values.anyReal ? *type : values.Inferred();
  case DataType::Double:
    return values.Numeric() ? *type : values.Inferred();
  default:
    return *type;
  }
}

} // namespace

RecordsetPtr ReadRecordset(Statement& st) {
  const int columns = st.ColumnCount();
  std::vector<ColumnValues> seen(static_cast<size_t>(columns));
  std::vector<std::vector<Value>> rows;
  while (st.Step()) {
    std::vector<Value> row;
    row.reserve(static_cast<size_t>(columns));
    for (int c = 0; c < columns; ++c) {
      row.push_back(st.Column(c));
      seen[static_cast<size_t>(c)].Add(row.back());
    }
    rows.push_back(std::move(row));
  }

  auto rs = std::make_shared<Recordset>();
  std::unordered_set<std::string> names;
  for (int c = 0; c < columns; ++c) {
    const ColumnValues& v = seen[static_cast<size_t>(c)];
    std::string name = st.ColumnName(c);
    if (name.empty()) name = "Expr" + std::to_string(c + 1);
    std::string unique = name;
    for (int n = 2; !names.insert(text::UCase(unique)).second; ++n)
      unique = name + "_" + std::to_string(n);
    const DataType type = FieldType(st.DeclaredType(c), v);
    rs->Fields().Append(unique, type, type == DataType::VarWChar ? v.longestText : 0);
  }
  rs->Open();
  rs->ReserveRecords(rows.size());
  for (auto& row : rows)
    rs->AppendLoaded(std::move(row));
  rs->MoveFirst();
  return rs;
}

} // namespace sqlite

namespace {

// The labour items of one schedule id: those for every body and those for
// the given body, in catalogue order.
constexpr const char* kLabourItemsSql =
    "SELECT allow_tick, ItemNo, Script, rrhour, pthour FROM LABOUR_ITEM"
    " WHERE schedule = ?1 AND sched_id = ?2"
    " AND (body_id IS NULL OR body_id = '' OR body_id = ?3)"
    " ORDER BY rowid";

constexpr const char* kVehiclePartsSql =
    "SELECT ItemNo, PARTNAME, Script, SIDE, QTY, unitcost, partno, \"Group\" FROM VEHICLE_PART"
    " WHERE cat_no = ?1 AND make = ?2 COLLATE NOCASE"
    " AND (body_id IS NULL OR body_id = '' OR body_id = ?3)"
    " AND (state IS NULL OR state = 0 OR state = ?4)"
    " ORDER BY rowid";

constexpr const char* kDiagramSql =
    "SELECT 1 FROM DIAGRAM_MAKE WHERE make = ?1 COLLATE NOCASE LIMIT 1";

// Binds a key, or Null (which matches nothing) when the key is empty.
void BindKey(sqlite::Statement& st, int index, const std::string& key) {
  if (key.empty())
    st.Bind(index, Value());
  else
    st.BindText(index, key);
}

} // namespace

SqliteCatalogue::SqliteCatalogue(const std::string& path)
    : db_(std::make_unique<sqlite::Database>(path, sqlite::Database::Mode::ReadOnly)) {}

SqliteCatalogue::~SqliteCatalogue() = default;

const std::string& SqliteCatalogue::Path() const { return db_->Path(); }

RecordsetPtr SqliteCatalogue::OpenRecordset(const std::string& sql, long, long) {
  return sqlite::ReadRecordset(*PrepareQuery(sql));
}

long long
SqliteCatalogue::StreamRows(const std::string& sql,
                            const std::function<void(const std::vector<std::string>&)>& header,
                            const std::function<bool(const std::vector<Value>&)>& row) {
  auto st = PrepareQuery(sql);
  const int columns = st->ColumnCount();
  std::vector<std::string> names;
  for (int c = 0; c < columns; ++c)
    names.push_back(st->ColumnName(c));
  header(names);
  long long rows = 0;
  std::vector<Value> values(static_cast<size_t>(columns));
  while (st->Step()) {
    for (int c = 0; c < columns; ++c)
      values[static_cast<size_t>(c)] = st->Column(c);
    ++rows;
    if (!row(values)) break;
  }
  return rows;
}

std::unique_ptr<sqlite::Statement> SqliteCatalogue::PrepareQuery(const std::string& sql) {
  auto holder = std::make_unique<sqlite::Statement>(*db_, sql);
  sqlite::Statement& st = *holder;
  if (st.Empty()) db_->Fail(err::kBadCommand, "the SQL text holds no statement");
  {
    // Whatever follows the first statement must be blanks or comments.
    sqlite::Statement rest(*db_, st.Tail());
    if (!rest.Empty())
      db_->Fail(err::kBadCommand,
                "the SQL text holds more than one statement; one read-only statement is "
                "allowed: " +
                    sql);
  }
  if (!st.ReadOnly() || st.ColumnCount() == 0)
    db_->Fail(err::kBadCommand, "only a read-only query may run on the catalogue: " + sql);
  return holder;
}

namespace {

void CheckSchedule(long schedule) {
  if (schedule < kScheduleNrma || schedule > kScheduleCp)
    throw Error(err::kInvalidCall,
                "Invalid procedure call or argument: labour schedule " + std::to_string(schedule) +
                    " (0 to 3)",
                sqlite::kSource);
}

// Steps a bound statement, handing each row's values to `row`. Returns the
// rows handed over.
long StepRows(sqlite::Statement& st, const CatalogueDataObject::RowSink& row) {
  const int columns = st.ColumnCount();
  std::vector<Value> values(static_cast<size_t>(columns));
  long rows = 0;
  while (st.Step()) {
    for (int c = 0; c < columns; ++c)
      values[static_cast<size_t>(c)] = st.Column(c);
    ++rows;
    if (!row(values)) break;
  }
  return rows;
}

} // namespace

void SqliteCatalogue::ForEachLabourItem(long schedule, const std::string& firstId,
                                        const std::string& secondId, const std::string& bodyId,
                                        const RowSink& row) {
  CheckSchedule(schedule);
  const std::string first = text::Trim(firstId), second = text::Trim(secondId),
                    body = text::Trim(bodyId);
  auto items = [&](const std::string& id) {
    sqlite::Statement st(*db_, kLabourItemsSql);
    st.BindInt(1, schedule);
    BindKey(st, 2, id);
    st.BindText(3, body);
    return StepRows(st, row);
  };
  if (items(first) == 0 && !second.empty()) items(second);
}

void SqliteCatalogue::ForEachVehiclePart(const std::string& make, const std::string& catNo,
                                         const std::string& bodyId, int16_t state,
                                         const RowSink& row) {
  sqlite::Statement st(*db_, kVehiclePartsSql);
  BindKey(st, 1, text::Trim(catNo));
  st.BindText(2, text::Trim(make));
  st.BindText(3, text::Trim(bodyId));
  st.BindInt(4, state);
  StepRows(st, row);
}

void SqliteCatalogue::GetLabourItems(RecordsetPtr& rs, long schedule, const std::string& firstId,
                                     const std::string& secondId, const std::string& bodyId) {
  CheckSchedule(schedule);
  const std::string first = text::Trim(firstId), second = text::Trim(secondId),
                    body = text::Trim(bodyId);
  auto items = [&](const std::string& id) {
    sqlite::Statement st(*db_, kLabourItemsSql);
    st.BindInt(1, schedule);
    BindKey(st, 2, id);
    st.BindText(3, body);
    return sqlite::ReadRecordset(st);
  };
  RecordsetPtr result = items(first);
  if (result->RecordCount() == 0 && !second.empty()) result = items(second);
  rs = std::move(result);
}

void SqliteCatalogue::GetVehicleParts(RecordsetPtr& rs, const std::string& make,
                                      const std::string& catNo, const std::string& bodyId,
                                      int16_t state) {
  sqlite::Statement st(*db_, kVehiclePartsSql);
  BindKey(st, 1, text::Trim(catNo));
  st.BindText(2, text::Trim(make));
  st.BindText(3, text::Trim(bodyId));
  st.BindInt(4, state);
  rs = sqlite::ReadRecordset(st);
}

bool SqliteCatalogue::HasVehicleDiagram(const std::string& make) {
  const std::string trimmed = text::Trim(make);
  if (trimmed.empty()) return false;
  sqlite::Statement st(*db_, kDiagramSql);
  st.BindText(1, trimmed);
  return st.Step();
}

} // namespace belvane::data
