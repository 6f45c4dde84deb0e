// The catalogue maintainer's tools: the sample catalogue as the editors will
// read it, CSV import (all or nothing, with the line of the first fault),
// the check, and the `belvane catalogue` commands.
#include "temp_dir.hpp"

#include "cipher/field.hpp"
#include "data/sqlite/sqlite_catalogue.hpp"
#include "data/tools/catalogue_check.hpp"
#include "data/tools/catalogue_writer.hpp"
#include "data/tools/csv_import.hpp"
#include "data/tools/sample_catalogue.hpp"
#include "text/error.hpp"

#include <gmock/gmock.h>

#include <sys/wait.h>

#include <cstdlib>
#include <fstream>
#include <set>
#include <sstream>

using namespace belvane;
using namespace belvane::data;
using ::testing::AllOf;
using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::IsSupersetOf;
using ::testing::Not;

namespace {

constexpr const char* kOtherKey =
    "000102030405060708090A0B0C0D0E0F101112131415161718191A1B1C1D1E1F20212223";

long ErrorOf(auto&& fn, std::string* description = nullptr) {
  try {
    fn();
  } catch (const Error& e) {
    if (description) *description = e.Description();
    return e.Number();
  }
  return 0;
}

std::string Write(const test::TempDir& dir, const std::string& name, const std::string& content) {
  const std::string path = dir.File(name);
  std::ofstream(path, std::ios::binary) << content;
  return path;
}

std::string EmptyCatalogue(const test::TempDir& dir, const std::string& name) {
  const std::string path = dir.File(name);
  tools::SqliteCatalogueWriter w(path);
  w.Commit();
  return path;
}

// Every row of every table, as text: equal dumps mean equal catalogues.
std::string Dump(const std::string& path) {
  SqliteCatalogue cat(path);
  std::string out;
  auto tables = cat.OpenRecordset("SELECT name FROM sqlite_schema WHERE type = 'table' ORDER BY 1");
  for (; !tables->Eof(); tables->MoveNext()) {
    const std::string table = tables->Fields("name").Value().ToText();
    auto rs = cat.OpenRecordset("SELECT * FROM \"" + table + "\" ORDER BY rowid");
    for (; !rs->Eof(); rs->MoveNext()) {
      out += table;
      for (size_t i = 0; i < rs->Fields().Count(); ++i)
        out += "|" + rs->Fields(i).Value().ToText();
      out += "\n";
    }
  }
  return out;
}

long Count(SqliteCatalogue& cat, const std::string& table) {
  return cat.OpenRecordset("SELECT * FROM " + table)->RecordCount();
}

} // namespace

// --- The sample catalogue ------------------------------------------------------

class SampleCatalogue : public ::testing::Test {
protected:
  static void SetUpTestSuite() {
    dir_ = new test::TempDir("sample");
    path_ = dir_->File("sample.db");
    tools::WriteSampleCatalogueFile(path_, {});
  }
  static void TearDownTestSuite() { delete dir_; }
  static inline test::TempDir* dir_ = nullptr;
  static inline std::string path_;
  SqliteCatalogue cat_{path_};

  // A model's row of ALLMODEL and its first body.
  struct Vehicle {
    std::string make, catNo, nrma, mta, third, body;
  };
  Vehicle VehicleOf(int modelId) {
    auto m =
        cat_.OpenRecordset("SELECT * FROM ALLMODEL WHERE MODEL_ID = " + std::to_string(modelId));
    auto b = cat_.OpenRecordset("SELECT * FROM BODY WHERE MODEL_ID = " + std::to_string(modelId));
    return {m->Collect("MAKE").ToText(),     m->Collect("cat_no").ToText(),
            m->Collect("NRMA_ID").ToText(),  m->Collect("MTA_ID").ToText(),
            m->Collect("THIRD_ID").ToText(), b->Collect("BODY_ID").ToText()};
  }
};

