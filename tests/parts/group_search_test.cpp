// The diagram group search: the estimator picks a panel on the vehicle
// diagram and the available parts of exactly that group are listed, as the
// text search lists its results; a cancelled diagram changes nothing.

#include "diagram/frm_butterfly.hpp"
#include "parts_fixture.hpp"

namespace belvane::test {
namespace {

using parts::frmParts;
namespace cat = parts::col::cat;

class GroupSearchTest : public PartsFixture {
protected:
  // The estimator's answer on the diagram page, played when it opens.
  void OnTheDiagram(std::function<void(diagram::frmButterfly&)> pick) {
    runtime.QueueModal([pick](forms::Form& f) { pick(static_cast<diagram::frmButterfly&>(f)); });
  }
  void Pick(const std::string& group) {
    OnTheDiagram([this, group](diagram::frmButterfly& d) {
      EXPECT_TRUE(user.PickGroupOnPage(d.wb1, group));
    });
  }
};

TEST_F(GroupSearchTest, APanelListsThePartsOfExactlyItsGroupInAnyCase) {
  std::vector<VehiclePart> parts = StandardParts();
  parts.push_back({"P180", "BUMPER STRIP", "", "O", 1, 20.0, "BS-1", "front bumper"});
  parts.push_back({"P190", "BUMPER BAR BRACKET", "", "O", 1, 5.0, "BB-1", "FRONT BUMPER BAR"});
  BuildCatalogue(parts, StandardItems());
  Open(eEdit, [&](frmParts& f) {
    Pick("FRONT BUMPER");
    EXPECT_TRUE(user.Click(f.cmdSearch(0)));
    ASSERT_TRUE(f.fgSearch.Visible());
    std::vector<std::string> found;
    for (int r = 1; r < f.fgSearch.Rows(); ++r)
      found.push_back(f.fgSearch.TextMatrix(r, cat::kItemNo) + " " +
                      f.fgSearch.TextMatrix(r, cat::kGroup));
    EXPECT_EQ(found, (std::vector<std::string>{"P100 FRONT BUMPER", "P180 front bumper",
                                               "G1 FRONT BUMPER"}));
    EXPECT_EQ(f.Label1.Caption(), "Parts Search Result");
    EXPECT_TRUE(f.cmdSearch(1).Enabled());
    // A result is added like a catalogue part.
    EXPECT_TRUE(user.DoubleClickCell(f.fgSearch, 1, cat::kDescription));
    EXPECT_EQ(f.FGSelectedParts.TextMatrix(1, 0), "P100");
  });
  EXPECT_FALSE(diagram::ButterflyForm().Loaded()); // unloaded with the editor
}

TEST_F(GroupSearchTest, ACancelledDiagramLeavesEarlierResultsAndANewGroupReplacesThem) {
  Open(eEdit, [&](frmParts& f) {
    f.txtSearch.Text("guard");
    user.Click(f.txtSearch);
    user.PressKey(forms::keys::kEnter);
    ASSERT_TRUE(f.fgSearch.Visible());
    const int rows = f.fgSearch.Rows();

    OnTheDiagram([this](diagram::frmButterfly& d) { EXPECT_TRUE(user.CancelPage(d.wb1)); });
    user.Click(f.cmdSearch(0));
    EXPECT_TRUE(f.fgSearch.Visible());
    EXPECT_EQ(f.fgSearch.Rows(), rows);
    OnTheDiagram([this](diagram::frmButterfly& d) { EXPECT_TRUE(user.Close(d)); });
    user.Click(f.cmdSearch(0));
    EXPECT_EQ(f.fgSearch.Rows(), rows);
    EXPECT_TRUE(runtime.Messages().empty());

    // A group no part carries: the results go, and the search says so.
    Pick("ROOF");
    user.Click(f.cmdSearch(0));
    EXPECT_FALSE(f.fgSearch.Visible());
    ASSERT_EQ(runtime.Messages().size(), 1u);
    EXPECT_EQ(runtime.Messages()[0].prompt, "No part record found");
    EXPECT_EQ(runtime.Messages()[0].title, "Part search");
    runtime.Reset();
  });
}

TEST_F(GroupSearchTest, ViewModeCannotSearchAndMakesNoDiagramWindow) {
  diagram::UnloadButterflyForm();
  const bool existed = diagram::ButterflyFormIfCreated() != nullptr;
  Open(eView, [&](frmParts& f) {
    EXPECT_FALSE(f.cmdSearch(0).Enabled());
    EXPECT_FALSE(user.Click(f.cmdSearch(0)));
  });
  if (!existed) {
    EXPECT_EQ(diagram::ButterflyFormIfCreated(), nullptr);
  }
}

} // namespace
} // namespace belvane::test
