// The PostgreSQL catalogue service: the contract every backend meets, and
// what a shared server adds: field types from the column types, a session
// that stays read only whatever a query tries, host texts that are bound and
// never spliced, a session the server ended, replacing a catalogue, and the
// location and command-line ways to reach it. The cluster comes from the
// ctest fixture (tests/data/pg_cluster.sh) through BELVANE_TEST_PG.
#include "catalogue_contract.hpp"
#include "error_number.hpp"
#include "temp_dir.hpp"

#include "data/postgres/pg_db.hpp"
#include "data/postgres/postgres_catalogue.hpp"
#include "data/tools/pg_catalogue_writer.hpp"
#include "text/error.hpp"

#include <gmock/gmock.h>
#include <libpq-fe.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <stdexcept>

using namespace belvane;
using namespace belvane::data;
using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;

namespace {

// The test cluster's database as a URI.
std::string ServerUri() {
  const char* uri = std::getenv("BELVANE_TEST_PG");
  if (!uri || !*uri)
    throw std::runtime_error("BELVANE_TEST_PG is not set: run these tests through ctest, whose "
                             "fixture starts the PostgreSQL cluster");
  return uri;
}

// A schema of its own for each catalogue, so that tests (and test processes
// run side by side) never meet; the URI's search path makes it the schema
// the writer and the service use.
std::string NewCatalogueUri() {
  static int counter = 0;
  const std::string schema = "c_" + std::to_string(getpid()) + "_" + std::to_string(++counter);
  postgres::Connection(ServerUri()).Exec("CREATE SCHEMA " + schema);
  return ServerUri() + "&options=-csearch_path%3D" + schema;
}

// The same connection as "keyword=value ..." text.
std::string KeywordConninfo(const std::string& uri) {
  char* error = nullptr;
  PQconninfoOption* options = PQconninfoParse(uri.c_str(), &error);
  if (!options) {
    const std::string message = error ? error : "cannot parse";
    PQfreemem(error);
    throw std::runtime_error(message);
  }
  std::string out;
  for (PQconninfoOption* o = options; o->keyword; ++o)
    if (o->val && *o->val)
      out += std::string(out.empty() ? "" : " ") + o->keyword + "='" + o->val + "'";
  PQconninfoFree(options);
  return out;
}

std::shared_ptr<PostgresCatalogue> WriteCatalogue(const std::string& uri,
                                                  const test::FillCatalogue& fill,
                                                  const std::vector<std::string>& omit = {}) {
  tools::PostgresCatalogueWriter writer(uri, omit);
  fill(writer);
  writer.Commit();
  return std::make_shared<PostgresCatalogue>(uri);
}

test::CatalogueBackend PostgresBackend() {
  return {"Postgres",
          [](const test::FillCatalogue& fill, const std::vector<std::string>& omit) {
            return WriteCatalogue(NewCatalogueUri(), fill, omit);
          },
          [] {
            std::string uri = ServerUri();
            uri.replace(uri.find("/catalogue?"), 11, "/no_such_catalogue?");
            return std::make_shared<PostgresCatalogue>(uri);
          }};
}

using belvane::test::ErrorNumber;

std::vector<DataType> FieldTypes(const Recordset& rs) {
  std::vector<DataType> out;
  for (size_t i = 0; i < rs.Fields().Count(); ++i)
    out.push_back(rs.Fields().Item(i).type);
  return out;
}

std::vector<std::string> FieldNames(const Recordset& rs) {
  std::vector<std::string> out;
  for (size_t i = 0; i < rs.Fields().Count(); ++i)
    out.push_back(rs.Fields().Item(i).name);
  return out;
}

Value Text(const char* s) { return Value(s); }
const Value kNull;

void OneModel(tools::CatalogueWriter& w) {
  w.Insert("cinfo", {Value(int16_t{2}), Text("One"), Text("2026-01")});
  w.Insert("ALLMODEL", {Value(1001), Text("KESTREL"), Text("ALDER"), kNull, kNull, kNull,
                        Text("KS100"), Text("N1"), Text("M1"), Text("T1")});
  w.Insert("DIAGRAM_MAKE", {Text("KESTREL")});
}

} // namespace

