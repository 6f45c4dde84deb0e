// Pictures of windows for the documentation and for the scripted demo.
#include "qt/qt_runtime.hpp"

#include <QPainter>
#include <QPixmap>
#include <QWidget>

namespace belvane::qt {

QImage WindowPicture(QWidget& window) {
  const QImage client = window.grab().toImage();
  const int border = 1;
  QFont titleFont = window.font();
  titleFont.setBold(true);
  const int titleHeight = QFontMetrics(titleFont).height() + 8;
  QImage picture(client.width() + 2 * border, client.height() + titleHeight + 2 * border,
                 QImage::Format_ARGB32);
  const QPalette palette = window.palette();
  picture.fill(palette.color(QPalette::Dark));
  QPainter painter(&picture);
  const QRect title(border, border, client.width(), titleHeight);
  painter.fillRect(title, palette.color(QPalette::Highlight));
  painter.setFont(titleFont);
  painter.setPen(palette.color(QPalette::HighlightedText));
  painter.drawText(title.adjusted(6, 0, -6, 0), Qt::AlignLeft | Qt::AlignVCenter,
                   window.windowTitle());
  painter.drawImage(border, border + titleHeight, client);
  return picture;
}

} // namespace belvane::qt
