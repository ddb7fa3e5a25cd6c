// The view of the working picture: its display size at a zoom, the zoom steps from the
// buttons, the keyboard and the mouse wheel, panning with the right mouse button, the quarter
// turns, the image size dialog, and the thumbnail fitting the tool windows use.
#include <QAction>
#include <QApplication>
#include <QKeySequence>
#include <QLabel>
#include <QLocale>
#include <QMenu>
#include <QMenuBar>
#include <QMouseEvent>
#include <QScrollArea>
#include <QScrollBar>
#include <QToolButton>
#include <QWheelEvent>
#include <cmath>
#include <exception>
#include <new>

#include "app/image_size_dialog.h"
#include "app/main_window.h"
#include "document/reshape.h"
#include "imaging/memory_budget.h"
#include "imaging/numeric.h"
#include "ui/picture_view.h"
#include "ui/platform.h"

namespace quillane {
namespace {

constexpr Extended kZoomInFactor = 1.25L;
constexpr Extended kZoomOutFactor = 0.8L;
constexpr int kWheelNotch = 120;  // one notch of an ordinary mouse wheel, in eighths of a degree

// Round(side * zoom / 100), as a 64-bit count so that no zoom overflows it.
std::int64_t DisplaySide(int side, double zoom) {
  const Extended v = static_cast<Extended>(side) * static_cast<Extended>(zoom) / 100;
  if (!(v < 1e18L)) return INT64_MAX;
  return static_cast<std::int64_t>(std::nearbyintl(v));
}

}  // namespace

void MainWindow::BuildViewControls() {
  auto button = [this](const char* name) { return findChild<QToolButton*>(name); };
  connect(button("SpeedButton5"), &QToolButton::clicked, this, &MainWindow::OnZoomOut);
  connect(button("SpeedButton6"), &QToolButton::clicked, this, &MainWindow::OnZoomIn);
  connect(button("SpeedButton12"), &QToolButton::clicked, this, &MainWindow::OnRotateClockwise);
  connect(button("SpeedButton8"), &QToolButton::clicked, this, &MainWindow::OnRotateAnticlockwise);
  connect(button("SpeedButton4"), &QToolButton::clicked, this, &MainWindow::OnImageSize);
  for (const char* name : {"Imagesize1", "Imagesize2"})
    connect(findChild<QAction*>(name), &QAction::triggered, this, &MainWindow::OnImageSize);

  // The zoom where a desktop user looks for it, with the usual keys.
  auto* view = new QMenu(" &View", menuBar());
  view->setObjectName("View1");
  const QList<QAction*> menus = menuBar()->actions();
  menuBar()->insertMenu(menus.size() > 2 ? menus[2] : nullptr, view);
  auto addEntry = [view](const QString& caption, const char* name,
                         const QList<QKeySequence>& keys) {
    QAction* action = view->addAction(caption);
    action->setObjectName(name);
    action->setShortcuts(keys);
    return action;
  };
  connect(addEntry("Zoom in", "ZoomIn1",
                   {QKeySequence::ZoomIn, QKeySequence(Qt::CTRL | Qt::Key_Equal)}),
          &QAction::triggered, this, &MainWindow::ZoomIn);
  connect(addEntry("Zoom out", "ZoomOut1", {QKeySequence::ZoomOut}), &QAction::triggered, this,
          &MainWindow::ZoomOut);
  connect(addEntry("Actual size", "ActualSize1", {QKeySequence(Qt::CTRL | Qt::Key_0)}),
          &QAction::triggered, this, &MainWindow::ZoomToActualSize);

  imageSize_ = new ImageSizeDialog(
      platform_,
      [this] { return QSize(document_.Working().Width(), document_.Working().Height()); },
      [this](int w, int h) {
        HoldBackgroundUntilShown();
        const ResizeResult result = ResizeDocument(document_, w, h);
        if (result == ResizeResult::Resized) ShowWorkingChanged();
        return result;
      },
      this);
  imageSize_->hide();

  qApp->installEventFilter(this);
}

// --- Zoom ----------------------------------------------------------------------------------

void MainWindow::ShowWorking(double zoom) {
  pictureView_->SetPicture(document_.SharedWorking());
  SetDisplaySize(zoom);
}

void MainWindow::SetDisplaySize(double zoom) {
  const Bitmap32& picture = document_.Working();
  // A picture opened or resized at a zoom meant for another one may come out of range: it is
  // shown at least one pixel and at most the largest widget in each direction.
  const auto side = [zoom](int s) {
    return static_cast<int>(std::clamp<std::int64_t>(DisplaySide(s, zoom), 1, QWIDGETSIZE_MAX));
  };
  pictureView_->resize(side(picture.Width()), side(picture.Height()));
}

QString MainWindow::ZoomLabelText(double zoom) {
  QLocale locale;
  locale.setNumberOptions(QLocale::OmitGroupSeparator);
  return locale.toString(zoom, 'f', 1) + "%";
}

double MainWindow::ZoomFromLabel() const {
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

void MainWindow::SetZoom(double zoom) {
  zoomPercent_ = zoom;
  zoomLabel_->setText(ZoomLabelText(zoom));
  SetDisplaySize(zoom);
}

void MainWindow::ZoomIn() {
  const double zoom = static_cast<double>(zoomPercent_ * kZoomInFactor);
  const Bitmap32& p = document_.Working();
  if (std::max(DisplaySide(p.Width(), zoom), DisplaySide(p.Height(), zoom)) > QWIDGETSIZE_MAX)
    return;
  SetZoom(zoom);
}

void MainWindow::ZoomOut() {
  const double zoom = static_cast<double>(zoomPercent_ * kZoomOutFactor);
  const Bitmap32& p = document_.Working();
  if (std::min(DisplaySide(p.Width(), zoom), DisplaySide(p.Height(), zoom)) < 1) return;
  SetZoom(zoom);
}

void MainWindow::ZoomToActualSize() {
  SetZoom(100.0);
}

void MainWindow::OnZoomOut() {
  ZoomOut();
}

void MainWindow::OnZoomIn() {
  ZoomIn();
}

// --- The application-wide filter -----------------------------------------------------------

bool MainWindow::eventFilter(QObject* watched, QEvent* event) {
  switch (event->type()) {
    case QEvent::Wheel:
      if (WheelZoom(watched, static_cast<QWheelEvent*>(event))) return true;
      break;
    case QEvent::MouseButtonPress:
    case QEvent::MouseButtonDblClick:  // the second press of a double click
      if (watched == pictureView_) PictureMouseDown(static_cast<QMouseEvent*>(event));
      break;
    case QEvent::MouseMove:
      if (watched == pictureView_) PictureMouseMove(static_cast<QMouseEvent*>(event));
      break;
    case QEvent::MouseButtonRelease:
      if (watched == pictureView_) PictureMouseUp(static_cast<QMouseEvent*>(event));
      break;
    default:
      break;
  }
  return QMainWindow::eventFilter(watched, event);
}

bool MainWindow::WheelZoom(QObject* watched, QWheelEvent* event) {
  auto* widget = qobject_cast<QWidget*>(watched);
  if (widget == nullptr || widget->window() != this) return false;
  const int turn = event->angleDelta().y();
  if (event->modifiers() & Qt::ControlModifier) {
    // Ctrl+wheel anywhere in the window zooms as elsewhere on the desktop: turning the wheel
    // away from the user zooms in, one step per notch however finely the wheel reports.
    if ((turn > 0) != (ctrlWheelRest_ > 0)) ctrlWheelRest_ = 0;
    ctrlWheelRest_ += turn;
    for (; ctrlWheelRest_ >= kWheelNotch; ctrlWheelRest_ -= kWheelNotch) ZoomIn();
    for (; ctrlWheelRest_ <= -kWheelNotch; ctrlWheelRest_ += kWheelNotch) ZoomOut();
    return true;
  }
  // Over the picture or its scroll box, every wheel message is one step: towards the user in,
  // away from the user out; the scroll box does not scroll.
  if (turn == 0 || !(widget == scrollBox_ || scrollBox_->isAncestorOf(widget))) return false;
  if (turn < 0)
    ZoomIn();
  else
    ZoomOut();
  return true;
}

// --- Panning -------------------------------------------------------------------------------

void MainWindow::PictureMouseDown(QMouseEvent* event) {
  panning_ =
      Panning{true, true, event->position().toPoint(), scrollBox_->horizontalScrollBar()->value(),
              scrollBox_->verticalScrollBar()->value()};
  if (event->button() == Qt::RightButton) pictureView_->setCursor(Qt::ClosedHandCursor);
}

void MainWindow::PictureMouseMove(QMouseEvent* event) {
  if (!(event->buttons() & Qt::RightButton) || !panning_.dragging) return;
  // The picture moves with the scroll, so the point under the mouse stays under it.
  const QPoint moved = panning_.press - event->position().toPoint();
  QScrollBar* h = scrollBox_->horizontalScrollBar();
  QScrollBar* v = scrollBox_->verticalScrollBar();
  h->setValue(h->value() + moved.x());
  v->setValue(v->value() + moved.y());
  if (h->value() != panning_.horizontal || v->value() != panning_.vertical)
    panning_.unmoved = false;
}

void MainWindow::PictureMouseUp(QMouseEvent* event) {
  panning_.dragging = false;
  pictureView_->unsetCursor();
  if (event->button() == Qt::RightButton && panning_.unmoved)
    popupMenu_->popup(event->globalPosition().toPoint());
}

// --- Rotation and image size ---------------------------------------------------------------

void MainWindow::Rotate(QuarterTurn turn) {
  const Bitmap32& working = document_.Working();
  const int width = working.Width(), height = working.Height();
  bool turned = false;
  HoldBackgroundUntilShown();
  try {
    turned = RotateDocument(document_, turn);
  } catch (const std::bad_alloc&) {
    platform_.ShowError(
        QStringLiteral("Turning the picture of %1 by %2 pixels ").arg(width).arg(height) +
        QString::fromStdString(MemoryNeedText(OperationBytes(width, height))));
    return;
  } catch (const std::exception& e) {
    platform_.ShowError(QString::fromStdString(e.what()));
    return;
  }
  if (!turned) {
    platform_.ShowMessage("Sorry", QStringLiteral("A picture of %1 by %2 pixels is too small to "
                                                  "turn; it is left as it is.")
                                       .arg(width)
                                       .arg(height));
    return;
  }
  ShowLoadedPicture(false);
}

void MainWindow::OnRotateClockwise() {
  Rotate(QuarterTurn::Clockwise);
}

void MainWindow::OnRotateAnticlockwise() {
  Rotate(QuarterTurn::Anticlockwise);
}

void MainWindow::OnImageSize() {
  imageSize_->show();
  imageSize_->raise();
  imageSize_->activateWindow();
}

// --- Thumbnails ----------------------------------------------------------------------------

QRect MainWindow::DisplayImageGeometry(int pictureWidth, int pictureHeight) {
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

void MainWindow::DisplayImage(PictureView& control) const {
  const QSize size = control.PictureSize();
  control.setGeometry(DisplayImageGeometry(size.width(), size.height()));
}

}  // namespace quillane
