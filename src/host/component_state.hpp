#pragma once
// The component's state, once per thread: which editors are loaded, and the
// status box. Every thread that uses the component has its own copy, as the
// host's apartment threads each have theirs.

namespace belvane {

// View or edit: how an editor is opened.
enum EQuoteEditMode : long { eView = 0, eEdit = 1 };

namespace host {

class frmStatus;

// True from the labour editor's load to its unload on this thread.
extern thread_local bool gbLabourFormLoaded;
// True from the parts editor's load to its unload on this thread.
extern thread_local bool gbPartsFormLoaded;

// The thread's status box, created on first use and kept.
frmStatus& StatusBox();

} // namespace host
} // namespace belvane
