#pragma once
// Loading a CSV file into a catalogue table.
//
// The file is UTF-8 (a byte order mark is skipped), comma-separated, with
// fields quoted the usual way ("a ""b"", c" holds: a "b", c) and the column
// names in its first line. An unquoted empty field is Null; a quoted empty
// field ("") is the empty text. Values go in as the column's declared type
// asks: whole numbers for INT columns, numbers for REAL or NUMERIC columns,
// text for TEXT columns; a column declared without a type takes a number
// written with '.' and shorter than 16 characters as a number, anything
// else as text.
//
// The whole file goes in at once: the first malformed row (wrong field
// count, bad number, a value the table refuses) stops the import with its
// line in the file (the header is line 1) and the reason, and nothing of
// the file is written. The import fills a copy of the catalogue beside it
// (<database>.import-partial) and renames it over the catalogue when
// complete, so an import that is killed or crashes leaves the catalogue as
// it was; readers keep reading the old file meanwhile. Two imports into one
// catalogue at once are refused.

#include <string>
#include <vector>

namespace belvane::data::tools {

struct ImportOptions {
  std::string database; // created with the catalogue tables when missing
  std::string table;    // an existing table, named without regard to case
  std::string csvFile;
  // The values of the columns the catalogue lists as enciphered (its
  // CIPHER_COLUMN table, else the standard list) are enciphered with the
  // field cipher (the key in force on this thread) as they go in, for rule
  // "always". A column of rule "long" (the hours) takes plain numbers of
  // fewer than 16 characters as they are, and longer values as enciphered
  // already, which must decipher to a number. Blank values (empty or only
  // spaces) stay as they are, since readers take them as absent.
  // `encipher` names more columns to encipher, every value; they are added
  // to the catalogue's list. A column that is not listed yet but already
  // holds values is refused, so that no column mixes plain and enciphered
  // values.
  std::vector<std::string> encipher;
};

struct ImportResult {
  std::string table; // as the database spells it
  long rows = 0;
  bool createdDatabase = false;
};

// Raises belvane::Error on failure: 53 when the CSV file does not exist,
// 13 for a value that is not the number its column needs, 5 for any other
// fault of the file or the options, and the catalogue errors of the
// database; the description names the file and line.
ImportResult ImportCsv(const ImportOptions& options);

// One record of a CSV text, as parsed.
struct CsvField {
  std::string text;
  bool quoted = false;
};
struct CsvRecord {
  long line = 0; // line of the file the record starts on
  std::vector<CsvField> fields;
};
// Parses a whole CSV text. Lines end with LF or CR LF; a CR at the very end
// of the text ends the last line too. Lines that are entirely empty are
// skipped.
// Raises error 5 naming `fileName` and the line for an unterminated quote
// or text after a closing quote.
std::vector<CsvRecord> ParseCsv(std::string_view text, const std::string& fileName);

} // namespace belvane::data::tools
