// The catalogue service as the editors use it: the SQL texts they send, the
// labour and parts queries, the diagram question, and the failures they
// must be able to tell apart.
#include "catalogue_contract.hpp"
#include "error_number.hpp"

#include "cipher/field.hpp"
#include "text/error.hpp"

#include <gmock/gmock.h>

using namespace belvane;
using namespace belvane::data;
using ::testing::ElementsAre;
using ::testing::HasSubstr;

namespace {

using Row = std::vector<Value>;

Value Text(const char* s) { return Value(s); }
Value Small(int n) { return Value(static_cast<int16_t>(n)); }
Value Enc(const char* s) { return Value(cipher::EncryptField(s)); }
const Value kNull;

// A small catalogue with one vehicle (KESTREL ALDER, model 1001, catalogue
// KS100, bodies "11" and "12") and enough neighbours to show each filter.
void FillTestCatalogue(tools::CatalogueWriter& w) {
  w.Insert("cinfo", {Small(2), Text("Test catalogue"), Text("2026-01")});
  w.Insert("ALLMODEL", {Value(1001), Text("KESTREL"), Text("ALDER"), Text("S1"), Small(2010),
                        Small(2014), Text("KS100"), Text("N1"), Text("M1"), Text("T1")});
  w.Insert("ALLMODEL", {Value(1002), Text("MARLOW"), Text("BRISK"), kNull, kNull, kNull,
                        Text("MW200"), Text("N2"), Text("M2"), Text("T2")});
  w.Insert("BODY", {Text("11"), Value(1001), Text("4D SEDAN")});
  w.Insert("BODY", {Text("12"), Value(1001), Text("5D HATCHBACK")});
  w.Insert("ITEM_2",
           {Text("G100"), Text("PAINT AND MATERIALS"), Text("PRT"), Text(""), Text("SUNDRIES")});
  w.Insert("ITEM_2",
           {Text("S200"), Text("WHEEL ALIGNMENT"), Text("SUB"), Text(""), Text("SUBLET")});
  w.Insert("ITEM_2",
           {Text("G104"), Text("BUMPER CLIP SET"), Text("PRT"), Text("O"), Text("FRONT BUMPER")});

  // schedule, sched_id, body_id, ItemNo, Script, rrhour, pthour, allow_tick
  auto labour = [&w](int schedule, const char* id, Value body, const char* item, const char* script,
                     Value rr, Value pt, Value allow) {
    w.Insert("LABOUR_ITEM", {Small(schedule), Text(id), std::move(body), Text(item), Text(script),
                             std::move(rr), std::move(pt), std::move(allow)});
  };
  labour(0, "N1", kNull, "L010", "FRONT BUMPER BAR", Value(1.2), Enc("2.5"), Small(7));
  labour(0, "N1", Text("12"), "L9002", "TAILGATE", Enc("1.5"), Value(3.1), Small(7));
  labour(0, "N1", Text(""), "L020", " BONNET R&I ", Value(0.8), kNull, Small(4));
  labour(0, "N1", Text("11"), "L9001", "BOOT LID", Value(1.0), Value(2.8), Small(7));
  labour(0, "N1", kNull, "L025", "BONNET PDR", kNull, kNull, kNull);
  labour(1, "N1", kNull, "L010", "FRONT BUMPER BAR", Value(1.3), Value(2.7), Small(5));
  labour(2, "T2", kNull, "L010", "FRONT BUMPER BAR", Value(1.1), Value(2.2), Small(7));
  labour(3, "N1", kNull, "L010", "FRONT BUMPER BAR", Value(1.4), Value(2.9), Small(7));

  // make, cat_no, body_id, state, ItemNo, PARTNAME, Script, SIDE, QTY,
  // unitcost, partno, Group
  auto part = [&w](const char* make, const char* cat, Value body, Value state, const char* item,
                   Value name, Value script, Value side, Value cost, Value partno,
                   const char* group) {
    w.Insert("VEHICLE_PART", {Text(make), Text(cat), std::move(body), std::move(state), Text(item),
                              std::move(name), std::move(script), std::move(side), Value(1),
                              std::move(cost), std::move(partno), Enc(group)});
  };
  part("KESTREL", "KS100", kNull, kNull, "P001", Enc("FRONT BUMPER BAR COVER"), kNull, Text("O"),
       Value(420.5), Enc("KS-52119-A0120"), "FRONT BUMPER");
  part("KESTREL", "KS100", kNull, kNull, "P002", Enc("FRONT GUARD PANEL"), kNull, Text("L"), kNull,
       Text(""), "L/H FRONT GUARD");
  part("KESTREL", "KS100", Text("11"), kNull, "P003", kNull, Text("BOOT LID PANEL"), Text("O"),
       Value(720.0), kNull, "BOOT LID");
  part("KESTREL", "KS100", Text("12"), kNull, "P004", Enc("TAILGATE PANEL"), kNull, Text("O"),
       Value(980.0), kNull, "TAILGATE");
  part("KESTREL", "KS100", kNull, Small(2), "P005", Enc("NUMBER PLATE BRACKET"), kNull, Text("O"),
       Value(18.0), kNull, "FRONT BUMPER");
  part("KESTREL", "KS100", kNull, Small(3), "P006", Enc("NUMBER PLATE BRACKET (EUROPEAN)"), kNull,
       Text("O"), Value(21.0), kNull, "FRONT BUMPER");
  part("KESTREL", "KS100", kNull, Small(0), "P007", kNull, Text("FRONT BUMPER CLIP"), Text(""),
       Value(1.2), kNull, "FRONT BUMPER");
  part("MARLOW", "KS100", kNull, kNull, "P900", Enc("OTHER MAKE"), kNull, Text("O"), Value(1.0),
       kNull, "BONNET");
  part("KESTREL", "KS999", kNull, kNull, "P901", Enc("OTHER CATALOGUE"), kNull, Text("O"),
       Value(1.0), kNull, "BONNET");

  w.Insert("DIAGRAM_MAKE", {Text("KESTREL")});
}

std::vector<std::string> Column(Recordset& rs, const char* field) {
  std::vector<std::string> out;
  for (; !rs.Eof(); rs.MoveNext())
    out.push_back(rs.Fields(field).Value().ToText());
  return out;
}

std::vector<std::string> FieldNames(const Recordset& rs) {
  std::vector<std::string> out;
  for (size_t i = 0; i < rs.Fields().Count(); ++i)
    out.push_back(rs.Fields().Item(i).name);
  return out;
}

using belvane::test::ErrorNumber;

} // namespace

