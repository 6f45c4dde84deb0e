#include "data/recordset.hpp"
#include "error_number.hpp"
#include "text/error.hpp"

#include <gtest/gtest.h>

#include <cctype>
#include <string>
#include <vector>

using namespace belvane;
using namespace belvane::data;

namespace {

using belvane::test::ErrorNumber;

// A quote item record set with a handful of labour records, loaded as a host
// would load it from its store.
std::unique_ptr<Recordset> QuoteItems() {
  auto rs = std::make_unique<Recordset>();
  auto& f = rs->Fields();
  f.Append("ITEMID", DataType::Integer);
  f.Append("DELITEM", DataType::Boolean);
  f.Append("itemno", DataType::VarWChar);
  f.Append("Category", DataType::VarWChar);
  f.Append("rrhour", DataType::Double);
  f.Append("report_on", DataType::SmallInt);
  rs->Open();
  rs->AppendLoaded(
      {Value(10), Value(false), Value("B200"), Value("R&R"), Value(1.5), Value(int16_t{0})});
  rs->AppendLoaded(
      {Value(11), Value(false), Value("a100"), Value("RA"), Value(), Value(int16_t{1})});
  rs->AppendLoaded(
      {Value(12), Value(true), Value("C300"), Value("PAINT"), Value(), Value(int16_t{0})});
  rs->AppendLoaded({Value(13), Value(false), Value(), Value("R&R"), Value(0.5), Value(int16_t{0})});
  return rs;
}

std::vector<std::string> ItemNos(Recordset& rs) {
  std::vector<std::string> out;
  for (rs.MoveFirst(); !rs.Eof(); rs.MoveNext())
    out.push_back(rs.Fields("itemno").Value().ToText());
  return out;
}

} // namespace

TEST(Recordset, FieldsByNameWithoutRegardToCase) {
  auto rs = QuoteItems();
  rs->MoveFirst();
  EXPECT_EQ(rs->Fields("ITEMNO").Value(), Value("B200"));
  EXPECT_EQ(rs->Collect("Itemid"), Value(10));
  rs->Fields("RRHOUR") = Value("2.25");
  EXPECT_EQ(rs->Fields("rrhour").Value(), Value(2.25));
  EXPECT_EQ(ErrorNumber([&] { rs->Fields("nosuch"); }), err::kItemNotFound);
  EXPECT_EQ(ErrorNumber([&] { rs->Collect("nosuch", Value(1)); }), err::kItemNotFound);
}

TEST(Recordset, WritesConvertToTheFieldTypeOrFailWithoutChange) {
  auto rs = QuoteItems();
  rs->MoveFirst();
  rs->Fields("report_on") = Value(true);
  EXPECT_EQ(rs->Fields("report_on").Value(), Value(int16_t{-1}));
  rs->Fields("ITEMID") = Value("42");
  EXPECT_EQ(rs->Fields("ITEMID").Value(), Value(42));
  try {
    rs->Fields("rrhour") = Value("abc");
    FAIL();
  } catch (const Error& e) {
    EXPECT_EQ(e.Number(), err::kTypeMismatch);
    EXPECT_NE(e.Description().find("rrhour"), std::string::npos);
  }
  EXPECT_EQ(rs->Fields("rrhour").Value(), Value(1.5));
  rs->Fields("rrhour") = Value(); // Null stays Null
  EXPECT_TRUE(rs->Fields("rrhour").Value().IsNull());
}

