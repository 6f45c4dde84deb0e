// The labour editor's session: how the schedule is chosen, view against
// edit mode, the status box and the mouse pointer, load errors, and the
// save call from the host.

#include "data/sqlite/sqlite_catalogue.hpp"
#include "host/frm_status.hpp"
#include "labour_fixture.hpp"

#include <thread>

namespace belvane::test {
namespace {

using labour::frmLabour;

// Counts the labour schedule reads of the catalogue underneath.
class CountingCatalogue : public data::CatalogueDataObject {
public:
  explicit CountingCatalogue(std::shared_ptr<data::CatalogueDataObject> inner)
      : inner_(std::move(inner)) {}
  data::RecordsetPtr OpenRecordset(const std::string& sql, long a, long b) override {
    return inner_->OpenRecordset(sql, a, b);
  }
  void GetLabourItems(data::RecordsetPtr& rs, long schedule, const std::string& first,
                      const std::string& second, const std::string& body) override {
    calls.push_back(schedule);
    inner_->GetLabourItems(rs, schedule, first, second, body);
  }
  void GetVehicleParts(data::RecordsetPtr& rs, const std::string& mk, const std::string& cat,
                       const std::string& body, int16_t state) override {
    inner_->GetVehicleParts(rs, mk, cat, body, state);
  }
  bool HasVehicleDiagram(const std::string& mk) override { return inner_->HasVehicleDiagram(mk); }
  std::vector<long> calls;

private:
  std::shared_ptr<data::CatalogueDataObject> inner_;
};

int SelectedOption(frmLabour& f) {
  int on = -1;
  for (int i = 0; i < 4; ++i)
    if (f.optSchedule(i).Value()) {
      EXPECT_EQ(on, -1) << "two options on";
      on = i;
    }
  return on;
}

using SessionTest = LabourFixture;

TEST_F(SessionTest, ScheduleChoiceAndTheReturnedScheduleType) {
  struct Case {
    bool insurerChanged, defaultSched;
    std::string given;
    int option;
    std::string returned;
  };
  const std::vector<Case> cases = {
      {false, false, "NRMA", 0, "NRMA"}, {false, false, "mta", 1, "MTA"},
      {false, false, "3rd", 2, "3RD"},   {false, false, "Cp", 3, "CP"},
      {false, false, "", 0, "NRMA"},     {false, true, "", 1, "MTA"},
      {false, true, "XYZ", 1, "MTA"},    {false, false, "XYZ", 0, "NRMA"},
      {true, true, "CP", 1, "MTA"},      {true, false, "MTA", 0, "NRMA"},
  };
  for (const Case& c : cases) {
    insurerChanged = c.insurerChanged;
    defaultSched = c.defaultSched;
    schedType = c.given;
    int option = -2;
    bool gridShown = false;
    EXPECT_EQ(Open(eEdit,
                   [&](frmLabour& f) {
                     option = SelectedOption(f);
                     gridShown = option >= 0 && f.FGLabourItems(option).Visible();
                   }),
              0);
    EXPECT_EQ(option, c.option) << c.given;
    EXPECT_TRUE(gridShown) << c.given;
    EXPECT_EQ(schedType, c.returned) << c.given;
  }
}

TEST_F(SessionTest, ViewModeLooksOnly) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  schedType = "mta";
  Open(eView, [&](frmLabour& f) {
    EXPECT_EQ(SelectedOption(f), -1);
    for (int i = 0; i < 4; ++i) {
      EXPECT_EQ(f.FGLabourItems(i).Rows(), 2) << "schedule " << i << " was loaded";
      EXPECT_FALSE(f.FGLabourItems(i).Enabled());
      EXPECT_FALSE(f.optSchedule(i).Enabled());
    }
    EXPECT_FALSE(f.txtSearch.Enabled());
    EXPECT_FALSE(f.T1.Enabled());
    EXPECT_FALSE(f.cmdDelete.Enabled());
    EXPECT_TRUE(f.cmdClose.Enabled());
    EXPECT_EQ(f.FGSelectedLabour.TextMatrix(1, 0), "100"); // the lines still show
    EXPECT_EQ(f.FGSelectedLabour.Col(), 0);
    EXPECT_EQ(f.DeletedItems(), nullptr);
    // Even a changed cell is not written back in view mode.
    f.FGSelectedLabour.TextMatrix(1, labour::col::kRRHours, "9.00");
    EXPECT_TRUE(user.Click(f.cmdClose));
    EXPECT_FALSE(f.Loaded());
  });
  EXPECT_EQ(schedType, "mta");
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5"}));
  EXPECT_EQ(quote->StoredStatus(0), data::RecordStatus::Unchanged);
  EXPECT_EQ(quote->Sort(), "itemno ASC");
}

TEST_F(SessionTest, AScheduleListIsReadOnceButAnEmptyOneAgain) {
  auto counting = std::make_shared<CountingCatalogue>(
      std::make_shared<data::SqliteCatalogue>(data::CatalogueLocation()));
  data::SetCatalogueDataObject(counting);
  Open(eEdit, [&](frmLabour& f) {
    EXPECT_EQ(f.FGLabourItems(0).Rows(), 6); // header + five NRMA items
    EXPECT_TRUE(user.Click(f.optSchedule(1)));
    EXPECT_EQ(f.FGLabourItems(1).TextMatrix(1, 1), "MTA WINDSCREEN");
    EXPECT_TRUE(f.FGLabourItems(1).Visible());
    EXPECT_FALSE(f.FGLabourItems(0).Visible());
    EXPECT_TRUE(user.Click(f.optSchedule(0)));
    EXPECT_TRUE(user.Click(f.optSchedule(2))); // no 3RD items: placeholder only
    EXPECT_EQ(f.FGLabourItems(2).Rows(), 2);
    EXPECT_TRUE(user.Click(f.optSchedule(0)));
    EXPECT_TRUE(user.Click(f.optSchedule(2)));
    EXPECT_TRUE(f.Enabled());
    EXPECT_EQ(f.SchedType(), "3RD");
  });
  EXPECT_EQ(counting->calls, (std::vector<long>{0, 1, 2, 2}));
  EXPECT_EQ(schedType, "3RD");
}

TEST_F(SessionTest, StatusBoxAndMousePointer) {
  std::string message;
  bool statusShown = false;
  Open(eEdit, [&](frmLabour&) {
    statusShown = host::StatusBox().Visible();
    message = host::StatusBox().lblMsg.Caption();
  });
  EXPECT_TRUE(statusShown);
  EXPECT_EQ(message, "Opening Labour...");
  EXPECT_FALSE(host::StatusBox().Loaded());
  EXPECT_EQ(runtime.MousePointerHistory(), (std::vector<int>{11, 11, 0, 0}));
  EXPECT_EQ(forms::Screen.MousePointer(), 0);

  // A second ShowStatusBox while the box is up keeps the first message.
  host::StatusBox().ShowStatusBox("first");
  host::StatusBox().ShowStatusBox("second");
  EXPECT_EQ(host::StatusBox().lblMsg.Caption(), "first");
  forms::Screen.MousePointer(forms::kPointerArrow);
  host::StatusBox().HideStatusBox();
  EXPECT_EQ(forms::Screen.MousePointer(), 0);
}

TEST_F(SessionTest, ALoadErrorIsReportedAndTheEditorStillOpens) {
  data::SetCatalogueLocation(dir.File("no-such-catalogue.db"));
  bool opened = false;
  int pointerDuringSession = -1;
  Open(eEdit, [&](frmLabour& f) {
    opened = f.Visible();
    pointerDuringSession = forms::Screen.MousePointer();
  });
  EXPECT_TRUE(opened);
  EXPECT_EQ(pointerDuringSession, 11); // stays the hourglass until the status box goes
  EXPECT_EQ(forms::Screen.MousePointer(), 0);
  ASSERT_EQ(runtime.Messages().size(), 1u);
  const auto& m = runtime.Messages()[0];
  EXPECT_EQ(m.title, "Labour form");
  EXPECT_EQ(m.style, 16);
  EXPECT_EQ(
      m.prompt.rfind("Error No: " + std::to_string(3709 + 2147221504LL) + "\r\nDescription: ", 0),
      0u)
      << m.prompt;
  EXPECT_NE(m.prompt.find("no-such-catalogue.db"), std::string::npos);
  EXPECT_NE(m.prompt.find("\r\nSource: "), std::string::npos);
}

TEST_F(SessionTest, NoRecordSetIsRefusedBeforeAnythingOpens) {
  quote.reset();
  try {
    Open(eEdit);
    ADD_FAILURE() << "opened without a record set";
  } catch (const belvane::Error& e) {
    EXPECT_EQ(e.Number(), belvane::err::kInvalidCall);
  }
  EXPECT_FALSE(host::StatusBox().Loaded());
  EXPECT_FALSE(host::gbLabourFormLoaded);
  EXPECT_EQ(forms::Screen.MousePointer(), 0);
  runtime.Reset(); // the queued script was never played
}

TEST_F(SessionTest, ASessionThatFailsLeavesNothingLoaded) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  frmLabour* form = nullptr;
  EXPECT_THROW(Open(eEdit,
                    [&](frmLabour& f) {
                      form = &f;
                      throw belvane::Error(5, "the desktop went away", "test");
                    }),
               belvane::Error);
  ASSERT_NE(form, nullptr);
  EXPECT_FALSE(form->Loaded());
  EXPECT_FALSE(host::gbLabourFormLoaded);
  EXPECT_FALSE(host::StatusBox().Loaded());
  EXPECT_EQ(forms::Screen.MousePointer(), 0);
  EXPECT_EQ(forms.SaveLabourChanges(), 0);
  EXPECT_EQ(quote->StoredStatus(0), data::RecordStatus::Unchanged);
}

