#include "ui/glyphs.h"

#include <QPainter>
#include <QPainterPath>
#include <QPixmap>

namespace quillane {
namespace {

constexpr int kSide = 20;

const QColor kInk(52, 58, 64);
const QColor kBlue(38, 110, 190);
const QColor kPaper(250, 250, 246);
const QColor kFolder(232, 186, 72);
const QColor kGreen(56, 150, 80);
const QColor kRed(200, 60, 50);

QPen InkPen(qreal width = 1.4, const QColor& color = kInk) {
  return QPen(color, width, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin);
}

// A curved arrow around (10, 10): an arc from startDeg sweeping spanDeg (counter-clockwise
// positive, as QPainterPath counts), with a head at its end.
void CurvedArrow(QPainter& p, qreal startDeg, qreal spanDeg, const QColor& color) {
  const QRectF circle(4, 4, 12, 12);
  QPainterPath arc;
  arc.arcMoveTo(circle, startDeg);
  arc.arcTo(circle, startDeg, spanDeg);
  p.setPen(InkPen(2.0, color));
  p.setBrush(Qt::NoBrush);
  p.drawPath(arc);

  const QPointF end = arc.currentPosition();
  const qreal tangentDeg = arc.angleAtPercent(1.0);
  QPainterPath head;
  head.moveTo(0, 0);
  head.lineTo(-5, -3.5);
  head.lineTo(-5, 3.5);
  head.closeSubpath();
  QTransform t;
  t.translate(end.x(), end.y());
  t.rotate(-tangentDeg);
  p.setPen(Qt::NoPen);
  p.setBrush(color);
  p.drawPath(t.map(head));
}

void StraightArrow(QPainter& p, QPointF from, QPointF to, const QColor& color) {
  p.setPen(InkPen(2.0, color));
  p.drawLine(from, to);
  QLineF line(to, from);
  QPainterPath head;
  head.moveTo(0, 0);
  head.lineTo(-5, -3.5);
  head.lineTo(-5, 3.5);
  head.closeSubpath();
  QTransform t;
  t.translate(to.x(), to.y());
  t.rotate(-line.angle() + 180);
  p.setPen(Qt::NoPen);
  p.setBrush(color);
  p.drawPath(t.map(head));
}

void Magnifier(QPainter& p, bool plus) {
  p.setPen(InkPen(1.6));
  p.setBrush(kPaper);
  p.drawEllipse(QPointF(8.5, 8.5), 5.5, 5.5);
  p.setPen(InkPen(3.0));
  p.drawLine(QPointF(12.6, 12.6), QPointF(17, 17));
  p.setPen(InkPen(1.8, kBlue));
  p.drawLine(QPointF(6, 8.5), QPointF(11, 8.5));
  if (plus) p.drawLine(QPointF(8.5, 6), QPointF(8.5, 11));
}

void Draw(QPainter& p, Glyph glyph) {
  switch (glyph) {
    case Glyph::Open: {
      p.setPen(InkPen(1.2));
      p.setBrush(kFolder.darker(115));
      p.drawRoundedRect(QRectF(2, 5, 14, 11), 1, 1);
      QPolygonF front{{4, 8.5}, {18.5, 8.5}, {16, 16}, {2, 16}};
      p.setBrush(kFolder);
      p.drawPolygon(front);
      break;
    }
    case Glyph::Save: {
      p.setPen(InkPen(1.2));
      p.setBrush(kBlue);
      p.drawRoundedRect(QRectF(3, 3, 14, 14), 1.5, 1.5);
      p.setBrush(kPaper);
      p.drawRect(QRectF(6, 3, 8, 5));
      p.setBrush(QColor(220, 225, 232));
      p.drawRect(QRectF(5.5, 11, 9, 6));
      break;
    }
    case Glyph::Renew:
      CurvedArrow(p, 100, 300, kGreen);
      break;
    case Glyph::Undo:
      CurvedArrow(p, -30, 210, kBlue);
      break;
    case Glyph::Redo:
      CurvedArrow(p, 210, -210, kBlue);
      break;
    case Glyph::ImageSize: {
      p.setPen(InkPen(1.0, QColor(120, 126, 132)));
      p.setBrush(kPaper);
      p.drawRect(QRectF(2.5, 2.5, 15, 15));
      StraightArrow(p, QPointF(6, 14), QPointF(15, 5), kInk);
      StraightArrow(p, QPointF(14, 6), QPointF(5, 15), kInk);
      break;
    }
    case Glyph::ZoomOut:
      Magnifier(p, false);
      break;
    case Glyph::ZoomIn:
      Magnifier(p, true);
      break;
    case Glyph::RotateClockwise:
      CurvedArrow(p, 180, -270, kInk);
      break;
    case Glyph::RotateAnticlockwise:
      CurvedArrow(p, 0, 270, kInk);
      break;
    case Glyph::Wallpaper: {
      p.setPen(InkPen(1.2));
      p.setBrush(QColor(150, 200, 240));
      p.drawRect(QRectF(2, 3, 16, 11));
      p.setPen(Qt::NoPen);
      p.setBrush(kGreen);
      p.drawPolygon(QPolygonF{{3, 13.4}, {8, 8}, {11, 11}, {13, 9}, {17.4, 13.4}});
      p.setBrush(kFolder);
      p.drawEllipse(QPointF(14, 6), 1.6, 1.6);
      p.setPen(InkPen(1.6));
      p.drawLine(QPointF(10, 14), QPointF(10, 17));
      p.drawLine(QPointF(6, 17.5), QPointF(14, 17.5));
      break;
    }
    case Glyph::Print: {
      p.setPen(InkPen(1.2));
      p.setBrush(kPaper);
      p.drawRect(QRectF(5.5, 2.5, 9, 6));
      p.setBrush(QColor(150, 156, 164));
      p.drawRoundedRect(QRectF(2, 7.5, 16, 7), 1.5, 1.5);
      p.setBrush(kPaper);
      p.drawRect(QRectF(5.5, 12, 9, 6));
      p.setPen(InkPen(0.8));
      p.drawLine(QPointF(7, 14.5), QPointF(13, 14.5));
      p.drawLine(QPointF(7, 16.3), QPointF(11.5, 16.3));
      break;
    }
    case Glyph::Mail: {
      p.setPen(InkPen(1.2));
      p.setBrush(kPaper);
      p.drawRect(QRectF(2, 5, 16, 11));
      p.setBrush(Qt::NoBrush);
      p.drawPolyline(QPolygonF{{2, 5}, {10, 11.5}, {18, 5}});
      p.setPen(InkPen(0.9, kRed));
      p.drawLine(QPointF(2.5, 15.5), QPointF(8, 10.5));
      p.drawLine(QPointF(17.5, 15.5), QPointF(12, 10.5));
      break;
    }
    case Glyph::ArrowDown:
    case Glyph::ArrowUp: {
      const bool down = glyph == Glyph::ArrowDown;
      p.setPen(Qt::NoPen);
      p.setBrush(kInk);
      for (int i = 0; i < 2; ++i) {
        const qreal y = down ? 5 + 6 * i : 15 - 6 * i;
        const qreal tip = down ? y + 5 : y - 5;
        p.drawPolygon(QPolygonF{{4.5, y}, {15.5, y}, {10, tip}});
      }
      break;
    }
    case Glyph::ColorUp: {
      const QColor colours[] = {kRed, kFolder, kGreen, kBlue};
      for (int i = 0; i < 4; ++i) {
        p.setPen(Qt::NoPen);
        p.setBrush(colours[i]);
        p.drawEllipse(QPointF(6 + (i % 2) * 8, 6 + (i / 2) * 8), 3.6, 3.6);
      }
      break;
    }
  }
}

QPixmap Render(Glyph glyph, qreal scale) {
  QPixmap pixmap(QSize(kSide, kSide) * scale);
  pixmap.setDevicePixelRatio(scale);
  pixmap.fill(Qt::transparent);
  QPainter p(&pixmap);
  p.setRenderHint(QPainter::Antialiasing);
  Draw(p, glyph);
  return pixmap;
}

}  // namespace

QIcon GlyphIcon(Glyph glyph) {
  QIcon icon;
  icon.addPixmap(Render(glyph, 1.0));
  icon.addPixmap(Render(glyph, 2.0));
  return icon;
}

}  // namespace quillane
