#include "ui/picture_view.h"

#include <QPaintEvent>
#include <QPainter>

namespace quillane {

QImage OpaqueImage(const Bitmap32& picture) {
  if (picture.Empty()) return QImage();
  // Pixels are B, G, R, A in memory, which is what Format_RGB32 reads on a little-endian
  // machine; that format also ignores the fourth byte.
  static_assert(Q_BYTE_ORDER == Q_LITTLE_ENDIAN, "pixel layout assumes a little-endian machine");
  const QImage view(reinterpret_cast<const uchar*>(picture.Data()), picture.Width(),
                    picture.Height(), static_cast<qsizetype>(picture.Width()) * 4,
                    QImage::Format_RGB32);
  return view.copy();
}

QImage SharedOpaqueImage(std::shared_ptr<const Bitmap32> picture) {
  if (!picture || picture->Empty()) return QImage();
  const Bitmap32& shown = *picture;
  auto* holder = new std::shared_ptr<const Bitmap32>(std::move(picture));
  return QImage(
      reinterpret_cast<const uchar*>(shown.Data()), shown.Width(), shown.Height(),
      static_cast<qsizetype>(shown.Width()) * 4, QImage::Format_RGB32,
      [](void* held) { delete static_cast<std::shared_ptr<const Bitmap32>*>(held); }, holder);
}

PictureView::PictureView(QWidget* parent) : QWidget(parent) {
  setAttribute(Qt::WA_OpaquePaintEvent);
}

void PictureView::SetPicture(const Bitmap32& picture) {
  image_ = OpaqueImage(picture);
  update();
}

void PictureView::SetPicture(std::shared_ptr<const Bitmap32> picture) {
  image_ = SharedOpaqueImage(std::move(picture));
  update();
}

void PictureView::paintEvent(QPaintEvent* event) {
  QPainter painter(this);
  if (image_.isNull()) {
    painter.fillRect(event->rect(), palette().window());
    painter.end();
    emit painted();
    return;
  }
  // No smoothing: a stretched picture shows its pixels as blocks, like a plain stretch copy.
  painter.setRenderHint(QPainter::SmoothPixmapTransform, false);
  painter.drawImage(rect(), image_);
  painter.end();
  emit painted();
}

}  // namespace quillane
