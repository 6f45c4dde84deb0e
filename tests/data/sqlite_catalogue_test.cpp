// The SQLite catalogue: the contract on SQLite, how record set fields are
// typed from the columns, files that are not catalogues, and the calling
// thread's instance.
#include "catalogue_contract.hpp"
#include "temp_dir.hpp"

#include "data/sqlite/sqlite_catalogue.hpp"
#include "data/sqlite/sqlite_db.hpp"
#include "data/tools/catalogue_writer.hpp"
#include "text/error.hpp"

#include <gmock/gmock.h>

#include <cstdlib>
#include <fstream>
#include <optional>
#include <thread>

using namespace belvane;
using namespace belvane::data;
using belvane::test::CatalogueContract;
using ::testing::HasSubstr;

namespace {

test::CatalogueBackend SqliteBackend() {
  // One folder for the whole run; each catalogue gets its own file.
  static test::TempDir dir("sqlite-contract");
  static int counter = 0;
  return {"Sqlite",
          [](const test::FillCatalogue& fill, const std::vector<std::string>& omit) {
            const std::string path = dir.File("catalogue-" + std::to_string(++counter) + ".db");
            tools::SqliteCatalogueWriter writer(path, omit);
            fill(writer);
            writer.Commit();
            return std::make_shared<SqliteCatalogue>(path);
          },
          [] { return std::make_shared<SqliteCatalogue>(dir.File("missing.db")); }};
}

long ErrorOf(auto&& fn, std::string* description = nullptr) {
  try {
    fn();
  } catch (const Error& e) {
    if (description) *description = e.Description();
    return e.Number();
  }
  return 0;
}

// A database with arbitrary tables, written with plain SQL.
std::string MakeDatabase(const test::TempDir& dir, const std::string& name, const char* sql) {
  const std::string path = dir.File(name);
  sqlite::Database db(path, sqlite::Database::Mode::Create);
  db.Exec(sql);
  return path;
}

} // namespace

INSTANTIATE_TEST_SUITE_P(Sqlite, CatalogueContract, ::testing::Values(SqliteBackend()),
                         test::BackendName);

TEST(SqliteCatalogue, FieldsTakeTheDeclaredTypeOrWhatTheValuesShare) {
  test::TempDir dir("sqlite-types");
  const std::string path = MakeDatabase(dir, "types.db", R"(
    CREATE TABLE t (s SMALLINT, i INTEGER, r REAL, x TEXT, b BOOLEAN, hours, wide INTEGER,
                    odd INTEGER);
    INSERT INTO t VALUES (2, 70000, 1.5, 'a', 1, 1.5, 5000000000, 'abc');
    INSERT INTO t VALUES (NULL, NULL, 2, '7', 0, 'F409B4ADC95996D4', 1, 2);
  )");
  SqliteCatalogue cat(path);
  auto rs = cat.OpenRecordset("SELECT t.*, count(*) OVER () AS n, s, 'k' AS k FROM t");
  auto type = [&](const char* f) { return rs->Fields(f).Type(); };
  EXPECT_EQ(type("s"), DataType::SmallInt);
  EXPECT_EQ(type("i"), DataType::Integer);
  EXPECT_EQ(type("r"), DataType::Double);
  EXPECT_EQ(type("x"), DataType::VarWChar);
  EXPECT_EQ(type("b"), DataType::Boolean);
  EXPECT_EQ(type("hours"), DataType::Variant); // a number and an enciphered text
  EXPECT_EQ(type("wide"), DataType::Double);   // beyond 32 bits
  EXPECT_EQ(type("odd"), DataType::Variant);   // text in an INTEGER column
  EXPECT_EQ(type("n"), DataType::Integer);     // an expression: from its values
  EXPECT_EQ(type("k"), DataType::VarWChar);
  EXPECT_EQ(type("s_2"), DataType::SmallInt); // a repeated name gets a suffix

  EXPECT_EQ(rs->Fields("s").Value(), Value(int16_t{2}));
  EXPECT_EQ(rs->Fields("r").Value(), Value(1.5));
  EXPECT_EQ(rs->Fields("b").Value(), Value(true));
  EXPECT_EQ(rs->Fields("hours").Value(), Value(1.5));
  EXPECT_EQ(rs->Fields("wide").Value(), Value(5000000000.0));
  rs->MoveNext();
  EXPECT_TRUE(rs->Fields("i").Value().IsNull());
  EXPECT_EQ(rs->Fields("r").Value(), Value(2.0));
  EXPECT_EQ(rs->Fields("x").Value(), Value("7"));
  EXPECT_EQ(rs->Fields("hours").Value(), Value("F409B4ADC95996D4"));
}

TEST(SqliteCatalogue, FilesThatAreNotCataloguesAreErrorsNamingTheFile) {
  test::TempDir dir("sqlite-files");
  const std::string garbage = dir.File("garbage.db");
  std::ofstream(garbage) << std::string(4096, 'x');
  for (const std::string& path : {dir.File("missing.db"), garbage, dir.Path()}) {
    std::string description;
    EXPECT_EQ(ErrorOf([&] { SqliteCatalogue cat(path); }, &description), err::kDataService) << path;
    EXPECT_THAT(description, HasSubstr(path));
  }
}

