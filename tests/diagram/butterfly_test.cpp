// The diagram window headless: the page chosen by the flag and the setting,
// the answer handed back through the page's trap, pages without a trap,
// missing pages, and the window kept loaded between searches.

#include "../data/temp_dir.hpp"
#include "cipher/field.hpp"
#include "data/recordset.hpp"
#include "data/sqlite/sqlite_catalogue.hpp"
#include "data/tools/sample_catalogue.hpp"
#include "diagram/frm_butterfly.hpp"
#include "diagram/registry.hpp"
#include "forms/page_host.hpp"
#include "forms/runtime.hpp"
#include "forms/simulated_user.hpp"

#include <gtest/gtest.h>

#include <fstream>
#include <set>

using namespace belvane;
using diagram::frmButterfly;

namespace {

constexpr const char* kKey = "SOFTWARE\\tessik\\frmsplash";

class ButterflyTest : public ::testing::Test {
protected:
  void SetUp() override {
    diagram::SetHiveFilePath(diagram::Hive::LocalMachine, dir.File("machine.json"));
    diagram::SetHiveFilePath(diagram::Hive::CurrentUser, dir.File("user.json"));
    runtime.Reset();
  }
  void TearDown() override {
    diagram::SetHiveFilePath(diagram::Hive::LocalMachine, "");
    diagram::SetHiveFilePath(diagram::Hive::CurrentUser, "");
    runtime.Reset();
  }

  void GraphicsPath(const std::string& folder) {
    diagram::CreateRegKey(diagram::Hive::LocalMachine, kKey);
    ASSERT_TRUE(diagram::WriteRegValue(diagram::Hive::LocalMachine, kKey, "GraphicsPath", folder));
  }
  // A graphics folder of the test's own with both pages.
  std::string PageFolder(const std::string& page) {
    const std::string folder = dir.File("art") + "/";
    std::filesystem::create_directories(folder);
    std::ofstream(folder + "butterfly.html") << page;
    std::ofstream(folder + "nobutterfly.html") << page;
    return folder;
  }
  // Shows the window with `play` as the user; returns the answer.
  std::pair<bool, std::string> Show(frmButterfly& form, bool drawing, std::function<void()> play) {
    runtime.QueueModal([play = std::move(play)](forms::Form&) { play(); });
    form.ShowForm(drawing);
    return {form.mbSearchGroup, form.msSearchStr};
  }

