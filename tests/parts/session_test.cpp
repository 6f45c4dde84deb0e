// The parts editor's session: the model's catalogue number (and model ids
// that would change the query), view against edit mode, the status box, a
// second call while open, the save call, the sort on unload, the close box
// and the description column's width at ten parts.

#include "data/sqlite/sqlite_catalogue.hpp"
#include "error_number.hpp"
#include "forms/keys.hpp"
#include "host/frm_status.hpp"
#include "parts_fixture.hpp"

namespace belvane::test {
namespace {

using parts::frmParts;
namespace sel = parts::col::sel;
namespace keys = forms::keys;
namespace msgbox = forms::msgbox;

// Passes every call to a catalogue underneath and keeps the SQL texts; the
// model look-up can be answered with several rows.
class RecordingCatalogue : public data::CatalogueDataObject {
public:
  explicit RecordingCatalogue(std::shared_ptr<data::CatalogueDataObject> inner)
      : inner_(std::move(inner)) {}
  data::RecordsetPtr OpenRecordset(const std::string& sql, long a, long b) override {
    texts.push_back(sql);
    if (severalModels && sql.starts_with("SELECT * FROM ALLMODEL")) {
      auto rs = std::make_shared<data::Recordset>();
      rs->Fields().Append("MODEL_ID", data::DataType::Integer);
      rs->Fields().Append("cat_no", data::DataType::VarWChar);
      rs->Open();
      rs->AppendLoaded({data::Value(int32_t{12}), data::Value("FIRST")});
      rs->AppendLoaded({data::Value(int32_t{12}), data::Value("SECOND")});
      rs->MoveFirst();
      return rs;
    }
    return inner_->OpenRecordset(sql, a, b);
  }
  void GetLabourItems(data::RecordsetPtr& rs, long s, const std::string& f, const std::string& g,
                      const std::string& b) override {
    inner_->GetLabourItems(rs, s, f, g, b);
  }
  void GetVehicleParts(data::RecordsetPtr& rs, const std::string& mk, const std::string& cat,
                       const std::string& body, int16_t state) override {
    partsAsked.push_back(cat);
    inner_->GetVehicleParts(rs, mk, cat, body, state);
  }
  bool HasVehicleDiagram(const std::string& mk) override { return inner_->HasVehicleDiagram(mk); }