TEST_F(SampleCatalogue, LabourSchedulesHaveEveryMaskAndPlainAndEncipheredHours) {
  const Vehicle v = VehicleOf(1001);
  RecordsetPtr rs;
  cat_.GetLabourItems(rs, kScheduleNrma, v.nrma, v.mta, v.body);
  ASSERT_GT(rs->RecordCount(), 30);
  std::set<int> masks;
  int plain = 0, enciphered = 0;
  for (; !rs->Eof(); rs->MoveNext()) {
    const int mask = rs->Collect("allow_tick").ToInt16();
    masks.insert(mask);
    for (const char* field : {"rrhour", "pthour"}) {
      const Value& hours = rs->Collect(field);
      const bool allowed = (mask & (field[0] == 'r' ? 4 : 1)) != 0;
      EXPECT_EQ(hours.IsNull(), !allowed) << rs->Collect("ItemNo").ToText() << " " << field;
      if (hours.IsNull()) continue;
      const std::string textForm = hours.ToText();
      if (textForm.size() >= 16) {
        ++enciphered;
        const double h = std::stod(cipher::DecryptField(textForm));
        EXPECT_GT(h, 0.0);
        EXPECT_LT(h, 20.0);
      } else {
        ++plain;
        EXPECT_GT(hours.ToDouble(), 0.0);
      }
    }
  }
  EXPECT_EQ(masks, (std::set<int>{0, 1, 2, 3, 4, 5, 6, 7}));
  EXPECT_GT(plain, 10);
  EXPECT_GT(enciphered, 10);

  for (long schedule : {kScheduleMta, kScheduleThird, kScheduleCp}) {
    const std::string& id = schedule == kScheduleMta     ? v.mta
                            : schedule == kScheduleThird ? v.third
                                                         : v.nrma;
    cat_.GetLabourItems(rs, schedule, id, "", v.body);
    EXPECT_GT(rs->RecordCount(), 30) << schedule;
  }
}

TEST_F(SampleCatalogue, HasAVehicleWhoseMtaItemsNeedTheSecondIdAndOneWithoutThirdPartyItems) {
  const Vehicle fallback = VehicleOf(1004);
  RecordsetPtr rs;
  cat_.GetLabourItems(rs, kScheduleMta, fallback.mta, "", fallback.body);
  EXPECT_EQ(rs->RecordCount(), 0);
  cat_.GetLabourItems(rs, kScheduleMta, fallback.mta, fallback.nrma, fallback.body);
  EXPECT_GT(rs->RecordCount(), 0);

  const Vehicle noThird = VehicleOf(1005);
  cat_.GetLabourItems(rs, kScheduleThird, noThird.third, "", noThird.body);
  EXPECT_EQ(rs->RecordCount(), 0);
}

TEST_F(SampleCatalogue, VehiclePartsHaveSidesGroupsAndStatePrices) {
  const Vehicle v = VehicleOf(1001);
  const int16_t state = cat_.OpenRecordset("select * from cinfo")->Collect("State").ToInt16();
  RecordsetPtr rs;
  cat_.GetVehicleParts(rs, v.make, v.catNo, v.body, state);
  ASSERT_GT(rs->RecordCount(), 50);
  std::set<std::string> sides, groups, names;
  int priced = 0, numbered = 0;
  for (; !rs->Eof(); rs->MoveNext()) {
    sides.insert(rs->Collect("SIDE").ToText());
    groups.insert(cipher::DecryptField(rs->Collect("Group").ToText()));
    const std::string partname = rs->Collect("PARTNAME").ToText();
    names.insert(partname.find_first_not_of(' ') == std::string::npos
                     ? rs->Collect("Script").ToText()
                     : cipher::DecryptField(partname));
    priced += rs->Collect("unitcost").IsNull() ? 0 : 1;
    const std::string partno = rs->Collect("partno").ToText();
    if (!partno.empty()) {
      ++numbered;
      EXPECT_THAT(cipher::DecryptField(partno), HasSubstr("-"));
    }
  }
  EXPECT_EQ(sides, (std::set<std::string>{"", "L", "O", "R"}));
  EXPECT_THAT(groups, IsSupersetOf({"FRONT BUMPER", "BONNET", "L/H FRONT GUARD", "R/H FRONT GUARD",
                                    "REAR BUMPER", "WINDSCREEN"}));
  EXPECT_THAT(names, Contains("NUMBER PLATE BRACKET"));
  EXPECT_THAT(names, Not(Contains("NUMBER PLATE BRACKET (EUROPEAN)"))); // state 2 only
  EXPECT_GT(priced, 40);
  EXPECT_GT(numbered, 40);

  EXPECT_TRUE(cat_.HasVehicleDiagram("KESTREL"));
  EXPECT_FALSE(cat_.HasVehicleDiagram("MARLOW"));
  EXPECT_EQ(cat_.OpenRecordset("SELECT * FROM ITEM_2 WHERE CATEGORY = 'PRT'")->RecordCount(), 11);
  EXPECT_TRUE(tools::CheckCatalogue(path_).Clean());
}

