#pragma once
// A form whose every control logs its events, for checking event order.

#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/runtime.hpp"

#include <string>
#include <vector>

namespace belvane::forms::testing {

class ProbeForm : public Form {
public:
  TextBox txtA{*this, "txtA"};
  TextBox txtB{*this, "txtB"};
  Label lblInfo{*this, "lblInfo"};
  CommandButton cmdOk{*this, "cmdOk"};
  CheckBox chkFlag{*this, "chkFlag"};
  ControlArray<OptionButton, 3> optKind{*this, "optKind"};
  Frame fraSearch{*this, "fraSearch"};
  TextBox txtInFrame{*this, "txtInFrame"};
  OptionButton optInFrame{*this, "optInFrame"};
  FlexGrid fgLines{*this, "fgLines"};
  ListView lvTypes{*this, "lvTypes"};

  std::vector<std::string> log;

  ProbeForm() : Form("frmProbe") {
    for (Control* c : Controls())
      Wire(*c);
    txtA.OnChange = [this] { Log(txtA, "Change"); };
    txtB.OnChange = [this] { Log(txtB, "Change"); };
    fgLines.OnEnterCell = [this] { Log(fgLines, "EnterCell"); };
    fgLines.OnLeaveCell = [this] { Log(fgLines, "LeaveCell"); };
    fgLines.OnScroll = [this] { Log(fgLines, "Scroll"); };
    lvTypes.OnItemClick = [this](int index) {
      log.push_back("lvTypes_ItemClick(" + std::to_string(index) + ")");
    };
  }

  void Log(const Control& c, const std::string& event) {
    std::string name = c.Name();
    if (c.Index() >= 0) name += "(" + std::to_string(c.Index()) + ")";
    log.push_back(name + "_" + event);
  }

protected:
  void Design() override {
    txtInFrame.Container(&fraSearch);
    optInFrame.Container(&fraSearch);
    fgLines.Cols(3);
    fgLines.Rows(6);
    fgLines.Move(0, 0, 3000, 7 * 240);
    for (int c = 0; c < 3; ++c)
      fgLines.ColWidth(c, 1000);
    lvTypes.AddItem("New(Space)");
    lvTypes.AddItem("Used(U)");
    lvTypes.AddItem("eXchange(X)");
  }

private:
  void Wire(Control& c) {
    c.OnGotFocus = [this, &c] { Log(c, "GotFocus"); };
    c.OnLostFocus = [this, &c] { Log(c, "LostFocus"); };
    c.OnClick = [this, &c] { Log(c, "Click"); };
    c.OnDblClick = [this, &c] { Log(c, "DblClick"); };
    c.OnKeyDown = [this, &c](int& key, int) { Log(c, "KeyDown(" + std::to_string(key) + ")"); };
    c.OnKeyUp = [this, &c](int& key, int) { Log(c, "KeyUp(" + std::to_string(key) + ")"); };
    c.OnKeyPress = [this, &c](int& ascii) { Log(c, "KeyPress(" + std::to_string(ascii) + ")"); };
    c.OnMouseDown = [this, &c](int button, int, int, int) {
      Log(c, "MouseDown(" + std::to_string(button) + ")");
    };
    c.OnMouseUp = [this, &c](int button, int, int, int) {
      Log(c, "MouseUp(" + std::to_string(button) + ")");
    };
  }
};

} // namespace belvane::forms::testing