TEST(Recordset, IterationAndCursorErrors) {
  auto rs = QuoteItems();
  EXPECT_EQ(rs->RecordCount(), 4);
  rs->MoveFirst();
  EXPECT_FALSE(rs->Bof());
  rs->MoveLast();
  EXPECT_EQ(rs->Collect("ITEMID"), Value(13));
  rs->MoveNext();
  EXPECT_TRUE(rs->Eof());
  EXPECT_EQ(ErrorNumber([&] { rs->MoveNext(); }), err::kNoCurrentRecord);
  EXPECT_EQ(ErrorNumber([&] { rs->Collect("ITEMID"); }), err::kNoCurrentRecord);
  rs->MovePrevious();
  EXPECT_EQ(rs->Collect("ITEMID"), Value(13));
  rs->MoveFirst();
  rs->MovePrevious();
  EXPECT_TRUE(rs->Bof());
  EXPECT_EQ(ErrorNumber([&] { rs->MovePrevious(); }), err::kNoCurrentRecord);
}

TEST(Recordset, DeleteKeepsIterationGoing) {
  auto rs = QuoteItems();
  // Delete every record whose report_on is 0 while walking forwards.
  std::vector<int> seen;
  for (rs->MoveFirst(); !rs->Eof(); rs->MoveNext()) {
    seen.push_back(rs->Collect("ITEMID").ToInt32());
    if (rs->Collect("report_on").ToInt32() == 0) {
      rs->Delete(adAffectCurrent);
      EXPECT_EQ(ErrorNumber([&] { rs->Collect("ITEMID"); }), err::kNoCurrentRecord);
    }
  }
  EXPECT_EQ(seen, (std::vector<int>{10, 11, 12, 13}));
  EXPECT_EQ(rs->RecordCount(), 1);
  EXPECT_EQ(ItemNos(*rs), (std::vector<std::string>{"a100"}));
  EXPECT_EQ(rs->StoredStatus(0), RecordStatus::Deleted);
  EXPECT_EQ(rs->StoredStatus(1), RecordStatus::Unchanged);
}

TEST(Recordset, FindAsTheWritersUseIt) {
  auto rs = QuoteItems();
  rs->Find("ITEMID = 12", 0, adSearchForward, adBookmarkFirst);
  ASSERT_FALSE(rs->Eof());
  EXPECT_EQ(rs->Collect("itemno"), Value("C300"));
  rs->Find("ITEMID = 99", 0, adSearchForward, adBookmarkFirst);
  EXPECT_TRUE(rs->Eof());
  // A deleted record is not found again.
  rs->Find("ITEMID = 11", 0, adSearchForward, adBookmarkFirst);
  rs->Delete();
  rs->Find("ITEMID = 11", 0, adSearchForward, adBookmarkFirst);
  EXPECT_TRUE(rs->Eof());
  // A changed id is found under its new value (the index follows writes).
  rs->Find("ITEMID = 10", 0, adSearchForward, adBookmarkFirst);
  rs->Fields("ITEMID") = Value(100);
  rs->Find("ITEMID = 10", 0, adSearchForward, adBookmarkFirst);
  EXPECT_TRUE(rs->Eof());
  rs->Find("ITEMID = 100", 0, adSearchForward, adBookmarkFirst);
  EXPECT_EQ(rs->Collect("itemno"), Value("B200"));
}

TEST(Recordset, FindOtherOperatorsDirectionsAndSkip) {
  auto rs = QuoteItems();
  rs->Find("Category = 'R&R'", 0, adSearchForward, adBookmarkFirst);
  EXPECT_EQ(rs->Collect("ITEMID"), Value(10));
  rs->Find("Category = 'R&R'", 1); // from the next record
  EXPECT_EQ(rs->Collect("ITEMID"), Value(13));
  rs->Find("Category = 'r&r'", 0, adSearchBackward, adBookmarkLast);
  EXPECT_EQ(rs->Collect("ITEMID"), Value(13));
  rs->Find("rrhour >= 1", 0, adSearchForward, adBookmarkFirst);
  EXPECT_EQ(rs->Collect("ITEMID"), Value(10));
  rs->Find("itemno LIKE 'C*'", 0, adSearchForward, adBookmarkFirst);
  EXPECT_EQ(rs->Collect("ITEMID"), Value(12));
  rs->Find("ITEMID > 100", 0, adSearchBackward, adBookmarkLast);
  EXPECT_TRUE(rs->Bof());
  rs->Find("rrhour = Null", 0, adSearchForward, adBookmarkFirst);
  EXPECT_EQ(rs->Collect("ITEMID"), Value(11));
  for (const char* bad : {"ITEMID", "ITEMID == 3", "ITEMID = 'x", "= 3", "ITEMID = 1 AND x = 2"})
    EXPECT_EQ(ErrorNumber([&] { rs->Find(bad, 0, adSearchForward, adBookmarkFirst); }),
              err::kBadArguments)
        << bad;
  EXPECT_EQ(ErrorNumber([&] { rs->Find("nosuch = 1", 0, adSearchForward, adBookmarkFirst); }),
            err::kItemNotFound);
}

