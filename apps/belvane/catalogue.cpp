// belvane catalogue: make, load and check catalogue databases.
#include "commands.hpp"

#include "cipher/field.hpp"
#include "data/sqlite/sqlite_catalogue.hpp"
#include "data/tools/catalogue_check.hpp"
#include "data/tools/csv_import.hpp"
#include "data/tools/pg_catalogue_writer.hpp"
#include "data/tools/sample_catalogue.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <fmt/core.h>

#include <cstdio>
#include <filesystem>
#include <iostream>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace belvane::cli {

namespace {

constexpr size_t kBadValuesShownPerColumn = 20;

// The field key: --key-file when it was given (even as ""), else the key in
// force (the machine-wide key file when anything is at its path, else the
// built-in key).
void SetUpKey(const std::string& keyFile, bool named) {
  if (named)
    cipher::SetFieldKeyFile(keyFile);
  else
    cipher::InitFieldCipher();
}

std::string KeyFooter() {
  return fmt::format("Key: with --key-file, the field key is read from FILE; otherwise from {} "
                     "when that file exists, else the built-in key is used.",
                     cipher::kFieldKeyFilePath);
}

int RunSample(const std::string& out, const std::string& pg,
              const data::tools::SampleOptions& options, const std::string& keyFile,
              bool keyNamed) {
  SetUpKey(keyFile, keyNamed);
  if (!pg.empty()) {
    data::tools::PostgresCatalogueWriter writer(pg);
    const auto summary = data::tools::WriteSampleCatalogue(writer, options);
    writer.Commit();
    fmt::print("Wrote the catalogue into PostgreSQL: seed {}, {} models\n", options.seed,
               options.models);
    for (const auto& [table, rows] : summary)
      fmt::print("  {:<14} {:>9} rows\n", table, rows);
    return 0;
  }
  const auto summary = data::tools::WriteSampleCatalogueFile(out, options);
  std::error_code ec;
  const auto bytes = std::filesystem::file_size(out, ec);
  fmt::print("Wrote {} ({} KB): seed {}, {} models\n", out, ec ? 0 : (bytes + 1023) / 1024,
             options.seed, options.models);
  for (const auto& [table, rows] : summary)
    fmt::print("  {:<14} {:>9} rows\n", table, rows);
  return 0;
}

int RunImport(const data::tools::ImportOptions& options, const std::string& keyFile,
              bool keyNamed) {
  SetUpKey(keyFile, keyNamed);
  try {
    const auto result = data::tools::ImportCsv(options);
    fmt::print("Imported {} rows into {} of {}{}\n", result.rows, result.table, options.database,
               result.createdDatabase ? " (new catalogue)" : "");
    return 0;
  } catch (const Error& e) {
    std::cerr << "belvane catalogue import: " << e.Description() << " (error " << e.Number()
              << ")\nNothing of " << options.csvFile << " was written.\n";
    return 1;
  }
}

int RunCheck(const std::string& database, const std::string& keyFile, bool keyNamed) {
  SetUpKey(keyFile, keyNamed);
  const auto report = data::tools::CheckCatalogue(database);
  fmt::print("Catalogue {}\n", database);
  for (const auto& d : report.damage)
    fmt::print("Damaged: {}\n", d);
  for (const auto& t : report.tables)
    fmt::print("  {:<14} {:>9} rows\n", t.name, t.rows);
  for (const auto& m : report.missing)
    fmt::print("Missing: {}\n", m);
  std::map<std::string, size_t> shown;
  for (const auto& b : report.bad) {
    size_t& n = shown[b.table + "." + b.column];
    if (++n <= kBadValuesShownPerColumn)
      fmt::print("Bad value: {}.{} rowid {}: {}\n", b.table, b.column, b.rowid, b.reason);
  }
  for (const auto& [column, n] : shown)
    if (n > kBadValuesShownPerColumn)
      fmt::print("  ... and {} more bad values in {}\n", n - kBadValuesShownPerColumn, column);
  fmt::print("{} enciphered values checked, {} do not decipher under the current key\n",
             report.enciphered, report.bad.size());
  return report.Clean() ? 0 : 1;
}

// One value as a field of a tab-separated line: a backslash, a tab, a line
// break or another control character is written as an escape (\\, \t, \n,
// \r, \xNN), as is each byte that is not part of a UTF-8 character, so
// every row is one line and no value can pass for another column or row.
std::string EscapeField(std::string_view s) {
  std::string out;
  out.reserve(s.size());
  size_t i = 0;
  while (i < s.size()) {
    const auto c = static_cast<unsigned char>(s[i]);
    if (c >= 0x80) {
      const size_t n = c >= 0xF0 ? 4 : c >= 0xE0 ? 3 : 2;
      // C1 controls (U+0080..U+009F) steer terminals as C0 ones do.
      const bool c1 =
          n == 2 && c == 0xC2 && i + 1 < s.size() && static_cast<unsigned char>(s[i + 1]) < 0xA0;
      if (!c1 && i + n <= s.size() && text::IsValidUtf8(s.substr(i, n))) {
        out.append(s.substr(i, n));
        i += n;
      } else {
        out += fmt::format("\\x{:02X}", c);
        ++i;
      }
      continue;
    }
    switch (c) {
    case '\\':
      out += "\\\\";
      break;
    case '\t':
      out += "\\t";
      break;
    case '\n':
      out += "\\n";
      break;
    case '\r':
      out += "\\r";
      break;
    default:
      if (c < 0x20 || c == 0x7F)
        out += fmt::format("\\x{:02X}", c);
      else
        out += static_cast<char>(c);
    }
    ++i;
  }
  return out;
}

int RunQuery(const std::string& database, const std::string& sql, long long limit) {
  data::SqliteCatalogue catalogue(database);
  bool stopped = false;
  // Rows are printed as they are read, so a query of any size (or one that
  // never ends) runs in constant memory; --limit ends it.
  catalogue.StreamRows(
      sql,
      [](const std::vector<std::string>& names) {
        std::string line;
        for (size_t i = 0; i < names.size(); ++i)
          line += (i ? "\t" : "") + EscapeField(names[i]);
        fmt::print("{}\n", line);
      },
      [&, printed = 0LL](const std::vector<data::Value>& values) mutable {
        if (limit > 0 && printed == limit) {
          stopped = true;
          return false;
        }
        std::string line;
        for (size_t i = 0; i < values.size(); ++i)
          line += (i ? "\t" : "") + EscapeField(values[i].ToText());
        fmt::print("{}\n", line);
        ++printed;
        return !std::ferror(stdout);
      });
  if (stopped)
    std::cerr << "belvane catalogue query: stopped after " << limit
              << " rows (--limit); the query has more\n";
  return 0;
}

int RunRecover(const std::string& database) {
  if (data::tools::RecoverCatalogue(database))
    fmt::print("Catalogue {}: the interrupted change was rolled back; the catalogue is as it was "
               "before that change\n",
               database);
  else
    fmt::print("Catalogue {}: nothing to recover\n", database);
  return 0;
}

} // namespace

