// The schedule lists, the text search and adding catalogue items to the
// quote, driven by the simulated user.

#include "forms/keys.hpp"
#include "labour_fixture.hpp"
#include "text/number.hpp"

namespace belvane::test {
namespace {

using labour::frmLabour;
namespace col = labour::col;

class CatalogueTest : public LabourFixture {
protected:
  text::ScopedNumberLocale locale{{".", ","}};

  static bool Grey(const grid::FlexGrid& g, int r, int c) {
    return g.CellStyleAt(r, c).backColor == grid::kGrey;
  }
  // The catalogue row of an item number in the NRMA list.
  static int CatalogueRow(frmLabour& f, const std::string& itemNo) {
    for (int r = 1; r < f.FGLabourItems(0).Rows(); ++r)
      if (f.FGLabourItems(0).TextMatrix(r, 0) == itemNo) return r;
    ADD_FAILURE() << "no catalogue row " << itemNo;
    return 1;
  }
  void Search(frmLabour& f, const std::string& text) {
    EXPECT_TRUE(user.Click(f.txtSearch));
    f.txtSearch.Text(text);
    EXPECT_TRUE(user.PressKey(forms::keys::kEnter));
  }
};

TEST_F(CatalogueTest, TheListShowsPlainAndDecipheredHoursByMask) {
  Open(eEdit, [&](frmLabour& f) {
    const auto& g = f.FGLabourItems(0);
    ASSERT_EQ(g.Rows(), 6);
    EXPECT_EQ(RowText(g, 1), "100|BONNET R&I|1.50||0.80|7");
    EXPECT_EQ(RowText(g, 2), "110|FRONT BUMPER BAR|2.25||1,234.50|5"); // enciphered
    EXPECT_EQ(RowText(g, 3), "120|L/H FRONT GUARD|||2.00|1");
    EXPECT_EQ(RowText(g, 5), "140|Roof panel|3.00|||6");
    EXPECT_FALSE(Grey(g, 2, 2));
    EXPECT_TRUE(Grey(g, 2, 3)); // mask 5: Repair grey
    EXPECT_FALSE(Grey(g, 2, 4));
    EXPECT_TRUE(Grey(g, 3, 2) && Grey(g, 3, 3) && !Grey(g, 3, 4));
    EXPECT_TRUE(Grey(g, 5, 4) && !Grey(g, 5, 3));
    EXPECT_EQ(g.TextMatrix(0, 5), "Allow");
    // A click puts the cell's text in the grid's tool tip.
    EXPECT_TRUE(user.ClickCell(f.FGLabourItems(0), 2, 1));
    EXPECT_EQ(f.FGLabourItems(0).ToolTipText(), "FRONT BUMPER BAR");
  });
}

TEST_F(CatalogueTest, TenItemsNarrowTheDescriptionNineDoNot) {
  // The placeholder row still counts when the list is measured.
  for (int n : {9, 10}) {
    std::vector<CatalogueItem> items;
    for (int i = 0; i < n; ++i)
      items.push_back({0, "N1", std::to_string(500 + i), "  ITEM  ", "1", "1", 7});
    BuildCatalogue(items);
    int width = 0;
    std::string desc;
    Open(eEdit, [&](frmLabour& f) {
      width = f.FGLabourItems(0).ColWidth(1);
      desc = f.FGLabourItems(0).TextMatrix(1, 1);
    });
    EXPECT_EQ(width, n == 10 ? 5750 - 240 : 5750) << n << " items";
    EXPECT_EQ(desc, "ITEM");
  }
}

TEST_F(CatalogueTest, TheRoadOfOneLabourEdit) {
  AddRecord(7, "050", "EXISTING", "R&R", 1.0);
  quote->MoveFirst();
  quote->Collect("qtnno", data::Value("Q1001"));
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    EXPECT_TRUE(user.DoubleClickCell(f.FGLabourItems(0), CatalogueRow(f, "110"), 2));
    EXPECT_TRUE(user.Type("2.5"));
    EXPECT_TRUE(user.PressKey(forms::keys::kEnter));
    EXPECT_TRUE(user.Click(f.cmdClose));
  });
  EXPECT_EQ(schedType, "NRMA");
  EXPECT_EQ(Records(), (std::vector<std::string>{"050 R&R 1", "110 R&R 2.5"}));
  data::Recordset& rs = *quote;
  rs.MoveLast();
  EXPECT_EQ(rs.Collect("qtnno"), data::Value("Q1001"));
  EXPECT_EQ(rs.Collect("subquote"), data::Value("0"));
  EXPECT_EQ(rs.Collect("script"), data::Value("FRONT BUMPER BAR"));
  EXPECT_EQ(rs.Collect("Category"), data::Value("R&R"));
  EXPECT_EQ(rs.Collect("rr_rate2"), data::Value(rrRate));
  EXPECT_EQ(rs.Collect("tag"), data::Value("1"));
  EXPECT_EQ(rs.Collect("DELITEM"), data::Value(false));
  EXPECT_EQ(rs.Collect("allow_tick"), data::Value("5"));
  EXPECT_TRUE(rs.Collect("ITEMID").IsNull());
}

