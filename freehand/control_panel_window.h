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
class TFreehand;
class ToolHost;

class TFreehand_control : public QWidget {
  Q_OBJECT

 public:
  static constexpr int kViewWidth = 217;
  static constexpr int kViewHeight = 193;

  TFreehand_control(PaintingState& state, ToolHost& host, TFreehand& workArea);

  PictureView* Image2() const { return image2_; }

 public slots:
  void Button1Click();  // OK
  void Button2Click();  // Cancel
  void Button8Click();  // Thin
  void Button4Click();  // Thick
  void ColorPanelClick();
  void TrackBar1Change(int position);

 protected:
  void showEvent(QShowEvent* event) override;
  void closeEvent(QCloseEvent* event) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  void FormShow();
  void FormClose();
  void ChooseTool(int tool, int penSize);
  void SetBrushColor(Pixel color);
  void Pick(QPoint at);

  PaintingState& state_;
  ToolHost& host_;
  TFreehand& workArea_;
  TBitmap32 source_;  // the photo as shown, for the eyedropper
  bool picking_ = false;

  PictureView* image2_ = nullptr;
  QFrame* panel1_ = nullptr;
  QButtonGroup* tools_ = nullptr;
  QWidget* colorPanel_ = nullptr;
  QSlider* trackBar1_ = nullptr;
  QLabel* label1_ = nullptr;
  QPushButton* thin_ = nullptr;
  QPushButton* thick_ = nullptr;
};

}  // namespace quillane
