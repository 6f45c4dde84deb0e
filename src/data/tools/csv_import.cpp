#include "data/tools/csv_import.hpp"

#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "data/sqlite/sqlite_db.hpp"
#include "data/tools/catalogue_check.hpp"
#include "data/tools/catalogue_schema.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <fcntl.h>
#include <sqlite3.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <memory>
#include <optional>
#include <sstream>
#include <system_error>

namespace belvane::data::tools {

namespace {

namespace fs = std::filesystem;

constexpr long kFileNotFound = 53;
constexpr long kFileAccess = 75;
constexpr const char* kSource = "Belvane.CatalogueImport";

// Blanks around a number are allowed (CSV files are often padded).
std::string_view TrimBlanks(std::string_view s) {
  while (!s.empty() && (s.front() == ' ' || s.front() == '\t'))
    s.remove_prefix(1);
  while (!s.empty() && (s.back() == ' ' || s.back() == '\t'))
    s.remove_suffix(1);
  return s;
}

std::optional<long long> ParseWhole(std::string_view s) {
  s = TrimBlanks(s);
  if (!s.empty() && s.front() == '+') s.remove_prefix(1);
  long long n = 0;
  auto [end, ec] = std::from_chars(s.data(), s.data() + s.size(), n);
  if (s.empty() || ec != std::errc() || end != s.data() + s.size()) return std::nullopt;
  return n;
}

// A number written with '.' as the decimal point, no grouping, no exponent.
std::optional<double> ParsePlainNumber(std::string_view s) {
  s = TrimBlanks(s);
  if (!s.empty() && s.front() == '+') s.remove_prefix(1);
  std::string_view digits = s.substr(!s.empty() && s.front() == '-' ? 1 : 0);
  if (digits.empty() || digits.find_first_not_of("0123456789.") != std::string_view::npos ||
      digits.find_first_of("0123456789") == std::string_view::npos)
    return std::nullopt;
  double d = 0;
  auto [end, ec] = std::from_chars(s.data(), s.data() + s.size(), d, std::chars_format::fixed);
  if (ec != std::errc() || end != s.data() + s.size() || !std::isfinite(d)) return std::nullopt;
  return d;
}

bool IsBlank(std::string_view s) { return s.find_first_not_of(' ') == std::string_view::npos; }

// SQLite's column affinity, from the declared type.
enum class Affinity { Integer, Text, None, Real, Numeric };

Affinity AffinityOf(const std::string& declared) {
  const std::string t = text::UCase(declared);
  auto has = [&t](const char* s) { return t.find(s) != std::string::npos; };
  if (has("INT")) return Affinity::Integer;
  if (has("CHAR") || has("CLOB") || has("TEXT")) return Affinity::Text;
  if (t.empty() || has("BLOB")) return Affinity::None;
  if (has("REAL") || has("FLOA") || has("DOUB")) return Affinity::Real;
  return Affinity::Numeric;
}

// How an import writes the values of a column.
enum class Cipher {
  None,    // as they are
  Always,  // every value that is not blank enciphered
  Long,    // the hours rule: numbers, enciphered from 16 characters on
  LongAll, // the hours rule, every number enciphered (--encipher)
};

// The values (not blank) a column of a table holds.
long long ValuesHeld(sqlite::Database& db, const std::string& table, const std::string& column) {
  sqlite::Statement st(db, "SELECT count(*) FROM " + QuoteName(table) + " WHERE " +
                               QuoteName(column) + " IS NOT NULL AND trim(" + QuoteName(column) +
                               ") <> ''");
  st.Step();
  return st.ColumnInt64(0);
}

void RegisterCipherColumn(sqlite::Database& db, const std::string& table, const std::string& column,
                          CipherRule rule) {
  sqlite::Statement reg(db, "INSERT OR IGNORE INTO CIPHER_COLUMN (table_name, column_name, rule) "
                            "VALUES (?1, ?2, ?3)");
  reg.BindText(1, table);
  reg.BindText(2, column);
  reg.BindText(3, CipherRuleName(rule));
  reg.Step();
}

struct TableColumn {
  std::string name;
  Affinity affinity;
};

std::string ReadFile(const std::string& path) {
  std::error_code ec;
  if (!fs::exists(path, ec))
    throw Error(kFileNotFound, "File not found: CSV file " + path, kSource);
  std::ifstream in(path, std::ios::binary);
  if (!in || fs::is_directory(path, ec))
    throw Error(kFileAccess, "Path/File access error: cannot read CSV file " + path, kSource);
  std::stringstream s;
  s << in.rdbuf();
  if (in.bad())
    throw Error(kFileAccess, "Path/File access error: cannot read CSV file " + path, kSource);
  return s.str();
}

[[noreturn]] void Malformed(const std::string& file, long line, const std::string& reason,
                            long number = err::kInvalidCall) {
  throw Error(number, file + " line " + std::to_string(line) + ": " + reason, kSource);
}

// The catalogue an import writes: a copy beside the target
// (<target>.import-partial), filled and then put in place with one rename,
// so that a crash or a kill at any moment leaves either the old catalogue or
// the new one at the target, never a half-written file or a journal that
// read-only readers cannot roll back. A leftover copy of an import that was
// killed is reused by the next import.
class ImportTarget {
public:
  explicit ImportTarget(std::string path)
      : path_(std::move(path)), partial_(path_ + ".import-partial") {
    std::error_code ec;
    existed_ = fs::exists(path_, ec);
    if (existed_ && fs::is_directory(path_, ec)) Fail("this is a folder, not a catalogue file");
    if (existed_ && ::access(path_.c_str(), W_OK) != 0)
      Fail(std::string("the catalogue file is read-only (") + std::strerror(errno) +
           "); an import replaces it, so it must be writable");
    LockPartial();
    try {
      Open();
    } catch (...) {
      Discard();
      throw;
    }
  }

