#pragma once
// One modal session of an editor, as both editors' SetQuoteNo runs it: the
// call is refused while the editor is open, the status box stays up until
// the session ends (however it ends), and the session unloads only a form
// it loaded itself.

#include <string>

namespace belvane::forms {
class Form;
}

namespace belvane::editor {

// Raises error 400 when the editor is loaded already (a host calling again
// from inside the editor's own session), before anything of the open
// session is touched.
void RefuseWhileLoaded(const forms::Form& form, bool loadedFlag, const std::string& editorName,
                       const char* source);

// Shows the status box with a message; unloads it when the scope ends, also
// when it ends in an error, so the hourglass never outlives the editor.
class StatusBoxScope {
public:
  explicit StatusBoxScope(const std::string& message);
  ~StatusBoxScope();
  StatusBoxScope(const StatusBoxScope&) = delete;
  StatusBoxScope& operator=(const StatusBoxScope&) = delete;
  // Unloads the status box now.
  void Close();
};

// Shows the form modally. A session that fails (a desktop refusing the
// window, say) or that the desktop ends without unloading the form leaves
// no editor loaded behind it for a save call to reach. Call it only on a
// form that is not loaded (see RefuseWhileLoaded).
void RunModalSession(forms::Form& form);

} // namespace belvane::editor