using belvane::test::CatalogueContract;

INSTANTIATE_TEST_SUITE_P(Postgres, CatalogueContract, ::testing::Values(PostgresBackend()),
                         belvane::test::BackendName);

TEST(PostgresCatalogue, FieldsTakeTheColumnTypes) {
  PostgresCatalogue cat(ServerUri());
  auto rs = cat.OpenRecordset(
      "SELECT 2::int2 AS s, 70000 AS i, 3::int8 AS n, 5000000000::int8 AS wide, 1.25::numeric AS "
      "m, 0.1::float8 AS r, true AS b, 'abc'::text AS t, 'xy'::varchar(9) AS v, DATE "
      "'2026-01-02' AS d, NULL::int4 AS z, 7 AS i, 8");
  EXPECT_THAT(FieldNames(*rs), ElementsAre("s", "i", "n", "wide", "m", "r", "b", "t", "v", "d", "z",
                                           "i_2", "Expr13"));
  EXPECT_THAT(FieldTypes(*rs),
              ElementsAre(DataType::SmallInt, DataType::Integer, DataType::Integer,
                          DataType::Double, DataType::Double, DataType::Double, DataType::Boolean,
                          DataType::VarWChar, DataType::VarWChar, DataType::VarWChar,
                          DataType::Integer, DataType::Integer, DataType::Integer));
  EXPECT_EQ(rs->Fields("s").Value(), Value(int16_t{2}));
  EXPECT_EQ(rs->Fields("i").Value(), Value(70000));
  EXPECT_EQ(rs->Fields("n").Value(), Value(3));
  EXPECT_EQ(rs->Fields("wide").Value(), Value(5000000000.0));
  EXPECT_EQ(rs->Fields("m").Value(), Value(1.25));
  EXPECT_EQ(rs->Fields("r").Value(), Value(0.1));
  EXPECT_EQ(rs->Fields("b").Value(), Value(true));
  EXPECT_EQ(rs->Fields("t").Value(), Value("abc"));
  EXPECT_EQ(rs->Fields().Item(7).definedSize, 3);
  EXPECT_EQ(rs->Fields("d").Value(), Value("2026-01-02")); // other types as the server writes them
  EXPECT_TRUE(rs->Fields("z").Value().IsNull());

  // No rows: the types still come from the columns.
  auto none = cat.OpenRecordset("SELECT 1::int2 AS s, 0.5 AS m WHERE false");
  EXPECT_EQ(none->RecordCount(), 0);
  EXPECT_THAT(FieldTypes(*none), ElementsAre(DataType::SmallInt, DataType::Double));
}

TEST(PostgresCatalogue, StaysReadOnlyWhateverAQueryTries) {
  const std::string uri = NewCatalogueUri();
  auto cat = WriteCatalogue(uri, OneModel);
  for (const char* sql : {"WITH gone AS (DELETE FROM allmodel RETURNING *) SELECT * FROM gone",
                          "INSERT INTO diagram_make (make) VALUES ('MARLOW') RETURNING make",
                          "SELECT * FROM allmodel FOR UPDATE", "SELECT 1; COMMIT",
                          "COMMIT; SELECT 1", "SET default_transaction_read_only = off"}) {
    EXPECT_EQ(ErrorNumber([&] { cat->OpenRecordset(sql); }), err::kBadCommand) << sql;
  }
  // A setting changed by a query does not outlive the call.
  EXPECT_EQ(cat->OpenRecordset("SELECT set_config('default_transaction_read_only', 'off', false), "
                               "set_config('search_path', 'pg_catalog', false)")
                ->RecordCount(),
            1);
  EXPECT_EQ(ErrorNumber([&] {
              cat->OpenRecordset("INSERT INTO diagram_make (make) VALUES ('MARLOW') RETURNING *");
            }),
            err::kBadCommand);
  EXPECT_EQ(cat->OpenRecordset("select * from cinfo")->RecordCount(), 1);

  // Seen from another session, nothing changed.
  PostgresCatalogue other(uri);
  EXPECT_EQ(other.OpenRecordset("SELECT * FROM ALLMODEL")->RecordCount(), 1);
  EXPECT_FALSE(other.HasVehicleDiagram("MARLOW"));
}