  ~ImportTarget() { Discard(); }

  ImportTarget(const ImportTarget&) = delete;
  ImportTarget& operator=(const ImportTarget&) = delete;

  sqlite::Database& Db() { return *db_; }
  bool Created() const { return !existed_; }

  // Writes the copy to disk and puts it in place of the target.
  void Commit() {
    db_->Exec("COMMIT");
    db_.reset();
    if (::fsync(lockFd_) != 0)
      Fail(std::string("cannot write the new catalogue: ") + std::strerror(errno));
    if (existed_) {
      std::error_code ec;
      fs::permissions(partial_, fs::status(path_, ec).permissions(), ec);
      if (::rename(partial_.c_str(), path_.c_str()) != 0)
        Fail(std::string("cannot put the new catalogue in place: ") + std::strerror(errno));
    } else {
      PlaceNew();
    }
    committed_ = true;
    SyncFolder();
    original_.reset();
  }

private:
  void Open() {
    if (existed_) {
      // Opening for writing rolls back a change an older tool left
      // unfinished; the write lock keeps other writers out until the new
      // file is in place, while readers carry on with the old one.
      original_ = std::make_unique<sqlite::Database>(path_, sqlite::Database::Mode::ReadWrite);
      original_->Exec("BEGIN IMMEDIATE");
    }
    db_ = std::make_unique<sqlite::Database>(partial_, sqlite::Database::Mode::Create);
    if (original_) CopyOriginal();
    // The copy is private until it is renamed, so it needs no journal.
    db_->Exec("PRAGMA journal_mode = OFF; PRAGMA synchronous = OFF");
    db_->Exec("BEGIN");
  }

  // Puts a new catalogue in place unless a file appeared at the target
  // meanwhile, which is never replaced.
  void PlaceNew() {
    if (::renameat2(AT_FDCWD, partial_.c_str(), AT_FDCWD, path_.c_str(), RENAME_NOREPLACE) == 0)
      return;
    if (errno == EEXIST)
      Fail("another program created the catalogue while this import ran; nothing was written, "
           "run the import again");
    if (errno != EINVAL && errno != ENOSYS)
      Fail(std::string("cannot put the new catalogue in place: ") + std::strerror(errno));
    // A file system without that kind of rename.
    std::error_code ec;
    if (fs::exists(path_, ec))
      Fail("another program created the catalogue while this import ran; nothing was written, "
           "run the import again");
    if (::rename(partial_.c_str(), path_.c_str()) != 0)
      Fail(std::string("cannot put the new catalogue in place: ") + std::strerror(errno));
  }

  void Discard() {
    db_.reset();
    original_.reset();
    if (lockFd_ < 0) return;
    if (!committed_) {
      std::error_code ec;
      fs::remove(partial_, ec);
    }
    ::close(lockFd_);
    lockFd_ = -1;
  }

  [[noreturn]] void Fail(const std::string& what) const {
    throw Error(err::kDataService, "Catalogue " + path_ + ": " + what, sqlite::kSource);
  }

