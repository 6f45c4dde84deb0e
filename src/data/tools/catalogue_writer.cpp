#include "data/tools/catalogue_writer.hpp"

#include "data/catalogue.hpp"
#include "data/sqlite/sqlite_db.hpp"
#include "data/tools/catalogue_schema.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <filesystem>
#include <system_error>

namespace belvane::data::tools {

namespace fs = std::filesystem;

SqliteCatalogueWriter::SqliteCatalogueWriter(std::string path, std::vector<std::string> omitTables)
    : path_(std::move(path)), partial_(path_ + ".partial"), omit_(std::move(omitTables)) {
  std::error_code ec;
  if (fs::is_directory(path_, ec))
    throw Error(err::kDataService,
                "Catalogue " + path_ + ": this is a folder, not a catalogue file; name a file",
                sqlite::kSource);
  fs::remove(partial_, ec); // a leftover of an earlier run that stopped
  db_ = std::make_unique<sqlite::Database>(partial_, sqlite::Database::Mode::Create);
  // The file is not in place until Commit, so a crash loses nothing: no
  // journal is needed while it is written.
  db_->Exec("PRAGMA journal_mode = OFF; PRAGMA synchronous = OFF; BEGIN");
  CreateCatalogueTables(*db_, omit_);
}

SqliteCatalogueWriter::~SqliteCatalogueWriter() {
  inserts_.clear();
  if (db_) {
    db_.reset();
    std::error_code ec;
    fs::remove(partial_, ec);
  }
}

void SqliteCatalogueWriter::Insert(std::string_view table, const std::vector<Value>& row) {
  for (const std::string& omitted : omit_)
    if (text::EqualsNoCase(omitted, table)) return;
  auto it = inserts_.find(table);
  if (it == inserts_.end()) {
    const TableDef* def = FindCatalogueTable(table);
    if (!def) db_->Fail(err::kNoSuchTable, "no such catalogue table: " + std::string(table));
    std::string sql = "INSERT INTO " + QuoteName(def->name) + " (";
    std::string values;
    for (size_t i = 0; i < def->columns.size(); ++i) {
      sql += (i ? ", " : "") + QuoteName(def->columns[i].name);
      values += (i ? ", ?" : "?") + std::to_string(i + 1);
    }
    sql += ") VALUES (" + values + ")";
    it = inserts_.emplace(std::string(table), std::make_unique<sqlite::Statement>(*db_, sql)).first;
  }
  sqlite::Statement& st = *it->second;
  if (row.size() != static_cast<size_t>(st.ParameterCount()))
    db_->Fail(err::kInvalidCall,
              "a row of " + std::string(table) + " has " + std::to_string(row.size()) + " values");
  for (size_t i = 0; i < row.size(); ++i)
    st.Bind(static_cast<int>(i + 1), row[i]);
  st.Step();
  st.Reset();
}

void SqliteCatalogueWriter::Commit() {
  CreateCatalogueIndexes(*db_);
  db_->Exec("COMMIT");
  inserts_.clear();
  db_.reset();
  std::error_code ec;
  fs::rename(partial_, path_, ec);
  if (ec) {
    const std::string why = ec.message();
    fs::remove(partial_, ec);
    throw Error(err::kDataService,
                "Catalogue " + path_ + ": cannot put the new file in place: " + why,
                sqlite::kSource);
  }
}

} // namespace belvane::data::tools