TEST(Recordset, FindFollowsTheSortOrder) {
  auto rs = QuoteItems();
  rs->AddNew();
  rs->Collect("ITEMID", Value(12));
  rs->Collect("itemno", Value("A000"));
  rs->SetSort("itemno ASC");
  rs->Find("ITEMID = 12", 0, adSearchForward, adBookmarkFirst);
  EXPECT_EQ(rs->Collect("itemno"), Value("A000"));
  rs->SetSort("itemno DESC");
  rs->Find("ITEMID = 12", 0, adSearchForward, adBookmarkFirst);
  EXPECT_EQ(rs->Collect("itemno"), Value("C300"));
}

TEST(Recordset, SortIsStableWithNullsFirstAndTextsWithoutCase) {
  auto rs = QuoteItems();
  rs->AddNew();
  rs->Collect("itemno", Value("A100"));
  rs->Collect("ITEMID", Value(1));
  rs->SetSort("itemno ASC");
  EXPECT_EQ(ItemNos(*rs), (std::vector<std::string>{"", "a100", "A100", "B200", "C300"}));
  rs->SetSort("itemno DESC, ITEMID ASC");
  EXPECT_EQ(ItemNos(*rs), (std::vector<std::string>{"C300", "B200", "A100", "a100", ""}));
  rs->SetSort("");
  EXPECT_EQ(ItemNos(*rs), (std::vector<std::string>{"B200", "a100", "C300", "", "A100"}));
  EXPECT_EQ(ErrorNumber([&] { rs->SetSort("itemno UP"); }), err::kBadArguments);
  EXPECT_EQ(ErrorNumber([&] { rs->SetSort("nosuch"); }), err::kItemNotFound);
  EXPECT_EQ(rs->Sort(), ""); // a refused sort leaves the old one
}

TEST(Recordset, FilterWithAndOrAndParentheses) {
  auto rs = QuoteItems();
  rs->SetFilter("DELITEM = False AND (Category = 'R&R' OR report_on = 1)");
  EXPECT_EQ(rs->RecordCount(), 3);
  EXPECT_EQ(ItemNos(*rs), (std::vector<std::string>{"B200", "a100", ""}));
  rs->SetFilter("itemno LIKE '%00' AND rrhour > 1");
  EXPECT_EQ(ItemNos(*rs), (std::vector<std::string>{"B200"}));
  rs->SetFilter("itemno IS NULL");
  EXPECT_EQ(rs->RecordCount(), 1);
  rs->SetFilter("");
  EXPECT_EQ(rs->RecordCount(), 4);
  EXPECT_EQ(ErrorNumber([&] { rs->SetFilter("(Category = 'RA'"); }), err::kBadArguments);
  EXPECT_EQ(ErrorNumber([&] { rs->SetFilter("Category = 'RA' XOR x = 1"); }), err::kBadArguments);
}

