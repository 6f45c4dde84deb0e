#include "error_number.hpp"
#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/input.hpp"
#include "forms/runtime.hpp"
#include "forms/simulated_user.hpp"
#include "text/error.hpp"

#include <gtest/gtest.h>

#include <thread>

using namespace belvane::forms;
using Log = std::vector<std::string>;

namespace {

// A form that logs its hooks and keeps a little state in its controls.
class frmDialog : public Form {
public:
  explicit frmDialog(std::string name = "frmDialog") : Form(std::move(name)) {
    cmdClose.OnClick = [this] { Unload(); };
    cmdHide.OnClick = [this] { Hide(); };
  }
  TextBox txtName{*this, "txtName"};
  CommandButton cmdClose{*this, "cmdClose"};
  CommandButton cmdHide{*this, "cmdHide"};
  FlexGrid fgItems{*this, "fgItems"};

  Log log;
  int cancelQueryUnload = 0;
  bool failLoad = false;

protected:
  void Design() override {
    log.push_back("Design");
    Caption("Dialog");
    txtName.Text("designed");
    fgItems.Cols(3);
  }
  void Form_Load() override {
    log.push_back("Load");
    fgItems.AddItem("1\tfirst");
    if (failLoad) throw belvane::Error(3021, "No current record", "frmDialog");
  }
  void Form_Activate() override { log.push_back("Activate"); }
  void Form_QueryUnload(int& cancel, int mode) override {
    log.push_back("QueryUnload(" + std::to_string(mode) + ")");
    cancel = cancelQueryUnload;
  }
  void Form_Unload(int&) override { log.push_back("Unload"); }
};

class FormLifecycle : public ::testing::Test {
protected:
  void SetUp() override { headless().Reset(); }
  static HeadlessRuntime& headless() { return ThreadHeadlessRuntime(); }
  SimulatedUser user;
};

using belvane::test::ErrorNumber;

} // namespace

TEST_F(FormLifecycle, ModalShowLoadsRunsTheScriptAndReturnsWhenUnloaded) {
  frmDialog form;
  bool scriptRan = false;
  headless().QueueModal([&](Form& shown) {
    scriptRan = true;
    EXPECT_EQ(&shown, &form);
    EXPECT_TRUE(form.Visible());
    EXPECT_TRUE(form.IsModal());
    EXPECT_TRUE(form.txtName.HasFocus()); // the first control took the focus
    EXPECT_EQ(form.log, (Log{"Design", "Load", "Activate"}));
    user.Type("!");
    EXPECT_EQ(form.txtName.Text(), "!designed");
    user.Click(form.cmdClose);
  });
  form.Show(ShowStyle::Modal);
  EXPECT_TRUE(scriptRan);
  EXPECT_FALSE(form.Loaded());
  EXPECT_FALSE(form.Visible());
  EXPECT_FALSE(form.IsModal());
  EXPECT_EQ(form.log, (Log{"Design", "Load", "Activate", "QueryUnload(1)", "Unload"}));
  ASSERT_EQ(headless().Sessions().size(), 1u);
  EXPECT_TRUE(headless().Sessions()[0].scripted);
  EXPECT_FALSE(headless().Sessions()[0].closedByCloseBox);
  // Unloaded: the controls are back to their construction state.
  EXPECT_EQ(form.txtName.Text(), "");
  EXPECT_EQ(form.fgItems.Rows(), 2);
  EXPECT_EQ(form.fgItems.Cols(), 2);
}

TEST_F(FormLifecycle, AFormTheScriptLeavesOpenIsClosedByItsCloseBox) {
  frmDialog form;
  headless().QueueModal([&](Form&) { user.Type("x"); });
  form.Show(ShowStyle::Modal);
  EXPECT_FALSE(form.Loaded());
  EXPECT_EQ(form.log.back(), "Unload");
  EXPECT_EQ(form.log.at(form.log.size() - 2), "QueryUnload(0)");
  EXPECT_TRUE(headless().Sessions().back().closedByCloseBox);

  form.log.clear(); // no script at all: closed at once
  form.Show(ShowStyle::Modal);
  EXPECT_EQ(form.log, (Log{"Design", "Load", "Activate", "QueryUnload(0)", "Unload"}));
  EXPECT_FALSE(headless().Sessions().back().scripted);
}

TEST_F(FormLifecycle, HideEndsTheModalCallAndKeepsTheFormLoaded) {
  frmDialog form;
  headless().QueueModal([&](Form&) {
    user.Type("kept ");
    user.Click(form.cmdHide);
    EXPECT_FALSE(user.Type("lost")); // hidden: no more input
  });
  form.Show(ShowStyle::Modal);
  EXPECT_TRUE(form.Loaded());
  EXPECT_FALSE(form.Visible());
  EXPECT_EQ(form.txtName.Text(), "kept designed");
  EXPECT_FALSE(headless().Sessions().back().closedByCloseBox);

  form.log.clear();
  headless().QueueModal([&](Form&) { user.Click(form.cmdClose); });
  form.Show(ShowStyle::Modal); // loaded already: no Design or Load
  EXPECT_EQ(form.log, (Log{"Activate", "QueryUnload(1)", "Unload"}));

  form.log.clear();
  headless().QueueModal([&](Form&) {
    EXPECT_EQ(form.txtName.Text(), "designed"); // afresh from the design
    EXPECT_EQ(form.fgItems.Rows(), 3);
  });
  form.Show(ShowStyle::Modal);
  EXPECT_EQ(form.log.front(), "Design");
}