namespace belvane::test {

std::shared_ptr<CatalogueDataObject>
CatalogueContract::Build(const std::vector<std::string>& omit) {
  return GetParam().build(FillTestCatalogue, omit);
}

} // namespace belvane::test

using belvane::test::CatalogueContract;

TEST_P(CatalogueContract, ModelLookUpReadsTheCatalogueNumberOrFindsNothing) {
  auto rs = cat_->OpenRecordset("SELECT * FROM ALLMODEL WHERE MODEL_ID = 1001");
  ASSERT_EQ(rs->RecordCount(), 1);
  EXPECT_EQ(rs->Fields("cat_no").Value(), Value("KS100"));
  EXPECT_EQ(rs->Fields("CAT_NO").Value(), Value("KS100")); // names without regard to case

  auto none = cat_->OpenRecordset("SELECT * FROM ALLMODEL WHERE MODEL_ID = 9999", 0, 0);
  EXPECT_EQ(none->State(), adStateOpen);
  EXPECT_EQ(none->RecordCount(), 0);
  EXPECT_TRUE(none->Eof());
  EXPECT_TRUE(none->HasField("cat_no"));
}

TEST_P(CatalogueContract, CatalogueStateAndGeneralPartsAsThePartsFormReadsThem) {
  auto info = cat_->OpenRecordset("select * from cinfo");
  EXPECT_EQ(info->Fields("State").Value().ToInt16(), 2);

  auto general = cat_->OpenRecordset("SELECT * FROM ITEM_2 WHERE CATEGORY = 'PRT'");
  ASSERT_EQ(general->RecordCount(), 2);
  EXPECT_EQ(general->Fields("ItemNo").Value(), Value("G100"));
  EXPECT_EQ(general->Fields("Script").Value(), Value("PAINT AND MATERIALS"));
  EXPECT_EQ(general->Fields("SIDE").Value(), Value(""));
  EXPECT_EQ(general->Fields("Group").Value(), Value("SUNDRIES"));
  general->MoveNext();
  EXPECT_EQ(general->Fields("Group").Value(), Value("FRONT BUMPER"));
}

