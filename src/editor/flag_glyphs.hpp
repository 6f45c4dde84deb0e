#pragma once
// The flag cells of both editors: "R" for a ticked box and "£" for an empty
// one, drawn in the flag font where the two characters show as boxes.

#include <string>

namespace belvane::editor {

inline constexpr const char* kTicked = "R";   // a ticked flag
inline constexpr const char* kUnticked = "£"; // an empty flag
inline constexpr const char* kFlagFont = "Wingdings 2";
inline constexpr double kFlagFontSize = 12;

// "R" gives "£", "£" gives "R", anything else "".
std::string ToggleFlagGlyph(const std::string& glyph);
// "R" gives "Yes", "£" gives "No", anything else "" (for tool tips).
std::string FlagGlyphToYesNo(const std::string& glyph);

} // namespace belvane::editor
