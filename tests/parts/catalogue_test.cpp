// The available parts (deciphered names, numbers and groups, the side in
// front of the description, general parts items), the load's own error
// reports, the text search and Browse, and adding a part by double click.

#include "parts_fixture.hpp"

namespace belvane::test {
namespace {

using parts::frmParts;
namespace cat = parts::col::cat;
namespace sel = parts::col::sel;
namespace msgbox = forms::msgbox;

using CatalogueTest = PartsFixture;

std::vector<std::string> Rows(const grid::FlexGrid& g) {
  std::vector<std::string> rows;
  for (int r = 1; r < g.Rows(); ++r) {
    std::string row;
    for (int c = 0; c < g.Cols(); ++c)
      row += (c ? "|" : "") + g.TextMatrix(r, c);
    rows.push_back(row);
  }
  return rows;
}

TEST_F(CatalogueTest, TheAvailablePartsAreTheVehiclesThenTheGeneralItems) {
  std::vector<std::string> rows;
  Open(eEdit, [&](frmParts& f) { rows = Rows(f.FGParts); });
  EXPECT_EQ(rows, (std::vector<std::string>{
                      "P100|FRONT BUMPER BAR|O|1|250.00|FB-1001|FRONT BUMPER",
                      "P110|L/H FRONT GUARD|L|1|1,234.50|FG-22L|FRONT GUARD",
                      "P111|R/H FRONT GUARD|R|1|0.00|FG-22R|FRONT GUARD",
                      "P120|REAR BUMPER COVER|o|2|99.90||REAR BUMPER",
                      "P130|/H bonnet hinge||2|12.00||BONNET",
                      "P140|HEADLAMP||1|300.00|HL-9|HEADLAMP",
                      "G1|Bumper bolt kit|O|1|0.00||FRONT BUMPER",
                      "G2|Paint sundries||1|0.00||",
                  }));
  EXPECT_TRUE(runtime.Messages().empty());
}

TEST_F(CatalogueTest, AValueThatDoesNotDecipherStopsTheVehiclePartsWithAMessage) {
  BuildCatalogue({{"P100", "FRONT BUMPER BAR", "", "O", 1, 250.0, "FB-1001", "FRONT BUMPER"}},
                 StandardItems(), [](data::tools::CatalogueWriter& w) {
                   using data::Value;
                   w.Insert("VEHICLE_PART",
                            {Value("FORD"), Value("FA1"), Value(), Value(), Value("P999"),
                             Value("NOT ENCIPHERED!!"), Value(""), Value("O"), Value(int32_t{1}),
                             Value(1.0), Value(), Value()});
                   w.Insert("VEHICLE_PART", {Value("FORD"), Value("FA1"), Value(), Value(),
                                             Value("P998"), Value(), Value("AFTER"), Value("O"),
                                             Value(int32_t{1}), Value(1.0), Value(), Value()});
                 });
  std::vector<std::string> items;
  bool redraw = false;
  Open(eEdit, [&](frmParts& f) {
    for (int r = 1; r < f.FGParts.Rows(); ++r)
      items.push_back(f.FGParts.TextMatrix(r, cat::kItemNo));
    redraw = f.FGParts.Redraw();
  });
  EXPECT_EQ(items, (std::vector<std::string>{"P100", "G1", "G2"}));
  EXPECT_TRUE(redraw);
  ASSERT_EQ(runtime.Messages().size(), 1u);
  EXPECT_EQ(runtime.Messages()[0].prompt.substr(0, 4), "13: ");
  EXPECT_EQ(runtime.Messages()[0].style, msgbox::kCritical);
  EXPECT_EQ(runtime.Messages()[0].title, "");
}

TEST_F(CatalogueTest, ACatalogueWithoutVehiclePartsOpensSilentlyWithTheGeneralItems) {
  const std::string path = dir.File("no-parts.db");
  {
    data::tools::SqliteCatalogueWriter writer(path, {"VEHICLE_PART"});
    WriteCatalogue(writer, {}, StandardItems());
    writer.Commit();
  }
  data::SetCatalogueLocation(path);
  int rows = 0;
  Open(eEdit, [&](frmParts& f) { rows = f.FGParts.Rows(); });
  EXPECT_EQ(rows, 3);
  EXPECT_TRUE(runtime.Messages().empty());

  // No parts at all: the available parts keep their blank row.
  BuildCatalogue({}, {});
  Open(eEdit, [&](frmParts& f) {
    EXPECT_EQ(f.FGParts.Rows(), 2);
    EXPECT_EQ(f.FGParts.TextMatrix(1, cat::kItemNo), "");
  });
}

TEST_F(CatalogueTest, TheTextSearchFindsItemNumbersAndDescriptionsInAnyCase) {
  Open(eEdit, [&](frmParts& f) {
    user.Click(f.txtSearch);
    EXPECT_EQ(f.txtSearch.BackColor(), grid::kYellow);
    user.Type("  bumper \n");
    EXPECT_TRUE(f.fgSearch.Visible());
    EXPECT_EQ(Rows(f.fgSearch), (std::vector<std::string>{
                                    "P100|FRONT BUMPER BAR|O|1|250.00|FB-1001|1",
                                    "P120|REAR BUMPER COVER|o|2|99.90||4",
                                    "G1|Bumper bolt kit|O|1|0.00||7",
                                }));
    EXPECT_EQ(f.Label1.Caption(), "Parts Search Result");
    EXPECT_TRUE(f.cmdSearch(1).IsEnabled());

    // Item numbers too; earlier results go.
    f.txtSearch.Text("");
    user.Type("p11\n");
    EXPECT_EQ(Rows(f.fgSearch),
              (std::vector<std::string>{"P110|L/H FRONT GUARD|L|1|1,234.50|FG-22L|2",
                                        "P111|R/H FRONT GUARD|R|1|0.00|FG-22R|3"}));

    // Nothing found: the message, the results hidden and empty, the rest
    // as it was.
    f.txtSearch.Text("");
    user.Type("zzz\n");
    ASSERT_EQ(runtime.Messages().size(), 1u);
    EXPECT_EQ(runtime.Messages()[0].prompt, "No part record found");
    EXPECT_EQ(runtime.Messages()[0].title, "Part search");
    EXPECT_EQ(runtime.Messages()[0].style, msgbox::kCritical);
    EXPECT_FALSE(f.fgSearch.Visible());
    EXPECT_EQ(f.fgSearch.Rows(), 2);
    EXPECT_EQ(f.Label1.Caption(), "Parts Search Result");
    EXPECT_TRUE(f.cmdSearch(1).IsEnabled());

    // A blank search does nothing at all.
    f.txtSearch.Text("   ");
    user.Type("\n");
    EXPECT_EQ(runtime.Messages().size(), 1u);

    user.Type("bumper\n");
    user.Click(f.cmdSearch(1)); // Browse
    EXPECT_FALSE(f.fgSearch.Visible());
    EXPECT_EQ(f.Label1.Caption(), "Available Parts");
    EXPECT_FALSE(f.cmdSearch(1).IsEnabled());
    EXPECT_EQ(f.txtSearch.BackColor(), grid::kCyan);
    EXPECT_EQ(f.FGParts.Rows(), 9); // the available parts untouched
  });
}

TEST_F(CatalogueTest, ADoubleClickAddsThePartPricedWithTheNewPartMarkup) {
  newMarkup = 25;
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    // The first part fills the blank starting row.
    user.DoubleClickCell(f.FGParts, 1, cat::kDescription);
    ASSERT_EQ(g.Rows(), 2);
    EXPECT_EQ(RowText(g, 1), "P100|FRONT BUMPER BAR|O||1|250.00|312.500|FB-1001|£||");
    EXPECT_EQ(g.CellStyleAt(1, sel::kReport).fontName, "Wingdings 2");
    // The editor is open on the unit price, all of it selected.
    EXPECT_TRUE(f.T1.Visible());
    EXPECT_EQ(g.Col(), sel::kUnitPrice);
    EXPECT_EQ(f.T1.SelLength(), f.T1.Length());
    user.Type("100\n");
    EXPECT_EQ(g.TextMatrix(1, sel::kUnitPrice), "100.00");
    EXPECT_EQ(g.TextMatrix(1, sel::kMarkup), "125.000");

    // The same part again (its description in another case): no second row.
    g.TextMatrix(1, sel::kDescription, "front bumper bar");
    user.ClickCell(g, 1, sel::kItemNo);
    user.DoubleClickCell(f.FGParts, 1, cat::kItemNo);
    EXPECT_EQ(g.Rows(), 2);
    EXPECT_EQ(g.Row(), 1);
    // Another side is another part; from the search results as well.
    user.Click(f.txtSearch);
    user.Type("guard\n");
    user.DoubleClickCell(f.fgSearch, 2, cat::kItemNo);
    ASSERT_EQ(g.Rows(), 3);
    EXPECT_EQ(RowText(g, 2), "P111|R/H FRONT GUARD|R||1|0.00|0.000|FG-22R|£||");
    EXPECT_EQ(g.Row(), 2);
    user.DoubleClickCell(f.fgSearch, 2, cat::kItemNo);
    EXPECT_EQ(g.Rows(), 3);
  });
}

