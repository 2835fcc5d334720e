#include "gui/common/icons.h"

#include <QPainter>
#include <QPainterPath>
#include <QPixmap>

namespace cx::gui {

namespace {

// The list's selection colour, so the icons and the list belong together.
const QColor kAccent(64, 188, 255);
const QColor kAccentDark(22, 112, 170);
const QColor kInk(40, 48, 56);

using Painter = void (*)(QPainter&, qreal);

QIcon DrawnIcon(Painter paint) {
  QIcon icon;
  for (int size : {16, 22, 24, 32, 48, 64}) {
    QPixmap pixmap(size, size);
    pixmap.fill(Qt::transparent);
    QPainter p(&pixmap);
    p.setRenderHint(QPainter::Antialiasing);
    paint(p, size);
    p.end();
    icon.addPixmap(pixmap);
  }
  return icon;
}

void PaintCards(QPainter& p, qreal s) {
  const qreal pen = qMax<qreal>(1.0, s / 32);
  // Two cards behind, one in front with ruled lines: records in a box.
  for (int i = 2; i >= 0; --i) {
    const qreal off = i * s * 0.09;
    QRectF card(s * 0.08 + off, s * 0.30 - off, s * 0.70, s * 0.58);
    QPainterPath path;
    path.addRoundedRect(card, s * 0.07, s * 0.07);
    p.setPen(QPen(kAccentDark, pen));
    p.setBrush(i == 0 ? QColor(Qt::white) : (i == 1 ? kAccent.lighter(140) : kAccent));
    p.drawPath(path);
  }
  const QRectF front(s * 0.08, s * 0.30, s * 0.70, s * 0.58);
  p.setPen(QPen(kAccent, qMax<qreal>(1.0, s / 16), Qt::SolidLine, Qt::RoundCap));
  p.drawLine(QPointF(front.left() + s * 0.10, front.top() + s * 0.15),
             QPointF(front.right() - s * 0.10, front.top() + s * 0.15));
  p.setPen(QPen(kInk.lighter(180), qMax<qreal>(1.0, s / 24), Qt::SolidLine, Qt::RoundCap));
  for (int line = 1; line <= 2; ++line) {
    const qreal y = front.top() + s * (0.15 + 0.13 * line);
    p.drawLine(QPointF(front.left() + s * 0.10, y), QPointF(front.right() - s * 0.20, y));
  }
}

void PaintNewRecord(QPainter& p, qreal s) {
  const qreal pen = qMax<qreal>(1.0, s / 16);
  QRectF sheet(s * 0.12, s * 0.10, s * 0.58, s * 0.76);
  p.setPen(QPen(kInk, pen));
  p.setBrush(Qt::white);
  p.drawRoundedRect(sheet, s * 0.06, s * 0.06);
  p.setPen(QPen(kInk.lighter(200), pen));
  for (int line = 0; line < 3; ++line) {
    const qreal y = sheet.top() + s * (0.20 + 0.15 * line);
    p.drawLine(QPointF(sheet.left() + s * 0.10, y), QPointF(sheet.right() - s * 0.10, y));
  }
  // The plus in a disc at the corner.
  const QRectF disc(s * 0.48, s * 0.48, s * 0.48, s * 0.48);
  p.setPen(Qt::NoPen);
  p.setBrush(QColor(46, 160, 67));
  p.drawEllipse(disc);
  p.setPen(QPen(Qt::white, qMax<qreal>(1.5, s / 10), Qt::SolidLine, Qt::RoundCap));
  const QPointF c = disc.center();
  const qreal arm = s * 0.13;
  p.drawLine(QPointF(c.x() - arm, c.y()), QPointF(c.x() + arm, c.y()));
  p.drawLine(QPointF(c.x(), c.y() - arm), QPointF(c.x(), c.y() + arm));
}

void PaintBack(QPainter& p, qreal s) {
  QPainterPath arrow;
  arrow.moveTo(s * 0.10, s * 0.50);
  arrow.lineTo(s * 0.46, s * 0.16);
  arrow.lineTo(s * 0.46, s * 0.36);
  arrow.lineTo(s * 0.88, s * 0.36);
  arrow.lineTo(s * 0.88, s * 0.64);
  arrow.lineTo(s * 0.46, s * 0.64);
  arrow.lineTo(s * 0.46, s * 0.84);
  arrow.closeSubpath();
  p.setPen(QPen(kAccentDark, qMax<qreal>(1.0, s / 20), Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
  p.setBrush(kAccent);
  p.drawPath(arrow);
}

}  // namespace

QImage AppIconImage(int size) {
  QImage image(size, size, QImage::Format_ARGB32_Premultiplied);
  image.fill(Qt::transparent);
  QPainter p(&image);
  p.setRenderHint(QPainter::Antialiasing);
  PaintCards(p, size);
  return image;
}

QIcon AppIcon() { return DrawnIcon(&PaintCards); }
QIcon NewRecordIcon() { return DrawnIcon(&PaintNewRecord); }
QIcon BackIcon() { return DrawnIcon(&PaintBack); }

QImage CheckBoxImage(bool checked, qreal scale) {
  const int side = qRound(13 * scale);
  QImage image(side, side, QImage::Format_ARGB32_Premultiplied);
  image.setDevicePixelRatio(scale);
  image.fill(Qt::white);
  QPainter p(&image);
  // A one-pixel dark frame on white, like a classic check box.
  p.setPen(QPen(QColor(64, 64, 64), 1.0));
  p.setBrush(Qt::NoBrush);
  p.drawRect(QRectF(0.5, 0.5, 12, 12));
  if (checked) {
    p.setRenderHint(QPainter::Antialiasing);
    p.setPen(QPen(Qt::black, 2.0, Qt::SolidLine, Qt::SquareCap, Qt::MiterJoin));
    QPainterPath tick;
    tick.moveTo(3.0, 6.5);
    tick.lineTo(5.5, 9.0);
    tick.lineTo(10.0, 3.5);
    p.drawPath(tick);
  }
  return image;
}

}  // namespace cx::gui
