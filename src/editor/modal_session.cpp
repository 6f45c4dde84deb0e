#include "editor/modal_session.hpp"

#include "forms/form.hpp"
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

} // namespace belvane::editor