TEST(SampleOptions, TheSameSeedGivesTheSameCatalogueAndOptionsAreChecked) {
  test::TempDir dir("sample-seed");
  const tools::SampleOptions small{7, 2, 100, 20};
  tools::WriteSampleCatalogueFile(dir.File("a.db"), small);
  tools::WriteSampleCatalogueFile(dir.File("b.db"), small);
  tools::SampleOptions other = small;
  other.seed = 8;
  tools::WriteSampleCatalogueFile(dir.File("c.db"), other);
  EXPECT_EQ(Dump(dir.File("a.db")), Dump(dir.File("b.db")));
  EXPECT_NE(Dump(dir.File("a.db")), Dump(dir.File("c.db")));

  SqliteCatalogue a(dir.File("a.db"));
  EXPECT_EQ(Count(a, "VEHICLE_PART"), 200);
  EXPECT_EQ(Count(a, "ALLMODEL"), 2);

  for (tools::SampleOptions bad :
       {tools::SampleOptions{1, 0, 1, 1}, tools::SampleOptions{1, 1, -1, 1},
        tools::SampleOptions{1, 1, 1, 1000}}) {
    EXPECT_EQ(ErrorOf([&] { tools::WriteSampleCatalogueFile(dir.File("bad.db"), bad); }),
              err::kInvalidCall);
    EXPECT_FALSE(std::filesystem::exists(dir.File("bad.db")));
    EXPECT_FALSE(std::filesystem::exists(dir.File("bad.db.partial")));
  }
}

// --- Import --------------------------------------------------------------------

class Import : public ::testing::Test {
protected:
  test::TempDir dir_{"import"};
  std::string db_ = EmptyCatalogue(dir_, "catalogue.db");

  tools::ImportResult Run(const std::string& table, const std::string& csv,
                          std::vector<std::string> encipher = {}) {
    return tools::ImportCsv({db_, table, Write(dir_, "in.csv", csv), std::move(encipher)});
  }
};

TEST_F(Import, QuotedFieldsNullsAndEncipheredColumnsGoInAsWritten) {
  const auto result =
      Run("vehicle_part",
          "\xEF\xBB\xBFmake,cat_no,ItemNo,PARTNAME,SIDE,QTY,unitcost,partno,Group\r\n"
          "KESTREL,KS100,P001,\"BUMPER, FRONT \"\"SPORT\"\"\",O,1,420.50,KS-1,"
          "FRONT BUMPER\r\n"
          "KESTREL,KS100,P002,\"TWO\nLINES\",,2,,\"\",BONNET\r\n"
          "\r\n"
          "KESTREL,KS100,P003,  ,L, 3 ,1.5,,L/H FRONT GUARD\n",
          {"PARTNAME", "partno", "group"});
  EXPECT_EQ(result.rows, 3);
  EXPECT_EQ(result.table, "VEHICLE_PART");
  EXPECT_FALSE(result.createdDatabase);

  SqliteCatalogue cat(db_);
  auto rs = cat.OpenRecordset("SELECT * FROM VEHICLE_PART ORDER BY rowid");
  EXPECT_EQ(cipher::DecryptField(rs->Collect("PARTNAME").ToText()), "BUMPER, FRONT \"SPORT\"");
  EXPECT_EQ(cipher::DecryptField(rs->Collect("partno").ToText()), "KS-1");
  EXPECT_EQ(cipher::DecryptField(rs->Collect("Group").ToText()), "FRONT BUMPER");
  EXPECT_EQ(rs->Collect("unitcost"), Value(420.5));
  EXPECT_TRUE(rs->Collect("body_id").IsNull()); // not in the file
  rs->MoveNext();
  EXPECT_EQ(cipher::DecryptField(rs->Collect("PARTNAME").ToText()), "TWO\nLINES");
  EXPECT_TRUE(rs->Collect("SIDE").IsNull());   // unquoted empty: Null
  EXPECT_EQ(rs->Collect("partno"), Value("")); // quoted empty: empty text, not enciphered
  EXPECT_TRUE(rs->Collect("unitcost").IsNull());
  rs->MoveNext();
  EXPECT_EQ(rs->Collect("PARTNAME"), Value("  ")); // blank: left blank
  EXPECT_EQ(rs->Collect("QTY"), Value(3));
  EXPECT_TRUE(tools::CheckCatalogue(db_).bad.empty());
}

