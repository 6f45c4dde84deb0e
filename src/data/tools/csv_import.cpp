#include "data/tools/csv_import.hpp"

#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "data/sqlite/sqlite_db.hpp"
#include "data/tools/catalogue_schema.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <charconv>
#include <cmath>
#include <filesystem>
#include <fstream>
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

bool ValidUtf8(std::string_view s) {
  size_t i = 0;
  while (i < s.size()) {
    const auto c = static_cast<unsigned char>(s[i]);
    size_t n = c < 0x80 ? 0 : (c >> 5) == 6 ? 1 : (c >> 4) == 14 ? 2 : (c >> 3) == 30 ? 3 : 9;
    if (n == 9 || (n == 1 && c < 0xC2) || i + n > s.size() - 1) return false;
    for (size_t k = 1; k <= n; ++k)
      if ((static_cast<unsigned char>(s[i + k]) >> 6) != 2) return false;
    i += n + 1;
  }
  return true;
}

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

// Removes the database file again when the import created it and failed.
class CreatedFileGuard {
public:
  CreatedFileGuard(std::string path, bool created) : path_(std::move(path)), armed_(created) {}
  ~CreatedFileGuard() {
    if (!armed_) return;
    std::error_code ec;
    for (const char* suffix : {"", "-journal", "-wal", "-shm"})
      fs::remove(path_ + suffix, ec);
  }
  void Keep() { armed_ = false; }

private:
  std::string path_;
  bool armed_;
};

} // namespace

std::vector<CsvRecord> ParseCsv(std::string_view text, const std::string& fileName) {
  std::vector<CsvRecord> records;
  if (text.starts_with("\xEF\xBB\xBF")) text.remove_prefix(3);
  size_t i = 0;
  long line = 1;
  while (i < text.size()) {
    // An entirely empty line holds no record.
    if (text[i] == '\n' || (text[i] == '\r' && i + 1 < text.size() && text[i + 1] == '\n')) {
      i += text[i] == '\r' ? 2 : 1;
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
        if (i < text.size() && text[i] != ',' && text[i] != '\n' &&
            !(text[i] == '\r' && i + 1 < text.size() && text[i + 1] == '\n'))
          Malformed(fileName, line, "text after the closing quote of a field");
      } else {
        while (i < text.size() && text[i] != ',' && text[i] != '\n' &&
               !(text[i] == '\r' && i + 1 < text.size() && text[i + 1] == '\n'))
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
      i += text[i] == '\r' ? 2 : 1;
      ++line;
    }
    records.push_back(std::move(rec));
  }
  return records;
}

ImportResult ImportCsv(const ImportOptions& o) {
  const std::string csv = ReadFile(o.csvFile);
  if (!ValidUtf8(csv)) {
    // Find the line for the report.
    long line = 1;
    size_t start = 0;
    for (size_t nl; (nl = csv.find('\n', start)) != std::string::npos; start = nl + 1, ++line)
      if (!ValidUtf8(std::string_view(csv).substr(start, nl - start))) break;
    Malformed(o.csvFile, line, "the text is not valid UTF-8");
  }
  const std::vector<CsvRecord> records = ParseCsv(csv, o.csvFile);
  if (records.empty()) Malformed(o.csvFile, 1, "the file has no header line");

  std::error_code ec;
  const bool create = !fs::exists(o.database, ec);
  CreatedFileGuard guard(o.database, create);
  sqlite::Database db(o.database,
                      create ? sqlite::Database::Mode::Create : sqlite::Database::Mode::ReadWrite);
  db.Exec("BEGIN IMMEDIATE");
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
  std::vector<bool> encipher(target.size(), false);
  for (const std::string& col : o.encipher) {
    bool named = false;
    for (size_t k = 0; k < target.size(); ++k) {
      if (!text::EqualsNoCase(target[k]->name, text::Trim(col))) continue;
      if (target[k]->affinity != Affinity::Text && target[k]->affinity != Affinity::None)
        throw Error(err::kInvalidCall,
                    "Column " + target[k]->name + " of " + result.table +
                        " holds numbers and cannot hold enciphered text",
                    kSource);
      encipher[k] = named = true;
    }
    if (!named)
      throw Error(err::kInvalidCall,
                  "--encipher names column \"" + col + "\", which the header of " + o.csvFile +
                      " does not have",
                  kSource);
  }

  std::string sql = "INSERT INTO " + QuoteName(result.table) + " (";
  for (size_t k = 0; k < target.size(); ++k)
    sql += (k ? ", " : "") + QuoteName(target[k]->name);
  sql += ") VALUES (";
  for (size_t k = 0; k < target.size(); ++k)
    sql += (k ? ", ?" : "?") + std::to_string(k + 1);
  sql += ")";
  sqlite::Statement insert(db, sql);

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
      if (encipher[k] && !IsBlank(f.text)) {
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
      Malformed(o.csvFile, rec.line, e.Description(), e.Number());
    }
    insert.Reset();
    ++result.rows;
  }

  // Record the enciphered columns, so that `check` looks at them.
  if (db.HasTable(kCipherColumnTable)) {
    sqlite::Statement reg(db, "INSERT OR IGNORE INTO CIPHER_COLUMN (table_name, column_name, rule) "
                              "VALUES (?1, ?2, 'always')");
    for (size_t k = 0; k < target.size(); ++k) {
      if (!encipher[k]) continue;
      reg.BindText(1, result.table);
      reg.BindText(2, target[k]->name);
      reg.Step();
      reg.Reset();
    }
  }
  db.Exec("COMMIT");
  guard.Keep();
  return result;
}

} // namespace belvane::data::tools
