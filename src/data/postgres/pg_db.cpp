#include "data/postgres/pg_db.hpp"

#include "data/catalogue.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <libpq-fe.h>

#include <charconv>
#include <cstdlib>
#include <limits>
#include <unordered_set>

namespace belvane::data::postgres {

namespace {

// Type oids of the built-in types the record set distinguishes.
constexpr Oid kBoolOid = 16, kInt8Oid = 20, kInt2Oid = 21, kInt4Oid = 23, kFloat4Oid = 700,
              kFloat8Oid = 701, kNumericOid = 1700;

std::string_view Trimmed(const char* s) {
  std::string_view v = s ? s : "";
  while (!v.empty() && (v.back() == '\n' || v.back() == ' '))
    v.remove_suffix(1);
  return v;
}

// The error number a failed statement's SQLSTATE stands for.
long ErrorNumber(std::string_view state) {
  if (state == "42P01") return err::kNoSuchTable; // undefined_table
  // Connection exceptions, a server shutting down or out of resources, and
  // a database that does not exist: the catalogue cannot be used at all.
  if (state.starts_with("08") || state.starts_with("57") || state.starts_with("53") ||
      state == "3D000")
    return err::kDataService;
  return err::kBadCommand;
}

} // namespace

Param ToParam(const Value& v) {
  switch (v.Type()) {
  case ValueType::Null:
    return std::nullopt;
  case ValueType::Boolean:
    return std::string(v.ToBool() ? "true" : "false");
  case ValueType::Double: {
    char buf[64];
    auto [end, ec] = std::to_chars(buf, buf + sizeof buf, v.ToDouble());
    return std::string(buf, end);
  }
  default:
    return v.ToText();
  }
}

Result::~Result() {
  if (r_) PQclear(r_);
}

Result& Result::operator=(Result&& other) noexcept {
  if (this != &other) {
    if (r_) PQclear(r_);
    r_ = other.r_;
    other.r_ = nullptr;
  }
  return *this;
}

int Result::Rows() const { return r_ ? PQntuples(r_) : 0; }
int Result::Columns() const { return r_ ? PQnfields(r_) : 0; }

Connection::Connection(std::string conninfo, std::string label) : label_(std::move(label)) {
  conn_ = PQconnectdb(conninfo.c_str());
  if (!conn_) throw Error(err::kDataService, label_ + " database: out of memory", kSource);
  if (PQstatus(conn_) != CONNECTION_OK) {
    const std::string message(Trimmed(PQerrorMessage(conn_)));
    const std::string where = Where();
    PQfinish(conn_);
    conn_ = nullptr;
    throw Error(err::kDataService, label_ + " " + where + ": cannot connect: " + message, kSource);
  }
  // Notices ("table ... does not exist, skipping") are of no interest to a
  // user; libpq would print them on standard error.
  PQsetNoticeProcessor(
      conn_, [](void*, const char*) {}, nullptr);
}

Connection::~Connection() {
  if (conn_) PQfinish(conn_);
}

std::string Connection::Where() const {
  auto text = [](const char* s) { return std::string(s ? s : ""); };
  std::string where = "database \"" + text(PQdb(conn_)) + "\"";
  const std::string host = text(PQhost(conn_)), port = text(PQport(conn_));
  if (!host.empty() || !port.empty()) where += " on " + host + (port.empty() ? "" : ":" + port);
  return where;
}

void Connection::Fail(long number, std::string_view what) const {
  throw Error(number, label_ + " " + Where() + ": " + std::string(what), kSource);
}

void Connection::FailResult(const pg_result* r, std::string_view context) const {
  std::string what(context);
  if (!what.empty()) what += ": ";
  if (!r || PQstatus(conn_) == CONNECTION_BAD) {
    what += Trimmed(r ? PQresultErrorMessage(r) : PQerrorMessage(conn_));
    Fail(err::kDataService, what);
  }
  const char* state = PQresultErrorField(r, PG_DIAG_SQLSTATE);
  what += Trimmed(PQresultErrorField(r, PG_DIAG_MESSAGE_PRIMARY));
  Fail(ErrorNumber(state ? state : ""), what);
}

Result Connection::Check(pg_result* r, std::string_view context) const {
  Result result(r);
  const ExecStatusType status = r ? PQresultStatus(r) : PGRES_FATAL_ERROR;
  if (status != PGRES_COMMAND_OK && status != PGRES_TUPLES_OK && status != PGRES_EMPTY_QUERY)
    FailResult(r, context);
  return result;
}

void Connection::Exec(std::string_view sql) { Check(PQexec(conn_, std::string(sql).c_str()), {}); }

namespace {

struct ParamArrays {
  std::vector<const char*> values;
  explicit ParamArrays(const std::vector<Param>& params) {
    values.reserve(params.size());
    for (const Param& p : params)
      values.push_back(p ? p->c_str() : nullptr);
  }
  int Count() const { return static_cast<int>(values.size()); }
};

} // namespace

Result Connection::Exec(std::string_view sql, const std::vector<Param>& params,
                        std::string_view context) {
  ParamArrays a(params);
  return Check(PQexecParams(conn_, std::string(sql).c_str(), a.Count(), nullptr, a.values.data(),
                            nullptr, nullptr, 0),
               context);
}

void Connection::Prepare(std::string_view sql, std::string_view context) {
  Check(PQprepare(conn_, "", std::string(sql).c_str(), 0, nullptr), context);
}

Result Connection::DescribePrepared(std::string_view context) {
  return Check(PQdescribePrepared(conn_, ""), context);
}

Result Connection::ExecPrepared(const std::vector<Param>& params, std::string_view context) {
  ParamArrays a(params);
  return Check(PQexecPrepared(conn_, "", a.Count(), a.values.data(), nullptr, nullptr, 0), context);
}

bool Connection::Lost() const { return PQstatus(conn_) == CONNECTION_BAD; }

void Connection::ReconnectIfLost(std::string_view setUp) {
  if (PQstatus(conn_) != CONNECTION_BAD) return;
  PQreset(conn_);
  if (PQstatus(conn_) != CONNECTION_OK)
    Fail(err::kDataService, "the connection was lost and cannot be made again: " +
                                std::string(Trimmed(PQerrorMessage(conn_))));
  if (!setUp.empty()) Exec(setUp);
}

namespace {

enum class Kind { Boolean, Int2, Int4, Int8, Real, Text };

Kind KindOf(Oid type) {
  switch (type) {
  case kBoolOid:
    return Kind::Boolean;
  case kInt2Oid:
    return Kind::Int2;
  case kInt4Oid:
    return Kind::Int4;
  case kInt8Oid:
    return Kind::Int8;
  case kFloat4Oid:
  case kFloat8Oid:
  case kNumericOid:
    return Kind::Real;
  default:
    return Kind::Text;
  }
}

long long ParseInteger(std::string_view s) {
  long long n = 0;
  std::from_chars(s.data(), s.data() + s.size(), n);
  return n;
}

} // namespace

RecordsetPtr ReadRecordset(const Result& result) {
  pg_result* r = result.Handle();
  const int rows = result.Rows(), columns = result.Columns();

  std::vector<Kind> kinds;
  std::vector<long> longest(static_cast<size_t>(columns), 0);
  std::vector<bool> wide(static_cast<size_t>(columns), false); // an int8 beyond 32 bits
  for (int c = 0; c < columns; ++c) {
    kinds.push_back(KindOf(PQftype(r, c)));
    for (int row = 0; row < rows; ++row) {
      if (PQgetisnull(r, row, c)) continue;
      const long length = PQgetlength(r, row, c);
      if (kinds.back() == Kind::Text)
        longest[static_cast<size_t>(c)] = std::max(longest[static_cast<size_t>(c)], length);
      if (kinds.back() == Kind::Int8) {
        const long long n = ParseInteger(PQgetvalue(r, row, c));
        if (n < std::numeric_limits<int32_t>::min() || n > std::numeric_limits<int32_t>::max())
          wide[static_cast<size_t>(c)] = true;
      }
    }
  }

  auto rs = std::make_shared<Recordset>();
  std::unordered_set<std::string> names;
  std::vector<DataType> types;
  for (int c = 0; c < columns; ++c) {
    const size_t i = static_cast<size_t>(c);
    std::string name = PQfname(r, c);
    if (name.empty() || name == "?column?") name = "Expr" + std::to_string(c + 1);
    std::string unique = name;
    for (int n = 2; !names.insert(text::UCase(unique)).second; ++n)
      unique = name + "_" + std::to_string(n);
    DataType type = DataType::VarWChar;
    switch (kinds[i]) {
    case Kind::Boolean:
      type = DataType::Boolean;
      break;
    case Kind::Int2:
      type = DataType::SmallInt;
      break;
    case Kind::Int4:
      type = DataType::Integer;
      break;
    case Kind::Int8:
      type = wide[i] ? DataType::Double : DataType::Integer;
      break;
    case Kind::Real:
      type = DataType::Double;
      break;
    case Kind::Text:
      break;
    }
    types.push_back(type);
    rs->Fields().Append(unique, type, type == DataType::VarWChar ? longest[i] : 0);
  }

  rs->Open();
  for (int row = 0; row < rows; ++row) {
    std::vector<Value> values;
    values.reserve(static_cast<size_t>(columns));
    for (int c = 0; c < columns; ++c) {
      if (PQgetisnull(r, row, c)) {
        values.emplace_back();
        continue;
      }
      const std::string_view s(PQgetvalue(r, row, c), static_cast<size_t>(PQgetlength(r, row, c)));
      switch (types[static_cast<size_t>(c)]) {
      case DataType::Boolean:
        values.emplace_back(s == "t");
        break;
      case DataType::SmallInt:
        values.emplace_back(static_cast<int16_t>(ParseInteger(s)));
        break;
      case DataType::Integer:
        values.emplace_back(static_cast<int32_t>(ParseInteger(s)));
        break;
      case DataType::Double:
        values.emplace_back(std::strtod(std::string(s).c_str(), nullptr));
        break;
      default:
        values.emplace_back(s);
        break;
      }
    }
    rs->AppendLoaded(std::move(values));
  }
  rs->MoveFirst();
  return rs;
}

} // namespace belvane::data::postgres
