#include "qt/scale.hpp"

#include <QGuiApplication>
#include <QScreen>

#include <algorithm>
#include <cmath>

namespace belvane::qt {

namespace {
constexpr int kRowTwips = 240;
}

Scale::Scale(double dotsPerInch)
    : rowPixels_(std::max(1, static_cast<int>(std::lround(dotsPerInch * kRowTwips / 1440.0)))) {}

int Scale::Pixels(int twips) const {
  return static_cast<int>(std::lround(static_cast<double>(twips) * rowPixels_ / kRowTwips));
}

int Scale::Twips(int pixels) const {
  return static_cast<int>(std::lround(static_cast<double>(pixels) * kRowTwips / rowPixels_));
}

QRect Scale::Rect(int originX, int originY, int left, int top, int width, int height) const {
  const int x = Pixels(originX + left) - Pixels(originX);
  const int y = Pixels(originY + top) - Pixels(originY);
  return QRect(x, y, Span(originX + left, width), Span(originY + top, height));
}

Scale ScreenScale() {
  const QScreen* screen = QGuiApplication::primaryScreen();
  return Scale(screen ? screen->logicalDotsPerInchY() : 96.0);
}

} // namespace belvane::qt