TEST_F(FormLifecycle, CancelledUnloadKeepsTheFormButTheModalCallStillEnds) {
  frmDialog form;
  form.cancelQueryUnload = 1;
  headless().QueueModal([&](Form&) {
    user.Click(form.cmdClose);
    EXPECT_TRUE(form.Visible()); // refused by QueryUnload
  });
  form.Show(ShowStyle::Modal);
  EXPECT_TRUE(form.Loaded());
  EXPECT_FALSE(form.Visible());
  EXPECT_EQ(ErrorNumber([&] {
              form.Show();
              form.Show(ShowStyle::Modal);
            }),
            kFormAlreadyDisplayed);
  form.cancelQueryUnload = 0;
  form.Unload();
  EXPECT_FALSE(form.Loaded());
}

TEST_F(FormLifecycle, AFailedLoadPassesItsErrorOnAndLeavesTheFormUnloaded) {
  frmDialog form;
  form.failLoad = true;
  EXPECT_EQ(ErrorNumber([&] { form.Show(ShowStyle::Modal); }), 3021);
  EXPECT_FALSE(form.Loaded());
  EXPECT_FALSE(form.Visible());
  EXPECT_EQ(form.log, (Log{"Design", "Load", "Unload"}));
  EXPECT_TRUE(headless().Sessions().empty());
  EXPECT_EQ(form.fgItems.Rows(), 2); // the half-filled grid is gone
  form.failLoad = false;
  form.Show(ShowStyle::Modal);
  EXPECT_EQ(form.log.at(3), "Design");
}

TEST_F(FormLifecycle, NestedModalFormsTakeTheirScriptsInOrder) {
  frmDialog outer("frmOuter");
  frmDialog inner("frmInner");
  outer.cmdHide.OnClick = [&] { inner.Show(ShowStyle::Modal); };
  Log order;
  headless().QueueModal([&](Form& f) {
    order.push_back(f.Name());
    user.Click(outer.cmdHide); // opens the inner form
    order.push_back("outer again");
    EXPECT_TRUE(user.Type("x"));
  });
  headless().QueueModal([&](Form& f) {
    order.push_back(f.Name());
    EXPECT_FALSE(user.Click(outer.cmdClose)); // under a modal form: refused
    EXPECT_EQ(Screen.ActiveForm(), &inner);
    user.Close(inner);
  });
  outer.Show(ShowStyle::Modal);
  EXPECT_EQ(order, (Log{"frmOuter", "frmInner", "outer again"}));
  EXPECT_EQ(outer.log.at(3), "Activate"); // active again once the inner form closed
  EXPECT_EQ(headless().Sessions().size(), 2u);
}

TEST_F(FormLifecycle, AScriptThatThrowsClosesItsFormAndPassesTheErrorOn) {
  frmDialog form;
  headless().QueueModal([](Form&) { throw std::runtime_error("script failed"); });
  EXPECT_THROW(form.Show(ShowStyle::Modal), std::runtime_error);
  EXPECT_FALSE(form.Loaded());
  EXPECT_EQ(Screen.ActiveForm(), nullptr);
}

TEST_F(FormLifecycle, MessageBoxesAreRecordedAndAnswered) {
  EXPECT_EQ(MsgBox("No labour record found", msgbox::kCritical, "Labour item search"), msgbox::kOk);
  EXPECT_EQ(MsgBox("Save?", msgbox::kYesNo), msgbox::kYes);
  EXPECT_EQ(MsgBox("Save?", msgbox::kYesNoCancel | msgbox::kDefaultButton3), msgbox::kCancel);
  headless().QueueAnswer(msgbox::kNo);
  EXPECT_EQ(MsgBox("Save?", msgbox::kYesNo | msgbox::kQuestion, "Parts"), msgbox::kNo);
  const auto& messages = headless().Messages();
  ASSERT_EQ(messages.size(), 4u);
  EXPECT_EQ(messages[0].prompt, "No labour record found");
  EXPECT_EQ(messages[0].style, 16);
  EXPECT_EQ(messages[0].title, "Labour item search");
  EXPECT_EQ(messages[3].answer, msgbox::kNo);
}

TEST_F(FormLifecycle, MousePointerAndDoEventsAreRecorded) {
  Screen.MousePointer(kPointerHourglass);
  DoEvents();
  Screen.MousePointer(kPointerDefault);
  EXPECT_EQ(headless().MousePointerHistory(), (std::vector<int>{11, 0}));
  EXPECT_EQ(Screen.MousePointer(), kPointerDefault);
  EXPECT_EQ(headless().DoEventsCount(), 1);
}

TEST_F(FormLifecycle, EachThreadHasItsOwnRuntimeAndAHostMayInstallOne) {
  std::thread other([] {
    MsgBox("from another thread");
    EXPECT_EQ(ThreadHeadlessRuntime().Messages().size(), 1u);
  });
  other.join();
  EXPECT_TRUE(headless().Messages().empty());

  struct HostRuntime : Runtime {
    std::vector<std::string> calls;
    void RunModal(Form& form) override {
      calls.push_back("modal " + form.Name());
      form.Unload();
    }
    int MessageBox(const std::string& prompt, int, const std::string&) override {
      calls.push_back("box " + prompt);
      return msgbox::kCancel;
    }
    void UnhandledError(const std::string&, long, const std::string&) override {}
  } host;
  {
    ScopedRuntime scoped(host);
    EXPECT_EQ(MsgBox("hello", msgbox::kOkCancel), msgbox::kCancel);
    frmDialog form;
    form.Show(ShowStyle::Modal);
    EXPECT_FALSE(form.Loaded());
  }
  EXPECT_EQ(host.calls, (Log{"box hello", "modal frmDialog"}));
  EXPECT_EQ(&CurrentRuntime(), &headless());
}
