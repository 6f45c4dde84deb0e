#include "data/tools/catalogue_check.hpp"

#include "cipher/field.hpp"
#include "data/sqlite/sqlite_db.hpp"
#include "data/tools/catalogue_schema.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <filesystem>
#include <system_error>

namespace belvane::data::tools {

namespace {

bool IsHexDigit(char c) {
  return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'F') || (c >= 'a' && c <= 'f');
}

// A plain number as catalogues hold hours: '.' as the decimal point.
bool IsPlainNumber(std::string_view s) {
  if (s.empty() || s.find_first_not_of("+-0123456789.") != std::string_view::npos) return false;
  if (s.front() == '+') s.remove_prefix(1);
  double d = 0;
  auto [end, ec] = std::from_chars(s.data(), s.data() + s.size(), d, std::chars_format::fixed);
  return ec == std::errc() && end == s.data() + s.size() && std::isfinite(d);
}

void CheckContents(sqlite::Database& db, CheckReport& report);

} // namespace

std::string CheckEncipheredValue(const std::string& stored, bool longRule, bool& wasEnciphered) {
  wasEnciphered = false;
  // The parts loader trims names and numbers before deciphering them.
  const std::string value = longRule ? stored : text::Trim(stored);
  if (value.empty()) return ""; // blank: no value
  if (longRule && value.size() < 16) {
    return IsPlainNumber(value) ? "" : "\"" + value + "\" is neither a number nor enciphered";
  }
  wasEnciphered = true;
  if (!std::all_of(value.begin(), value.end(), IsHexDigit))
    return "not hexadecimal, so not an enciphered value";
  if (value.size() % 16 != 0)
    return std::to_string(value.size()) + " digits: an enciphered value has a multiple of 16";
  std::string plain;
  try {
    plain = cipher::DecryptField(value);
    // A value enciphered under another key deciphers to garbage whose
    // padding is almost never right: enciphering it again does not give the
    // stored text back.
    if (!text::EqualsNoCase(cipher::EncryptField(plain), value))
      return "does not decipher under the current key";
  } catch (const Error&) {
    return "does not decipher under the current key";
  }
  // Tabs and line breaks can be part of a text; other control characters
  // are what a wrong key leaves.
  if (std::any_of(plain.begin(), plain.end(), [](char c) {
        return (static_cast<unsigned char>(c) < 32 && c != '\t' && c != '\n' && c != '\r') ||
               c == 127;
      }))
    return "deciphers to control characters (is this the right key?)";
  if (longRule && !IsPlainNumber(plain)) return "deciphers to a text that is not a number";
  return "";
}

CheckReport CheckCatalogue(const std::string& database) {
  sqlite::Database db(database, sqlite::Database::Mode::ReadOnly);
  CheckReport report;
  // Counting rows reads an index rather than the table, and the checks
  // below read only some columns: a damaged page shows only here.
  constexpr int kDamageReported = 100;
  try {
    sqlite::Statement st(db, "PRAGMA integrity_check(" + std::to_string(kDamageReported) + ")");
    while (st.Step()) {
      std::string line = st.Column(0).ToText();
      if (line != "ok") report.damage.push_back(std::move(line));
    }
  } catch (const Error& e) {
    report.damage.push_back(e.Description());
  }
  // A damaged file may fail anywhere below; what was found so far stands.
  try {
    CheckContents(db, report);
  } catch (const Error& e) {
    report.damage.push_back(e.Description());
  }
  return report;
}

bool RecoverCatalogue(const std::string& database) {
  std::error_code ec;
  const bool hadJournal = std::filesystem::file_size(database + "-journal", ec) > 0 && !ec;
  // A connection that may write rolls an interrupted change back as it first
  // reads the file.
  sqlite::Database db(database, sqlite::Database::Mode::ReadWrite);
  return hadJournal;
}

namespace {

// The tables, the catalogue columns and every enciphered value.
void CheckContents(sqlite::Database& db, CheckReport& report) {
  {
    sqlite::Statement st(db, "SELECT name FROM sqlite_schema WHERE type = 'table' AND name NOT "
                             "LIKE 'sqlite\\_%' ESCAPE '\\' ORDER BY name COLLATE NOCASE");
    while (st.Step())
      report.tables.push_back({st.Column(0).ToText(), 0});
  }
  for (CheckedTable& t : report.tables) {
    sqlite::Statement st(db, "SELECT count(*) FROM " + QuoteName(t.name));
    st.Step();
    t.rows = st.ColumnInt64(0);
  }

  auto columnsOf = [&db](const std::string& table) {
    std::vector<std::string> names;
    sqlite::Statement st(db, "SELECT name FROM pragma_table_info(?1)");
    st.BindText(1, table);
    while (st.Step())
      names.push_back(st.Column(0).ToText());
    return names;
  };
  auto hasColumn = [](const std::vector<std::string>& names, const std::string& name) {
    return std::any_of(names.begin(), names.end(),
                       [&](const std::string& n) { return text::EqualsNoCase(n, name); });
  };

  for (const TableDef& def : CatalogueTables()) {
    if (!db.HasTable(def.name)) {
      report.missing.push_back("table " + def.name);
      continue;
    }
    const auto names = columnsOf(def.name);
    for (const ColumnDef& c : def.columns)
      if (!hasColumn(names, c.name)) report.missing.push_back("column " + def.name + "." + c.name);
  }

  // The enciphered columns: as the catalogue lists them, else the standard
  // ones.
  std::vector<CipherColumn> cipherColumns;
  if (db.HasTable(kCipherColumnTable)) {
    sqlite::Statement st(db, "SELECT table_name, column_name, rule FROM CIPHER_COLUMN ORDER BY "
                             "rowid");
    while (st.Step())
      cipherColumns.push_back(
          {st.Column(0).ToText(), st.Column(1).ToText(),
           st.Column(2).ToText() == "long" ? CipherRule::Long : CipherRule::Always});
  } else {
    cipherColumns = StandardCipherColumns();
  }

  for (const CipherColumn& c : cipherColumns) {
    if (!db.HasTable(c.table) || !hasColumn(columnsOf(c.table), c.column)) continue;
    sqlite::Statement st(db, "SELECT rowid, " + QuoteName(c.column) + " FROM " +
                                 QuoteName(c.table) + " ORDER BY rowid");
    while (st.Step()) {
      const Value v = st.Column(1);
      if (v.IsNull()) continue;
      // Plain numbers are allowed in the hours columns only.
      if (!v.TextIf()) {
        if (c.rule == CipherRule::Always)
          report.bad.push_back(
              {c.table, c.column, st.ColumnInt64(0), "a number where an enciphered text belongs"});
        continue;
      }
      bool enciphered = false;
      std::string reason =
          CheckEncipheredValue(*v.TextIf(), c.rule == CipherRule::Long, enciphered);
      if (enciphered) ++report.enciphered;
      if (!reason.empty()) report.bad.push_back({c.table, c.column, st.ColumnInt64(0), reason});
    }
  }
}

} // namespace

} // namespace belvane::data::tools
