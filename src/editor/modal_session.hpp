#pragma once
// One modal session of an editor, as both editors' SetQuoteNo runs it: the
// call is refused while the editor is open, the status box stays up until
// the session ends (however it ends), and the session unloads only a form
// it loaded itself.

#include <functional>
#include <string>
#include <vector>

namespace belvane::data {
class Recordset;
}
namespace belvane::grid {
class FlexGrid;
}
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

// The data rows of a grid, one tab-separated text per row: the lines as
// loaded, to compare with when the window closes.
std::vector<std::string> GridRowTexts(const grid::FlexGrid& grid);

// The estimator changed the lines since they were loaded: a stored line is
// on the removed-items list, or a row's texts differ from the snapshot.
bool LinesChanged(const grid::FlexGrid& grid, const std::vector<std::string>& loaded,
                  const data::Recordset* removed);

// Closing the window otherwise than by Close, with edits in hand: asks
// `question` (Yes, No, Cancel; No by default, so a session ended without an
// answer closes without writing, as the close box always did). Yes runs
// `write`; Cancel, or a write that is refused (its error goes on to the
// caller), keeps the window open (cancel = 1).
void AskBeforeDiscarding(const std::string& question, const std::string& title,
                         const std::function<void()>& write, int& cancel);

} // namespace belvane::editor
