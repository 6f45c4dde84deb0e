#include "host/frm_status.hpp"

#include "forms/runtime.hpp"
#include "host/component_state.hpp"

#include <memory>

namespace belvane::host {

thread_local bool gbLabourFormLoaded = false;
thread_local bool gbPartsFormLoaded = false;

frmStatus& StatusBox() {
  thread_local std::unique_ptr<frmStatus> instance;
  if (!instance) instance = std::make_unique<frmStatus>();
  return *instance;
}

frmStatus::frmStatus() : Form("frmStatus") { lblMsg.Container(&frStatus); }

void frmStatus::Design() {
  Caption("");
  FontName("Tahoma");
  FontSize(9.75);
  ScaleWidth(3975);
  ScaleHeight(945);
  frStatus.Move(120, 0, 3735, 855);
  lblMsg.Move(120, 360, 3495, 255);
  lblMsg.FontName("Tahoma");
  lblMsg.FontSize(8.25);
}

void frmStatus::Form_Load() { forms::DoEvents(); }

void frmStatus::Form_Unload(int& /*cancel*/) { forms::Screen.MousePointer(forms::kPointerDefault); }

void frmStatus::ShowStatusBox(const std::string& strMsg) {
  forms::Screen.MousePointer(forms::kPointerHourglass);
  if (!Loaded()) Load();
  if (!Visible()) {
    lblMsg.Caption(strMsg);
    Show(forms::ShowStyle::Modeless);
    ZOrder(0);
    forms::DoEvents();
  }
}

void frmStatus::ChangeStatusText(const std::string& psMsg) {
  lblMsg.Caption(psMsg);
  Refresh();
}

void frmStatus::HideStatusBox() { Unload(); }

} // namespace belvane::host
