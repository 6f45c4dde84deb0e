#include "editor/modal_session.hpp"

#include "data/recordset.hpp"
#include "forms/form.hpp"
#include "forms/runtime.hpp"
#include "grid/flex_grid.hpp"
#include "host/component_state.hpp"
#include "host/frm_status.hpp"
#include "text/error.hpp"

namespace belvane::editor {

void RefuseWhileLoaded(const forms::Form& form, bool loadedFlag, const std::string& editorName,
                       const char* source) {
  if (form.Loaded() || loadedFlag)
    throw Error(forms::kFormAlreadyDisplayed,
                "The " + editorName + " is already open; close it before opening it again", source);
}

StatusBoxScope::StatusBoxScope(const std::string& message) {
  host::StatusBox().ShowStatusBox(message);
}

StatusBoxScope::~StatusBoxScope() { Close(); }

void StatusBoxScope::Close() {
  host::frmStatus& box = host::StatusBox();
  if (box.Loaded()) box.Unload();
}

void RunModalSession(forms::Form& form) {
  try {
    form.Show(forms::ShowStyle::Modal);
  } catch (...) {
    if (form.Loaded()) {
      try {
        form.Unload();
      } catch (...) {
      }
    }
    throw;
  }
  // A window the desktop hid without unloading it (the estimator cancelled
  // the close box, then the session was ended) is unloaded here.
  if (form.Loaded()) form.Unload();
}

std::vector<std::string> GridRowTexts(const grid::FlexGrid& g) {
  std::vector<std::string> rows;
  rows.reserve(static_cast<size_t>(g.Rows()));
  for (int r = 1; r < g.Rows(); ++r) {
    std::string row;
    for (int c = 0; c < g.Cols(); ++c) {
      if (c) row += '\t';
      row += g.TextView(r, c);
    }
    rows.push_back(std::move(row));
  }
  return rows;
}

bool LinesChanged(const grid::FlexGrid& g, const std::vector<std::string>& loaded,
                  const data::Recordset* removed) {
  if (removed && removed->State() == data::adStateOpen && removed->RecordCount() > 0) return true;
  return GridRowTexts(g) != loaded;
}

void AskBeforeDiscarding(const std::string& question, const std::string& title,
                         const std::function<void()>& write, int& cancel) {
  const int answer = forms::MsgBox(question,
                                   forms::msgbox::kYesNoCancel | forms::msgbox::kQuestion |
                                       forms::msgbox::kDefaultButton2,
                                   title);
  if (answer == forms::msgbox::kCancel) {
    cancel = 1;
  } else if (answer == forms::msgbox::kYes) {
    try {
      write();
    } catch (...) {
      cancel = 1;
      throw;
    }
  }
}

} // namespace belvane::editor