TEST_P(CatalogueContract, LabourItemsOfTheScheduleForTheBodyInCatalogueOrder) {
  RecordsetPtr rs;
  cat_->GetLabourItems(rs, kScheduleNrma, " N1 ", "M1", "12");
  ASSERT_TRUE(rs);
  EXPECT_EQ(rs->State(), adStateOpen);
  EXPECT_THAT(FieldNames(*rs), ElementsAre("allow_tick", "ItemNo", "Script", "rrhour", "pthour"));
  // Positioned on the first item; items for every body and for body 12 only.
  EXPECT_EQ(rs->Fields("ItemNo").Value(), Value("L010"));
  EXPECT_EQ(rs->Fields("allow_tick").Value().ToInt16(), 7);
  EXPECT_DOUBLE_EQ(rs->Fields("rrhour").Value().ToDouble(), 1.2);
  // Enciphered hours arrive as stored (16 or more characters) and decipher.
  const std::string paint = rs->Fields("pthour").Value().ToText();
  EXPECT_GE(paint.size(), 16u);
  EXPECT_EQ(cipher::DecryptField(paint), "2.5");
  EXPECT_THAT(Column(*rs, "ItemNo"), ElementsAre("L010", "L9002", "L020", "L025"));

  rs->MoveFirst();
  rs->MoveNext();
  EXPECT_EQ(cipher::DecryptField(rs->Fields("rrhour").Value().ToText()), "1.5");
  rs->MoveNext();
  EXPECT_EQ(rs->Fields("Script").Value(), Value(" BONNET R&I ")); // as stored
  EXPECT_TRUE(rs->Fields("pthour").Value().IsNull());
  rs->MoveNext();
  EXPECT_TRUE(rs->Fields("allow_tick").Value().IsNull()); // the form reads Null as 7

  cat_->GetLabourItems(rs, kScheduleNrma, "N1", "M1", "11");
  EXPECT_THAT(Column(*rs, "ItemNo"), ElementsAre("L010", "L020", "L9001", "L025"));
  cat_->GetLabourItems(rs, kScheduleCp, "N1", "", "11");
  EXPECT_THAT(Column(*rs, "rrhour"), ElementsAre("1.4"));
}

TEST_P(CatalogueContract, LabourItemsFallBackToTheSecondIdOnlyWhenTheFirstHasNone) {
  RecordsetPtr rs;
  // MTA: nothing filed under M1 in schedule 1, so N1's schedule 1 items.
  cat_->GetLabourItems(rs, kScheduleMta, "M1", "N1", "11");
  EXPECT_THAT(Column(*rs, "rrhour"), ElementsAre("1.3"));
  // NRMA: N1 has items, so M1 is not looked at (and schedule 1 stays apart).
  cat_->GetLabourItems(rs, kScheduleNrma, "N1", "M1", "11");
  EXPECT_EQ(rs->RecordCount(), 4);
  // An empty first id goes straight to the second.
  cat_->GetLabourItems(rs, kScheduleMta, "", "N1", "11");
  EXPECT_EQ(rs->RecordCount(), 1);
}

TEST_P(CatalogueContract, AnEmptyScheduleIsAnOpenEmptyRecordSet) {
  RecordsetPtr rs;
  cat_->GetLabourItems(rs, kScheduleThird, "T1", "", "11"); // T1 has no items
  ASSERT_TRUE(rs);
  EXPECT_EQ(rs->State(), adStateOpen);
  EXPECT_EQ(rs->RecordCount(), 0);
  EXPECT_TRUE(rs->Eof());
  EXPECT_TRUE(rs->HasField("rrhour"));
  cat_->GetLabourItems(rs, kScheduleThird, "", "", "11");
  EXPECT_EQ(rs->RecordCount(), 0);

  EXPECT_EQ(ErrorNumber([&] { cat_->GetLabourItems(rs, 4, "N1", "", "11"); }), err::kInvalidCall);
}