void RegisterCatalogue(CLI::App& app, int& exitCode) {
  auto* group = app.add_subcommand("catalogue", "Make, load and check catalogue databases");
  group->require_subcommand(1);

  {
    struct Opt {
      std::string out, pg, keyFile;
      data::tools::SampleOptions sample;
    };
    auto o = std::make_shared<Opt>();
    auto* cmd = group->add_subcommand(
        "sample", "Write a realistic, deterministic sample catalogue (SQLite or PostgreSQL)");
    auto* out = cmd->add_option("--out", o->out, "Catalogue file to write (replaced when complete)")
                    ->type_name("FILE");
    auto* pg = cmd->add_option("--pg", o->pg,
                               "PostgreSQL database to write the catalogue into (libpq connection "
                               "string or URI; its catalogue tables are replaced when complete)")
                   ->type_name("CONNINFO");
    out->excludes(pg);
    pg->excludes(out);
    cmd->add_option("--seed", o->sample.seed, "Seed of the generator")->capture_default_str();
    cmd->add_option("--models", o->sample.models, "Vehicle models, over four makes")
        ->capture_default_str()
        ->check(CLI::Range(1, 10000));
    cmd->add_option("--parts-per-model", o->sample.partsPerModel, "Vehicle part rows per model")
        ->capture_default_str()
        ->check(CLI::Range(0, 1000000));
    cmd->add_option("--labour-items", o->sample.labourItems,
                    "Labour items per schedule of each model (body items come on top)")
        ->capture_default_str()
        ->check(CLI::Range(0, data::tools::SampleLabourOperationCount()));
    auto* key = cmd->add_option("--key-file", o->keyFile, "File holding the field key text")
                    ->type_name("FILE");
    cmd->footer(KeyFooter());
    cmd->callback([o, key, &exitCode] {
      if (o->out.empty() && o->pg.empty()) throw CLI::RequiredError("--out or --pg");
      exitCode = FinishOutput("belvane catalogue sample",
                              RunSample(o->out, o->pg, o->sample, o->keyFile, key->count() > 0));
    });
  }

  {
    struct Opt {
      data::tools::ImportOptions import;
      std::string keyFile;
    };
    auto o = std::make_shared<Opt>();
    auto* cmd = group->add_subcommand(
        "import", "Load a CSV file (header row = column names) into a catalogue table, all or "
                  "nothing");
    cmd->add_option("--db", o->import.database,
                    "Catalogue file (created with the catalogue tables when missing)")
        ->required()
        ->type_name("FILE");
    cmd->add_option("--table", o->import.table, "Table to load")->required()->type_name("NAME");
    cmd->add_option("--encipher", o->import.encipher, "Columns to encipher with the field cipher")
        ->delimiter(',')
        ->type_name("COL[,COL...]");
    auto* key = cmd->add_option("--key-file", o->keyFile, "File holding the field key text")
                    ->type_name("FILE");
    cmd->add_option("CSV", o->import.csvFile, "CSV file to load")->required()->type_name("");
    cmd->footer("An unquoted empty field is Null; \"\" is the empty text. A malformed row stops "
                "the import with its line number (the header is line 1) and nothing is "
                "written.\n" +
                KeyFooter());
    cmd->callback([o, key, &exitCode] {
      exitCode = FinishOutput("belvane catalogue import",
                              RunImport(o->import, o->keyFile, key->count() > 0));
    });
  }

  {
    struct Opt {
      std::string database, keyFile;
    };
    auto o = std::make_shared<Opt>();
    auto* cmd = group->add_subcommand(
        "check", "Report the tables, row counts and enciphered values that do not decipher");
    cmd->add_option("--db", o->database, "Catalogue file")->required()->type_name("FILE");
    auto* key = cmd->add_option("--key-file", o->keyFile, "File holding the field key text")
                    ->type_name("FILE");
    cmd->footer("Runs SQLite's integrity check of every page and index first. Exit status 1 "
                "when the file is damaged, a catalogue table or column is missing or a value "
                "does not decipher; 2 when the report cannot be written.\n" +
                KeyFooter());
    cmd->callback([o, key, &exitCode] {
      exitCode = FinishOutput("belvane catalogue check",
                              RunCheck(o->database, o->keyFile, key->count() > 0));
    });
  }

  {
    struct Opt {
      std::string database, sql;
      long long limit = 0;
    };
    auto o = std::make_shared<Opt>();
    auto* cmd = group->add_subcommand(
        "query", "Run one read-only SQL statement through the catalogue service and print the "
                 "rows as they are read, tab-separated, values as stored");
    cmd->add_option("--db", o->database, "Catalogue file")->required()->type_name("FILE");
    cmd->add_option("--limit", o->limit, "Print at most N rows (0: all)")
        ->capture_default_str()
        ->check(CLI::NonNegativeNumber)
        ->type_name("N");
    cmd->add_option("SQL", o->sql, "The statement")->required()->type_name("");
    cmd->footer("In values, a backslash, tab, line break or other control character is written "
                "as \\\\, \\t, \\n, \\r or \\xNN, as is a byte that is not UTF-8; Null is "
                "written as nothing.");
    cmd->callback([o, &exitCode] {
      exitCode = FinishOutput("belvane catalogue query", RunQuery(o->database, o->sql, o->limit));
    });
  }

  {
    auto database = std::make_shared<std::string>();
    auto* cmd = group->add_subcommand(
        "recover", "Roll back a change to a catalogue that was interrupted (a journal left "
                   "beside the file), which readers cannot do");
    cmd->add_option("--db", *database, "Catalogue file")->required()->type_name("FILE");
    cmd->callback([database, &exitCode] {
      exitCode = FinishOutput("belvane catalogue recover", RunRecover(*database));
    });
  }
}

} // namespace belvane::cli
