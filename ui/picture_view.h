// An image control: shows a picture stretched to the control's own size, pixel by nearest
// pixel, and opaque (the alpha byte is ignored, as a plain bitmap shows it).
#pragma once

#include <QImage>
#include <QWidget>
#include <memory>

#include "imaging/bitmap32.h"

namespace quillane {

class PictureView : public QWidget {
  Q_OBJECT

 public:
  explicit PictureView(QWidget* parent = nullptr);

  // Takes a copy of picture; the control's size is left to the caller.
  void SetPicture(const Bitmap32& picture);
  // Shows picture itself, without a copy, for as long as the control (or a copy of Image())
  // shows it: a picture that never changes needs no copy of tens of megabytes to be shown.
  void SetPicture(std::shared_ptr<const Bitmap32> picture);
  // Size of the picture (not of the control).
  QSize PictureSize() const { return image_.size(); }
  const QImage& Image() const { return image_; }

 signals:
  // The control has just painted itself.
  void painted();

 protected:
  void paintEvent(QPaintEvent* event) override;

 private:
  QImage image_;
};

// The picture as a QImage that ignores alpha, sharing nothing with picture.
QImage OpaqueImage(const Bitmap32& picture);
// The same picture read in place: the image holds picture until its last copy is gone, and
// copies its pixels only if someone writes to it.
QImage SharedOpaqueImage(std::shared_ptr<const Bitmap32> picture);

}  // namespace quillane