TEST_P(CatalogueContract, VehiclePartsOfTheMakeCatalogueBodyAndState) {
  RecordsetPtr rs;
  cat_->GetVehicleParts(rs, " kestrel ", "KS100", "11", 2);
  ASSERT_TRUE(rs);
  EXPECT_THAT(FieldNames(*rs), ElementsAre("ItemNo", "PARTNAME", "Script", "SIDE", "QTY",
                                           "unitcost", "partno", "Group"));
  // Every body and body 11; every state and state 2; not MARLOW, not KS999.
  EXPECT_THAT(Column(*rs, "ItemNo"), ElementsAre("P001", "P002", "P003", "P005", "P007"));

  rs->MoveFirst();
  EXPECT_EQ(cipher::DecryptField(rs->Fields("PARTNAME").Value().ToText()),
            "FRONT BUMPER BAR COVER");
  EXPECT_EQ(cipher::DecryptField(rs->Fields("partno").Value().ToText()), "KS-52119-A0120");
  EXPECT_EQ(cipher::DecryptField(rs->Fields("Group").Value().ToText()), "FRONT BUMPER");
  EXPECT_EQ(rs->Fields("SIDE").Value(), Value("O"));
  EXPECT_EQ(rs->Fields("QTY").Value().ToInt32(), 1);
  EXPECT_DOUBLE_EQ(rs->Fields("unitcost").Value().ToDouble(), 420.5);
  rs->MoveNext();
  EXPECT_TRUE(rs->Fields("unitcost").Value().IsNull());
  EXPECT_EQ(rs->Fields("partno").Value(), Value(""));
  EXPECT_EQ(cipher::DecryptField(rs->Fields("Group").Value().ToText()), "L/H FRONT GUARD");
  rs->MoveNext();
  EXPECT_TRUE(rs->Fields("PARTNAME").Value().IsNull());
  EXPECT_EQ(rs->Fields("Script").Value(), Value("BOOT LID PANEL"));

  cat_->GetVehicleParts(rs, "KESTREL", "KS100", "12", 3);
  EXPECT_THAT(Column(*rs, "ItemNo"), ElementsAre("P001", "P002", "P004", "P006", "P007"));
}

TEST_P(CatalogueContract, VehiclePartsOfAnUnknownVehicleAreAnOpenEmptyRecordSet) {
  RecordsetPtr rs;
  using Vehicle = std::pair<const char*, const char*>;
  for (auto [make, catNo] :
       {Vehicle{"KESTREL", ""}, Vehicle{"KESTREL", "NOPE"}, Vehicle{"NOPE", "KS100"}}) {
    rs.reset();
    cat_->GetVehicleParts(rs, make, catNo, "11", 2);
    ASSERT_TRUE(rs) << make << " " << catNo;
    EXPECT_EQ(rs->State(), adStateOpen);
    EXPECT_EQ(rs->RecordCount(), 0);
    EXPECT_TRUE(rs->HasField("partno"));
  }
}

TEST_P(CatalogueContract, DiagramsByMakeWithoutRegardToCaseOrBlanks) {
  EXPECT_TRUE(cat_->HasVehicleDiagram("KESTREL"));
  EXPECT_TRUE(cat_->HasVehicleDiagram(" kestrel "));
  EXPECT_FALSE(cat_->HasVehicleDiagram("MARLOW"));
  EXPECT_FALSE(cat_->HasVehicleDiagram(""));
}

TEST_P(CatalogueContract, OnlyOneReadOnlyStatementRuns) {
  for (const char* sql : {"DELETE FROM ALLMODEL", "UPDATE ALLMODEL SET cat_no = 'X'",
                          "INSERT INTO DIAGRAM_MAKE (make) VALUES ('MARLOW')", "CREATE TABLE T (a)",
                          "DROP TABLE ALLMODEL", "SELECT 1; DELETE FROM ALLMODEL",
                          "SELECT 1; SELECT 2", "", "  -- x"}) {
    std::string description;
    EXPECT_EQ(ErrorNumber([&] { cat_->OpenRecordset(sql); }, &description), err::kBadCommand)
        << sql;
  }
  // Nothing was changed, and the catalogue still answers.
  EXPECT_EQ(cat_->OpenRecordset("SELECT * FROM ALLMODEL")->RecordCount(), 2);
  EXPECT_FALSE(cat_->HasVehicleDiagram("MARLOW"));
  // A trailing semicolon or comment is still one statement.
  EXPECT_EQ(cat_->OpenRecordset("SELECT * FROM cinfo; -- state")->RecordCount(), 1);
}