TEST_F(CatalogueTest, EachColumnAddsWhatItShows) {
  Open(eEdit, [&](frmLabour& f) {
    auto& sel = f.FGSelectedLabour;
    auto& cat = f.FGLabourItems(0);
    // The whole item: every hours cell the item has; the first add replaces
    // the placeholder; the editor opens on Repair of a described item.
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "100"), 0));
    ASSERT_EQ(sel.Rows(), 2);
    EXPECT_EQ(RowText(sel, 1), "100|BONNET R&I|1.50|£||£|0.80|£|£|<Default>|£|7||||");
    EXPECT_TRUE(f.T1.Visible());
    EXPECT_EQ(sel.Col(), col::kRAHours);
    EXPECT_TRUE(sel.CellStyleAt(1, col::kRate).fontItalic);
    EXPECT_EQ(sel.CellStyleAt(1, col::kRRReport).fontName, "Wingdings 2");

    // No description: the editor opens on it.
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "130"), 1));
    EXPECT_EQ(sel.Row(), 2);
    EXPECT_EQ(sel.Col(), col::kDescription);

    // Paint only, then the R&R of the same item fills the same row.
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "120"), 4));
    EXPECT_EQ(RowText(sel, 3), "120|L/H FRONT GUARD||£||£|2.00|£|£|<NA>|£|1||||");
    EXPECT_EQ(sel.Col(), col::kPTHours);
    EXPECT_EQ(f.T1.SelLength(), 4);
    for (int c : {2, 3, 4, 5})
      EXPECT_TRUE(Grey(sel, 3, c)) << c;
    EXPECT_FALSE(Grey(sel, 3, 6));

    // A grey catalogue cell adds nothing.
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "120"), 2));
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "110"), 3));
    EXPECT_EQ(sel.Rows(), 4);

    // Paint of 140 is grey; its R&R goes in, with the default rate.
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "140"), 4));
    EXPECT_EQ(sel.Rows(), 4);
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "140"), 2));
    EXPECT_EQ(RowText(sel, 4), "140|Roof panel|3.00|£||£||£|£|<Default>|£|6||||");

    // The Allow column adds the item with no hours and goes to its number.
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "110"), 5));
    EXPECT_EQ(RowText(sel, 5), "110|FRONT BUMPER BAR||£||£||£|£|<NA>|£|5||||");
    EXPECT_EQ(sel.Col(), col::kItemNo);
    // Its paint, then its R&R: no second row, <NA> becomes <Default>.
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "110"), 4));
    EXPECT_TRUE(user.DoubleClickCell(cat, CatalogueRow(f, "110"), 2));
    EXPECT_EQ(sel.Rows(), 6);
    EXPECT_EQ(RowText(sel, 5), "110|FRONT BUMPER BAR|2.25|£||£|1,234.50|£|£|<Default>|£|5||||");
    EXPECT_EQ(sel.Row(), 5);
    EXPECT_EQ(sel.Col(), col::kRRHours);
  });
}