  test::TempDir dir{"butterfly"};
  forms::HeadlessRuntime& runtime = forms::ThreadHeadlessRuntime();
  forms::SimulatedUser user;
};

TEST_F(ButterflyTest, APanelPickedOnTheDrawingComesBackAsItsGroup) {
  frmButterfly form;
  const auto answer = Show(form, true, [&] {
    // The default folder, stored as the setting on the way.
    EXPECT_EQ(form.wb1.LocationURL(), diagram::DefaultGraphicsFolder() + "butterfly.html");
    EXPECT_EQ(form.Caption(), "Search Parts");
    EXPECT_TRUE(user.PickGroupOnPage(form.wb1, "L/H FRONT DOOR"));
    EXPECT_FALSE(form.Visible());
  });
  EXPECT_EQ(answer, std::make_pair(true, std::string("L/H FRONT DOOR")));
  EXPECT_EQ(diagram::ReadRegValue(diagram::Hive::LocalMachine, kKey, "GraphicsPath"),
            diagram::DefaultGraphicsFolder());
  EXPECT_FALSE(runtime.Sessions().back().closedByCloseBox);
}

TEST_F(ButterflyTest, TheTextComesBackAsThePageGivesItAndAnyCaseOfCancelCancels) {
  GraphicsPath(PageFolder("<input type=hidden id=event_trap value=''><p id=x data-group='Front "
                          "Bumper'>a</p><button id=c data-cancel>Cancel</button>"));
  frmButterfly form;
  EXPECT_EQ(Show(form, true, [&] { user.ClickOnPage(form.wb1, "x"); }),
            std::make_pair(true, std::string("Front Bumper")));
  for (const char* cancel : {"cancel", "Cancel", "CANCEL"}) {
    const auto answer = Show(form, true, [&] {
      form.wb1.Document()->Find("event_trap")->Value(cancel);
      EXPECT_TRUE(user.ClickOnPage(form.wb1, "event_trap"));
    });
    EXPECT_EQ(answer, std::make_pair(false, std::string())) << cancel;
  }
  EXPECT_EQ(Show(form, true, [&] { EXPECT_TRUE(user.CancelPage(form.wb1)); }),
            std::make_pair(false, std::string()));
  // "Cancelled" is a group like any other: only the whole word cancels.
  EXPECT_EQ(Show(form, true,
                 [&] {
                   form.wb1.Document()->Find("event_trap")->Value("Cancelled");
                   user.ClickOnPage(form.wb1, "event_trap");
                 }),
            std::make_pair(true, std::string("Cancelled")));
}

TEST_F(ButterflyTest, AMakeWithoutADrawingGetsTheGroupButtonsPage) {
  frmButterfly form;
  const auto answer = Show(form, false, [&] {
    EXPECT_EQ(form.wb1.LocationURL(), diagram::DefaultGraphicsFolder() + "nobutterfly.html");
    EXPECT_TRUE(user.PickGroupOnPage(form.wb1, "ROOF"));
  });
  EXPECT_EQ(answer, std::make_pair(true, std::string("ROOF")));
}

TEST_F(ButterflyTest, AStoredFolderIsJoinedToThePageAsItStands) {
  GraphicsPath("d:\\art\\");
  frmButterfly form;
  const auto answer = Show(form, true, [&] {
    EXPECT_EQ(form.wb1.LocationURL(), "d:\\art\\butterfly.html");
    // No such page: the browser's error page, no trap, nothing to pick.
    ASSERT_NE(form.wb1.Document(), nullptr);
    EXPECT_TRUE(form.wb1.Document()->IsErrorPage());
    EXPECT_FALSE(user.PickGroupOnPage(form.wb1, "ROOF"));
    EXPECT_TRUE(form.Visible());
  });
  EXPECT_EQ(answer, std::make_pair(false, std::string()));
  EXPECT_TRUE(runtime.Sessions().back().closedByCloseBox);
}

TEST_F(ButterflyTest, APageWithoutAnInputTrapCanOnlyBeClosed) {
  for (const char* page :
       {"<p id=x data-group='ROOF'>Roof</p>",
        "<button id=event_trap>trap</button><p id=x data-group='ROOF'>Roof</p>"}) {
    GraphicsPath(PageFolder(page));
    frmButterfly form;
    const auto answer = Show(form, true, [&] {
      EXPECT_TRUE(user.ClickOnPage(form.wb1, "x")); // the click lands; nothing comes of it
      EXPECT_TRUE(form.Visible());
      EXPECT_TRUE(user.Close(form));
    });
    EXPECT_EQ(answer, std::make_pair(false, std::string())) << page;
  }
}

TEST_F(ButterflyTest, TheWindowStaysLoadedBetweenSearchesAndUnloadsOnlyWhenMade) {
  diagram::UnloadButterflyForm(); // never shown on this thread: nothing made
  EXPECT_EQ(diagram::ButterflyFormIfCreated(), nullptr);

  frmButterfly& form = diagram::ButterflyForm();
  EXPECT_EQ(diagram::ButterflyFormIfCreated(), &form);
  Show(form, true, [&] { user.PickGroupOnPage(form.wb1, "ROOF"); });
  const forms::HtmlDocument* page = form.wb1.Document();
  ASSERT_NE(page, nullptr);

  // Shown again (even for a make without a drawing): the same page, and the
  // last answer cleared as the window comes up; closing it gives none.
  const auto answer = Show(form, false, [&] {
    EXPECT_EQ(form.wb1.Document(), page);
    EXPECT_EQ(form.wb1.LocationURL(), diagram::DefaultGraphicsFolder() + "butterfly.html");
    EXPECT_FALSE(form.mbSearchGroup);
    EXPECT_EQ(form.msSearchStr, "");
  });
  EXPECT_EQ(answer, std::make_pair(false, std::string()));
  // The close box unloads the window: the next search loads it afresh.
  EXPECT_FALSE(form.Loaded());
  EXPECT_EQ(Show(form, false,
                 [&] {
                   EXPECT_EQ(form.wb1.LocationURL(),
                             diagram::DefaultGraphicsFolder() + "nobutterfly.html");
                   user.PickGroupOnPage(form.wb1, "BONNET");
                 }),
            std::make_pair(true, std::string("BONNET")));
  EXPECT_TRUE(form.Loaded()); // hidden by the pick, still loaded
  diagram::UnloadButterflyForm();
  EXPECT_FALSE(form.Loaded());
  diagram::UnloadButterflyForm();
}

// Every panel of both pages names a group that the sample catalogue's parts
// carry for every body of every model, so each finds parts.
TEST_F(ButterflyTest, EveryPanelOfThePagesFindsPartsInTheSampleCatalogue) {
  std::set<std::string> groups[2];
  const std::string pages[2] = {"butterfly.html", "nobutterfly.html"};
  for (int p = 0; p < 2; ++p) {
    std::ifstream in(diagram::DefaultGraphicsFolder() + pages[p]);
    const std::string html((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    auto document = forms::HtmlDocument::FromHtml(html);
    ASSERT_NE(document->Find("event_trap"), nullptr) << pages[p];
    EXPECT_EQ(document->Find("event_trap")->TagName(), "input");
    for (const auto& element : document->Elements())
      if (const std::string* g = element->Attribute("data-group")) groups[p].insert(*g);
  }
  EXPECT_EQ(groups[0], groups[1]);
  EXPECT_EQ(groups[0].size(), 16u);

  const std::string path = dir.File("sample.db");
  data::tools::WriteSampleCatalogueFile(path, {});
  cipher::InitFieldCipher();
  data::SqliteCatalogue catalogue(path);
  auto bodies = catalogue.OpenRecordset(
      "SELECT a.MAKE, a.cat_no, b.BODY_ID FROM ALLMODEL a JOIN BODY b ON b.MODEL_ID = a.MODEL_ID");
  int checked = 0;
  for (; !bodies->Eof(); bodies->MoveNext(), ++checked) {
    data::RecordsetPtr parts;
    catalogue.GetVehicleParts(parts, bodies->Fields(0).Value().ToText(),
                              bodies->Fields(1).Value().ToText(),
                              bodies->Fields(2).Value().ToText(), 1);
    std::set<std::string> found;
    for (; !parts->Eof(); parts->MoveNext())
      found.insert(cipher::DecryptField(parts->Fields("Group").Value().ToText()));
    for (const std::string& g : groups[0])
      EXPECT_TRUE(found.count(g)) << g << " has no parts for body "
                                  << bodies->Fields(2).Value().ToText();
  }
  EXPECT_GT(checked, 8);
}

} // namespace
