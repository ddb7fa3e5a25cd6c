// The image size dialog: resamples the document's picture to a typed width and height, with
// the aspect ratio held while typing and "-" / "+" steps of 80 % and 125 %. Not modal: the
// main window and the tool windows stay usable while it is open.
#pragma once

#include <QDialog>
#include <QSize>
#include <functional>

#include "document/reshape.h"

class QCheckBox;
class QLineEdit;
class QPushButton;
class QToolButton;

namespace quillane {

class PlatformServices;

class ImageSizeDialog : public QDialog {
  Q_OBJECT

 public:
  // pictureSize gives the working picture's size at the moment it is asked; resize resamples
  // the document to a width and height (ResizeDocument) and shows the result.
  ImageSizeDialog(PlatformServices& platform, std::function<QSize()> pictureSize,
                  std::function<ResizeResult(int, int)> resize, QWidget* parent = nullptr);

 public slots:
  void OnShrink();   // "-": both fields to 80 %
  void OnEnlarge();  // "+": both fields to 125 %
  void OnOk();
  void OnCancel();

 protected:
  void showEvent(QShowEvent* event) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  // After a key released in one field: the other field from it, with the picture's ratio.
  void HoldAspect(QLineEdit* typed, QLineEdit* other, bool fromWidth);
  // Both fields times percent / 100, rounded; false (with the error shown) at a field that is
  // not an integer.
  bool ScaleFields(int percent);

  PlatformServices& platform_;
  std::function<QSize()> pictureSize_;
  std::function<ResizeResult(int, int)> resize_;
  QLineEdit* widthField_ = nullptr;
  QLineEdit* heightField_ = nullptr;
  QCheckBox* holdAspect_ = nullptr;
  // Whether a field's text was typed into since its last key release: keys that edit nothing
  // (Tab arriving from the other field, arrows, Shift) do not recompute the other field.
  bool widthEdited_ = false;
  bool heightEdited_ = false;
};

}  // namespace quillane