TEST(Recordset, ChangeStatesForTheHost) {
  auto rs = QuoteItems();
  rs->MoveFirst();
  rs->Collect("rrhour", Value(1.5)); // same value: no change
  EXPECT_EQ(rs->Status(), RecordStatus::Unchanged);
  rs->Collect("rrhour", Value(3.0));
  EXPECT_EQ(rs->Status(), RecordStatus::Modified);
  EXPECT_EQ(rs->Fields("rrhour").OriginalValue(), Value(1.5));
  rs->MoveNext();
  rs->Delete();
  rs->AddNew();
  rs->Collect("itemno", Value("N1"));
  EXPECT_EQ(rs->Status(), RecordStatus::New);
  rs->AddNew();
  rs->Delete();
  std::vector<RecordStatus> states;
  for (size_t i = 0; i < rs->StoredCount(); ++i)
    states.push_back(rs->StoredStatus(i));
  EXPECT_EQ(states, (std::vector<RecordStatus>{RecordStatus::Modified, RecordStatus::Deleted,
                                               RecordStatus::Unchanged, RecordStatus::Unchanged,
                                               RecordStatus::New, RecordStatus::Discarded}));
  EXPECT_EQ(rs->StoredOriginal(0, 4), Value(1.5));
  EXPECT_EQ(rs->StoredValue(0, 4), Value(3.0));
  rs->AcceptChanges();
  EXPECT_EQ(rs->StoredCount(), 4u);
  for (size_t i = 0; i < rs->StoredCount(); ++i)
    EXPECT_EQ(rs->StoredStatus(i), RecordStatus::Unchanged);
}

TEST(Recordset, InMemoryRemovedItemsList) {
  Recordset deleted;
  deleted.Fields().Append("ITEMID", DataType::Integer, 0, -1);
  EXPECT_EQ(deleted.State(), adStateClosed);
  deleted.Open();
  EXPECT_EQ(deleted.State(), adStateOpen);
  EXPECT_EQ(deleted.RecordCount(), 0);
  EXPECT_TRUE(deleted.Eof());
  EXPECT_TRUE(deleted.Bof());
  deleted.MoveFirst(); // allowed on an empty record set
  deleted.AddNew();
  deleted.Fields("itemid") = Value(57);
  EXPECT_EQ(deleted.RecordCount(), 1);
  EXPECT_EQ(ErrorNumber([&] { deleted.Fields().Append("X", DataType::Double); }), 3219);
  EXPECT_EQ(ErrorNumber([&] { deleted.Open(); }), err::kOpenAlready);
  deleted.Close();
  EXPECT_EQ(deleted.State(), adStateClosed);
  EXPECT_EQ(ErrorNumber([&] { (void)deleted.RecordCount(); }), err::kClosed);
  EXPECT_EQ(ErrorNumber([&] { deleted.MoveFirst(); }), err::kClosed);
  EXPECT_EQ(ErrorNumber([&] { deleted.AddNew(); }), err::kClosed);
}

TEST(Recordset, FindScalesOverLargeRecordSets) {
  // Many lookups over many records: answered from the index, and the
  // answers stay right as records are added and deleted in between.
  Recordset rs;
  rs.Fields().Append("ITEMID", DataType::Integer);
  rs.Fields().Append("n", DataType::Double);
  rs.Open();
  for (int i = 0; i < 20000; ++i)
    rs.AppendLoaded({Value(i * 2), Value(double(i))});
  for (int i = 0; i < 20000; i += 7) {
    rs.Find("ITEMID = " + std::to_string(i * 2), 0, adSearchForward, adBookmarkFirst);
    ASSERT_FALSE(rs.Eof());
    ASSERT_EQ(rs.Collect("n"), Value(double(i)));
    if (i % 3 == 0) rs.Delete();
  }
  rs.Find("ITEMID = 42", 0, adSearchForward, adBookmarkFirst);
  EXPECT_TRUE(rs.Eof()); // 21 * 2: i = 21 was deleted
  rs.Find("ITEMID = 3", 0, adSearchForward, adBookmarkFirst);
  EXPECT_TRUE(rs.Eof());
}

