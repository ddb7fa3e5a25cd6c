// The control panel of freehand painting (caption "Original photo"): the source photo to pick
// colours from, the five tools, the brush colour, the pen size, Thin and Thick for line
// drawings, and OK and Cancel, which end the painting.
#pragma once

#include <QWidget>

#include "freehand/painting_state.h"
#include "imaging/bitmap32.h"

class QButtonGroup;
class QFrame;
class QLabel;
class QPushButton;
class QSlider;
class QToolButton;

namespace quillane {

class PictureView;
class WorkAreaWindow;
class ToolHost;

class ControlPanelWindow : public QWidget {
  Q_OBJECT

 public:
  static constexpr int kViewWidth = 217;
  static constexpr int kViewHeight = 193;

  ControlPanelWindow(PaintingState& state, ToolHost& host, WorkAreaWindow& workArea);

  PictureView* PhotoView() const { return photoView_; }

 public slots:
  void OnOk();
  void OnCancel();
  void OnThin();
  void OnThick();
  void ChooseBrushColor();
  void OnPenSizeChanged(int position);

 protected:
  void showEvent(QShowEvent* event) override;
  void closeEvent(QCloseEvent* event) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  void OnShown();
  void OnClosed();
  void ChooseTool(int tool, int penSize);
  void SetBrushColor(Pixel color);
  void Pick(QPoint at);

  PaintingState& state_;
  ToolHost& host_;
  WorkAreaWindow& workArea_;
  Bitmap32 source_;  // the photo as shown, for the eyedropper
  bool picking_ = false;

  PictureView* photoView_ = nullptr;
  QFrame* toolPanel_ = nullptr;
  QButtonGroup* tools_ = nullptr;
  QWidget* colorPanel_ = nullptr;
  QSlider* penSizeSlider_ = nullptr;
  QLabel* penSizeLabel_ = nullptr;
  QPushButton* thin_ = nullptr;
  QPushButton* thick_ = nullptr;
};

}  // namespace quillane