TEST_F(CatalogueTest, AnItemAlreadyOnTheQuoteIsNotAddedTwice) {
  AddRecord(1, "100", "bonnet r&i", "PAINT", 0.5);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    auto& sel = f.FGSelectedLabour;
    // From the catalogue the description matches without regard to case.
    EXPECT_TRUE(user.DoubleClickCell(f.FGLabourItems(0), CatalogueRow(f, "100"), 4));
    EXPECT_EQ(sel.Rows(), 2);
    EXPECT_EQ(sel.TextMatrix(1, col::kPTHours), "0.50"); // filled cells stay
    EXPECT_TRUE(user.DoubleClickCell(f.FGLabourItems(0), CatalogueRow(f, "100"), 2));
    EXPECT_EQ(sel.Rows(), 2);
    EXPECT_EQ(sel.TextMatrix(1, col::kRRHours), "1.50");
    EXPECT_EQ(sel.TextMatrix(1, col::kRate), "<Default>");
    // From search results it must match exactly: "BONNET R&I" is a new line.
    Search(f, "bonnet");
    ASSERT_TRUE(f.fgSearch.Visible());
    EXPECT_TRUE(user.DoubleClickCell(f.fgSearch, 1, 2));
    EXPECT_EQ(sel.Rows(), 3);
    EXPECT_EQ(sel.TextMatrix(2, col::kDescription), "BONNET R&I");
  });
}

TEST_F(CatalogueTest, SearchFindsNumbersAndDescriptionsAndBrowseGoesBack) {
  Open(eEdit, [&](frmLabour& f) {
    EXPECT_TRUE(user.Click(f.txtSearch));
    EXPECT_EQ(f.txtSearch.BackColor(), grid::kYellow);
    Search(f, "  bonnet ");
    const auto& s = f.fgSearch;
    ASSERT_EQ(s.Rows(), 2);
    EXPECT_EQ(RowText(s, 1), "100|BONNET R&I|1.50||0.80|7|1");
    EXPECT_TRUE(s.Visible());
    EXPECT_TRUE(f.cmdBrowse.Enabled());
    EXPECT_EQ(f.Label1.Caption(), "Labour Search Result");

    Search(f, "11"); // in item number 110 only
    ASSERT_EQ(s.Rows(), 2);
    EXPECT_EQ(RowText(s, 1), "110|FRONT BUMPER BAR|2.25||1,234.50|5|2");
    EXPECT_TRUE(Grey(s, 1, 3));
    EXPECT_FALSE(Grey(s, 1, 2));

    Search(f, "R"); // many rows; the grey of the last search is gone
    EXPECT_EQ(s.Rows(), 5);
    EXPECT_EQ(s.TextMatrix(1, 0), "100");
    EXPECT_FALSE(Grey(s, 1, 3));

    EXPECT_TRUE(user.Click(f.cmdBrowse));
    EXPECT_FALSE(s.Visible());
    EXPECT_FALSE(f.cmdBrowse.Enabled());
    EXPECT_EQ(f.Label1.Caption(), "Available Labour Item");
    EXPECT_EQ(f.txtSearch.BackColor(), grid::kCyan);
  });
  EXPECT_TRUE(runtime.Messages().empty());
}

TEST_F(CatalogueTest, BlankAndFruitlessSearches) {
  Open(eEdit, [&](frmLabour& f) {
    Search(f, "   ");
    EXPECT_FALSE(f.fgSearch.Visible());
    EXPECT_TRUE(runtime.Messages().empty());
    Search(f, "zzz");
    EXPECT_FALSE(f.fgSearch.Visible());
    EXPECT_FALSE(f.cmdBrowse.Enabled());
    ASSERT_EQ(runtime.Messages().size(), 1u);
    EXPECT_EQ(runtime.Messages()[0].prompt, "No labour record found");
    EXPECT_EQ(runtime.Messages()[0].title, "Labour item search");
    EXPECT_EQ(runtime.Messages()[0].style, 16);
    // The search covers the list of the schedule chosen.
    EXPECT_TRUE(user.Click(f.optSchedule(1)));
    Search(f, "windscreen");
    EXPECT_EQ(f.fgSearch.TextMatrix(1, 0), "200");
  });
}

} // namespace
} // namespace belvane::test

namespace belvane::test {
namespace {

TEST_F(CatalogueTest, HoursThatDoNotDecipherLeaveTheListPainted) {
  BuildCatalogue({
      {0, "N1", "100", "BONNET R&I", "1.5", "0.8", 7},
      {0, "N1", "110", "FRONT BUMPER BAR", std::string(16, 'Z'), "1", 7},
  });
  Open(eEdit, [&](frmLabour& f) {
    EXPECT_TRUE(f.FGLabourItems(0).Redraw());
    EXPECT_EQ(f.FGLabourItems(0).TextMatrix(2, col::kDescription), "BONNET R&I"); // kept
  });
  ASSERT_EQ(runtime.Messages().size(), 1u); // the load reports the failure
  EXPECT_EQ(runtime.Messages()[0].title, "Labour form");
}

} // namespace
} // namespace belvane::test
