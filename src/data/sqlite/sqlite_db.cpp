#include "data/sqlite/sqlite_db.hpp"

#include "data/catalogue.hpp"
#include "text/error.hpp"

#include <sqlite3.h>

#include <climits>
#include <filesystem>
#include <system_error>

namespace belvane::data::sqlite {

namespace {

// How long a reader waits for a writer (an import running beside it).
constexpr int kBusyTimeoutMs = 5000;

long NumberFor(int rc, std::string_view message) {
  switch (rc & 0xff) {
  case SQLITE_CANTOPEN:
  case SQLITE_NOTADB:
  case SQLITE_CORRUPT:
  case SQLITE_IOERR:
  case SQLITE_PERM:
  case SQLITE_FULL:
  case SQLITE_NOMEM:
  case SQLITE_BUSY:
  case SQLITE_LOCKED:
  case SQLITE_READONLY:
    return err::kDataService;
  default:
    break;
  }
  if (message.starts_with("no such table")) return err::kNoSuchTable;
  return err::kBadCommand;
}

// Functions no statement on these connections may call, whatever the text
// or the file's schema says: fts3_tokenizer reads and writes a pointer to
// native code (an address leak with one argument, a call to any address
// with two), load_extension runs native code from a file.
int RefuseUnsafeFunctions(void*, int action, const char*, const char* function, const char*,
                          const char*) {
  if (action != SQLITE_FUNCTION || !function) return SQLITE_OK;
  for (const char* refused : {"fts3_tokenizer", "load_extension"})
    if (sqlite3_stricmp(function, refused) == 0) return SQLITE_DENY;
  return SQLITE_OK;
}

// Settings every connection gets before it reads anything of the file.
void Harden(sqlite3* db) {
  // Catalogue texts may not reach other files, and nothing may rewrite the
  // schema behind SQLite's back.
  sqlite3_limit(db, SQLITE_LIMIT_ATTACHED, 0);
  sqlite3_db_config(db, SQLITE_DBCONFIG_DEFENSIVE, 1, nullptr);
  // A database file comes from outside: its views and triggers may use only
  // functions without side effects, and full-text tokenizers cannot be
  // replaced.
  sqlite3_db_config(db, SQLITE_DBCONFIG_TRUSTED_SCHEMA, 0, nullptr);
  sqlite3_db_config(db, SQLITE_DBCONFIG_ENABLE_FTS3_TOKENIZER, 0, nullptr);
  sqlite3_db_config(db, SQLITE_DBCONFIG_ENABLE_LOAD_EXTENSION, 0, nullptr);
  sqlite3_set_authorizer(db, RefuseUnsafeFunctions, nullptr);
}

} // namespace

Database::Database(std::string path, Mode mode, std::string label, std::string source)
    : path_(std::move(path)), label_(std::move(label)), source_(std::move(source)) {
  namespace fs = std::filesystem;
  std::error_code ec;
  if (mode != Mode::Create) {
    if (!fs::exists(path_, ec)) Fail(err::kDataService, "the database file does not exist");
    if (fs::is_directory(path_, ec))
      Fail(err::kDataService, "this is a folder, not a database file");
  }
  int flags = 0;
  switch (mode) {
  case Mode::ReadOnly:
    flags |= SQLITE_OPEN_READONLY;
    break;
  case Mode::ReadWrite:
    flags |= SQLITE_OPEN_READWRITE;
    break;
  case Mode::Create:
    flags |= SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE;
    break;
  }
  int rc = sqlite3_open_v2(path_.c_str(), &db_, flags, nullptr);
  if (rc != SQLITE_OK) {
    std::string message = db_ ? sqlite3_errmsg(db_) : "out of memory";
    sqlite3_close(db_);
    db_ = nullptr;
    Fail(err::kDataService, "cannot open the database: " + message);
  }
  sqlite3_extended_result_codes(db_, 1);
  sqlite3_busy_timeout(db_, kBusyTimeoutMs);
  Harden(db_);
  try {
    if (mode == Mode::ReadOnly) Exec("PRAGMA query_only = 1");
    // SQLite reads the file lazily: read the schema now, so that a file that
    // is not a database fails here rather than on the first query.
    Statement probe(*this, "SELECT count(*) FROM sqlite_schema");
    probe.Step();
  } catch (...) {
    sqlite3_close(db_);
    db_ = nullptr;
    throw;
  }
}

// A statement that outlives its connection keeps the connection until it
// is finalized, rather than leaving it open for good.
Database::~Database() { sqlite3_close_v2(db_); }

void Database::Fail(int rc, std::string_view context) const {
  if (rc == SQLITE_READONLY_ROLLBACK || rc == SQLITE_READONLY_RECOVERY)
    Fail(err::kDataService,
         "a change to this file was interrupted (its journal is still beside it), and the file "
         "cannot be read until that change is rolled back. Run \"belvane catalogue recover --db " +
             path_ + "\" (or open the file once for writing) to roll it back.");
  std::string message = db_ ? sqlite3_errmsg(db_) : sqlite3_errstr(rc);
  std::string what(context);
  if (!what.empty()) what += ": ";
  what += message;
  // A damaged or foreign file surfaces on the first read as "not a database".
  Fail(NumberFor(rc, message), what);
}

void Database::Fail(long number, std::string_view what) const {
  throw Error(number, label_ + " " + path_ + ": " + std::string(what), source_);
}

void Database::Exec(std::string_view sql) {
  std::string text(sql);
  char* message = nullptr;
  int rc = sqlite3_exec(db_, text.c_str(), nullptr, nullptr, &message);
  if (rc != SQLITE_OK) {
    std::string m = message ? message : sqlite3_errstr(rc);
    sqlite3_free(message);
    Fail(NumberFor(rc, m), m);
  }
}

bool Database::HasTable(std::string_view table) {
  Statement st(*this, "SELECT 1 FROM sqlite_schema WHERE type IN ('table', 'view') AND name = ?1 "
                      "COLLATE NOCASE");
  st.BindText(1, table);
  return st.Step();
}

// --- Statement ---------------------------------------------------------------

Statement::Statement(Database& db, std::string_view sql) : db_(db), sql_(sql) {
  const char* tail = nullptr;
  int rc =
      sqlite3_prepare_v2(db.Handle(), sql_.c_str(), static_cast<int>(sql_.size()), &st_, &tail);
  if (rc != SQLITE_OK) {
    sqlite3_finalize(st_);
    st_ = nullptr;
    db.Fail(rc, "");
  }
  if (tail) tail_ = std::string_view(sql_).substr(static_cast<size_t>(tail - sql_.c_str()));
}

Statement::~Statement() { sqlite3_finalize(st_); }

int Statement::ParameterCount() const { return sqlite3_bind_parameter_count(st_); }

void Statement::Bind(int index, const Value& v) {
  switch (v.Type()) {
  case ValueType::Null:
    sqlite3_bind_null(st_, index);
    return;
  case ValueType::Boolean:
    BindInt(index, v.ToBool() ? 1 : 0);
    return;
  case ValueType::Integer:
  case ValueType::Long:
    BindInt(index, v.ToInt32());
    return;
  case ValueType::Double:
    sqlite3_bind_double(st_, index, v.ToDouble());
    return;
  case ValueType::Text:
    BindText(index, *v.TextIf());
    return;
  }
}

void Statement::BindText(int index, std::string_view s) {
  int rc = sqlite3_bind_text64(st_, index, s.data(), s.size(), SQLITE_TRANSIENT, SQLITE_UTF8);
  if (rc != SQLITE_OK) db_.Fail(rc, "cannot bind a value");
}

void Statement::BindInt(int index, long long n) {
  int rc = sqlite3_bind_int64(st_, index, n);
  if (rc != SQLITE_OK) db_.Fail(rc, "cannot bind a value");
}

bool Statement::Step() {
  int rc = sqlite3_step(st_);
  if (rc == SQLITE_ROW) return true;
  if (rc == SQLITE_DONE) return false;
  db_.Fail(rc, "");
}

void Statement::Reset() {
  sqlite3_reset(st_);
  sqlite3_clear_bindings(st_);
}

int Statement::ColumnCount() const { return sqlite3_column_count(st_); }

std::string Statement::ColumnName(int i) const {
  const char* name = sqlite3_column_name(st_, i);
  return name ? name : "";
}

std::string Statement::DeclaredType(int i) const {
  const char* decl = sqlite3_column_decltype(st_, i);
  return decl ? decl : "";
}

Value Statement::Column(int i) const {
  switch (sqlite3_column_type(st_, i)) {
  case SQLITE_NULL:
    return Value();
  case SQLITE_INTEGER: {
    sqlite3_int64 n = sqlite3_column_int64(st_, i);
    if (n >= INT32_MIN && n <= INT32_MAX) return Value(static_cast<int32_t>(n));
    return Value(static_cast<double>(n));
  }
  case SQLITE_FLOAT:
    return Value(sqlite3_column_double(st_, i));
  default: {
    const auto* p = static_cast<const char*>(sqlite3_column_blob(st_, i));
    return Value(std::string(p ? p : "", static_cast<size_t>(sqlite3_column_bytes(st_, i))));
  }
  }
}

long long Statement::ColumnInt64(int i) const { return sqlite3_column_int64(st_, i); }

bool Statement::ReadOnly() const { return sqlite3_stmt_readonly(st_) != 0; }

} // namespace belvane::data::sqlite
