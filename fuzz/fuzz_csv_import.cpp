// CSV import into a catalogue: any file goes in whole or is refused with an
// error, and a refused import leaves the catalogue as it was.
// Input: a byte choosing the table (and --encipher of the second header
// column when odd), then the CSV text.
#include "data/sqlite/sqlite_catalogue.hpp"
#include "data/tools/catalogue_schema.hpp"
#include "data/tools/catalogue_writer.hpp"
#include "data/tools/csv_import.hpp"
#include "text/error.hpp"
#include "text/strings.hpp"

#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

using namespace belvane;
namespace fs = std::filesystem;

namespace {

const fs::path& Folder() {
  static const fs::path dir = [] {
    const fs::path base = fs::exists("/dev/shm") ? fs::path("/dev/shm") : fs::temp_directory_path();
    fs::path d = base / ("belvane-fuzz-import-" + std::to_string(::getpid()));
    fs::create_directories(d);
    data::tools::SqliteCatalogueWriter w((d / "template.db").string());
    w.Commit();
    return d;
  }();
  return dir;
}

// The rows of one table, or of every table when `table` is empty.
long long Rows(const std::string& db, const std::string& table = "") {
  data::SqliteCatalogue cat(db);
  long long n = 0;
  for (const auto& t : data::tools::CatalogueTables())
    if (table.empty() || t.name == table)
      n +=
          cat.OpenRecordset("SELECT count(*) AS n FROM \"" + t.name + "\"")->Collect("n").ToInt32();
  return n;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  if (size == 0) return 0;
  const fs::path& dir = Folder();
  const auto& tables = data::tools::CatalogueTables();
  const std::string db = (dir / "cat.db").string(), csv = (dir / "in.csv").string();
  fs::copy_file(dir / "template.db", db, fs::copy_options::overwrite_existing);
  std::ofstream(csv, std::ios::binary)
      .write(reinterpret_cast<const char*>(data) + 1, static_cast<std::streamsize>(size - 1));

  data::tools::ImportOptions o;
  o.database = db;
  o.csvFile = csv;
  o.table = tables[data[0] % tables.size()].name;
  if (data[0] & 0x80) {
    // --encipher the second column named in the header, if any.
    const std::string text(reinterpret_cast<const char*>(data) + 1, size - 1);
    const size_t a = text.find(','), b = text.find_first_of(",\r\n", a + 1);
    if (a != std::string::npos) o.encipher.push_back(text.substr(a + 1, b - a - 1));
  }
  const long long before = Rows(db), tableBefore = Rows(db, o.table);
  try {
    const auto result = data::tools::ImportCsv(o);
    if (Rows(db, o.table) != tableBefore + result.rows) std::abort();
  } catch (const Error&) {
    if (Rows(db) != before) std::abort(); // refused: nothing written
  }
  if (fs::exists(db + ".import-partial") || fs::exists(db + "-journal")) std::abort();
  return 0;
}