  // Takes the copy's file for this import alone: a second import of the
  // same catalogue is told so instead of writing the same copy.
  void LockPartial() {
    for (int attempt = 0; attempt < 5; ++attempt) {
      const int fd = ::open(partial_.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0644);
      if (fd < 0) Fail("cannot create " + partial_ + " beside it: " + std::strerror(errno));
      if (::flock(fd, LOCK_EX | LOCK_NB) != 0) {
        const int e = errno;
        ::close(fd);
        if (e == EWOULDBLOCK)
          Fail("another import into this catalogue is running; wait for it to finish");
        Fail("cannot lock " + partial_ + ": " + std::strerror(e));
      }
      // The file locked must still be the one at that name (an import that
      // just finished renamed it away), and named only there.
      struct stat held {
      }, named{};
      if (::fstat(fd, &held) == 0 && ::stat(partial_.c_str(), &named) == 0 &&
          held.st_ino == named.st_ino && held.st_dev == named.st_dev) {
        if (held.st_nlink == 1 && ::ftruncate(fd, 0) == 0) {
          lockFd_ = fd;
          return;
        }
        ::unlink(partial_.c_str()); // linked elsewhere too: never truncate it
      }
      ::close(fd);
    }
    Fail("cannot take " + partial_ + " for this import; try again");
  }

  // Copies the catalogue page by page through a connection of its own (the
  // one holding the write lock cannot be read from by a copy).
  void CopyOriginal() {
    sqlite::Database source(path_, sqlite::Database::Mode::ReadOnly);
    sqlite3_backup* backup = sqlite3_backup_init(db_->Handle(), "main", source.Handle(), "main");
    if (!backup) db_->Fail(sqlite3_extended_errcode(db_->Handle()), "cannot copy the catalogue");
    const int rc = sqlite3_backup_step(backup, -1);
    sqlite3_backup_finish(backup);
    if (rc != SQLITE_DONE) {
      if (sqlite3_extended_errcode(db_->Handle()) != SQLITE_OK)
        db_->Fail(sqlite3_extended_errcode(db_->Handle()), "cannot copy the catalogue");
      source.Fail(rc, "cannot copy the catalogue");
    }
  }

  void SyncFolder() const {
    const fs::path folder = fs::absolute(fs::path(path_)).parent_path();
    const int fd = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (fd < 0) return;
    ::fsync(fd);
    ::close(fd);
  }

