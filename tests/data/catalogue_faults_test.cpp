// The catalogue tools and the catalogue service against careless operators
// and hostile files: imports killed midway, journals readers cannot roll
// back, functions that reach native code, damaged pages, enciphered columns
// imported as plain text, bytes that are not UTF-8, output that cannot be
// written, and catalogue files that disappear or break while in use.
#include "temp_dir.hpp"

#include "cipher/field.hpp"
#include "data/sqlite/sqlite_catalogue.hpp"
#include "data/tools/catalogue_check.hpp"
#include "data/tools/catalogue_writer.hpp"
#include "data/tools/csv_import.hpp"
#include "data/tools/sample_catalogue.hpp"
#include "error_number.hpp"
#include "text/error.hpp"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <signal.h>
#include <sqlite3.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>

using namespace belvane;
using namespace belvane::data;
using belvane::test::ErrorNumber;
using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;

namespace fs = std::filesystem;

namespace {

std::string Read(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

void Write(const std::string& path, const std::string& content) {
  std::ofstream(path, std::ios::binary) << content;
}

long long Rows(const std::string& catalogue, const std::string& table) {
  SqliteCatalogue cat(catalogue);
  auto rs = cat.OpenRecordset("SELECT count(*) AS n FROM " + table);
  return rs->Collect("n").ToInt32();
}

class CatalogueFaults : public ::testing::Test {
protected:
  struct Result {
    int status;
    std::string out, err;
  };
  // Runs `belvane <args>` in the test folder; `out` is where standard
  // output goes.
  Result Belvane(const std::string& args, const std::string& out = "out.txt",
                 const std::string& prefix = "") {
    const std::string cmd = "cd '" + dir_.Path() + "' && " + prefix + "'" BELVANE_CLI_PATH "' " +
                            args + " </dev/null >" + out + " 2>err.txt";
    const int raw = std::system(cmd.c_str());
    return {WIFEXITED(raw) ? WEXITSTATUS(raw) : -1, Read(dir_.File("out.txt")),
            Read(dir_.File("err.txt"))};
  }

  std::string SmallCatalogue(const std::string& name) {
    const std::string path = dir_.File(name);
    tools::SampleOptions o;
    o.models = 2;
    o.partsPerModel = 50;
    o.labourItems = 8;
    tools::WriteSampleCatalogueFile(path, o);
    return path;
  }

  // A CSV of `rows` parts for VEHICLE_PART.
  std::string PartsCsv(const std::string& name, int rows) {
    std::string csv = "make,cat_no,ItemNo,Script,QTY,unitcost\n";
    for (int i = 0; i < rows; ++i)
      csv += "KIA,C" + std::to_string(i % 50) + ",P" + std::to_string(i) +
             ",Front bumper bar reinforcement and brackets " + std::to_string(i) + ",1,12.5\n";
    Write(dir_.File(name), csv);
    return dir_.File(name);
  }

  // Starts `belvane catalogue import`, kills it when `killWhen` says so
  // (or when it ends by itself), and says whether it was killed.
  bool ImportAndKill(const std::string& db, const std::string& csv,
                     const std::function<bool(std::chrono::microseconds)>& killWhen) {
    const pid_t child = ::fork();
    if (child == 0) {
      const int null = ::open("/dev/null", O_WRONLY);
      ::dup2(null, 1);
      ::dup2(null, 2);
      ::execl(BELVANE_CLI_PATH, BELVANE_CLI_PATH, "catalogue", "import", "--db", db.c_str(),
              "--table", "VEHICLE_PART", csv.c_str(), static_cast<char*>(nullptr));
      ::_exit(127);
    }
    const auto start = std::chrono::steady_clock::now();
    int status = 0;
    for (;;) {
      if (::waitpid(child, &status, WNOHANG) == child) return false;
      const auto elapsed = std::chrono::duration_cast<std::chrono::microseconds>(
          std::chrono::steady_clock::now() - start);
      if (killWhen(elapsed)) break;
      std::this_thread::sleep_for(std::chrono::microseconds(200));
    }
    ::kill(child, SIGKILL);
    ::waitpid(child, &status, 0);
    return WIFSIGNALED(status);
  }

  test::TempDir dir_{"catalogue-faults"};
};

} // namespace

TEST_F(CatalogueFaults, AnImportKilledAtAnyPointLeavesTheOldOrTheNewCatalogue) {
  const std::string db = SmallCatalogue("cat.db");
  const long long before = Rows(db, "VEHICLE_PART");
  const std::string csv = PartsCsv("parts.csv", 60000);
  const std::string partial = db + ".import-partial";

  int killedMidway = 0;
  auto check = [&](const char* when) {
    SCOPED_TRACE(when);
    EXPECT_FALSE(fs::exists(db + "-journal"));
    long long rows = -1;
    EXPECT_EQ(ErrorNumber([&] { rows = Rows(db, "VEHICLE_PART"); }), 0);
    // The old catalogue, or a whole new one (an import that finished before
    // its kill came adds all its rows; several may have finished).
    EXPECT_TRUE(rows >= before && (rows - before) % 60000 == 0) << rows;
    const tools::CheckReport report = tools::CheckCatalogue(db);
    EXPECT_TRUE(report.damage.empty());
  };
  // Kill points: at once, while the catalogue is copied, while rows go in,
  // and at spread times up to the end.
  for (int us : {0, 1000, 3000}) {
    killedMidway += ImportAndKill(db, csv, [us](auto t) { return t.count() >= us; });
    check("early");
  }
  killedMidway += ImportAndKill(db, csv, [&](auto) {
    std::error_code ec;
    return fs::file_size(partial, ec) > 0 && !ec;
  });
  check("copy begun");
  killedMidway += ImportAndKill(db, csv, [&](auto) {
    std::error_code ec;
    return fs::file_size(partial, ec) > 200000 && !ec;
  });
  check("rows going in");
  for (int ms : {20, 50, 100, 200, 400, 800}) {
    killedMidway += ImportAndKill(db, csv, [ms](auto t) { return t.count() >= ms * 1000; });
    check("later");
  }
  EXPECT_GE(killedMidway, 5);

  // A new catalogue: nothing at the target, or the whole catalogue.
  const std::string fresh = dir_.File("fresh.db");
  for (int ms : {5, 30, 100}) {
    ImportAndKill(fresh, csv, [ms](auto t) { return t.count() >= ms * 1000; });
    if (fs::exists(fresh)) {
      EXPECT_EQ(Rows(fresh, "VEHICLE_PART"), 60000);
      fs::remove(fresh);
    }
    EXPECT_FALSE(fs::exists(fresh + "-journal"));
  }

  // An import left to finish goes in whole, whatever the killed ones left.
  const auto r = Belvane("catalogue import --db cat.db --table VEHICLE_PART parts.csv");
  ASSERT_EQ(r.status, 0) << r.err;
  EXPECT_GE(Rows(db, "VEHICLE_PART"), before + 60000);
  EXPECT_FALSE(fs::exists(partial));
}

TEST_F(CatalogueFaults, AReaderThatMeetsAnInterruptedChangeSaysHowToRecover) {
  const std::string db = SmallCatalogue("cat.db");
  const long long before = Rows(db, "VEHICLE_PART");
  // Another program changes the catalogue in place and dies midway.
  const pid_t child = ::fork();
  if (child == 0) {
    sqlite3* h = nullptr;
    sqlite3_open(db.c_str(), &h);
    sqlite3_exec(h,
                 "PRAGMA cache_size = 1; BEGIN; DELETE FROM VEHICLE_PART; "
                 "UPDATE LABOUR_ITEM SET Script = 'x'",
                 nullptr, nullptr, nullptr);
    ::kill(::getpid(), SIGKILL);
  }
  int status = 0;
  ::waitpid(child, &status, 0);
  ASSERT_TRUE(fs::exists(db + "-journal"));

  std::string why;
  EXPECT_EQ(ErrorNumber([&] { SqliteCatalogue cat(db); }, &why), err::kDataService);
  EXPECT_THAT(
      why, AllOf(HasSubstr("was interrupted"), HasSubstr("belvane catalogue recover --db " + db)));
  auto r = Belvane("catalogue check --db cat.db");
  EXPECT_EQ(r.status, 2);
  EXPECT_THAT(r.err, HasSubstr("catalogue recover"));

  r = Belvane("catalogue recover --db cat.db");
  EXPECT_EQ(r.status, 0) << r.err;
  EXPECT_THAT(r.out, HasSubstr("rolled back"));
  EXPECT_EQ(Rows(db, "VEHICLE_PART"), before);
  r = Belvane("catalogue recover --db cat.db");
  EXPECT_THAT(r.out, HasSubstr("nothing to recover"));
}

TEST_F(CatalogueFaults, QueriesCannotReachNativeCode) {
  const std::string db = SmallCatalogue("cat.db");
  SqliteCatalogue cat(db);
  std::string why;
  // One argument would print the address of a tokenizer in the library.
  EXPECT_EQ(
      ErrorNumber([&] { cat.OpenRecordset("SELECT hex(fts3_tokenizer('simple')) AS a"); }, &why),
      err::kBadCommand);
  EXPECT_THAT(why, HasSubstr("not authorized to use function: fts3_tokenizer"));
  // Two arguments would set a pointer that the next full-text statement
  // calls.
  EXPECT_EQ(ErrorNumber([&] {
              cat.OpenRecordset("SELECT fts3_tokenizer('simple', x'4141414141414141') AS a");
            }),
            err::kBadCommand);
  EXPECT_EQ(ErrorNumber([&] { cat.OpenRecordset("SELECT load_extension('/tmp/x.so') AS a"); }),
            err::kBadCommand);
  auto r = Belvane("catalogue query --db cat.db \"SELECT fts3_tokenizer('simple')\"");
  EXPECT_EQ(r.status, 2);
  EXPECT_EQ(r.out, "");
  // Full-text search itself still works.
  EXPECT_EQ(cat.OpenRecordset("SELECT 1 AS one")->Collect("one").ToInt32(), 1);
}

TEST_F(CatalogueFaults, TheSchemaOfACatalogueFileIsNotTrusted) {
  const std::string db = SmallCatalogue("cat.db");
  {
    sqlite3* h = nullptr;
    ASSERT_EQ(sqlite3_open(db.c_str(), &h), SQLITE_OK);
    // Views that call functions a catalogue has no business calling from
    // its own schema.
    ASSERT_EQ(sqlite3_exec(h,
                           "CREATE VIEW tok AS SELECT fts3_tokenizer('simple') AS t;"
                           "CREATE VIEW js AS SELECT json('{}') AS j;"
                           "CREATE VIEW plain AS SELECT upper('a') AS u;",
                           nullptr, nullptr, nullptr),
              SQLITE_OK);
    sqlite3_close(h);
  }
  SqliteCatalogue cat(db);
  EXPECT_NE(ErrorNumber([&] { cat.OpenRecordset("SELECT * FROM tok"); }), 0);
  std::string why;
  EXPECT_EQ(ErrorNumber([&] { cat.OpenRecordset("SELECT * FROM js"); }, &why), err::kBadCommand);
  EXPECT_THAT(why, HasSubstr("unsafe use of json()"));
  // Functions without side effects still work in views.
  EXPECT_EQ(cat.OpenRecordset("SELECT * FROM plain")->Collect("u").ToText(), "A");
}

TEST_F(CatalogueFaults, CheckFindsADestroyedTablePage) {
  const std::string db = SmallCatalogue("cat.db");
  ASSERT_TRUE(tools::CheckCatalogue(db).Clean());
  long long root = 0, pageSize = 0;
  {
    SqliteCatalogue cat(db);
    root = cat.OpenRecordset("SELECT rootpage FROM sqlite_schema WHERE name = 'VEHICLE_PART'")
               ->Collect("rootpage")
               .ToInt32();
    pageSize =
        cat.OpenRecordset("SELECT page_size FROM pragma_page_size")->Collect("page_size").ToInt32();
  }
  {
    std::fstream f(db, std::ios::in | std::ios::out | std::ios::binary);
    f.seekp((root - 1) * pageSize);
    const std::string garbage(static_cast<size_t>(pageSize), '\x5A');
    f.write(garbage.data(), pageSize);
  }
  // The row count is answered from an index and still looks right...
  EXPECT_EQ(ErrorNumber([&] { Rows(db, "VEHICLE_PART"); }), 0);
  // ...but the check reads every page.
  const tools::CheckReport report = tools::CheckCatalogue(db);
  EXPECT_FALSE(report.damage.empty());
  EXPECT_FALSE(report.Clean());
  const auto r = Belvane("catalogue check --db cat.db");
  EXPECT_EQ(r.status, 1);
  EXPECT_THAT(r.out, HasSubstr("Damaged: "));
}

TEST_F(CatalogueFaults, ImportFollowsTheCataloguesEncipheredColumns) {
  const std::string db = SmallCatalogue("cat.db");
  Write(dir_.File("parts.csv"), "make,cat_no,ItemNo,PARTNAME,partno,Script\n"
                                "KIA,C1,P1,Bonnet,BN-1,Bonnet panel\n"
                                "KIA,C1,P2,,  ,Guard\n");
  auto r = Belvane("catalogue import --db cat.db --table VEHICLE_PART parts.csv");
  ASSERT_EQ(r.status, 0) << r.err;
  {
    SqliteCatalogue cat(db);
    auto rs = cat.OpenRecordset("SELECT PARTNAME, partno, Script FROM VEHICLE_PART WHERE cat_no = "
                                "'C1' AND make = 'KIA' ORDER BY ItemNo");
    cipher::InitFieldCipher();
    EXPECT_EQ(cipher::DecryptField(rs->Collect("PARTNAME").ToText()), "Bonnet");
    EXPECT_EQ(cipher::DecryptField(rs->Collect("partno").ToText()), "BN-1");
    EXPECT_EQ(rs->Collect("Script").ToText(), "Bonnet panel"); // not listed: plain
    rs->MoveNext();
    EXPECT_TRUE(rs->Collect("PARTNAME").IsNull());
    EXPECT_EQ(rs->Collect("partno").ToText(), "  "); // blank stays blank
  }
  r = Belvane("catalogue check --db cat.db");
  EXPECT_EQ(r.status, 0) << r.out;

  cipher::InitFieldCipher();
  // The hours: plain numbers below 16 characters, enciphered numbers from
  // 16 on; anything else is refused rather than found by the check.
  Write(dir_.File("labour.csv"), "schedule,sched_id,ItemNo,rrhour,pthour\n"
                                 "0,S1,L1,1.5,2.25\n"
                                 "0,S1,L2," +
                                     cipher::EncryptField("1.25") + ",\n");
  r = Belvane("catalogue import --db cat.db --table LABOUR_ITEM labour.csv");
  ASSERT_EQ(r.status, 0) << r.err;
  for (const std::string& bad :
       {std::string("one hour"), std::string("1.250000000000000"), cipher::EncryptField("abc")}) {
    Write(dir_.File("labour.csv"), "schedule,sched_id,ItemNo,rrhour\n0,S1,L3," + bad + "\n");
    r = Belvane("catalogue import --db cat.db --table LABOUR_ITEM labour.csv");
    EXPECT_EQ(r.status, 1) << bad;
    EXPECT_THAT(r.err, HasSubstr("labour.csv line 2: column rrhour")) << bad;
  }
  r = Belvane("catalogue check --db cat.db");
  EXPECT_EQ(r.status, 0) << r.out;

  // --encipher on a column that already holds plain values would leave it
  // mixed: refused, nothing written.
  const long long before = Rows(db, "VEHICLE_PART");
  r = Belvane("catalogue import --db cat.db --table VEHICLE_PART --encipher Script parts.csv");
  EXPECT_EQ(r.status, 1);
  EXPECT_THAT(r.err, HasSubstr("already holds"));
  EXPECT_EQ(Rows(db, "VEHICLE_PART"), before);
  // On a column without values it is taken and listed, so check reads it.
  {
    tools::SqliteCatalogueWriter empty(dir_.File("empty.db"));
    empty.Commit();
  }
  Write(dir_.File("items.csv"), "ItemNo,CATEGORY,Script\nI1,R&R,Secret text\n");
  r = Belvane("catalogue import --db empty.db --table ITEM_2 --encipher Script items.csv");
  ASSERT_EQ(r.status, 0) << r.err;
  {
    SqliteCatalogue cat(dir_.File("empty.db"));
    EXPECT_EQ(cat.OpenRecordset("SELECT count(*) AS n FROM CIPHER_COLUMN WHERE table_name = "
                                "'ITEM_2' AND column_name = 'Script'")
                  ->Collect("n")
                  .ToInt32(),
              1);
  }
  r = Belvane("catalogue import --db empty.db --table ITEM_2 items.csv"); // listed now
  ASSERT_EQ(r.status, 0) << r.err;
  r = Belvane("catalogue check --db empty.db");
  EXPECT_EQ(r.status, 0) << r.out;
  EXPECT_THAT(r.out, Not(HasSubstr("Bad value")));
}

TEST_F(CatalogueFaults, CsvTextThatIsNotUtf8AndATrailingCarriageReturn) {
  const std::string db = SmallCatalogue("cat.db");
  for (const std::string& bad :
       {std::string("\xED\xA0\x80"), std::string("\xC0\xAF"), std::string("\xE0\x80\xAF"),
        std::string("\xF4\x90\x80\x80"), std::string("\xE2\x82")}) {
    Write(dir_.File("items.csv"), "ItemNo,CATEGORY\nI1,R&R\nI2," + bad + "\n");
    const auto r = Belvane("catalogue import --db cat.db --table ITEM_2 items.csv");
    EXPECT_EQ(r.status, 1);
    EXPECT_THAT(r.err, HasSubstr("items.csv line 3: the text is not valid UTF-8"));
  }
  const auto records = tools::ParseCsv("a,b\r\n1,2\r", "x.csv");
  ASSERT_EQ(records.size(), 2u);
  EXPECT_EQ(records[1].fields[1].text, "2");
  EXPECT_EQ(tools::ParseCsv("a,\"b\"\r", "x.csv")[0].fields[1].text, "b");
  EXPECT_EQ(tools::ParseCsv("a,b\rc\n", "x.csv")[0].fields[1].text, "b\rc"); // kept inside a line
}

TEST_F(CatalogueFaults, OutputThatCannotBeWrittenIsAFailure) {
  SmallCatalogue("cat.db");
  for (const char* args :
       {"catalogue check --db cat.db", "catalogue query --db cat.db \"SELECT 1\"",
        "catalogue recover --db cat.db",
        "catalogue query --db cat.db \"SELECT * FROM VEHICLE_PART\""}) {
    const auto r = Belvane(args, "/dev/full");
    EXPECT_EQ(r.status, 2) << args;
    EXPECT_THAT(r.err, HasSubstr("No space left on device")) << args;
  }
}

TEST_F(CatalogueFaults, ADatabaseThatCannotBeWrittenIsNotBlamedOnACsvLine) {
  const std::string db = SmallCatalogue("cat.db");
  const long long before = Rows(db, "VEHICLE_PART");
  PartsCsv("parts.csv", 60000);
  // Files may not grow past 1 MB: the copy fills up as rows go in.
  const auto r = Belvane("catalogue import --db cat.db --table VEHICLE_PART parts.csv", "out.txt",
                         "trap '' XFSZ; ulimit -f 1024; ");
  EXPECT_EQ(r.status, 1);
  EXPECT_THAT(r.err, AllOf(HasSubstr("Catalogue cat.db"), Not(HasSubstr(" line "))));
  EXPECT_EQ(Rows(db, "VEHICLE_PART"), before);
  EXPECT_FALSE(fs::exists(db + ".import-partial"));
}

TEST_F(CatalogueFaults, QueryOutputIsEscapedStreamedAndLimited) {
  SmallCatalogue("cat.db");
  auto r =
      Belvane("catalogue query --db cat.db \"SELECT 'a' || char(9) || 'b' || char(10) || "
              "'c\\\\d' || char(27) || '[2J' || char(155) AS v, x'FF41' AS w, 'Müller' AS u\"");
  ASSERT_EQ(r.status, 0) << r.err;
  EXPECT_EQ(r.out, "v\tw\tu\na\\tb\\nc\\\\d\\x1B[2J\\xC2\\x9B\t\\xFFA\tMüller\n");

  // A query without end stops at the limit, its rows printed as they came.
  r = Belvane("catalogue query --db cat.db --limit 3 \"WITH RECURSIVE c(x) AS (SELECT 1 UNION "
              "ALL SELECT x + 1 FROM c) SELECT x FROM c\"");
  ASSERT_EQ(r.status, 0) << r.err;
  EXPECT_EQ(r.out, "x\n1\n2\n3\n");
  EXPECT_THAT(r.err, HasSubstr("stopped after 3 rows"));
}

TEST_F(CatalogueFaults, SampleOntoAFolderSaysWhatIsWrong) {
  fs::create_directories(dir_.File("folder.db"));
  const auto r = Belvane("catalogue sample --out folder.db --models 1");
  EXPECT_NE(r.status, 0);
  EXPECT_THAT(r.err, AllOf(HasSubstr("folder.db"), HasSubstr("folder"), Not(HasSubstr("Success"))));
  EXPECT_TRUE(fs::is_directory(dir_.File("folder.db")));
}

// --- The catalogue service when its file goes away or breaks ----------------

TEST_F(CatalogueFaults, ACatalogueFileThatDisappearsOrBreaksWhileInUse) {
  const std::string db = SmallCatalogue("cat.db");
  SqliteCatalogue cat(db);
  std::vector<std::pair<std::string, std::string>> models; // make, cat_no
  for (auto m = cat.OpenRecordset("SELECT MAKE, cat_no FROM ALLMODEL"); !m->Eof(); m->MoveNext())
    models.emplace_back(m->Collect("MAKE").ToText(), m->Collect("cat_no").ToText());
  ASSERT_EQ(models.size(), 2u);
  RecordsetPtr rs;
  cat.GetVehicleParts(rs, models[0].first, models[0].second, "", 0);
  const long before = rs->RecordCount();
  ASSERT_GT(before, 0);

  // Removed: the open catalogue keeps reading the file it opened; a new
  // one says the file is gone.
  const std::string moved = dir_.File("moved.db");
  fs::rename(db, moved);
  cat.GetVehicleParts(rs, models[0].first, models[0].second, "", 0);
  EXPECT_EQ(rs->RecordCount(), before);
  std::string why;
  EXPECT_EQ(ErrorNumber([&] { SqliteCatalogue gone(db); }, &why), err::kDataService);
  EXPECT_THAT(why, AllOf(HasSubstr(db), HasSubstr("does not exist")));

  // Cut short under an open catalogue: each read fails with the file named,
  // and nothing crashes; the catalogue object stays usable for calls that
  // do not need the lost pages.
  SqliteCatalogue open(moved);
  fs::resize_file(moved, 3 * 4096);
  int failures = 0;
  for (const auto& [make, catNo] : models) {
    const long n = ErrorNumber([&] { open.GetVehicleParts(rs, make, catNo, "", 0); }, &why);
    if (n != 0) {
      ++failures;
      EXPECT_EQ(n, err::kDataService);
      EXPECT_THAT(why, HasSubstr(moved));
    }
  }
  EXPECT_GT(failures, 0);
  const long diagram = ErrorNumber([&] { open.HasVehicleDiagram(models[0].first); });
  EXPECT_TRUE(diagram == 0 || diagram == err::kDataService) << diagram;
}
