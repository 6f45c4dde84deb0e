// The labour editor's store: quote records into grid rows at load, and grid
// rows back into records on Close.

#include "labour_fixture.hpp"

namespace belvane::test {
namespace {

using labour::frmLabour;
namespace col = labour::col;

using StoreTest = LabourFixture;

bool Grey(const grid::FlexGrid& g, int r, int c) {
  return g.CellStyleAt(r, c).backColor == grid::kGrey;
}

TEST_F(StoreTest, AnEmptyQuoteLeavesThePlaceholderRow) {
  Open(eEdit, [&](frmLabour& f) {
    EXPECT_EQ(f.FGSelectedLabour.Rows(), 2);
    EXPECT_EQ(RowText(f.FGSelectedLabour, 1), "|||||||||||||||");
    EXPECT_EQ(f.FGSelectedLabour.Cols(), 16);
    EXPECT_EQ(f.FGSelectedLabour.TextMatrix(0, 9), "R&R Rate");
  });
}

TEST_F(StoreTest, LoadBuildsOneRowPerLine) {
  // One line with all three operations, flags and a rate of its own.
  AddRecord(11, "100", "BONNET R&I", "R&R", 1.5, 1, 70.0);
  AddRecord(12, "100", "bonnet r&i", "RA", 0.5, 0);
  AddRecord(13, "100", "BONNET R&I", "PAINT", 2.0, 1);
  // A line with only paint, allowed paint only.
  AddRecord(21, "200", "ROOF", "PAINT", 3.0, 0, std::nullopt, "1");
  // A repair-only line at the default rate.
  AddRecord(31, "300", "DOOR", "RA", 1.0);
  // Hidden: tag D, deleted, Null tag, Null DELITEM.
  AddRecord(41, "400", "HIDDEN D", "R&R", 1.0, 0, std::nullopt, "7", "D");
  AddRecord(42, "401", "HIDDEN DEL", "R&R", 1.0, 0, std::nullopt, "7", "1", true);
  AddRecord(43, "402", "NULL TAG", "R&R", 1.0);
  quote->Collect("tag", data::Value());
  AddRecord(44, "403", "NULL DELITEM", "R&R", 1.0);
  quote->Collect("DELITEM", data::Value());
  // A line whose first record has an unknown category gets no row.
  AddRecord(51, "500", "ODD", "PRT", 1.0);
  // Mechanical, and a Null allow mask read as 7.
  AddRecord(61, "600", "ENGINE", "R&R", 4.0);
  quote->Collect("partno", data::Value("m"));
  quote->Collect("allow_tick", data::Value());
  Stored();

  Open(eEdit, [&](frmLabour& f) {
    const auto& g = f.FGSelectedLabour;
    ASSERT_EQ(g.Rows(), 5);
    EXPECT_EQ(RowText(g, 1), "100|BONNET R&I|1.50|R|0.50|£|2.00|R|£|70.00|£|7||11|12|13");
    EXPECT_EQ(RowText(g, 2), "200|ROOF||£||£|3.00|£|£|<NA>|£|1||||21");
    EXPECT_TRUE(Grey(g, 2, col::kRRHours) && Grey(g, 2, col::kRRReport));
    EXPECT_TRUE(Grey(g, 2, col::kRAHours) && Grey(g, 2, col::kRAReport));
    EXPECT_FALSE(Grey(g, 2, col::kPTHours));
    EXPECT_TRUE(g.CellStyleAt(2, col::kRate).fontItalic);
    EXPECT_EQ(RowText(g, 3), "300|DOOR||£|1.00|£||£|£|<NA>|£|7|||31|");
    EXPECT_EQ(RowText(g, 4), "600|ENGINE|4.00|£||£||£|£|<Default>|R|7||61||");
    EXPECT_TRUE(g.CellStyleAt(4, col::kRate).fontItalic);
    EXPECT_FALSE(g.CellStyleAt(1, col::kRate).fontItalic);
    for (int c : {3, 5, 7, 8, 10}) {
      EXPECT_EQ(g.CellStyleAt(1, c).fontName, "Wingdings 2");
      EXPECT_EQ(g.CellStyleAt(1, c).fontSize, 12);
    }
  });
}

TEST_F(StoreTest, TenLinesNarrowTheDescriptionNineDoNot) {
  for (int n : {9, 10}) {
    quote = data::QuoteStore::NewItemRecordset();
    for (int i = 0; i < n; ++i)
      AddRecord(100 + i, std::to_string(100 + i), "L", "R&R", 1.0);
    Stored();
    int width = 0, full = 0;
    Open(eEdit, [&](frmLabour& f) {
      width = f.FGSelectedLabour.ColWidth(col::kDescription);
      full = f.FGSelectedLabour.Width() - 6950 - 20;
    });
    EXPECT_EQ(width, n == 10 ? full - 240 : full) << n << " lines";
  }
}

TEST_F(StoreTest, CloseWritesEveryKindOfChange) {
  AddRecord(11, "100", "BONNET R&I", "R&R", 1.5);
  AddRecord(12, "100", "BONNET R&I", "RA", 0.5);
  AddRecord(13, "100", "BONNET R&I", "PAINT", 2.0);
  AddRecord(21, "200", "ROOF", "R&R", 1.0);
  AddRecord(22, "200", "ROOF", "PAINT", 2.0);
  AddRecord(31, "300", "DOOR", "R&R", 1.0);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    g.TextMatrix(1, col::kRAHours, "");      // cleared: the RA record goes
    g.TextMatrix(1, col::kPTHours, "-1.00"); // negative: tag D
    g.TextMatrix(1, col::kBlend, "R");
    g.TextMatrix(1, col::kMechanical, "R");
    g.TextMatrix(1, col::kRate, "72.50");
    g.TextMatrix(2, col::kDescription, "  "); // blanked: every record goes
    g.TextMatrix(3, col::kRRHours, "abc");    // not numeric: left alone
    g.AddItem("900\tNEW LINE\t1,234.50\tR\t\t£\t\t£\t£\t<Default>\t£\t7\t\t\t\t");
    EXPECT_TRUE(user.Click(f.cmdClose));
  });
  data::Recordset& rs = *quote;
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5", "100 PAINT -1", "300 R&R 1",
                                                 "900 R&R 1234.5"}));
  rs.Find("ITEMID = 11", 0, data::adSearchForward, data::adBookmarkFirst);
  EXPECT_EQ(rs.Collect("partno"), data::Value("M"));
  EXPECT_EQ(rs.Collect("rr_rate2"), data::Value(72.5));
  EXPECT_EQ(rs.Collect("tag"), data::Value("1"));
  rs.Find("ITEMID = 13", 0, data::adSearchForward, data::adBookmarkFirst);
  EXPECT_EQ(rs.Collect("tag"), data::Value("D"));
  EXPECT_EQ(rs.Collect("blend"), data::Value(int16_t{1}));
  EXPECT_EQ(rs.Collect("rr_rate2"), data::Value(ptRate));
  rs.Find("ITEMID = 31", 0, data::adSearchForward, data::adBookmarkFirst);
  EXPECT_EQ(rs.Status(), data::RecordStatus::Unchanged);
  rs.Find("itemno = '900'", 0, data::adSearchForward, data::adBookmarkFirst);
  EXPECT_TRUE(rs.Collect("ITEMID").IsNull());
  EXPECT_EQ(rs.Collect("qtnno"), data::Value(quoteNo));
  EXPECT_EQ(rs.Collect("subquote"), data::Value(subQuoteNo));
  EXPECT_EQ(rs.Collect("script"), data::Value("NEW LINE"));
  EXPECT_EQ(rs.Collect("report_on"), data::Value(int16_t{1}));
  EXPECT_EQ(rs.Collect("rr_rate2"), data::Value(rrRate));
  EXPECT_EQ(rs.Collect("DELITEM"), data::Value(false));
  EXPECT_EQ(rs.Collect("allow_tick"), data::Value("7"));
  EXPECT_TRUE(rs.Collect("Rev").IsNull());
  // The hidden paint record does not come back at the next load.
  Open(eView,
       [&](frmLabour& f) { EXPECT_EQ(f.FGSelectedLabour.TextMatrix(1, col::kPTHours), ""); });
}