TEST(PostgresCatalogue, HostTextsAndValuesAreBoundNeverSpliced) {
  auto cat = WriteCatalogue(NewCatalogueUri(), [](tools::CatalogueWriter& w) {
    w.Insert("DIAGRAM_MAKE", {Text("O'BRIEN \xE2\x98\x83 MOTORS")});
    for (double cost : {0.1, 1e-7, 123456789.125})
      w.Insert("VEHICLE_PART", {Text("KESTREL"), Text("KS100"), kNull, kNull, Text("P1"),
                                Text("x'); DROP TABLE vehicle_part; --"),
                                Text("\xC3\x9C"
                                     "ber"),
                                Text("O"), Value(1), Value(cost), kNull, Text("G")});
  });
  EXPECT_TRUE(cat->HasVehicleDiagram(" o'brien \xE2\x98\x83 motors "));
  EXPECT_FALSE(cat->HasVehicleDiagram("x' OR 'a' = 'a"));

  RecordsetPtr rs;
  cat->GetVehicleParts(rs, "KESTREL' OR '1' = '1", "KS100", "", 0);
  EXPECT_EQ(rs->RecordCount(), 0);
  cat->GetVehicleParts(rs, "kestrel", "KS100", "", 0);
  ASSERT_EQ(rs->RecordCount(), 3);
  std::vector<double> costs;
  for (; !rs->Eof(); rs->MoveNext())
    costs.push_back(rs->Fields("unitcost").Value().ToDouble());
  EXPECT_THAT(costs, ElementsAre(0.1, 1e-7, 123456789.125)); // exactly, in load order
  rs->MoveFirst();
  EXPECT_EQ(rs->Fields("PARTNAME").Value(), Value("x'); DROP TABLE vehicle_part; --"));
  EXPECT_EQ(rs->Fields("Script").Value(), Value("\xC3\x9C"
                                                "ber"));
}

TEST(PostgresCatalogue, ErrorsNameTheDatabaseAndTheServer) {
  std::string description;
  EXPECT_EQ(ErrorNumber([] { PostgresBackend().openMissing(); }, &description), err::kDataService);
  EXPECT_THAT(description, AllOf(HasSubstr("no_such_catalogue"), HasSubstr("/tmp/belvane-pg-")));

  PostgresCatalogue empty(NewCatalogueUri()); // a schema without a catalogue
  EXPECT_EQ(ErrorNumber([&] { empty.OpenRecordset("select * from cinfo"); }, &description),
            err::kNoSuchTable);
  EXPECT_THAT(description, AllOf(HasSubstr("\"catalogue\""), HasSubstr("cinfo")));
  EXPECT_EQ(ErrorNumber([&] { empty.OpenRecordset("SELEC 1"); }, &description), err::kBadCommand);
  EXPECT_THAT(description, HasSubstr("SELEC 1"));
}

TEST(PostgresCatalogue, ASessionTheServerEndedIsMadeAgain) {
  const std::string uri = NewCatalogueUri();
  WriteCatalogue(uri, OneModel);
  const std::string name = "victim_" + std::to_string(getpid());
  PostgresCatalogue cat(uri + "&application_name=" + name);
  EXPECT_TRUE(cat.HasVehicleDiagram("KESTREL"));

  postgres::Connection admin(ServerUri());
  auto ended = admin.Exec("SELECT pg_terminate_backend(pid, 5000) FROM pg_stat_activity "
                          "WHERE application_name = $1",
                          {name});
  ASSERT_EQ(ended.Rows(), 1);

  EXPECT_TRUE(cat.HasVehicleDiagram("KESTREL"));
  EXPECT_EQ(cat.OpenRecordset("SELECT * FROM allmodel")->RecordCount(), 1);
  EXPECT_EQ(ErrorNumber([&] { cat.OpenRecordset("DELETE FROM allmodel RETURNING *"); }),
            err::kBadCommand);
}

