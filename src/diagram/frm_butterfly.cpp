#include "diagram/frm_butterfly.hpp"

#include "diagram/registry.hpp"
#include "text/strings.hpp"

namespace belvane::diagram {

frmButterfly::frmButterfly() : Form("frmButterfly") {
  wb1.OnDownloadComplete = [this] { wb1_DownloadComplete(); };
}

frmButterfly::~frmButterfly() { Unbind(); }

void frmButterfly::ShowForm(bool pbEnableButterfly) {
  mbEnableButterfly = pbEnableButterfly;
  Show(forms::ShowStyle::Modal);
}

void frmButterfly::Design() {
  Caption("Search Parts");
  // 760 by 560 pixels at 96 dots per inch: the drawing and its cancel
  // button are readable whole, without scrolling.
  ScaleWidth(11400);
  ScaleHeight(8400);
  wb1.Move(0, 0, 11400, 8400);
}

void frmButterfly::Form_Load() {
  mbSearchGroup = false;
  const std::string folder =
      GetMachineSetting("tessik", "frmsplash", "GraphicsPath", DefaultGraphicsFolder());
  const std::string page = folder + (mbEnableButterfly ? kDiagramPage : kNoDiagramPage);
  wb1.Navigate(page);
}

void frmButterfly::Form_Activate() {
  msSearchStr.clear();
  mbSearchGroup = false;
}

void frmButterfly::Form_Unload(int& /*cancel*/) {
  // The page goes with the browser's state; its trap is no longer ours.
  Unbind();
}

// After every completed download: hold the page and trap the clicks of its
// "event_trap" input. A page without one (or whose "event_trap" is not an
// input element, which cannot be trapped) leaves nothing bound: the user
// can only close the window.
void frmButterfly::wb1_DownloadComplete() {
  Unbind();
  mDocument = wb1.DocumentHandle();
  if (!mDocument) return;
  forms::HtmlElement* element = mDocument->Find("event_trap");
  if (!element || element->TagName() != "input") return;
  mInputTag = element;
  mInputTag->OnClick = [this] { return mInputTag_onclick(); };
}

bool frmButterfly::mInputTag_onclick() {
  const std::string v = mInputTag ? mInputTag->Value() : std::string();
  if (text::LCase(v) != "cancel") {
    mbSearchGroup = true;
    msSearchStr = v;
  } else {
    msSearchStr.clear();
    mbSearchGroup = false;
  }
  Hide();
  return false; // the element's own action does not run
}

void frmButterfly::Unbind() {
  if (mInputTag) mInputTag->OnClick = nullptr;
  mInputTag = nullptr;
  mDocument.reset();
}

// ---- the thread's instance ----

namespace {
thread_local std::unique_ptr<frmButterfly> instance;
}

frmButterfly& ButterflyForm() {
  if (!instance) instance = std::make_unique<frmButterfly>();
  return *instance;
}

frmButterfly* ButterflyFormIfCreated() noexcept { return instance.get(); }

void UnloadButterflyForm() {
  if (instance && instance->Loaded()) instance->Unload();
}

} // namespace belvane::diagram
