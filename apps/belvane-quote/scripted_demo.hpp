#pragma once
// The scripted demo: a short session played with real keys and clicks on
// the real windows (on the offscreen platform where there is no display).
// It opens a quote's labour editor, adds a catalogue item and types its
// hours, ticks a flag, searches, deletes a line and closes, then looks at
// the quote in view mode. It prints each step and the quote before and
// after, and saves a picture of every window it meets in `folder`.

#include <ostream>
#include <string>

namespace belvane::qt {
class QtRuntime;
}

namespace belvane::quote {

class QuoteWindow;

// Returns the process exit status: 0 when every step did what it should.
int RunScriptedDemo(QuoteWindow& window, qt::QtRuntime& runtime, const std::string& folder,
                    std::ostream& out);

} // namespace belvane::quote