TEST(PostgresCatalogueWriter, ReplacesTheCatalogueOnlyOnCommit) {
  const std::string uri = NewCatalogueUri();
  auto cat = WriteCatalogue(uri, OneModel);

  auto twoModels = [](tools::CatalogueWriter& w) {
    OneModel(w);
    w.Insert("ALLMODEL", {Value(1002), Text("MARLOW"), Text("BRISK"), kNull, kNull, kNull,
                          Text("MW200"), Text("N2"), Text("M2"), Text("T2")});
  };
  {
    tools::PostgresCatalogueWriter abandoned(uri);
    twoModels(abandoned);
    EXPECT_EQ(ErrorNumber([&] { abandoned.Insert("NOPE", {}); }), err::kNoSuchTable);
    EXPECT_EQ(ErrorNumber([&] { abandoned.Insert("BODY", {Text("11")}); }), err::kInvalidCall);
  }
  EXPECT_EQ(cat->OpenRecordset("SELECT * FROM ALLMODEL")->RecordCount(), 1);
  EXPECT_TRUE(cat->HasVehicleDiagram("KESTREL"));

  WriteCatalogue(uri, twoModels, {"DIAGRAM_MAKE"});
  EXPECT_EQ(cat->OpenRecordset("SELECT * FROM ALLMODEL")->RecordCount(), 2);
  EXPECT_EQ(ErrorNumber([&] { cat->HasVehicleDiagram("KESTREL"); }), err::kNoSuchTable);
  auto cipher = cat->OpenRecordset("SELECT * FROM CIPHER_COLUMN WHERE table_name = 'VEHICLE_PART'");
  EXPECT_EQ(cipher->RecordCount(), 3);
}

TEST(PostgresCatalogueLocation, APostgresLocationSelectsThePostgresService) {
  const std::string uri = NewCatalogueUri();
  WriteCatalogue(uri, OneModel);
  struct Restore {
    ~Restore() { SetCatalogueLocation(""); }
  } restore;
  const std::string keywords = KeywordConninfo(uri);
  for (const std::string& location : {uri, "postgresql:" + keywords, "postgres:" + keywords}) {
    SetCatalogueLocation(location);
    auto cat = Catalogue();
    EXPECT_TRUE(std::dynamic_pointer_cast<PostgresCatalogue>(cat)) << location;
    EXPECT_EQ(cat->OpenRecordset("SELECT * FROM ALLMODEL WHERE MODEL_ID = 1001")->RecordCount(), 1)
        << location;
  }
  SetCatalogueLocation("postgresql:dbname=no_such_catalogue host=/tmp/belvane-pg-none");
  EXPECT_EQ(ErrorNumber([] { Catalogue(); }), err::kDataService);
}

TEST(PostgresCatalogueCli, TheSampleCommandWritesIntoTheDatabase) {
  test::TempDir dir("pg-cli");
  auto belvane = [&dir](const std::string& args) {
    const std::string cmd = "cd '" + dir.Path() + "' && '" BELVANE_CLI_PATH "' " + args +
                            " </dev/null >out.txt 2>err.txt";
    const int raw = std::system(cmd.c_str());
    std::ifstream err(dir.File("err.txt"));
    std::stringstream s;
    s << err.rdbuf();
    return std::make_pair(WIFEXITED(raw) ? WEXITSTATUS(raw) : -1, s.str());
  };
  const std::string uri = NewCatalogueUri();
  auto [status, err] = belvane("catalogue sample --pg '" + uri +
                               "' --models 2 --parts-per-model 10 --labour-items 8");
  ASSERT_EQ(status, 0) << err;
  PostgresCatalogue cat(uri);
  EXPECT_EQ(cat.OpenRecordset("SELECT * FROM ALLMODEL")->RecordCount(), 2);
  auto count = cat.OpenRecordset("SELECT count(*) AS n FROM vehicle_part");
  EXPECT_EQ(count->Fields("n").Value(), Value(20));

  std::tie(status, err) = belvane("catalogue sample --models 2");
  EXPECT_NE(status, 0);
  EXPECT_THAT(err, HasSubstr("--out or --pg"));
  std::tie(status, err) = belvane("catalogue sample --out s.db --pg '" + uri + "'");
  EXPECT_NE(status, 0);
}