TEST(SqliteCatalogue, TheConnectionCannotWriteWhateverTheText) {
  test::TempDir dir("sqlite-readonly");
  const std::string path =
      MakeDatabase(dir, "c.db", "CREATE TABLE a (x); INSERT INTO a VALUES (1)");
  SqliteCatalogue cat(path);
  for (const char* sql : {"ATTACH DATABASE 'other.db' AS other", "PRAGMA query_only = 0",
                          "WITH d AS (DELETE FROM a RETURNING x) SELECT * FROM d",
                          "DELETE FROM a RETURNING x", "VACUUM"})
    EXPECT_NE(ErrorOf([&] { cat.OpenRecordset(sql); }), 0) << sql;
  EXPECT_EQ(cat.OpenRecordset("SELECT * FROM a")->RecordCount(), 1);
  EXPECT_FALSE(std::filesystem::exists(dir.File("other.db")));
}

// --- The calling thread's instance --------------------------------------------

class ThreadCatalogue : public ::testing::Test {
protected:
  void TearDown() override {
    SetCatalogueDataObject(nullptr);
    SetCatalogueLocation("");
  }
  std::string NewCatalogue(const std::string& name) {
    const std::string path = dir_.File(name);
    tools::SqliteCatalogueWriter writer(path);
    writer.Insert("DIAGRAM_MAKE", {Value(name)});
    writer.Commit();
    return path;
  }
  test::TempDir dir_{"thread-catalogue"};
};

TEST_F(ThreadCatalogue, OneInstancePerThreadMadeOnFirstUseFromTheLocation) {
  SetCatalogueLocation(NewCatalogue("first"));
  auto a = Catalogue();
  EXPECT_EQ(Catalogue(), a);
  EXPECT_TRUE(a->HasVehicleDiagram("first"));

  std::shared_ptr<CatalogueDataObject> other;
  std::thread([&other] { other = Catalogue(); }).join();
  EXPECT_NE(other, a);
  EXPECT_TRUE(other->HasVehicleDiagram("first"));

  // A new location replaces the instance on its next use.
  SetCatalogueLocation(NewCatalogue("second"));
  auto b = Catalogue();
  EXPECT_NE(b, a);
  EXPECT_TRUE(b->HasVehicleDiagram("second"));
}

TEST_F(ThreadCatalogue, AFailedOpenIsRetriedOnTheNextUse) {
  const std::string path = dir_.File("later.db");
  SetCatalogueLocation(path);
  std::string description;
  EXPECT_EQ(ErrorOf([] { Catalogue(); }, &description), err::kDataService);
  EXPECT_THAT(description, HasSubstr(path));
  // The file appears: the next call opens it.
  tools::SqliteCatalogueWriter writer(path);
  writer.Commit();
  EXPECT_FALSE(Catalogue()->HasVehicleDiagram("x"));
}

TEST_F(ThreadCatalogue, AHostObjectIsUsedOnItsThreadUntilWithdrawn) {
  class Fake final : public CatalogueDataObject {
  public:
    RecordsetPtr OpenRecordset(const std::string&, long, long) override { return nullptr; }
    void GetLabourItems(RecordsetPtr&, long, const std::string&, const std::string&,
                        const std::string&) override {}
    void GetVehicleParts(RecordsetPtr&, const std::string&, const std::string&, const std::string&,
                         int16_t) override {}
    bool HasVehicleDiagram(const std::string&) override { return true; }
  };
  auto fake = std::make_shared<Fake>();
  SetCatalogueDataObject(fake);
  SetCatalogueLocation(NewCatalogue("own")); // does not displace the host's object
  EXPECT_EQ(Catalogue(), fake);
  std::shared_ptr<CatalogueDataObject> other;
  std::thread([&other] { other = Catalogue(); }).join();
  EXPECT_NE(other, fake);
  SetCatalogueDataObject(nullptr);
  EXPECT_NE(Catalogue(), fake);
}

TEST_F(ThreadCatalogue, TheDefaultLocationComesFromTheEnvironment) {
  struct SavedEnv {
    const char* name;
    std::optional<std::string> value;
    explicit SavedEnv(const char* n) : name(n) {
      if (const char* v = std::getenv(n)) value = v;
    }
    ~SavedEnv() {
      if (value)
        setenv(name, value->c_str(), 1);
      else
        unsetenv(name);
    }
  } saved[] = {SavedEnv("BELVANE_CATALOGUE"), SavedEnv("XDG_DATA_HOME")};
  setenv("BELVANE_CATALOGUE", "/srv/catalogue.db", 1);
  EXPECT_EQ(CatalogueLocation(), "/srv/catalogue.db");
  SetCatalogueLocation("/elsewhere.db");
  EXPECT_EQ(CatalogueLocation(), "/elsewhere.db");
  SetCatalogueLocation("");
  unsetenv("BELVANE_CATALOGUE");
  setenv("XDG_DATA_HOME", "/data", 1);
  EXPECT_EQ(CatalogueLocation(), "/data/belvane/catalogue.db");
}
