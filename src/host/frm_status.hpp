#pragma once
// frmStatus: the small modeless window that says an editor is opening while
// it loads its grids. While it is shown the mouse pointer is the hourglass;
// unloading it always puts the default pointer back.

#include "forms/controls.hpp"
#include "forms/form.hpp"

#include <string>

namespace belvane::host {

// The messages the editors show in the status box while they open.
inline constexpr const char* kOpeningLabour = "Opening Labour...";
inline constexpr const char* kOpeningParts = "Opening Parts...";

class frmStatus : public forms::Form {
public:
  forms::Frame frStatus{*this, "frStatus"};
  forms::Label lblMsg{*this, "lblMsg"};

  frmStatus();

  // Hourglass on; loads the window if needed. When the window is not
  // visible yet: sets the message, shows it modeless in front and yields
  // once so it paints. When it is visible already the message stays.
  void ShowStatusBox(const std::string& strMsg);
  // Sets the message and repaints at once.
  void ChangeStatusText(const std::string& psMsg);
  // Unloads the window.
  void HideStatusBox();

protected:
  void Design() override;
  void Form_Load() override;
  void Form_Unload(int& cancel) override;
};

} // namespace belvane::host
