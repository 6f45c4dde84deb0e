#include "editor/flag_glyphs.hpp"

namespace belvane::editor {

std::string ToggleFlagGlyph(const std::string& glyph) {
  if (glyph == kTicked) return kUnticked;
  if (glyph == kUnticked) return kTicked;
  return "";
}

std::string FlagGlyphToYesNo(const std::string& glyph) {
  if (glyph == kTicked) return "Yes";
  if (glyph == kUnticked) return "No";
  return "";
}

} // namespace belvane::editor
