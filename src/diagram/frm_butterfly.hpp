#pragma once
// frmButterfly: the vehicle diagram window ("Search Parts"). It shows a page
// of the graphics folder in its web browser wb1: "butterfly.html", a
// clickable drawing of the vehicle, or "nobutterfly.html", the panel groups
// as buttons, for makes without a drawing. The page does the picking and
// hands back one text through its input element "event_trap": the form
// traps that element's click, keeps the text and hides. The form knows
// nothing of panels, groups or who asked.
//
// A caller (the parts editor's group search):
//
//     diagram::frmButterfly& diagram = diagram::ButterflyForm();
//     diagram.ShowForm(hasDiagram);          // modal; returns when done
//     if (diagram.mbSearchGroup) search(diagram.msSearchStr);
//
// and, as it unloads itself, diagram::UnloadButterflyForm(), which unloads
// the thread's diagram window if it was ever made and creates none.
//
// The graphics folder is the machine-wide setting "GraphicsPath" of
// application "tessik", section "frmsplash" (registry.hpp); without one it
// is DefaultGraphicsFolder(). The folder text is joined to the page's file
// name as it stands, so it ends with a separator.

#include "forms/controls.hpp"
#include "forms/form.hpp"

#include <memory>
#include <string>

namespace belvane::diagram {

class frmButterfly : public forms::Form {
public:
  frmButterfly();
  ~frmButterfly() override;

  // Keeps the flag (a drawing exists for the vehicle) and shows the window
  // modally; returns when the window is hidden or closed. The first call
  // loads the window and its page; later ones show the page already loaded.
  void ShowForm(bool pbEnableButterfly);

  // The answer, read after ShowForm: the group text picked on the page
  // (empty when nothing was picked), and whether a group was picked.
  std::string msSearchStr;
  bool mbSearchGroup = false;

  forms::WebBrowser wb1{*this, "wb1"};

  // The page file names, and the setting that locates their folder.
  static constexpr const char* kDiagramPage = "butterfly.html";
  static constexpr const char* kNoDiagramPage = "nobutterfly.html";

protected:
  void Design() override;
  void Form_Load() override;
  void Form_Activate() override;
  void Form_Unload(int& cancel) override;

private:
  void wb1_DownloadComplete();
  bool mInputTag_onclick();
  void Unbind();

  bool mbEnableButterfly = false;
  std::shared_ptr<forms::HtmlDocument> mDocument;
  forms::HtmlElement* mInputTag = nullptr;
};

// The calling thread's diagram window, created on first use and kept.
frmButterfly& ButterflyForm();
// The calling thread's diagram window if it was ever created, else nullptr.
frmButterfly* ButterflyFormIfCreated() noexcept;
// Unloads the calling thread's diagram window when it exists and is
// loaded; creates nothing.
void UnloadButterflyForm();

} // namespace belvane::diagram