TEST_F(SessionTest, SessionsReuseOneFormAndStartAfresh) {
  frmLabour* first = nullptr;
  Open(eEdit, [&](frmLabour& f) {
    first = &f;
    f.FGSelectedLabour.TextMatrix(1, 1, "left over");
    EXPECT_TRUE(user.Click(f.optSchedule(3)));
  });
  Open(eView, [&](frmLabour& f) {
    EXPECT_EQ(&f, first);
    EXPECT_EQ(f.FGSelectedLabour.TextMatrix(1, 1), "");
    EXPECT_EQ(f.FGLabourItems(3).Rows(), 2); // not loaded in view mode
    EXPECT_EQ(SelectedOption(f), -1);
  });
  EXPECT_EQ(runtime.Sessions().size(), 2u);
}

TEST_F(SessionTest, SaveLabourChangesOnlyWhileTheEditorIsLoaded) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  EXPECT_EQ(forms.SaveLabourChanges(), 0); // before any session: nothing
  EXPECT_FALSE(host::gbLabourFormLoaded);
  EXPECT_EQ(quote->StoredStatus(0), data::RecordStatus::Unchanged);

  std::vector<std::string> duringSave;
  Open(eEdit, [&](frmLabour& f) {
    EXPECT_TRUE(host::gbLabourFormLoaded);
    f.FGSelectedLabour.TextMatrix(1, labour::col::kRRHours, "2.00");
    EXPECT_EQ(forms.SaveLabourChanges(), 0);
    duringSave = Records();
    f.FGSelectedLabour.TextMatrix(1, labour::col::kRRHours, "3.00");
    // Leaving by the close box, the estimator declines to save.
    runtime.QueueAnswer(forms::msgbox::kNo);
  });
  EXPECT_EQ(duringSave, (std::vector<std::string>{"100 R&R 2"}));
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 2"}));
  EXPECT_FALSE(host::gbLabourFormLoaded);
  EXPECT_EQ(forms.SaveLabourChanges(), 0); // after: nothing
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 2"}));
}

