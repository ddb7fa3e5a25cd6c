#include "ui/freehand/work_area_window.h"

#include <QAction>
#include <QCloseEvent>
#include <QImage>
#include <QKeySequence>
#include <QMouseEvent>
#include <QPaintEvent>
#include <QPainter>
#include <QScrollArea>
#include <QScrollBar>
#include <QShowEvent>
#include <QVBoxLayout>
#include <cmath>

#include "ui/tool_host.h"

namespace quillane {
namespace {

QPoint PicturePoint(const QMouseEvent* event) {
  const QPointF at = event->position();
  return QPoint(static_cast<int>(std::floor(at.x())), static_cast<int>(std::floor(at.y())));
}

QRect ToQRect(const PaintRect& r) {
  return QRect(r.left, r.top, r.Width(), r.Height());
}

// The odd-distance rule of the rubber band: an end an odd number of pixels from the anchor
// moves one pixel further.
int BandCoordinate(int at, int anchor) {
  return (at - anchor) % 2 != 0 ? at + 1 : at;
}

}  // namespace

// --- Image1 ------------------------------------------------------------------------------------

FreehandCanvas::FreehandCanvas(WorkAreaWindow& area, QWidget* parent)
    : QWidget(parent), area_(area) {
  setObjectName("Image1");
  setToolTip("Right-down to move");
  setAttribute(Qt::WA_OpaquePaintEvent);
  setMouseTracking(true);
}

void FreehandCanvas::paintEvent(QPaintEvent* event) {
  QPainter painter(this);
  const Bitmap32& picture = area_.Picture();
  const QRect exposed = event->rect();
  if (picture.Empty()) {
    painter.fillRect(exposed, palette().window());
    return;
  }
  // The picture's own pixels, shown opaque, without copying them: only the exposed part is
  // drawn.
  const QImage view(reinterpret_cast<const uchar*>(picture.Data()), picture.Width(),
                    picture.Height(), static_cast<qsizetype>(picture.Width()) * 4,
                    QImage::Format_RGB32);
  painter.drawImage(exposed, view, exposed);
  painter.setPen(QPen(Qt::black, 1));
  if (area_.OutlineShown()) {
    const int r = area_.OutlineRadius();
    painter.drawEllipse(QPointF(area_.OutlineCentre()) + QPointF(0.5, 0.5), r, r);
  }
  if (area_.BandShown()) painter.drawLine(area_.BandStart(), area_.BandEnd());
}

void FreehandCanvas::mousePressEvent(QMouseEvent* event) {
  area_.PictureMouseDown(event->button(), PicturePoint(event));
}
void FreehandCanvas::mouseMoveEvent(QMouseEvent* event) {
  area_.PictureMouseMove(event->buttons(), PicturePoint(event));
}
void FreehandCanvas::mouseReleaseEvent(QMouseEvent* event) {
  area_.PictureMouseUp(event->button(), PicturePoint(event));
}
void FreehandCanvas::leaveEvent(QEvent* event) {
  area_.PictureMouseLeave();
  QWidget::leaveEvent(event);
}

// --- WorkAreaWindow
// ---------------------------------------------------------------------------------

WorkAreaWindow::WorkAreaWindow(PaintingState& state, ToolHost& host)
    : QWidget(nullptr, Qt::Window | Qt::WindowStaysOnTopHint | Qt::CustomizeWindowHint |
                           Qt::WindowTitleHint | Qt::WindowCloseButtonHint),
      state_(state),
      host_(host) {
  setObjectName("TFreehand");
  setWindowTitle("Work area");
  setGeometry(235, 40, 738, 595);

  auto* layout = new QVBoxLayout(this);
  layout->setContentsMargins(0, 0, 0, 0);
  scrollBox_ = new QScrollArea(this);
  scrollBox_->setObjectName("ScrollBox1");
  scrollBox_->setAlignment(Qt::AlignCenter);
  scrollBox_->setWidgetResizable(false);
  canvas_ = new FreehandCanvas(*this, scrollBox_);
  canvas_->resize(0, 0);
  scrollBox_->setWidget(canvas_);
  layout->addWidget(scrollBox_);

  undoStroke_ = new QAction("Undo stroke", this);
  undoStroke_->setObjectName("UndoStroke");
  undoStroke_->setShortcut(QKeySequence::Undo);
  undoStroke_->setShortcutContext(Qt::WindowShortcut);
  connect(undoStroke_, &QAction::triggered, this, &WorkAreaWindow::UndoStroke);
  addAction(undoStroke_);
}

// --- Opening and closing -----------------------------------------------------------------------

void WorkAreaWindow::showEvent(QShowEvent* event) {
  QWidget::showEvent(event);
  if (!event->spontaneous()) OnShown();
}

void WorkAreaWindow::closeEvent(QCloseEvent* event) {
  OnClosed();
  QWidget::closeEvent(event);
}

void WorkAreaWindow::OnShown() {
  picture_ = host_.Document().Working();
  strokes_.Clear();
  strokeTool_ = PaintingState::kNoTool;
  panning_ = false;
  outlineShown_ = bandShown_ = pointerInside_ = false;
  canvas_->resize(picture_.Width(), picture_.Height());
  canvas_->update();
  UpdateToolCursor();
  host_.SetMainWindowEnabled(false);
}

void WorkAreaWindow::OnClosed() {
  if (state_.controlPanelOpen && controlPanel_ != nullptr) controlPanel_->close();
  // The painting is over: nothing of it is kept unless OK took it.
  strokes_.Clear();
  strokeTool_ = PaintingState::kNoTool;
  picture_ = Bitmap32();
  canvas_->resize(0, 0);
}

// --- Tools -------------------------------------------------------------------------------------

void WorkAreaWindow::UpdateToolCursor() {
  canvas_->setCursor(Qt::ArrowCursor);
  const bool outlined =
      state_.tool == PaintingState::kBrush || state_.tool == PaintingState::kRubber;
  if (!outlined)
    RemoveOutline();
  else if (pointerInside_)
    ShowOutline(pointer_);
}

void WorkAreaWindow::PenSizeChanged() {
  if (outlineShown_) ShowOutline(outlineCentre_);
}

void WorkAreaWindow::Repaint(const PaintRect& area) {
  if (!area.Empty()) canvas_->update(ToQRect(area));
}

void WorkAreaWindow::Dab(QPoint at) {
  const int size = state_.penSize;
  strokes_.Keep(picture_, DiscBounds(picture_, at.x(), at.y(), size));
  Repaint(strokeTool_ == PaintingState::kBrush
              ? BrushDisc(picture_, at.x(), at.y(), size, state_.brush)
              : RubDisc(picture_, at.x(), at.y(), size));
}

void WorkAreaWindow::StartPen() {
  pen_ = LinePen{state_.brushColor, state_.penSize, 0};
}

void WorkAreaWindow::LineTo(QPoint to, bool withEnd) {
  strokes_.Keep(picture_, LineBounds(picture_, penAt_.x(), penAt_.y(), to.x(), to.y(), pen_.width));
  Repaint(DrawLine(picture_, pen_, penAt_.x(), penAt_.y(), to.x(), to.y(), withEnd));
  penAt_ = to;
}

void WorkAreaWindow::WholePictureStep(void (*operation)(Bitmap32&)) {
  if (picture_.Empty() || strokeTool_ != PaintingState::kNoTool) return;
  strokes_.Begin(picture_);
  strokes_.Keep(picture_, PaintRect{0, 0, picture_.Width(), picture_.Height()});
  operation(picture_);
  strokes_.End();
  canvas_->update();
}

void WorkAreaWindow::ThinPicture() {
  WholePictureStep(&Thin);
}
void WorkAreaWindow::ThickPicture() {
  WholePictureStep(&Thick);
}

void WorkAreaWindow::UndoStroke() {
  // Not in the middle of a stroke: its pixels are still being saved.
  if (strokeTool_ != PaintingState::kNoTool) return;
  Repaint(strokes_.Undo(picture_));
}

// --- The mouse ---------------------------------------------------------------------------------

void WorkAreaWindow::PictureMouseDown(Qt::MouseButton button, QPoint at) {
  if (button == Qt::RightButton) {
    panning_ = true;
    panFrom_ = at;
    return;
  }
  if (button != Qt::LeftButton || picture_.Empty() || strokeTool_ != PaintingState::kNoTool) return;
  switch (state_.tool) {
    case PaintingState::kRubber:
    case PaintingState::kBrush:
      strokeTool_ = state_.tool;
      strokes_.Begin(picture_);
      Dab(at);
      break;
    case PaintingState::kPen:
      strokeTool_ = state_.tool;
      strokes_.Begin(picture_);
      StartPen();
      penAt_ = at;
      break;
    case PaintingState::kBeeline:
      strokeTool_ = state_.tool;
      RemoveBand();
      anchor_ = bandEnd_ = at;
      break;
    default:
      break;
  }
}

void WorkAreaWindow::PictureMouseMove(Qt::MouseButtons buttons, QPoint at) {
  pointerInside_ = true;
  pointer_ = at;
  if (panning_ && (buttons & Qt::RightButton)) {
    QScrollBar* h = scrollBox_->horizontalScrollBar();
    QScrollBar* v = scrollBox_->verticalScrollBar();
    h->setValue(h->value() + panFrom_.x() - at.x());
    v->setValue(v->value() + panFrom_.y() - at.y());
  }
  if (buttons & Qt::LeftButton) {
    switch (strokeTool_) {
      case PaintingState::kRubber:
      case PaintingState::kBrush:
        Dab(at);
        break;
      case PaintingState::kPen:
        LineTo(at);
        break;
      case PaintingState::kBeeline:
        RemoveBand();
        bandEnd_ = QPoint(BandCoordinate(at.x(), anchor_.x()), BandCoordinate(at.y(), anchor_.y()));
        bandShown_ = true;
        canvas_->update(QRect(anchor_, bandEnd_).normalized().adjusted(-1, -1, 1, 1));
        break;
      default:
        break;
    }
  }
  if (state_.tool == PaintingState::kBrush || state_.tool == PaintingState::kRubber)
    ShowOutline(at);
}

void WorkAreaWindow::PictureMouseUp(Qt::MouseButton button, QPoint at) {
  if (button == Qt::RightButton) {
    panning_ = false;
    return;
  }
  if (button != Qt::LeftButton) return;
  if (strokeTool_ == PaintingState::kBeeline) {
    RemoveBand();
    strokes_.Begin(picture_);
    StartPen();
    penAt_ = anchor_;
    LineTo(at, true);
  }
  strokes_.End();
  strokeTool_ = PaintingState::kNoTool;
}

void WorkAreaWindow::PictureMouseLeave() {
  pointerInside_ = false;
  RemoveOutline();
}

// --- What is drawn over the picture ------------------------------------------------------------

void WorkAreaWindow::RemoveOutline() {
  if (!outlineShown_) return;
  outlineShown_ = false;
  const int r = outlineRadius_;
  canvas_->update(
      QRect(outlineCentre_ - QPoint(r, r), outlineCentre_ + QPoint(r, r)).adjusted(-1, -1, 2, 2));
}

void WorkAreaWindow::ShowOutline(QPoint at) {
  RemoveOutline();
  // Not on the three leftmost columns or top rows, nor on the two rightmost or bottom ones.
  if (!(at.x() > 2 && at.x() < picture_.Width() - 2 && at.y() >= 3 &&
        at.y() < picture_.Height() - 2))
    return;
  outlineShown_ = true;
  outlineCentre_ = at;
  outlineRadius_ = state_.penSize;
  const int r = outlineRadius_;
  canvas_->update(QRect(at - QPoint(r, r), at + QPoint(r, r)).adjusted(-1, -1, 2, 2));
}

void WorkAreaWindow::RemoveBand() {
  if (!bandShown_) return;
  bandShown_ = false;
  canvas_->update(QRect(anchor_, bandEnd_).normalized().adjusted(-1, -1, 1, 1));
}

}  // namespace quillane
