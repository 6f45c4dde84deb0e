#pragma once
// Twips to pixels. The models measure in twips, 1440 to the inch; the views
// draw at the screen's resolution. The scale is the screen's dots per inch,
// rounded so that a standard grid row (240 twips) is a whole number of
// pixels: every row of a grid then starts on the pixel its twip position
// gives, and an editor laid over a cell by the model's geometry lands on
// the cell exactly.

#include <QPoint>
#include <QRect>

namespace belvane::qt {

class Scale {
public:
  // At the given dots per inch (96 gives 15 twips to the pixel).
  explicit Scale(double dotsPerInch = 96.0);

  // Pixels of a length in twips, rounded to the nearest pixel.
  int Pixels(int twips) const;
  // Twips of a length in pixels.
  int Twips(int pixels) const;
  // The pixel length of the twip span [from, from + length): the difference
  // of the two rounded edges, so spans laid end to end tile without gaps.
  int Span(int from, int length) const { return Pixels(from + length) - Pixels(from); }
  // The pixel rectangle of a twip rectangle whose origin lies at `originX`,
  // `originY` twips inside the window, relative to that origin's pixel.
  QRect Rect(int originX, int originY, int left, int top, int width, int height) const;

  int RowPixels() const noexcept { return rowPixels_; }
  double DotsPerInch() const noexcept { return rowPixels_ * 6.0; }

private:
  int rowPixels_; // pixels of 240 twips
};

// The scale of the primary screen (96 dots per inch without one).
Scale ScreenScale();

} // namespace belvane::qt