// Names are found through a hash of their length and a few bytes: names
// alike in those must still be told apart, in any case, and a name that
// is not there found as missing.
TEST(Recordset, FieldNamesAlikeInHashAreToldApart) {
  Recordset rs;
  std::vector<std::string> names;
  for (char a = 'A'; a <= 'Z'; ++a)
    names.push_back(std::string("F") + a + "X"); // same length, first and last byte
  for (int i = 0; i < 20; ++i)
    names.push_back("field_" + std::to_string(i)); // same first byte and length
  names.push_back("Größe");                        // not ASCII: the full case mapping
  for (const std::string& n : names)
    rs.Fields().Append(n, DataType::Variant);
  ASSERT_EQ(rs.Fields().Count(), names.size());
  for (size_t i = 0; i < names.size(); ++i) {
    std::string lower = names[i];
    for (char& c : lower)
      c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    EXPECT_EQ(rs.Fields().IndexOf(names[i]), i) << names[i];
    EXPECT_EQ(rs.Fields().IndexOf(lower), i) << lower;
  }
  EXPECT_EQ(rs.Fields().IndexOf("GRÖSSE"), std::nullopt);
  EXPECT_EQ(rs.Fields().IndexOf("GRÖßE"), names.size() - 1);
  EXPECT_EQ(rs.Fields().IndexOf("F1X"), std::nullopt);
  EXPECT_EQ(rs.Fields().IndexOf("field_20"), std::nullopt);
  EXPECT_EQ(rs.Fields().IndexOf(""), std::nullopt);
  EXPECT_EQ(ErrorNumber([&] { rs.Fields().Append("fax", DataType::Variant); }), err::kBadArguments);
}

TEST(Recordset, LoadedValuesOfAnotherTypeAreStillConverted) {
  Recordset rs;
  rs.Fields().Append("n", DataType::SmallInt);
  rs.Fields().Append("t", DataType::VarWChar);
  rs.Fields().Append("d", DataType::Double);
  rs.Open();
  rs.AppendLoaded({Value(int32_t{7}), Value(2.5), Value("3")});
  rs.MoveFirst();
  EXPECT_EQ(rs.Collect("n").Type(), ValueType::Integer);
  EXPECT_EQ(rs.Collect("t").Type(), ValueType::Text);
  EXPECT_EQ(rs.Collect("d"), Value(3.0));
  // A write of the same value in the field's own type changes nothing.
  rs.Collect("t", Value(rs.Collect("t").ToText()));
  EXPECT_EQ(rs.Status(), RecordStatus::Unchanged);
  rs.Collect("t", Value("other"));
  EXPECT_EQ(rs.Status(), RecordStatus::Modified);
  EXPECT_EQ(rs.Fields("t").OriginalValue().Type(), ValueType::Text);
}

TEST(Recordset, BackToAStoredRecordOnlyWhileItIsLiveAndInView) {
  auto rs = QuoteItems();
  rs->Find("ITEMID = 12", 0, adSearchForward, adBookmarkFirst);
  const size_t twelve = rs->CurrentStored();
  rs->MoveFirst();
  EXPECT_TRUE(rs->MoveToStored(twelve));
  EXPECT_EQ(rs->Collect("ITEMID").ToInt32(), 12);
  // Outside the filter, or deleted, it cannot be made current.
  rs->SetFilter("ITEMID <> 12");
  rs->MoveFirst();
  EXPECT_FALSE(rs->MoveToStored(twelve));
  EXPECT_EQ(rs->Collect("ITEMID").ToInt32(), 10); // the cursor did not move
  rs->SetFilter("");
  ASSERT_TRUE(rs->MoveToStored(twelve));
  rs->Delete();
  rs->MoveFirst();
  EXPECT_FALSE(rs->MoveToStored(twelve));
  EXPECT_FALSE(rs->MoveToStored(99));
  rs->MoveLast();
  rs->MoveNext();
  EXPECT_EQ(ErrorNumber([&] { (void)rs->CurrentStored(); }), err::kNoCurrentRecord);
}