TEST_F(CatalogueTest, APartKnownOnlyByItsSideOpensTheEditorOnItsDescription) {
  BuildCatalogue({{"P200", std::nullopt, "", "L", 1, 20.0, "S-1", "MIRROR"},
                  {"P201", std::nullopt, "", "O", 1, 20.0, "S-2", "MIRROR"}},
                 {});
  Open(eEdit, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    user.DoubleClickCell(f.FGParts, 1, cat::kItemNo); // "L/H "
    EXPECT_EQ(g.Col(), sel::kDescription);
    EXPECT_EQ(f.T1.Text(), "L/H ");
    user.Type("MIRROR\n");
    user.DoubleClickCell(f.FGParts, 2, cat::kItemNo); // ""
    EXPECT_EQ(g.Col(), sel::kDescription);
    EXPECT_EQ(g.Row(), 2);
  });
}

TEST_F(CatalogueTest, APartTypedByHandWithoutAnItemNumberIsNotOverwritten) {
  AddPart({1, "", "HAND MADE BRACKET"});
  Stored();
  Open(eEdit, [&](frmParts& f) {
    user.DoubleClickCell(f.FGParts, 1, cat::kItemNo);
    EXPECT_EQ(f.FGSelectedParts.Rows(), 3);
    EXPECT_EQ(f.FGSelectedParts.TextMatrix(1, sel::kDescription), "HAND MADE BRACKET");
    EXPECT_EQ(f.FGSelectedParts.TextMatrix(1, sel::kItemId), "1");
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records().size(), 2u);
}

} // namespace
} // namespace belvane::test
