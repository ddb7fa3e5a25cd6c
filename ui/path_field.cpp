#include "ui/path_field.h"

#include <QPainter>
#include <QStyle>
#include <QStyleOptionFrame>

namespace quillane {
namespace {

// The room QLineEdit leaves on each side of its text inside the frame.
constexpr int kTextMargin = 2;

}  // namespace

PathField::PathField(QWidget* parent) : QLineEdit(parent) {}

QRect PathField::TextArea() const {
  QStyleOptionFrame option;
  initStyleOption(&option);
  const QRect contents = style()->subElementRect(QStyle::SE_LineEditContents, &option, this);
  return contents.adjusted(kTextMargin, 0, -kTextMargin, 0);
}

QString PathField::ShownText() const {
  const QString path = text();
  const int room = TextArea().width();
  const QFontMetrics metrics = fontMetrics();
  if (metrics.horizontalAdvance(path) <= room) return path;
  // The folder's own name whole, after as much of the start as fits.
  const qsizetype slash = path.lastIndexOf('/');
  if (slash > 0) {
    const QString end = QChar(0x2026) + path.mid(slash);
    for (qsizetype start = slash - 1; start > 0; --start) {
      const QString shown = path.left(start) + end;
      if (metrics.horizontalAdvance(shown) <= room) return shown;
    }
  }
  return metrics.elidedText(path, Qt::ElideMiddle, room);
}

void PathField::paintEvent(QPaintEvent* event) {
  const QString shown = ShownText();
  // Being edited, or short enough: the field as usual, with its cursor and selection.
  if (hasFocus() || shown == text()) {
    QLineEdit::paintEvent(event);
    return;
  }
  QPainter painter(this);
  QStyleOptionFrame option;
  initStyleOption(&option);
  style()->drawPrimitive(QStyle::PE_PanelLineEdit, &option, &painter, this);
  painter.setPen(
      palette().color(isEnabled() ? QPalette::Normal : QPalette::Disabled, QPalette::Text));
  painter.drawText(TextArea(), Qt::AlignLeft | Qt::AlignVCenter, shown);
}

}  // namespace quillane
