#pragma once
// Checking a catalogue database: its tables and row counts, the catalogue
// tables or columns it lacks, and every enciphered value that does not
// decipher under the field key in force on the calling thread.

#include <string>
#include <vector>

namespace belvane::data::tools {

struct CheckedTable {
  std::string name;
  long long rows = 0;
};

struct BadValue {
  std::string table;
  std::string column;
  long long rowid = 0;
  std::string reason;
};

struct CheckReport {
  std::vector<std::string> damage;  // what SQLite's integrity check found, or a read that failed
  std::vector<CheckedTable> tables; // every table of the database, by name
  std::vector<std::string> missing; // catalogue tables or columns that are absent
  long long enciphered = 0;         // enciphered values checked
  std::vector<BadValue> bad;        // values that do not decipher, in table order
  bool Clean() const { return damage.empty() && missing.empty() && bad.empty(); }
};

// A value of an enciphered column and whether it deciphers. `longRule`: the
// column holds plain numbers below 16 characters (the labour hours). Returns
// the reason it does not, or "" when it does.
std::string CheckEncipheredValue(const std::string& value, bool longRule, bool& wasEnciphered);

// Opens the database read only and runs SQLite's integrity check (every
// page, every index against its table) before the catalogue's own checks.
// Raises the catalogue errors when the file cannot be opened at all.
CheckReport CheckCatalogue(const std::string& database);

// Rolls back a change to a catalogue that was interrupted and left its
// journal beside the file, which readers (who open catalogues read only)
// cannot do. Returns whether there was such a journal.
bool RecoverCatalogue(const std::string& database);

} // namespace belvane::data::tools