TEST_F(Import, HoursKeepTheirKindAndNewEncipheredColumnsAreRecorded) {
  Run("LABOUR_ITEM",
      "schedule,sched_id,ItemNo,rrhour,pthour,allow_tick\n"
      "0,N1,L010,1.5,2.5,7\n"
      "0,N1,L011,F409B4ADC95996D4,,4\n",
      {"pthour"});
  SqliteCatalogue cat(db_);
  auto rs = cat.OpenRecordset("SELECT rrhour, pthour FROM LABOUR_ITEM ORDER BY rowid");
  EXPECT_EQ(rs->Collect("rrhour"), Value(1.5)); // a plain number stays a number
  EXPECT_EQ(cipher::DecryptField(rs->Collect("pthour").ToText()), "2.5");
  rs->MoveNext();
  EXPECT_EQ(rs->Collect("rrhour"), Value("F409B4ADC95996D4")); // 16 characters: text

  Run("ITEM_2", "ItemNo,Script,CATEGORY\nG1,SECRET,PRT\n", {"Script"});
  // An import puts a new file in place; a catalogue opened before it reads
  // the old one until it is opened again.
  SqliteCatalogue after(db_);
  auto listed = after.OpenRecordset(
      "SELECT rule FROM CIPHER_COLUMN WHERE table_name = 'ITEM_2' AND column_name = 'Script'");
  ASSERT_EQ(listed->RecordCount(), 1);
  EXPECT_EQ(listed->Collect("rule"), Value("always"));
}

TEST_F(Import, AMalformedRowStopsTheImportWithItsLineAndNothingIsWritten) {
  Run("VEHICLE_PART", "make,cat_no,ItemNo\nKESTREL,KS100,P000\n");
  struct Case {
    const char* csv;
    long line;
    long number;
    const char* reason;
  };
  const Case cases[] = {
      {"make,cat_no,ItemNo\nK,C,P1\nK,C\n", 3, err::kInvalidCall, "2 fields; the header has 3"},
      {"make,cat_no,ItemNo,QTY\nK,C,P1,1\nK,C,P2,1\nK,C,P3,two\n", 4, err::kTypeMismatch,
       "QTY: \"two\" is not a whole number"},
      {"make,cat_no,ItemNo,unitcost\nK,C,P1,12.5.1\n", 2, err::kTypeMismatch, "not a number"},
      {"make,cat_no,ItemNo,PARTNAME\nK,C,P1,\"A\nB\"\nK,C\n", 4, err::kInvalidCall, "fields"},
      {"make,cat_no,ItemNo\nK,C,P1\n,C,P2\n", 3, err::kBadCommand, "NOT NULL"},
      {"make,cat_no,ItemNo\nK,C,\"P1\n", 2, err::kInvalidCall, "not closed"},
      {"make,cat_no,ItemNo\nK,C,\"P1\"x\n", 2, err::kInvalidCall, "after the closing quote"},
      {"make,nosuch\n", 1, err::kInvalidCall, "no column \"nosuch\""},
      {"make,make\n", 1, err::kInvalidCall, "twice"},
  };
  for (const Case& c : cases) {
    std::string description;
    EXPECT_EQ(ErrorOf([&] { Run("VEHICLE_PART", c.csv); }, &description), c.number) << c.csv;
    EXPECT_THAT(description, AllOf(HasSubstr("in.csv line " + std::to_string(c.line) + ":"),
                                   HasSubstr(c.reason)))
        << c.csv;
  }
  std::string description;
  EXPECT_EQ(ErrorOf([&] { Run("LABOUR_ITEM", "schedule,sched_id,ItemNo,allow_tick\n0,N,L,8\n"); },
                    &description),
            err::kBadCommand);
  EXPECT_THAT(description, AllOf(HasSubstr("line 2"), HasSubstr("CHECK")));

  SqliteCatalogue cat(db_);
  EXPECT_EQ(Count(cat, "VEHICLE_PART"), 1);
  EXPECT_EQ(Count(cat, "LABOUR_ITEM"), 0);
}

