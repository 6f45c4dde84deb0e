// belvane catalogue: make, load and check catalogue databases.
#include "commands.hpp"

#include "cipher/field.hpp"
#include "data/sqlite/sqlite_catalogue.hpp"
#include "data/tools/catalogue_check.hpp"
#include "data/tools/csv_import.hpp"
#include "data/tools/pg_catalogue_writer.hpp"
#include "data/tools/sample_catalogue.hpp"
#include "text/error.hpp"

#include <fmt/core.h>

#include <filesystem>
#include <iostream>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace belvane::cli {

namespace {

constexpr size_t kBadValuesShownPerColumn = 20;

// The field key: --key-file, else the key in force (the machine-wide key
// file when it exists, else the built-in key).
void SetUpKey(const std::string& keyFile) {
  if (keyFile.empty())
    cipher::InitFieldCipher();
  else
    cipher::SetFieldKeyFile(keyFile);
}

std::string KeyFooter() {
  return fmt::format("Key: with --key-file, the field key is read from FILE; otherwise from {} "
                     "when that file exists, else the built-in key is used.",
                     cipher::kFieldKeyFilePath);
}

int RunSample(const std::string& out, const std::string& pg,
              const data::tools::SampleOptions& options, const std::string& keyFile) {
  SetUpKey(keyFile);
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

int RunImport(const data::tools::ImportOptions& options, const std::string& keyFile) {
  SetUpKey(keyFile);
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

int RunCheck(const std::string& database, const std::string& keyFile) {
  SetUpKey(keyFile);
  const auto report = data::tools::CheckCatalogue(database);
  fmt::print("Catalogue {}\n", database);
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

int RunQuery(const std::string& database, const std::string& sql) {
  data::SqliteCatalogue catalogue(database);
  auto rs = catalogue.OpenRecordset(sql);
  const auto& fields = rs->Fields();
  for (size_t i = 0; i < fields.Count(); ++i)
    fmt::print("{}{}", i ? "\t" : "", fields.Item(i).name);
  fmt::print("\n");
  for (; !rs->Eof(); rs->MoveNext()) {
    for (size_t i = 0; i < fields.Count(); ++i)
      fmt::print("{}{}", i ? "\t" : "", rs->Fields(i).Value().ToText());
    fmt::print("\n");
  }
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
    cmd->add_option("--key-file", o->keyFile, "File holding the field key text")->type_name("FILE");
    cmd->footer(KeyFooter());
    cmd->callback([o, &exitCode] {
      if (o->out.empty() && o->pg.empty()) throw CLI::RequiredError("--out or --pg");
      exitCode = RunSample(o->out, o->pg, o->sample, o->keyFile);
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
    cmd->add_option("--key-file", o->keyFile, "File holding the field key text")->type_name("FILE");
    cmd->add_option("CSV", o->import.csvFile, "CSV file to load")->required()->type_name("");
    cmd->footer("An unquoted empty field is Null; \"\" is the empty text. A malformed row stops "
                "the import with its line number (the header is line 1) and nothing is "
                "written.\n" +
                KeyFooter());
    cmd->callback([o, &exitCode] { exitCode = RunImport(o->import, o->keyFile); });
  }

  {
    struct Opt {
      std::string database, keyFile;
    };
    auto o = std::make_shared<Opt>();
    auto* cmd = group->add_subcommand(
        "check", "Report the tables, row counts and enciphered values that do not decipher");
    cmd->add_option("--db", o->database, "Catalogue file")->required()->type_name("FILE");
    cmd->add_option("--key-file", o->keyFile, "File holding the field key text")->type_name("FILE");
    cmd->footer("Exit status 1 when a catalogue table or column is missing or a value does not "
                "decipher.\n" +
                KeyFooter());
    cmd->callback([o, &exitCode] { exitCode = RunCheck(o->database, o->keyFile); });
  }

  {
    struct Opt {
      std::string database, sql;
    };
    auto o = std::make_shared<Opt>();
    auto* cmd = group->add_subcommand(
        "query", "Run one read-only SQL statement through the catalogue service and print the "
                 "rows, tab-separated, values as stored");
    cmd->add_option("--db", o->database, "Catalogue file")->required()->type_name("FILE");
    cmd->add_option("SQL", o->sql, "The statement")->required()->type_name("");
    cmd->callback([o, &exitCode] { exitCode = RunQuery(o->database, o->sql); });
  }
}

} // namespace belvane::cli
