// Nothing the estimator types is lost: a line typed by hand is stored and
// reopens, a damaged stored line does not keep the quote shut, a second
// call while the editor is open leaves the session alone, Escape on the
// first cell brings its text back, and the close box asks before it
// discards edits.

#include "forms/keys.hpp"
#include "labour_fixture.hpp"
#include "text/number.hpp"

namespace belvane::test {
namespace {

using labour::frmLabour;
namespace col = labour::col;
namespace keys = forms::keys;
namespace msgbox = forms::msgbox;

class LostWorkTest : public LabourFixture {
protected:
  text::ScopedNumberLocale locale{{".", ","}};

  // The one question the close box asks.
  static constexpr const char* kQuestion = "Save the changes to this quote's labour lines?";

  int Questions() const {
    int n = 0;
    for (const auto& m : runtime.Messages())
      n += m.prompt == kQuestion;
    return n;
  }
};

TEST_F(LostWorkTest, ALineTypedByHandIsStoredAndReopens) {
  data::QuoteStore store(dir.File("quotes.db"));
  data::QuoteHeader header;
  header.qtnno = quoteNo;
  store.SaveQuote(header);
  quote = store.LoadItems(quoteNo, data::ItemKind::Labour);

  // Into the empty quote's placeholder row: a description and R&R hours,
  // no rate, no allow mask.
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    user.ClickCell(g, 1, col::kDescription);
    user.Type("HAND MADE BRACKET");
    user.PressKey(keys::kEnter);
    user.Type("2");
    user.PressKey(keys::kEnter);
    EXPECT_EQ(g.TextMatrix(1, col::kRate), "<Default>");
    user.Click(f.cmdClose);
  });
  EXPECT_TRUE(runtime.UnhandledErrors().empty());
  ASSERT_EQ(Records(), (std::vector<std::string>{" R&R 2"}));
  quote->MoveFirst();
  EXPECT_EQ(quote->Collect("rr_rate2").ToDouble(), rrRate);
  EXPECT_TRUE(quote->Collect("allow_tick").IsNull());
  EXPECT_EQ(store.SaveItems(quoteNo, *quote).inserted, 1);

  // It opens again, editable, with every operation allowed.
  quote = store.LoadItems(quoteNo, data::ItemKind::Labour);
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    EXPECT_EQ(g.TextMatrix(1, col::kDescription), "HAND MADE BRACKET");
    EXPECT_EQ(g.TextMatrix(1, col::kRate), "<Default>");
    EXPECT_EQ(g.TextMatrix(1, col::kAllow), "7");
    user.Click(f.cmdClose);
  });
  EXPECT_TRUE(runtime.Messages().empty());
}

TEST_F(LostWorkTest, ARefusedWriteBackSaysWhichCellAndWhatToDo) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    f.FGSelectedLabour.TextMatrix(1, col::kRate, "abc");
    user.Click(f.cmdClose);
    EXPECT_TRUE(f.Visible()); // the editor stays open with the lines
    ASSERT_EQ(runtime.UnhandledErrors().size(), 1u);
    const std::string said = runtime.UnhandledErrors()[0].description;
    EXPECT_NE(said.find("Labour item 100 \"BONNET R&I\" in row 1"), std::string::npos) << said;
    EXPECT_NE(said.find("Type a rate or clear the R&R hours"), std::string::npos) << said;
    f.FGSelectedLabour.TextMatrix(1, col::kRate, "<Default>");
    runtime.Reset();
    user.Click(f.cmdClose);
  });
  EXPECT_FALSE(host::gbLabourFormLoaded);
}

TEST_F(LostWorkTest, ADamagedStoredLineOpensWithAMessageAndTheOthersStayEditable) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5, 0, std::nullopt, "");
  AddRecord(2, "140", "Roof panel", "R&R", 3.0);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    ASSERT_EQ(g.Rows(), 3);
    EXPECT_EQ(g.TextMatrix(1, col::kAllow), "7");
    EXPECT_EQ(g.TextMatrix(2, col::kRRHours), "3.00");
    user.ClickCell(g, 2, col::kRRHours);
    user.Type("4");
    user.PressKey(keys::kEnter);
    user.Click(f.cmdClose);
  });
  ASSERT_FALSE(runtime.Messages().empty());
  const auto& said = runtime.Messages()[0];
  EXPECT_EQ(said.title, "Labour form");
  EXPECT_NE(said.prompt.find("Labour item 100 \"BONNET R&I\": allowed operations"),
            std::string::npos)
      << said.prompt;
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5", "140 R&R 4"}));
  quote->MoveFirst();
  EXPECT_EQ(quote->Collect("allow_tick").ToText(), "7"); // stored readable again
}

TEST_F(LostWorkTest, ASecondCallWhileTheEditorIsOpenLeavesTheSessionAlone) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  data::RecordsetPtr other = data::QuoteStore::NewItemRecordset();
  std::string otherSched = "CP";
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    user.ClickCell(g, 1, col::kRRHours);
    user.Type("2");
    try {
      forms.ShowLabourForm(other, otherSched, "Q2", "0", make, modelId, bodyId, schedId, mtaId,
                           thirdId, 1, 2, 3, false, false, eEdit);
      ADD_FAILURE() << "the second call was not refused";
    } catch (const Error& e) {
      EXPECT_EQ(e.Number(), 400);
    }
    // The open session is as it was: loaded, its edit in hand.
    EXPECT_TRUE(f.Loaded());
    EXPECT_TRUE(host::gbLabourFormLoaded);
    EXPECT_TRUE(f.T1.Visible());
    user.PressKey(keys::kEnter);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(schedType, "NRMA");
  EXPECT_EQ(otherSched, "CP");
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 2"}));
  EXPECT_EQ(other->Sort(), "");
}