TEST_F(Import, WrongOptionsAreRefusedBeforeAnythingIsWritten) {
  const std::string csv = "make,cat_no,ItemNo,QTY\nK,C,P1,1\n";
  std::string description;
  EXPECT_EQ(ErrorOf([&] { Run("NOSUCH", csv); }, &description), err::kNoSuchTable);
  EXPECT_THAT(description, HasSubstr("NOSUCH"));
  EXPECT_EQ(ErrorOf([&] { Run("VEHICLE_PART", csv, {"PARTNAME"}); }, &description),
            err::kInvalidCall);
  EXPECT_THAT(description, HasSubstr("PARTNAME"));
  EXPECT_EQ(ErrorOf([&] { Run("VEHICLE_PART", csv, {"QTY"}); }, &description), err::kInvalidCall);
  EXPECT_THAT(description, HasSubstr("holds numbers"));
  EXPECT_EQ(ErrorOf([&] {
              tools::ImportCsv({db_, "VEHICLE_PART", dir_.File("none.csv"), {}});
            }),
            53);
  EXPECT_EQ(ErrorOf([&] { Run("VEHICLE_PART", "make,cat_no,ItemNo\nK,C,\xFF\n"); }, &description),
            err::kInvalidCall);
  EXPECT_THAT(description, HasSubstr("line 2: the text is not valid UTF-8"));
  SqliteCatalogue cat(db_);
  EXPECT_EQ(Count(cat, "VEHICLE_PART"), 0);
}

TEST_F(Import, AMissingDatabaseIsCreatedAndRemovedAgainWhenTheImportFails) {
  db_ = dir_.File("new.db");
  EXPECT_NE(ErrorOf([&] { Run("ITEM_2", "ItemNo,CATEGORY\nG1\n"); }), 0);
  EXPECT_FALSE(std::filesystem::exists(db_));
  const auto result = Run("ITEM_2", "ItemNo,CATEGORY\nG1,PRT\n");
  EXPECT_TRUE(result.createdDatabase);
  SqliteCatalogue cat(db_);
  EXPECT_EQ(Count(cat, "ITEM_2"), 1);
  EXPECT_EQ(Count(cat, "ALLMODEL"), 0); // the whole catalogue schema
}

// --- Check ---------------------------------------------------------------------

TEST(Check, ReportsValuesThatDoNotDecipherAndMissingTables) {
  test::TempDir dir("check");
  cipher::SetFieldKeyText(kOtherKey);
  const std::string foreign = cipher::EncryptField("FRONT BUMPER");
  cipher::ResetFieldKey();
  const std::string good = cipher::EncryptField("FRONT BUMPER");
  ASSERT_NE(foreign, good);

  const std::string path = dir.File("c.db");
  {
    tools::SqliteCatalogueWriter w(path, {"DIAGRAM_MAKE"});
    auto part = [&w](Value partname, Value partno, Value group) {
      w.Insert("VEHICLE_PART",
               {Value("K"), Value("C"), Value(), Value(), Value("P"), std::move(partname), Value(),
                Value("O"), Value(1), Value(), std::move(partno), std::move(group)});
    };
    part(Value(good), Value(""), Value(good));  // rowid 1: fine
    part(Value(foreign), Value(), Value(good)); // 2: another key
    part(Value("   "), Value("NOT HEX"),
         Value(good + " ")); // 3: blank fine, not hex, trailing blank fine
    part(Value(), Value(good.substr(0, 20)), Value(12)); // 4: 20 digits; 2 digits
    auto labour = [&w](Value rr) {
      w.Insert("LABOUR_ITEM", {Value(int16_t{0}), Value("N"), Value(), Value("L"), Value(),
                               std::move(rr), Value(), Value(int16_t{7})});
    };
    labour(Value(1.5));                            // 1: plain number
    labour(Value("2.5"));                          // 2: plain number as text
    labour(Value(cipher::EncryptField("1.5")));    // 3: enciphered
    labour(Value("abc"));                          // 4: neither
    labour(Value(cipher::EncryptField("BONNET"))); // 5: not a number
    w.Commit();
  }
  const auto report = tools::CheckCatalogue(path);
  EXPECT_FALSE(report.Clean());
  EXPECT_THAT(report.missing, Contains("table DIAGRAM_MAKE"));
  std::vector<std::string> bad;
  for (const auto& b : report.bad)
    bad.push_back(b.table + "." + b.column + " " + std::to_string(b.rowid) + ": " + b.reason);
  EXPECT_THAT(bad, ::testing::ElementsAre(
                       "LABOUR_ITEM.rrhour 4: \"abc\" is neither a number nor enciphered",
                       "LABOUR_ITEM.rrhour 5: deciphers to a text that is not a number",
                       "VEHICLE_PART.PARTNAME 2: does not decipher under the current key",
                       "VEHICLE_PART.partno 3: not hexadecimal, so not an enciphered value",
                       "VEHICLE_PART.partno 4: 20 digits: an enciphered value has a multiple of 16",
                       "VEHICLE_PART.Group 4: 2 digits: an enciphered value has a multiple of 16"));
  EXPECT_EQ(report.enciphered, 10);
  const auto counts = report.tables;
  EXPECT_THAT(counts, Contains(::testing::Field(&tools::CheckedTable::rows, 5)));
}

