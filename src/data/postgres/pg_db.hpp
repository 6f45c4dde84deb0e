#pragma once
// A thin owner of a libpq connection and its results, for the PostgreSQL
// catalogue service and the catalogue tools. Every failure becomes a
// belvane::Error whose description names the database and its server and
// says what went wrong:
//   err::kDataService  the server cannot be reached, the database does not
//                      exist, or the connection was lost;
//   err::kNoSuchTable  a statement names a table the database lacks;
//   err::kBadCommand   any other statement that cannot run.

#include "data/recordset.hpp"
#include "data/value.hpp"

#include <optional>
#include <string>
#include <string_view>
#include <vector>

struct pg_conn;
struct pg_result;

namespace belvane::data::postgres {

inline constexpr const char* kSource = "Belvane.Catalogue";

// A parameter in text form; nothing stands for Null.
using Param = std::optional<std::string>;
// The text form of a value as a parameter: Booleans as true/false, numbers
// as the shortest text that reads back the same.
Param ToParam(const Value& v);

class Result {
public:
  Result() = default;
  explicit Result(pg_result* r) : r_(r) {}
  ~Result();
  Result(Result&& other) noexcept : r_(other.r_) { other.r_ = nullptr; }
  Result& operator=(Result&& other) noexcept;
  Result(const Result&) = delete;
  Result& operator=(const Result&) = delete;

  pg_result* Handle() const { return r_; }
  int Rows() const;
  int Columns() const;

private:
  pg_result* r_ = nullptr;
};

class Connection {
public:
  // Connects with a libpq connection string or URI. `label` names the kind
  // of database in error descriptions ("Catalogue database ... on ...: ").
  explicit Connection(std::string conninfo, std::string label = "Catalogue");
  ~Connection();
  Connection(const Connection&) = delete;
  Connection& operator=(const Connection&) = delete;

  // "database "catalogue" on /tmp/x:55432" (never the password).
  std::string Where() const;

  // Runs commands that return nothing of interest (settings, transactions,
  // schema); several may be given in one text.
  void Exec(std::string_view sql);
  // Runs one statement with parameters $1... and returns its result.
  Result Exec(std::string_view sql, const std::vector<Param>& params,
              std::string_view context = {});

  // The unnamed prepared statement: prepares `sql` (which the server refuses
  // unless it is at most one statement), describes it and runs it.
  void Prepare(std::string_view sql, std::string_view context = {});
  Result DescribePrepared(std::string_view context = {});
  Result ExecPrepared(const std::vector<Param>& params, std::string_view context = {});

  // True once the server was found gone (the connection broke).
  bool Lost() const;
  // When the connection was lost, connects again and runs `setUp` (the
  // session settings) on the new connection.
  void ReconnectIfLost(std::string_view setUp);

  // Raises `number` with "<label> <where>: <what>".
  [[noreturn]] void Fail(long number, std::string_view what) const;

private:
  // Raises the error a failed result stands for (a null result: the
  // connection's own message), with `context` before the server's message.
  [[noreturn]] void FailResult(const pg_result* r, std::string_view context) const;
  Result Check(pg_result* r, std::string_view context) const;

  pg_conn* conn_ = nullptr;
  std::string label_;
};

// Reads every row of a result into a new open record set positioned on the
// first record. A field takes the type of its column (int2: 16-bit integer,
// int4: 32-bit, int8: 32-bit when every value fits, else Double; float4,
// float8 and numeric: Double; bool: Boolean; anything else: text in the
// server's text form). A repeated column name gets "_2", "_3", ... appended.
RecordsetPtr ReadRecordset(const Result& result);

} // namespace belvane::data::postgres