TEST_F(StoreTest, WritingTwiceEqualsWritingOnce) {
  AddRecord(11, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  std::vector<std::string> afterFirst;
  Open(eEdit, [&](frmLabour& f) {
    f.FGSelectedLabour.AddItem("900\tNEW\t1.00\t£\t2.00\t£\t\t£\t£\t<Default>\t£\t7\t\t\t\t");
    f.FGSelectedLabour.TextMatrix(1, col::kRRHours, "2.50");
    forms.SaveLabourChanges();
    afterFirst = Records();
    EXPECT_TRUE(user.Click(f.cmdClose));
  });
  EXPECT_EQ(afterFirst, (std::vector<std::string>{"100 R&R 2.5", "900 R&R 1", "900 RA 2"}));
  EXPECT_EQ(Records(), afterFirst);
}

TEST_F(StoreTest, ARowThatCannotBeWrittenChangesNothing) {
  AddRecord(11, "100", "BONNET R&I", "R&R", 1.5);
  AddRecord(21, "200", "ROOF", "R&R", 1.0);
  Stored();
  bool stillOpen = false;
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    g.TextMatrix(1, col::kRRHours, "3.00"); // would be written first
    g.TextMatrix(2, col::kRate, "cheap");   // cannot go into rr_rate2
    EXPECT_FALSE(user.Click(f.cmdClose) && !f.Loaded());
    stillOpen = f.Loaded();
    // Nothing of the first row was written either.
    EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5", "200 R&R 1"}));
    for (size_t i = 0; i < quote->StoredCount(); ++i)
      EXPECT_EQ(quote->StoredStatus(i), data::RecordStatus::Unchanged);
    ASSERT_EQ(runtime.UnhandledErrors().size(), 1u);
    const auto& e = runtime.UnhandledErrors()[0];
    EXPECT_NE(e.description.find("Labour item 200"), std::string::npos) << e.description;
    EXPECT_NE(e.description.find("R&R Rate"), std::string::npos) << e.description;
    runtime.Reset();
    // The estimator corrects the cell and closes.
    g.TextMatrix(2, col::kRate, "60.00");
    EXPECT_TRUE(user.Click(f.cmdClose));
  });
  EXPECT_TRUE(stillOpen);
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 3", "200 R&R 1"}));
}