// --- The commands ----------------------------------------------------------------

class CatalogueCli : public ::testing::Test {
protected:
  test::TempDir dir_{"catalogue-cli"};
  struct Result {
    int status = -1;
    std::string out, err;
  };
  static std::string Read(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::stringstream s;
    s << in.rdbuf();
    return s.str();
  }
  Result Belvane(const std::string& args) {
    const std::string cmd = "cd '" + dir_.Path() + "' && '" BELVANE_CLI_PATH "' " + args +
                            " </dev/null >out.txt 2>err.txt";
    const int raw = std::system(cmd.c_str());
    return {WIFEXITED(raw) ? WEXITSTATUS(raw) : -1, Read(dir_.File("out.txt")),
            Read(dir_.File("err.txt"))};
  }
};

TEST_F(CatalogueCli, SampleImportAndCheckAsAMaintainerRunsThem) {
  auto r = Belvane("catalogue sample --out s.db --models 2 --parts-per-model 10 --labour-items 8");
  ASSERT_EQ(r.status, 0) << r.err;
  EXPECT_THAT(r.out, AllOf(HasSubstr("s.db"), HasSubstr("VEHICLE_PART"), HasSubstr("20 rows")));

  r = Belvane("catalogue check --db s.db");
  EXPECT_EQ(r.status, 0) << r.out << r.err;
  EXPECT_THAT(r.out, HasSubstr("0 do not decipher"));

  Write(dir_, "other.key", kOtherKey);
  r = Belvane("catalogue check --db s.db --key-file other.key");
  EXPECT_EQ(r.status, 1);
  EXPECT_THAT(r.out, HasSubstr("does not decipher under the current key"));

  Write(dir_, "parts.csv", "make,cat_no,ItemNo,PARTNAME,QTY\nK,C,P1,BONNET,1\nK,C,P2,GUARD,x\n");
  r = Belvane("catalogue import --db s.db --table VEHICLE_PART --encipher PARTNAME parts.csv");
  EXPECT_EQ(r.status, 1);
  EXPECT_THAT(r.err, AllOf(HasSubstr("parts.csv line 3: column QTY"),
                           HasSubstr("Nothing of parts.csv was written")));

  Write(dir_, "parts.csv", "make,cat_no,ItemNo,PARTNAME,QTY\nK,C,P1,BONNET,1\n");
  r = Belvane("catalogue import --db s.db --table VEHICLE_PART --encipher PARTNAME parts.csv");
  EXPECT_EQ(r.status, 0) << r.err;
  EXPECT_THAT(r.out, HasSubstr("Imported 1 rows into VEHICLE_PART"));

  r = Belvane("catalogue query --db s.db \"SELECT count(*) AS n FROM VEHICLE_PART\"");
  EXPECT_EQ(r.out, "n\n21\n");
  r = Belvane("catalogue query --db s.db \"DELETE FROM VEHICLE_PART\"");
  EXPECT_EQ(r.status, 2);
  EXPECT_THAT(r.err, HasSubstr("read-only"));
}
