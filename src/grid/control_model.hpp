#pragma once
// The properties every control shares, the grid included: position and size
// (twips, relative to the container), visibility, enabled state, tag, tool
// tip, font, colours and the stacking order among siblings. The forms layer
// adds focus, keys and clicks on top of this model.

#include "grid/observable.hpp"

#include <cstdint>
#include <string>

namespace belvane::grid {

// Colours are BGR values: 0x0000FF is red, 0xFF0000 blue.
using Color = std::uint32_t;
inline constexpr Color kBlack = 0x000000;
inline constexpr Color kWhite = 0xFFFFFF;
inline constexpr Color kGrey = 0x808080;
inline constexpr Color kYellow = 0x00FFFF;
inline constexpr Color kCyan = 0xFFFF00;
inline constexpr Color kButtonFace = 0xF0F0F0;

// Error number of a property given a value it cannot take.
inline constexpr long kInvalidPropertyValue = 380;

class ControlModel : public Observable {
public:
  ControlModel();

  int Left() const noexcept { return state_.left; }
  int Top() const noexcept { return state_.top; }
  int Width() const noexcept { return state_.width; }
  int Height() const noexcept { return state_.height; }
  void Left(int left);
  void Top(int top);
  void Width(int width);
  void Height(int height);
  // Sets position and size at once; one notice. A negative width or height
  // keeps the current one.
  void Move(int left, int top, int width = -1, int height = -1);

  bool Visible() const noexcept { return state_.visible; }
  void Visible(bool visible);
  bool Enabled() const noexcept { return state_.enabled; }
  void Enabled(bool enabled);

  const std::string& Tag() const noexcept { return state_.tag; }
  void Tag(std::string tag);
  const std::string& ToolTipText() const noexcept { return state_.toolTip; }
  void ToolTipText(std::string text);

  const std::string& FontName() const noexcept { return state_.fontName; }
  void FontName(std::string name);
  double FontSize() const noexcept { return state_.fontSize; }
  void FontSize(double points);
  bool FontBold() const noexcept { return state_.fontBold; }
  void FontBold(bool bold);
  bool FontItalic() const noexcept { return state_.fontItalic; }
  void FontItalic(bool italic);

  Color BackColor() const noexcept { return state_.backColor; }
  void BackColor(Color color);
  Color ForeColor() const noexcept { return state_.foreColor; }
  void ForeColor(Color color);

  // Position 0 brings the control in front of its siblings, 1 sends it to the
  // back. Views stack siblings by ZOrderKey, lowest at the back; equal keys
  // keep the order in which the controls were declared.
  void ZOrder(int position = 0);
  long long ZOrderKey() const noexcept { return state_.zKey; }

  // Tells the views that the control gained or lost the keyboard focus
  // (the focus itself is kept by the forms layer).
  void AnnounceFocus(bool hasFocus);

protected:
  // Hooks for the forms layer (focus follows visibility and enabled state).
  virtual void VisibleChanged() {}
  virtual void EnabledChanged() {}

  // The defaults a control of this kind starts with and returns to on reset.
  void SetDefaultSize(int width, int height);
  void SetDefaultColors(Color back, Color fore);
  // Back to the defaults, without events; observers hear of it.
  void ResetCommon();

private:
  struct State {
    int left = 0;
    int top = 0;
    int width = 1215;
    int height = 495;
    bool visible = true;
    bool enabled = true;
    std::string tag;
    std::string toolTip;
    std::string fontName = "Tahoma";
    double fontSize = 8.25;
    bool fontBold = false;
    bool fontItalic = false;
    Color backColor = kWhite;
    Color foreColor = kBlack;
    long long zKey = 0;
  };
  State state_;
  State defaults_;
};

} // namespace belvane::grid