  bool severalModels = false;
  std::vector<std::string> texts;
  std::vector<std::string> partsAsked;

private:
  std::shared_ptr<data::CatalogueDataObject> inner_;
};

class SessionTest : public PartsFixture {
protected:
  std::shared_ptr<RecordingCatalogue> Recording() {
    auto recording = std::make_shared<RecordingCatalogue>(
        std::make_shared<data::SqliteCatalogue>(data::CatalogueLocation()));
    data::SetCatalogueDataObject(recording);
    return recording;
  }
  std::string CatNoOpened() {
    std::string catNo = "<not opened>";
    Open(eEdit, [&](frmParts& f) { catNo = f.CatNo(); });
    return catNo;
  }
};

TEST_F(SessionTest, TheModelsCatalogueNumber) {
  auto recording = Recording();
  modelId = "12";
  EXPECT_EQ(CatNoOpened(), "FA1");
  EXPECT_EQ(recording->texts.front(), "SELECT * FROM ALLMODEL WHERE MODEL_ID = 12");
  EXPECT_EQ(recording->partsAsked.back(), "FA1");
  modelId = " 13 ";
  EXPECT_EQ(CatNoOpened(), "FO1");
  // A model the catalogue does not hold: an empty catalogue number, and the
  // general parts only.
  modelId = "99";
  int available = 0;
  Open(eEdit, [&](frmParts& f) {
    EXPECT_EQ(f.CatNo(), "");
    available = f.FGParts.Rows() - 1;
    EXPECT_EQ(f.FGParts.TextMatrix(1, 0), "G1");
  });
  EXPECT_EQ(available, 2);
  // Several rows: the first one's.
  recording->severalModels = true;
  modelId = "12";
  EXPECT_EQ(CatNoOpened(), "FIRST");
  EXPECT_TRUE(runtime.Messages().empty());
}

TEST_F(SessionTest, AModelIdThatIsNoWholeNumberNeverReachesTheQuery) {
  auto recording = Recording();
  for (const std::string id : {"1 OR 1=1", "1; DELETE FROM ALLMODEL", "", "12a", "0x0C", "1.0",
                               "12 --", "99999999999999999999"}) {
    modelId = id;
    recording->texts.clear();
    EXPECT_EQ(CatNoOpened(), "") << id;
    for (const std::string& sql : recording->texts)
      EXPECT_EQ(sql.find("ALLMODEL"), std::string::npos) << id << ": " << sql;
  }
  // The models are all still there.
  modelId = "12";
  EXPECT_EQ(CatNoOpened(), "FA1");
  modelId = "13";
  EXPECT_EQ(CatNoOpened(), "FO1");
  EXPECT_TRUE(runtime.Messages().empty());
}

TEST_F(SessionTest, ViewModeShowsThePartsAndChangesNothing) {
  AddPart({1, "P100", "FRONT BUMPER BAR", "O", "", 1, 250.0, 325.0, "FB-1001", 1, "A"});
  Stored();
  Open(eView, [&](frmParts& f) {
    auto& g = f.FGSelectedParts;
    EXPECT_EQ(RowText(g, 1), "P100|FRONT BUMPER BAR|O||1|250.00|325.000|FB-1001|R|A|1");
    EXPECT_EQ(g.Row(), 1);
    EXPECT_EQ(g.Col(), sel::kItemNo);
    EXPECT_EQ(f.FGParts.Rows(), 2); // no catalogue
    EXPECT_EQ(f.FGParts.TextMatrix(1, 0), "");
    EXPECT_EQ(f.LV1.ItemCount(), 0);
    EXPECT_EQ(f.DeletedItems(), nullptr);
    for (forms::Control* c : std::initializer_list<forms::Control*>{
             &f.txtSearch, &f.FGParts, &f.T1, &f.LV1, &f.CB1, &f.cmdDelete, &f.cmdSearch(0)})
      EXPECT_FALSE(c->IsEnabled()) << c->Name();
    EXPECT_TRUE(f.FGSelectedParts.Enabled());
    EXPECT_TRUE(f.cmdClose.Enabled());
    // Keys, clicks and double clicks change nothing.
    user.ClickCell(g, 1, sel::kUnitPrice);
    user.Type("9");
    user.PressKey(keys::kF2);
    user.PressKey(keys::kBack);
    user.DoubleClickCell(g, 1, sel::kReport);
    user.ClickCell(g, 1, sel::kReport);
    user.Type(" ");
    EXPECT_EQ(RowText(g, 1), "P100|FRONT BUMPER BAR|O||1|250.00|325.000|FB-1001|R|A|1");
    EXPECT_FALSE(f.T1.Visible());
    // Even a cell changed by code is not written back.
    g.TextMatrix(1, sel::kQty, "5");
    forms.SavePartsChanges();
    user.Click(f.cmdClose);
    EXPECT_FALSE(f.Loaded());
  });
  EXPECT_EQ(Records(),
            (std::vector<std::string>{"P100|FRONT BUMPER BAR|O||1|250|325|FB-1001|1|A|1"}));
  EXPECT_EQ(quote->StoredStatus(0), data::RecordStatus::Unchanged);
  EXPECT_EQ(quote->Sort(), "itemno ASC");
  EXPECT_TRUE(runtime.Messages().empty());
}

TEST_F(SessionTest, EditModeLoadsInItsOrder) {
  AddPart({1, "P100", "FRONT BUMPER BAR"});
  Stored();
  data::Value result = data::Value(1);
  result = Open(eEdit, [&](frmParts& f) {
    EXPECT_TRUE(host::gbPartsFormLoaded);
    ASSERT_EQ(f.LV1.ItemCount(), 5);
    EXPECT_EQ(f.LV1.ItemText(1), "New(Space)");
    EXPECT_EQ(f.LV1.ItemText(3), "eXchange(X)");
    EXPECT_EQ(f.LV1.ItemText(5), "After Market(A)");
    EXPECT_EQ(f.FGSelectedParts.Row(), 1);
    EXPECT_EQ(f.FGSelectedParts.Col(), sel::kDescription);
    EXPECT_TRUE(f.txtSearch.IsEnabled());
    EXPECT_TRUE(f.cmdSearch(0).IsEnabled());
    EXPECT_FALSE(f.cmdSearch(1).IsEnabled());
    EXPECT_EQ(f.cmdSearch(0).ToolTipText(), "Search");
    EXPECT_EQ(f.cmdSearch(1).ToolTipText(), "Browse");
    EXPECT_NE(f.DeletedItems(), nullptr);
    EXPECT_EQ(f.Caption(), "Parts");
    // The layouts: titles and the description's fill.
    EXPECT_EQ(RowText(f.FGSelectedParts, 0),
              "Item No|Description|Side|New?|Qty|U.Price|Markup|Part No|Rpt|Rev|ItemID");
    EXPECT_EQ(f.FGSelectedParts.ColWidth(sel::kDescription), 10470 - 6500 - 20);
    EXPECT_EQ(RowText(f.FGParts, 0), "Item No|Description|Side|Qty|Unit Price|Part No.|Grp");
    EXPECT_EQ(f.FGParts.ColWidth(1), 10470 - 5200 - 20);
    user.Click(f.cmdClose);
  });
  EXPECT_TRUE(result.IsNull());
  EXPECT_FALSE(host::gbPartsFormLoaded);
  // The pointer: hourglass while loading, then the default.
  const auto& pointers = runtime.MousePointerHistory();
  ASSERT_GE(pointers.size(), 2u);
  EXPECT_EQ(pointers.back(), forms::kPointerDefault);
}

TEST_F(SessionTest, TheStatusBoxStaysUntilTheEditorCloses) {
  std::string message;
  bool shown = false;
  Open(eEdit, [&](frmParts&) {
    shown = host::StatusBox().Visible();
    message = host::StatusBox().lblMsg.Caption();
  });
  EXPECT_TRUE(shown);
  EXPECT_EQ(message, "Opening Parts...");
  EXPECT_FALSE(host::StatusBox().Loaded());
  EXPECT_EQ(forms::Screen.MousePointer(), forms::kPointerDefault);
}

TEST_F(SessionTest, ASecondCallWhileTheEditorIsOpenIsRefusedAndChangesNothing) {
  AddPart({1, "P100", "FRONT BUMPER BAR"});
  Stored();
  data::RecordsetPtr other = data::QuoteStore::NewItemRecordset();
  Open(eEdit, [&](frmParts& f) {
    user.ClickCell(f.FGSelectedParts, 1, sel::kQty);
    user.Type("3");
    const long number = ErrorNumber([&] {
      forms.ShowPartsForm(other, "Q9", "0", make, "13", bodyId, 1, 2, 3, 4, 5, 6, 7, 8, eEdit);
    });
    EXPECT_EQ(number, 400);
    EXPECT_TRUE(f.Loaded());
    EXPECT_EQ(f.CatNo(), "FA1");
    EXPECT_TRUE(f.T1.Visible());
    EXPECT_EQ(f.FGSelectedParts.TextMatrix(1, sel::kQty), "3");
    user.PressKey(keys::kEnter);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records()[0].substr(0, 26), "P100|FRONT BUMPER BAR|O||3");
  EXPECT_EQ(other->Sort(), "");
  EXPECT_EQ(other->RecordCount(), 0);
}

TEST_F(SessionTest, SavePartsChangesWritesOnlyWhileTheEditorIsOpen) {
  AddPart({1, "P100", "FRONT BUMPER BAR"});
  Stored();
  EXPECT_EQ(forms.SavePartsChanges(), 0); // before any session: nothing
  EXPECT_EQ(quote->StoredStatus(0), data::RecordStatus::Unchanged);
  Open(eEdit, [&](frmParts& f) {
    f.FGSelectedParts.TextMatrix(1, sel::kQty, "4");
    EXPECT_EQ(forms.SavePartsChanges(), 0);
    quote->MoveFirst();
    EXPECT_EQ(quote->Collect("qty").ToDouble(), 4);
    f.FGSelectedParts.TextMatrix(1, sel::kQty, "5");
    runtime.QueueAnswer(msgbox::kNo);
  });
  EXPECT_EQ(forms.SavePartsChanges(), 0); // after: nothing
  quote->MoveFirst();
  EXPECT_EQ(quote->Collect("qty").ToDouble(), 4);
}

TEST_F(SessionTest, TheRecordSetIsSortedOnUnloadWhateverHappened) {
  AddPart({1, "P300", "C PART"});
  AddPart({2, "P100", "A PART"});
  AddPart({3, "P200", "B PART"});
  Stored();
  Open(eEdit, [&](frmParts& f) { user.Click(f.cmdClose); });
  EXPECT_EQ(quote->Sort(), "itemno ASC");
  std::vector<std::string> order;
  for (quote->MoveFirst(); !quote->Eof(); quote->MoveNext())
    order.push_back(quote->Collect("itemno").ToText());
  EXPECT_EQ(order, (std::vector<std::string>{"P100", "P200", "P300"}));
  // A load that fails (a damaged unit cost) unloads too, and sorts.
  auto loose = std::make_shared<data::Recordset>();
  for (const char* f : {"ITEMID", "DELITEM", "tag", "ItemNo", "Script", "SIDE", "MARK", "QTY",
                        "unitcost", "rrhour", "partno", "report_on", "rev"})
    loose->Fields().Append(f, data::DataType::Variant);
  loose->Open();
  loose->AppendLoaded({data::Value(int32_t{1}), data::Value(false), data::Value("1"),
                       data::Value("P1"), data::Value("X"), data::Value("O"), data::Value(""),
                       data::Value(1.0), data::Value("abc"), data::Value(1.0), data::Value(""),
                       data::Value(int16_t{0}), data::Value()});
  loose->MoveFirst();
  quote = loose;
  EXPECT_EQ(ErrorNumber([&] { Open(eEdit); }), err::kTypeMismatch);
  EXPECT_EQ(quote->Sort(), "itemno ASC");
  EXPECT_FALSE(host::StatusBox().Loaded());
  runtime.Reset(); // the unused script
}

TEST_F(SessionTest, TheCloseBoxAsksBeforeItDiscardsEdits) {
  AddPart({1, "P100", "FRONT BUMPER BAR"});
  Stored();
  const std::string question = "Save the changes to this quote's parts?";
  auto editAndCloseBox = [&](int answer) {
    Open(eEdit, [&](frmParts& f) {
      user.ClickCell(f.FGSelectedParts, 1, sel::kQty);
      user.Type("7"); // still in the editor
      runtime.QueueAnswer(answer);
      user.Close(f);
      if (answer == msgbox::kCancel) {
        EXPECT_TRUE(f.Visible());
        EXPECT_EQ(f.FGSelectedParts.TextMatrix(1, sel::kQty), "7");
        user.Click(f.cmdClose);
      }
    });
  };
  editAndCloseBox(msgbox::kNo);
  EXPECT_EQ(Messages(question), 1);
  EXPECT_EQ(runtime.Messages()[0].style,
            msgbox::kYesNoCancel | msgbox::kQuestion | msgbox::kDefaultButton2);
  EXPECT_EQ(runtime.Messages()[0].title, "Parts");
  quote->MoveFirst();
  EXPECT_EQ(quote->Collect("qty").ToDouble(), 1);
  editAndCloseBox(msgbox::kYes);
  quote->MoveFirst();
  EXPECT_EQ(quote->Collect("qty").ToDouble(), 7);
  quote->Collect("qty", data::Value(1.0));
  editAndCloseBox(msgbox::kCancel);
  quote->MoveFirst();
  EXPECT_EQ(quote->Collect("qty").ToDouble(), 7);
  EXPECT_EQ(Messages(question), 3);

  // Nothing edited, or view mode: no question. A deletion alone is an edit.
  runtime.Reset();
  Open(eEdit, [&](frmParts& f) { user.Close(f); });
  Open(eView, [&](frmParts& f) { user.Close(f); });
  EXPECT_TRUE(runtime.Messages().empty());
  Open(eEdit, [&](frmParts& f) {
    user.Click(f.cmdDelete);
    runtime.QueueAnswer(msgbox::kYes);
    user.Close(f);
  });
  EXPECT_EQ(Messages(question), 1);
  EXPECT_TRUE(Records().empty());
}

TEST_F(SessionTest, TenPartsOpenWithANarrowerDescriptionThanNine) {
  for (int i = 1; i <= 9; ++i)
    AddPart({i, "P" + std::to_string(100 + i), "PART " + std::to_string(i)});
  Stored();
  int nine = 0, ten = 0;
  Open(eView, [&](frmParts& f) { nine = f.FGSelectedParts.ColWidth(sel::kDescription); });
  AddPart({10, "P110", "PART 10"});
  Stored();
  Open(eView, [&](frmParts& f) { ten = f.FGSelectedParts.ColWidth(sel::kDescription); });
  EXPECT_EQ(nine, 10470 - 6500 - 20);
  EXPECT_EQ(ten, nine - 240);
}

} // namespace
} // namespace belvane::test
