// The work area: a private copy of the working picture at full size in a scrolling window,
// taking the strokes of the brush, rubber, pen and beeline. Strokes write straight into the
// copy and repaint only what they changed; each keeps the pixels it overwrote so Ctrl+Z can
// take it back. The control panel (ControlPanelWindow) opens and closes with it.
#pragma once

#include <QPoint>
#include <QRect>
#include <QWidget>

#include "freehand/painting_state.h"
#include "freehand/stroke_history.h"
#include "freehand/strokes.h"
#include "imaging/bitmap32.h"

class QAction;
class QScrollArea;

namespace quillane {

class ToolHost;
class WorkAreaWindow;

// Image1: shows the picture unscaled, with the brush outline and the beeline's rubber band
// drawn over it (never into it).
class FreehandCanvas : public QWidget {
  Q_OBJECT

 public:
  FreehandCanvas(WorkAreaWindow& area, QWidget* parent);

 protected:
  void paintEvent(QPaintEvent* event) override;
  void mousePressEvent(QMouseEvent* event) override;
  void mouseMoveEvent(QMouseEvent* event) override;
  void mouseReleaseEvent(QMouseEvent* event) override;
  void leaveEvent(QEvent* event) override;

 private:
  WorkAreaWindow& area_;
};

class WorkAreaWindow : public QWidget {
  Q_OBJECT

 public:
  WorkAreaWindow(PaintingState& state, ToolHost& host);

  // The companion it closes with.
  void SetControlPanel(QWidget* panel) { controlPanel_ = panel; }

  const Bitmap32& Picture() const { return picture_; }
  FreehandCanvas* Canvas() const { return canvas_; }
  QScrollArea* ScrollBox() const { return scrollBox_; }
  const StrokeHistory& Strokes() const { return strokes_; }

  // Thin and Thick of the control panel, each one step of Ctrl+Z.
  void ThinPicture();
  void ThickPicture();
  // Ctrl+Z: the last stroke (or Thin, Thick) taken back.
  void UndoStroke();
  // The Ctrl+Z action, for the control panel to carry too: one action, so the key works in
  // either window of the pair and never takes back two steps at once.
  QAction* UndoStrokeAction() const { return undoStroke_; }
  // The pointers for the current tool; the brush outline follows a new pen size at once.
  void UpdateToolCursor();
  void PenSizeChanged();

  // The mouse on the picture, in picture pixels.
  void PictureMouseDown(Qt::MouseButton button, QPoint at);
  void PictureMouseMove(Qt::MouseButtons buttons, QPoint at);
  void PictureMouseUp(Qt::MouseButton button, QPoint at);
  void PictureMouseLeave();

  // What the canvas draws over the picture.
  bool OutlineShown() const { return outlineShown_; }
  QPoint OutlineCentre() const { return outlineCentre_; }
  int OutlineRadius() const { return outlineRadius_; }
  bool BandShown() const { return bandShown_; }
  QPoint BandStart() const { return anchor_; }
  QPoint BandEnd() const { return bandEnd_; }

 protected:
  void showEvent(QShowEvent* event) override;
  void closeEvent(QCloseEvent* event) override;

 private:
  void OnShown();
  void OnClosed();
  void Dab(QPoint at);
  void LineTo(QPoint to, bool withEnd = false);
  void Repaint(const PaintRect& area);
  void WholePictureStep(void (*operation)(Bitmap32&));
  void RemoveOutline();
  void ShowOutline(QPoint at);
  void RemoveBand();
  void StartPen();

  PaintingState& state_;
  ToolHost& host_;
  QWidget* controlPanel_ = nullptr;
  QScrollArea* scrollBox_ = nullptr;
  FreehandCanvas* canvas_ = nullptr;
  QAction* undoStroke_ = nullptr;

  Bitmap32 picture_;
  StrokeHistory strokes_;
  int strokeTool_ = PaintingState::kNoTool;  // the tool of the stroke under way, or none
  LinePen pen_;
  QPoint penAt_;

  bool panning_ = false;
  QPoint panFrom_;

  bool outlineShown_ = false;
  QPoint outlineCentre_;
  int outlineRadius_ = 0;
  bool pointerInside_ = false;
  QPoint pointer_;

  bool bandShown_ = false;
  QPoint anchor_;
  QPoint bandEnd_;
};

}  // namespace quillane