TEST_F(SessionTest, EachThreadHasItsOwnEditor) {
  const std::string catalogue = data::CatalogueLocation();
  auto session = [&](const std::string& item, double hours, std::vector<std::string>& out,
                     const labour::frmLabour*& form) {
    cipher::InitFieldCipher();
    auto rs = data::QuoteStore::NewItemRecordset();
    std::string type = "NRMA";
    forms::SimulatedUser threadUser;
    forms::ThreadHeadlessRuntime().QueueModal([&](forms::Form& f) {
      auto& lab = static_cast<frmLabour&>(f);
      form = &lab;
      lab.FGSelectedLabour.TextMatrix(1, 0, item);
      lab.FGSelectedLabour.TextMatrix(1, 1, "line " + item);
      lab.FGSelectedLabour.TextMatrix(1, labour::col::kRRHours, std::to_string(hours));
      lab.FGSelectedLabour.TextMatrix(1, labour::col::kRate, labour::kDefaultRate);
      threadUser.Click(lab.cmdClose);
    });
    CForms cf;
    cf.ShowLabourForm(rs, type, "Q", "0", "FORD", "1", "B1", "N1", "M1", "T1", 50, 50, 50, false,
                      false, eEdit);
    for (rs->MoveFirst(); !rs->Eof(); rs->MoveNext())
      out.push_back(rs->Collect("itemno").ToText() + " " + rs->Collect("rrhour").ToText());
  };
  std::vector<std::string> a, b;
  const labour::frmLabour *fa = nullptr, *fb = nullptr;
  std::thread ta([&] { session("A1", 1.0, a, fa); });
  std::thread tb([&] { session("B2", 2.0, b, fb); });
  ta.join();
  tb.join();
  EXPECT_EQ(a, (std::vector<std::string>{"A1 1"}));
  EXPECT_EQ(b, (std::vector<std::string>{"B2 2"}));
  EXPECT_NE(fa, fb);
  (void)catalogue;
}

} // namespace
} // namespace belvane::test