TEST_F(LostWorkTest, EscapeOnTheFirstCellBringsItsTextBack) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    auto& g = f.FGSelectedLabour;
    EXPECT_EQ(g.Row(), 1);
    EXPECT_EQ(g.Col(), col::kDescription);
    user.Click(g); // the current cell, no move
    user.PressKey(keys::kF2);
    user.Type("XYZ");
    user.PressKey(keys::kEscape);
    EXPECT_EQ(f.T1.Text(), "BONNET R&I");
    user.PressKey(keys::kEnter);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5"}));
}

TEST_F(LostWorkTest, TheCloseBoxAsksBeforeItDiscardsEdits) {
  auto editAndCloseBox = [&](std::optional<int> answer) {
    Open(eEdit, [&](frmLabour& f) {
      user.ClickCell(f.FGSelectedLabour, 1, col::kRRHours);
      user.Type("4");
      user.PressKey(keys::kEnter);
      if (answer) runtime.QueueAnswer(*answer);
      user.Close(f);
      if (answer == msgbox::kCancel) {
        EXPECT_TRUE(f.Visible()); // still open, the edit in hand
        EXPECT_EQ(f.FGSelectedLabour.TextMatrix(1, col::kRRHours), "4.00");
        user.Click(f.cmdClose);
      }
    });
  };

  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  Stored();
  // No: discarded, as before.
  editAndCloseBox(msgbox::kNo);
  EXPECT_EQ(Questions(), 1);
  EXPECT_EQ(runtime.Messages()[0].style,
            msgbox::kYesNoCancel | msgbox::kQuestion | msgbox::kDefaultButton2);
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5"}));
  // Yes: written back exactly as Close writes.
  editAndCloseBox(msgbox::kYes);
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 4"}));
  // Cancel: the editor stays; its own Close then writes.
  quote->MoveFirst();
  quote->Collect("rrhour", data::Value(1.5));
  editAndCloseBox(msgbox::kCancel);
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 4"}));
  EXPECT_EQ(Questions(), 3);

  // Nothing edited, view mode, Close: no question.
  runtime.Reset();
  Open(eEdit, [&](frmLabour& f) { user.Close(f); });
  Open(eView, [&](frmLabour& f) {
    f.FGSelectedLabour.TextMatrix(1, col::kRRHours, "9.00");
    user.Close(f);
  });
  Open(eEdit, [&](frmLabour& f) {
    user.ClickCell(f.FGSelectedLabour, 1, col::kRRHours);
    user.Type("5");
    user.PressKey(keys::kEnter);
    user.Click(f.cmdClose);
  });
  EXPECT_EQ(Questions(), 0);
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 5"}));
}

TEST_F(LostWorkTest, ADeletionAloneIsAnEditTheCloseBoxAsksAbout) {
  AddRecord(1, "100", "BONNET R&I", "R&R", 1.5);
  AddRecord(2, "140", "Roof panel", "R&R", 3.0);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    user.ClickCell(f.FGSelectedLabour, 2, col::kItemNo);
    user.Click(f.cmdDelete);
    runtime.QueueAnswer(msgbox::kYes);
    user.Close(f);
  });
  EXPECT_EQ(Questions(), 1);
  EXPECT_EQ(Records(), (std::vector<std::string>{"100 R&R 1.5"}));
}

TEST_F(LostWorkTest, AHostRecordSetWithoutAFieldTheEditorWritesIsRefusedWhole) {
  // A host's record set that lacks "subquote": no line can be kept.
  quote = std::make_shared<data::Recordset>();
  for (const char* f :
       {"ITEMID", "DELITEM", "tag", "qtnno", "itemno", "script", "Category", "rrhour", "rahour",
        "pthour", "report_on", "blend", "allow_tick", "Rev", "rr_rate2", "partno"})
    quote->Fields().Append(f, std::string(f) == "ITEMID" ? data::DataType::Integer
                                                         : data::DataType::Variant);
  quote->Open();
  quote->AddNew();
  for (auto [field, value] :
       std::initializer_list<std::pair<const char*, data::Value>>{{"ITEMID", int32_t{1}},
                                                                  {"DELITEM", false},
                                                                  {"tag", "1"},
                                                                  {"qtnno", "Q1001"},
                                                                  {"itemno", "100"},
                                                                  {"script", "BONNET R&I"},
                                                                  {"Category", "R&R"},
                                                                  {"rrhour", 1.5},
                                                                  {"allow_tick", "7"},
                                                                  {"rr_rate2", 55.0}})
    quote->Collect(field, value);
  Stored();
  Open(eEdit, [&](frmLabour& f) {
    user.ClickCell(f.FGSelectedLabour, 1, col::kPTHours);
    user.Type("2");
    user.PressKey(keys::kEnter);
    user.Click(f.cmdClose);
    EXPECT_TRUE(f.Visible());
    ASSERT_EQ(runtime.UnhandledErrors().size(), 1u);
    EXPECT_NE(runtime.UnhandledErrors()[0].description.find("subquote"), std::string::npos);
    runtime.Reset();
    runtime.QueueAnswer(msgbox::kNo);
  });
  EXPECT_EQ(quote->StoredStatus(0), data::RecordStatus::Unchanged);
  EXPECT_EQ(quote->RecordCount(), 1);
}

} // namespace
} // namespace belvane::test