  std::string path_, partial_;
  bool existed_ = false;
  bool committed_ = false;
  int lockFd_ = -1;
  std::unique_ptr<sqlite::Database> original_;
  std::unique_ptr<sqlite::Database> db_;
};

} // namespace

std::vector<CsvRecord> ParseCsv(std::string_view text, const std::string& fileName) {
  std::vector<CsvRecord> records;
  if (text.starts_with("\xEF\xBB\xBF")) text.remove_prefix(3);
  // A line ends with LF, CR LF, or a CR that is the last character.
  auto lineEndAt = [&text](size_t at) -> size_t {
    if (at >= text.size()) return 0;
    if (text[at] == '\n') return 1;
    if (text[at] == '\r') {
      if (at + 1 == text.size()) return 1;
      if (text[at + 1] == '\n') return 2;
    }
    return 0;
  };
  size_t i = 0;
  long line = 1;
  while (i < text.size()) {
    // An entirely empty line holds no record.
    if (const size_t n = lineEndAt(i)) {
      i += n;
      ++line;
      continue;
    }
    CsvRecord rec;
    rec.line = line;
    for (;;) {
      CsvField field;
      if (i < text.size() && text[i] == '"') {
        field.quoted = true;
        const long quoteLine = line;
        ++i;
        for (;;) {
          if (i >= text.size())
            Malformed(fileName, quoteLine,
                      "a quoted field is not closed before the end of the file");
          if (text[i] == '"') {
            if (i + 1 < text.size() && text[i + 1] == '"') {
              field.text += '"';
              i += 2;
              continue;
            }
            ++i;
            break;
          }
          if (text[i] == '\n') ++line;
          field.text += text[i++];
        }
        if (i < text.size() && text[i] != ',' && !lineEndAt(i))
          Malformed(fileName, line, "text after the closing quote of a field");
      } else {
        while (i < text.size() && text[i] != ',' && !lineEndAt(i))
          field.text += text[i++];
      }
      rec.fields.push_back(std::move(field));
      if (i < text.size() && text[i] == ',') {
        ++i;
        continue;
      }
      break; // end of line or of the text
    }
    if (i < text.size()) {
      i += lineEndAt(i);
      ++line;
    }
    records.push_back(std::move(rec));
  }
  return records;
}

ImportResult ImportCsv(const ImportOptions& o) {
  const std::string csv = ReadFile(o.csvFile);
  if (!text::IsValidUtf8(csv)) {
    // Find the line for the report.
    long line = 1;
    size_t start = 0;
    for (size_t nl; (nl = csv.find('\n', start)) != std::string::npos; start = nl + 1, ++line)
      if (!text::IsValidUtf8(std::string_view(csv).substr(start, nl - start))) break;
    Malformed(o.csvFile, line, "the text is not valid UTF-8");
  }
  const std::vector<CsvRecord> records = ParseCsv(csv, o.csvFile);
  if (records.empty()) Malformed(o.csvFile, 1, "the file has no header line");

  ImportTarget out(o.database);
  sqlite::Database& db = out.Db();
  const bool create = out.Created();
  if (create) {
    CreateCatalogueTables(db);
    CreateCatalogueIndexes(db);
  }

  // The table and its columns, as the database has them.
  ImportResult result;
  result.createdDatabase = create;
  {
    sqlite::Statement st(db, "SELECT name FROM sqlite_schema WHERE type = 'table' AND name = ?1 "
                             "COLLATE NOCASE");
    st.BindText(1, o.table);
    if (!st.Step()) db.Fail(err::kNoSuchTable, "no such table: " + o.table);
    result.table = st.Column(0).ToText();
  }
  std::vector<TableColumn> columns;
  {
    sqlite::Statement st(db, "SELECT name, type FROM pragma_table_info(?1)");
    st.BindText(1, result.table);
    while (st.Step())
      columns.push_back({st.Column(0).ToText(), AffinityOf(st.Column(1).ToText())});
  }

  // The header: each name a column of the table, none twice.
  const CsvRecord& header = records.front();
  std::vector<const TableColumn*> target;
  for (const CsvField& f : header.fields) {
    const std::string name = text::Trim(f.text);
    if (name.empty()) Malformed(o.csvFile, header.line, "a column name in the header is empty");
    const TableColumn* found = nullptr;
    for (const TableColumn& c : columns)
      if (text::EqualsNoCase(c.name, name)) found = &c;
    if (!found)
      Malformed(o.csvFile, header.line,
                "table " + result.table + " has no column \"" + name + "\"");
    for (const TableColumn* t : target)
      if (t == found) Malformed(o.csvFile, header.line, "column \"" + name + "\" appears twice");
    target.push_back(found);
  }
  // Which columns hold enciphered values: those the catalogue lists (its
  // CIPHER_COLUMN table, else the standard list), and those --encipher
  // names. A column must never mix plain and enciphered values, so
  // --encipher on a column that is not listed yet is refused while the
  // table holds values in it.
  const bool hasList = db.HasTable(kCipherColumnTable);
  std::vector<CipherColumn> listed;
  if (hasList) {
    sqlite::Statement st(db, "SELECT column_name, rule FROM CIPHER_COLUMN WHERE table_name = ?1 "
                             "COLLATE NOCASE");
    st.BindText(1, result.table);
    while (st.Step())
      listed.push_back({result.table, st.Column(0).ToText(),
                        st.Column(1).ToText() == "long" ? CipherRule::Long : CipherRule::Always});
  } else {
    for (const CipherColumn& c : StandardCipherColumns())
      if (text::EqualsNoCase(c.table, result.table)) listed.push_back(c);
  }
  std::vector<Cipher> cipherOf(target.size(), Cipher::None);
  for (size_t k = 0; k < target.size(); ++k)
    for (const CipherColumn& c : listed)
      if (text::EqualsNoCase(c.column, target[k]->name))
        cipherOf[k] = c.rule == CipherRule::Long ? Cipher::Long : Cipher::Always;
  std::vector<bool> newlyListed(target.size(), false);
  for (const std::string& col : o.encipher) {
    bool named = false;
    for (size_t k = 0; k < target.size(); ++k) {
      if (!text::EqualsNoCase(target[k]->name, text::Trim(col))) continue;
      named = true;
      if (cipherOf[k] == Cipher::None) {
        const long long held = ValuesHeld(db, result.table, target[k]->name);
        if (held > 0)
          throw Error(err::kInvalidCall,
                      "Column " + target[k]->name + " of " + result.table + " already holds " +
                          std::to_string(held) +
                          " values that are not enciphered; enciphering the new ones would mix "
                          "plain and enciphered values in one column. Nothing was written.",
                      kSource);
        newlyListed[k] = true;
      }
      cipherOf[k] = cipherOf[k] == Cipher::Long ? Cipher::LongAll : Cipher::Always;
    }
    if (!named)
      throw Error(err::kInvalidCall,
                  "--encipher names column \"" + col + "\", which the header of " + o.csvFile +
                      " does not have",
                  kSource);
  }
  for (size_t k = 0; k < target.size(); ++k)
    if (cipherOf[k] != Cipher::None && target[k]->affinity != Affinity::Text &&
        target[k]->affinity != Affinity::None)
      throw Error(err::kInvalidCall,
                  "Column " + target[k]->name + " of " + result.table +
                      " holds numbers and cannot hold enciphered text",
                  kSource);

  std::string sql = "INSERT INTO " + QuoteName(result.table) + " (";
  for (size_t k = 0; k < target.size(); ++k)
    sql += (k ? ", " : "") + QuoteName(target[k]->name);
  sql += ") VALUES (";
  for (size_t k = 0; k < target.size(); ++k)
    sql += (k ? ", ?" : "?") + std::to_string(k + 1);
  sql += ")";
  // The statement ends before the copy is closed and put in place: a
  // connection with a statement still open cannot be closed.
  auto insertHolder = std::make_unique<sqlite::Statement>(db, sql);
  sqlite::Statement& insert = *insertHolder;

  for (size_t r = 1; r < records.size(); ++r) {
    const CsvRecord& rec = records[r];
    if (rec.fields.size() != target.size())
      Malformed(o.csvFile, rec.line,
                std::to_string(rec.fields.size()) + " fields; the header has " +
                    std::to_string(target.size()));
    for (size_t k = 0; k < target.size(); ++k) {
      const CsvField& f = rec.fields[k];
      const TableColumn& col = *target[k];
      const int index = static_cast<int>(k + 1);
      auto bad = [&](const char* what) {
        Malformed(o.csvFile, rec.line, "column " + col.name + ": \"" + f.text + "\" is not " + what,
                  err::kTypeMismatch);
      };
      if (f.text.empty() && !f.quoted) {
        insert.Bind(index, Value());
        continue;
      }
      if (cipherOf[k] == Cipher::Long && f.text.size() >= 16) {
        // The hours columns: a value this long is one enciphered already
        // (as a catalogue holds it), which must decipher to a number.
        bool enciphered = false;
        const std::string why = CheckEncipheredValue(f.text, true, enciphered);
        if (!why.empty())
          Malformed(o.csvFile, rec.line, "column " + col.name + ": \"" + f.text + "\" " + why,
                    err::kTypeMismatch);
        insert.BindText(index, f.text);
        continue;
      }
      if ((cipherOf[k] == Cipher::Long || cipherOf[k] == Cipher::LongAll) && !IsBlank(f.text) &&
          !ParsePlainNumber(f.text))
        bad("a number"); // the hours are numbers, plain or enciphered
      const bool encipherThis =
          !IsBlank(f.text) && (cipherOf[k] == Cipher::Always || cipherOf[k] == Cipher::LongAll);
      if (encipherThis) {
        try {
          insert.BindText(index, cipher::EncryptField(f.text));
        } catch (const Error& e) {
          Malformed(o.csvFile, rec.line, "column " + col.name + ": " + e.Description(), e.Number());
        }
        continue;
      }
      switch (col.affinity) {
      case Affinity::Integer:
        if (auto n = ParseWhole(f.text))
          insert.BindInt(index, *n);
        else
          bad("a whole number");
        break;
      case Affinity::Real:
      case Affinity::Numeric:
        if (auto d = ParsePlainNumber(f.text))
          insert.Bind(index, Value(*d));
        else
          bad("a number");
        break;
      case Affinity::None:
        if (auto d = ParsePlainNumber(f.text); d && f.text.size() < 16)
          insert.Bind(index, Value(*d));
        else
          insert.BindText(index, f.text);
        break;
      case Affinity::Text:
        insert.BindText(index, f.text);
        break;
      }
    }
    try {
      insert.Step();
    } catch (const Error& e) {
      // A row the table refuses is the file's fault; a database that cannot
      // be written is not.
      if (e.Number() == err::kDataService) throw;
      Malformed(o.csvFile, rec.line, e.Description(), e.Number());
    }
    insert.Reset();
    ++result.rows;
  }
  insertHolder.reset();

  // Record the columns --encipher added, so that readers and `check` know
  // them. A catalogue without the list gets one, holding the standard
  // columns it went by until now.
  if (std::find(newlyListed.begin(), newlyListed.end(), true) != newlyListed.end()) {
    if (!hasList) {
      db.Exec(CreateTableSql(*FindCatalogueTable(kCipherColumnTable)));
      for (const CipherColumn& c : StandardCipherColumns())
        RegisterCipherColumn(db, c.table, c.column, c.rule);
    }
    for (size_t k = 0; k < target.size(); ++k)
      if (newlyListed[k])
        RegisterCipherColumn(db, result.table, target[k]->name, CipherRule::Always);
  }
  out.Commit();
  return result;
}

} // namespace belvane::data::tools
