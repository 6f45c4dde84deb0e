// The parts store: loading with repricing of prices made under the old
// markup, which records are shown, the three passes of the write-back, and
// the check that refuses a write-back before anything changes.

#include "error_number.hpp"
#include "parts_fixture.hpp"

namespace belvane::test {
namespace {

using parts::frmParts;
namespace sel = parts::col::sel;

class StoreTest : public PartsFixture {
protected:
  // The "Markup" texts of the selected grid, in row order.
  std::vector<std::string> LoadedPrices() {
    std::vector<std::string> prices;
    Open(eView, [&](frmParts& f) {
      for (int r = 1; r < f.FGSelectedParts.Rows(); ++r)
        prices.push_back(f.FGSelectedParts.TextMatrix(r, sel::kMarkup));
    });
    return prices;
  }
  static StoredPart Priced(int id, const std::string& mark, std::optional<double> unitcost,
                           std::optional<double> rrhour) {
    StoredPart p{id, "P" + std::to_string(id), "PART " + std::to_string(id)};
    p.mark = mark;
    p.unitcost = unitcost;
    p.rrhour = rrhour;
    return p;
  }
};

TEST_F(StoreTest, PricesMadeWithTheOldMarkupAreRepricedAndNoOthers) {
  // Old markups: new 25, used 18, recore 12, after-market 8; current ones
  // 30, 20, 15, 10.
  AddPart(Priced(1, "", 100, 125));      // old new markup: 130
  AddPart(Priced(2, "", 100, 120));      // another markup: kept
  AddPart(Priced(3, " ", 100, 125.004)); // a space is new; 25.004% reads as 25.00
  AddPart(Priced(4, "x", 100, 118));     // exchange takes the used markups
  AddPart(Priced(5, "U", 100, 118));
  AddPart(Priced(6, "C", 100, 112));
  AddPart(Priced(7, "Z", 100, 112)); // no type: the recore pair carried over
  AddPart(Priced(8, "A", 100, 108));
  AddPart(Priced(9, "A", 0, 55));       // no unit cost
  AddPart(Priced(10, "U", 1000, 1250)); // 25% is not the used rate
  Stored();
  EXPECT_EQ(LoadedPrices(),
            (std::vector<std::string>{"130.000", "120.000", "130.000", "120.000", "120.000",
                                      "115.000", "115.000", "110.000", "0.000", "1,250.000"}));
}

TEST_F(StoreTest, ATypeLetterOfNoTypeBeforeAnyOtherRecordUsesNoMarkup) {
  AddPart(Priced(1, "Z", 100, 100)); // 0% is the carried-over "old" rate 0: 100 * (1 + 0)
  AddPart(Priced(2, "Q", 100, 125)); // 25% is not 0: kept
  Stored();
  EXPECT_EQ(LoadedPrices(), (std::vector<std::string>{"100.000", "125.000"}));
}

TEST_F(StoreTest, NullPricesShowThePriceOfTheirTypeInsteadOfFailing) {
  AddPart(Priced(1, "U", 50, std::nullopt));           // 50 * 1.20
  AddPart(Priced(2, "", std::nullopt, 10));            // no unit cost
  AddPart(Priced(3, "C", std::nullopt, std::nullopt)); // neither
  Stored();
  std::vector<std::string> rows;
  Open(eEdit, [&](frmParts& f) {
    for (int r = 1; r < f.FGSelectedParts.Rows(); ++r)
      rows.push_back(f.FGSelectedParts.TextMatrix(r, sel::kUnitPrice) + " " +
                     f.FGSelectedParts.TextMatrix(r, sel::kMarkup));
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(rows, (std::vector<std::string>{"50.00 60.000", " 0.000", " 0.000"}));
  EXPECT_TRUE(runtime.Messages().empty());
  // Written back as shown: the empty unit cost as 0.
  EXPECT_EQ(Records()[1], "P2|PART 2|O||1|0|0||0|<Null>|1");
}

TEST_F(StoreTest, OnlyLiveRecordsAreShownAndHiddenOnesSurviveSaves) {
  StoredPart shown{1, "P1", "SHOWN"};
  StoredPart deleted{2, "P2", "DELETED"};
  deleted.deleted = true;
  StoredPart hidden{3, "P3", "HIDDEN"};
  hidden.tag = "D";
  StoredPart noTag{4, "P4", "NO TAG"};
  noTag.tag = std::nullopt;
  StoredPart noDelItem{5, "P5", "NO DELITEM"};
  noDelItem.deleted = std::nullopt;
  for (const auto& p : {shown, deleted, hidden, noTag, noDelItem})
    AddPart(p);
  // A deleted record of an earlier session without an id goes with the
  // first save; one hidden by its tag stays.
  data::Recordset& rs = *quote;
  rs.AddNew();
  rs.Collect("DELITEM", data::Value(true));
  rs.Collect("tag", data::Value("1"));
  rs.Collect("itemno", data::Value("P6"));
  rs.AddNew();
  rs.Collect("DELITEM", data::Value(false));
  rs.Collect("tag", data::Value("D"));
  rs.Collect("itemno", data::Value("P7"));
  Stored();
  int rows = 0;
  Open(eEdit, [&](frmParts& f) {
    rows = f.FGSelectedParts.Rows() - 1;
    EXPECT_EQ(f.FGSelectedParts.TextMatrix(1, sel::kDescription), "SHOWN");
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(rows, 1);
  std::vector<std::string> items;
  for (rs.MoveFirst(); !rs.Eof(); rs.MoveNext())
    items.push_back(rs.Collect("itemno").ToText());
  EXPECT_EQ(items, (std::vector<std::string>{"P1", "P2", "P3", "P4", "P5", "P7"}));
}

TEST_F(StoreTest, TheLoadStartsAtTheRecordSetsCurrentRecord) {
  for (int i = 1; i <= 4; ++i)
    AddPart({i, "P" + std::to_string(i), "PART " + std::to_string(i)});
  Stored();
  quote->MoveNext();
  quote->MoveNext();
  std::vector<std::string> items;
  Open(eView, [&](frmParts& f) {
    for (int r = 1; r < f.FGSelectedParts.Rows(); ++r)
      items.push_back(f.FGSelectedParts.TextMatrix(r, sel::kItemNo));
  });
  EXPECT_EQ(items, (std::vector<std::string>{"P3", "P4"}));
}

TEST_F(StoreTest, AnEmptyQuoteKeepsItsPlaceholderAndWritesNothing) {
  Open(eEdit, [&](frmParts& f) {
    EXPECT_EQ(f.FGSelectedParts.Rows(), 2);
    EXPECT_EQ(RowText(f.FGSelectedParts, 1), "||||||||||");
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(quote->RecordCount(), 0);
  EXPECT_EQ(quote->StoredCount(), 0u);
}

TEST_F(StoreTest, TheWriteBackUpdatesAppendsAndDeletes) {
  AddPart({1, "P1", "KEPT L/H", "L", "U", 2, 100, 120, "PN-1", 1, "B"});
  AddPart({2, "P2", "REMOVED"});
  AddPart({3, "P3", "BLANKED"});
  Stored();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    // Row 1: cells emptied; row 3: description blanked; row 2: deleted.
    g.TextMatrix(1, sel::kQty, "");
    g.TextMatrix(1, sel::kUnitPrice, "");
    g.TextMatrix(1, sel::kMarkup, " ");
    g.TextMatrix(1, sel::kRev, "");
    g.TextMatrix(1, sel::kPartNo, "  PN-1A ");
    g.TextMatrix(1, sel::kReport, "?"); // neither tick: report_on left alone
    g.TextMatrix(3, sel::kDescription, "  ");
    user.ClickCell(g, 2, sel::kItemNo);
    user.Click(f.cmdDelete);
    // A new part typed by hand.
    g.AddItem("N1\tHAND MADE\tO\tA\t3\t1,234.50\t1,358.000\t\t£");
    EXPECT_EQ(forms.SavePartsChanges(), 0);
    EXPECT_EQ(forms.SavePartsChanges(), 0); // twice: the same as once
    const auto once = Records();
    user.Click(f.cmdClose);
    EXPECT_EQ(Records(), once);
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{
                           "N1|HAND MADE|O|A|3|1234.5|1358||0|<Null>|1",
                           "P1|KEPT L/H|L|U|0|0|0|PN-1A|1|<Null>|1",
                       }));
  // The new record carries the session's quote, category and flags.
  quote->Find("itemno = 'N1'", 0, data::adSearchForward, data::adBookmarkFirst);
  ASSERT_FALSE(quote->Eof());
  EXPECT_TRUE(quote->Collect("ITEMID").IsNull());
  EXPECT_EQ(quote->Collect("qtnno").ToText(), qtnNo);
  EXPECT_EQ(quote->Collect("subquote").ToText(), subQuoteNo);
  EXPECT_EQ(quote->Collect("Category").ToText(), "PRT");
  EXPECT_FALSE(quote->Collect("DELITEM").ToBool());
  EXPECT_EQ(quote->Collect("tag").ToText(), "1");
  EXPECT_EQ(quote->StoredStatus(1), data::RecordStatus::Deleted);
  EXPECT_EQ(quote->StoredStatus(2), data::RecordStatus::Deleted);
}

TEST_F(StoreTest, ARefusedWriteBackChangesNothingAndSaysWhichCell) {
  AddPart({1, "P1", "FIRST"});
  AddPart({2, "P2", "SECOND"});
  Stored();
  const auto before = Records();
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    user.ClickCell(g, 1, sel::kItemNo);
    user.Click(f.cmdDelete); // a removal that must not happen either
    g.AddItem("N1\tNEW\tO\t\t1\t10.00\t13.000\t\t£");
    g.TextMatrix(1, sel::kMarkup, "abc");
    user.Click(f.cmdClose);
    EXPECT_TRUE(f.Visible());
    ASSERT_EQ(runtime.UnhandledErrors().size(), 1u);
    const std::string said = runtime.UnhandledErrors()[0].description;
    EXPECT_NE(said.find("Part P2 \"SECOND\" in row 1"), std::string::npos) << said;
    EXPECT_NE(said.find("\"abc\" in \"Markup\""), std::string::npos) << said;
    EXPECT_NE(said.find("Nothing was saved"), std::string::npos) << said;
    EXPECT_EQ(Records(), before);
    EXPECT_EQ(quote->StoredStatus(0), data::RecordStatus::Unchanged);

    // A part whose stored record has gone from the quote.
    g.TextMatrix(1, sel::kMarkup, "1.000");
    g.TextMatrix(2, sel::kItemId, "77");
    runtime.Reset();
    EXPECT_EQ(ErrorNumber([&] { forms.SavePartsChanges(); }), err::kNoCurrentRecord);
    EXPECT_EQ(Records(), before);
    g.TextMatrix(2, sel::kItemId, "");
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{"N1|NEW|O||1|10|13||0|<Null>|1",
                                                 "P2|SECOND|O||1|100|1||0|<Null>|1"}));
}

} // namespace
} // namespace belvane::test
