// The view of the working picture: its display size at a zoom, the zoom label, and the
// thumbnail fitting the tool windows use.
#include <QLabel>
#include <QLocale>

#include "app/main_window.h"
#include "imaging/numeric.h"
#include "ui/picture_view.h"

namespace quillane {

void TMyPicture::ShowWorking(double zoom) {
  image1_->SetPicture(document_.Working());
  SetDisplaySize(zoom);
}

void TMyPicture::SetDisplaySize(double zoom) {
  const TBitmap32& picture = document_.Working();
  const Extended z = zoom;
  image1_->resize(Round(picture.Width() * z / 100), Round(picture.Height() * z / 100));
}

double TMyPicture::ZoomFromLabel() const {
  QString number = zoomLabel_->text();
  number.chop(1);
  bool ok = false;
  const double z = QLocale().toDouble(number, &ok);
  if (ok) return z;
  // The zoom commands write the label with the locale's separator; a label written in the C
  // locale still reads.
  const double c = QLocale::c().toDouble(number, &ok);
  return ok ? c : zoomPercent_;
}

QRect TMyPicture::DisplayImageGeometry(int pictureWidth, int pictureHeight) {
  if (pictureWidth < 1 || pictureHeight < 1) return QRect(2, 2, 0, 0);
  if (static_cast<Extended>(pictureWidth) / pictureHeight >= 1) {
    const int h = MulDiv(105, pictureHeight, pictureWidth);
    const int t = (105 - h) / 2;
    return QRect(2, t + 2, 105, h + 2);
  }
  const int w = MulDiv(105, pictureWidth, pictureHeight);
  const int l = (105 - w) / 2;
  return QRect(l + 2, 2, w + 2, 105);
}

void TMyPicture::DisplayImage(PictureView& control) const {
  const QSize size = control.PictureSize();
  control.setGeometry(DisplayImageGeometry(size.width(), size.height()));
}

}  // namespace quillane