TEST_P(CatalogueContract, MissingTablesAndColumnsAreErrorsThatNameThem) {
  auto cat = Build({"VEHICLE_PART", "cinfo", "DIAGRAM_MAKE"});
  RecordsetPtr rs;
  std::string description;
  // The parts form passes over a catalogue without vehicle parts by this
  // number, so it must be exactly this one.
  EXPECT_EQ(
      ErrorNumber([&] { cat->GetVehicleParts(rs, "KESTREL", "KS100", "11", 0); }, &description),
      err::kNoSuchTable);
  EXPECT_THAT(description, HasSubstr("VEHICLE_PART"));
  EXPECT_EQ(ErrorNumber([&] { cat->OpenRecordset("select * from cinfo"); }, &description),
            err::kNoSuchTable);
  EXPECT_THAT(description, HasSubstr("cinfo"));
  EXPECT_EQ(ErrorNumber([&] { cat->HasVehicleDiagram("KESTREL"); }), err::kNoSuchTable);

  EXPECT_EQ(ErrorNumber([&] { cat_->OpenRecordset("SELECT nosuch FROM ALLMODEL"); }, &description),
            err::kBadCommand);
  EXPECT_THAT(description, HasSubstr("nosuch"));
}

TEST_P(CatalogueContract, AMissingCatalogueCannotBeOpened) {
  std::string description;
  EXPECT_EQ(ErrorNumber([&] { GetParam().openMissing(); }, &description), err::kDataService);
  EXPECT_FALSE(description.empty());
}

namespace belvane::test {
namespace {

// Rows streamed must be the rows of the record set, in order, for every
// case the record set tests above cover (fallback, empty, unknown vehicle),
// each value reading as the record set's does; a sink that stops early
// gets no more rows; a bad schedule raises the same error.
TEST_P(CatalogueContract, StreamedRowsAreTheRecordSetsRows) {
  using data::Value;
  // Texts as a loader reads them: every value through ToText, so a number
  // held in the record set's field type and the stored one agree.
  auto recordRows = [](data::Recordset& rs) {
    std::vector<std::vector<std::string>> rows;
    for (rs.MoveFirst(); !rs.Eof(); rs.MoveNext()) {
      std::vector<std::string> row;
      for (size_t i = 0; i < rs.Fields().Count(); ++i)
        row.push_back(rs.Fields(i).Value().ToText());
      rows.push_back(row);
    }
    return rows;
  };
  std::vector<std::vector<std::string>> streamed;
  auto collect = [&streamed](const std::vector<Value>& row) {
    std::vector<std::string> texts;
    for (const Value& v : row)
      texts.push_back(v.ToText());
    streamed.push_back(texts);
    return true;
  };
  struct Labour {
    long schedule;
    const char *first, *second, *body;
  };
  for (const Labour& l :
       {Labour{data::kScheduleNrma, " N1 ", "M1", "12"},
        Labour{data::kScheduleMta, "M1", "N1", "11"}, Labour{data::kScheduleMta, "", "N1", "11"},
        Labour{data::kScheduleThird, "T1", "", "11"}}) {
    data::RecordsetPtr rs;
    cat_->GetLabourItems(rs, l.schedule, l.first, l.second, l.body);
    streamed.clear();
    cat_->ForEachLabourItem(l.schedule, l.first, l.second, l.body, collect);
    EXPECT_EQ(streamed, recordRows(*rs)) << l.schedule << " " << l.first;
  }
  struct Vehicle {
    const char *make, *catNo, *body;
    int16_t state;
  };
  for (const Vehicle& v :
       {Vehicle{" kestrel ", "KS100", "11", 2}, Vehicle{"KESTREL", "KS100", "12", 3},
        Vehicle{"KESTREL", "", "11", 2}, Vehicle{"NOPE", "KS100", "11", 2}}) {
    data::RecordsetPtr rs;
    cat_->GetVehicleParts(rs, v.make, v.catNo, v.body, v.state);
    streamed.clear();
    cat_->ForEachVehiclePart(v.make, v.catNo, v.body, v.state, collect);
    EXPECT_EQ(streamed, recordRows(*rs)) << v.make << " " << v.catNo;
  }
  // Enciphered values arrive as stored and decipher.
  streamed.clear();
  cat_->ForEachVehiclePart("KESTREL", "KS100", "11", 2, collect);
  ASSERT_FALSE(streamed.empty());
  EXPECT_EQ(cipher::DecryptField(streamed[0][1]), "FRONT BUMPER BAR COVER");

  int seen = 0;
  cat_->ForEachVehiclePart("KESTREL", "KS100", "11", 2, [&seen](const std::vector<Value>&) {
    ++seen;
    return false;
  });
  EXPECT_EQ(seen, 1);
  EXPECT_EQ(ErrorNumber([&] {
              cat_->ForEachLabourItem(4, "N1", "", "11",
                                      [](const std::vector<Value>&) { return true; });
            }),
            err::kInvalidCall);
}

} // namespace
} // namespace belvane::test
