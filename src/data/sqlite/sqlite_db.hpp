#pragma once
// A thin owner of an SQLite connection and its statements, for the catalogue
// service and the catalogue tools. Every failure becomes a belvane::Error
// whose description names the database file and what went wrong:
//   err::kDataService  the file cannot be opened, read or written;
//   err::kNoSuchTable  a statement names a table the database lacks;
//   err::kBadCommand   any other statement that cannot run.

#include "data/value.hpp"

#include <string>
#include <string_view>

struct sqlite3;
struct sqlite3_stmt;

namespace belvane::data::sqlite {

inline constexpr const char* kSource = "Belvane.Catalogue";

class Database {
public:
  enum class Mode {
    ReadOnly,  // an existing file, read only (the catalogue service)
    ReadWrite, // an existing file
    Create     // created when missing
  };

  // `label` names the kind of database in error descriptions ("Catalogue
  // <file>: ..."), `source` is the errors' source.
  Database(std::string path, Mode mode, std::string label = "Catalogue",
           std::string source = kSource);
  ~Database();
  Database(const Database&) = delete;
  Database& operator=(const Database&) = delete;

  sqlite3* Handle() const { return db_; }
  const std::string& Path() const { return path_; }

  // Runs statements that return nothing of interest (schema, pragmas,
  // transactions).
  void Exec(std::string_view sql);

  // Raises the error for SQLite result code `rc` with the connection's
  // message, as "Catalogue <file>: <context>: <message>".
  [[noreturn]] void Fail(int rc, std::string_view context) const;
  // Raises `number` with "Catalogue <file>: <what>".
  [[noreturn]] void Fail(long number, std::string_view what) const;

  bool HasTable(std::string_view table);

private:
  sqlite3* db_ = nullptr;
  std::string path_;
  std::string label_;
  std::string source_;
};

class Statement {
public:
  // Prepares the first statement of `sql`; the rest of the text, if any, is
  // available from Tail().
  Statement(Database& db, std::string_view sql);
  ~Statement();
  Statement(const Statement&) = delete;
  Statement& operator=(const Statement&) = delete;

  // The text after the first statement.
  std::string_view Tail() const { return tail_; }
  sqlite3_stmt* Handle() const { return st_; }
  bool Empty() const { return st_ == nullptr; } // the text held only blanks or comments

  int ParameterCount() const;
  void Bind(int index, const Value& v);
  void BindText(int index, std::string_view s);
  void BindInt(int index, long long n);

  // Steps once: true while a row is current.
  bool Step();
  void Reset();

  int ColumnCount() const;
  std::string ColumnName(int i) const;
  // The declared type of a result column taken straight from a table column
  // ("" for an expression or an untyped column).
  std::string DeclaredType(int i) const;
  // Integers that do not fit 32 bits come back as Double; blobs as text.
  Value Column(int i) const;
  long long ColumnInt64(int i) const;
  bool ReadOnly() const;

private:
  Database& db_;
  sqlite3_stmt* st_ = nullptr;
  std::string sql_;
  std::string_view tail_;
};

} // namespace belvane::data::sqlite