TEST_F(StoreTest, ALineWhoseRecordIsGoneIsRefused) {
  AddRecord(11, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    f.FGSelectedLabour.TextMatrix(1, col::kRRHours, "2.00");
    f.FGSelectedLabour.TextMatrix(1, col::kItemId1, "99"); // no such record
    try {
      forms.SaveLabourChanges();
      ADD_FAILURE() << "the save went through";
    } catch (const belvane::Error& e) {
      EXPECT_EQ(e.Number(), belvane::err::kNoCurrentRecord);
      EXPECT_NE(e.Description().find("ItemID1"), std::string::npos) << e.Description();
    }
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5"}));
  EXPECT_EQ(quote->StoredStatus(0), data::RecordStatus::Unchanged);
}

TEST_F(StoreTest, TheRecordSetComesBackSortedByItemNumber) {
  for (auto mode : {eEdit, eView}) {
    quote = data::QuoteStore::NewItemRecordset();
    AddRecord(3, "300", "C", "R&R", 1.0);
    AddRecord(1, "100", "A", "R&R", 1.0);
    AddRecord(2, "200", "B", "R&R", 1.0);
    Stored();
    Open(mode);
    EXPECT_EQ(quote->Sort(), "itemno ASC");
    EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1", "200 R&R 1", "300 R&R 1"}));
  }
}

TEST_F(StoreTest, UpdateChangesReloadsFromTheRecordSet) {
  AddRecord(11, "100", "BONNET R&I", "R&R", 1.5);
  AddRecord(21, "200", "ROOF", "R&R", 1.0);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    f.FGSelectedLabour.TextMatrix(1, col::kRRHours, "8.00");
    f.FGSelectedLabour.CellBackColorAt(2, col::kRRHours, grid::kGrey);
    f.UpdateChanges();
    EXPECT_EQ(f.FGSelectedLabour.Rows(), 3);
    EXPECT_EQ(f.FGSelectedLabour.TextMatrix(1, col::kRRHours), "1.50");
    EXPECT_FALSE(Grey(f.FGSelectedLabour, 2, col::kRRHours));
    EXPECT_EQ(f.FGSelectedLabour.TextMatrix(0, 0), "Item No");
  });
}

} // namespace
} // namespace belvane::test
