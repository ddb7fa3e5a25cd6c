// The tool window every effect runs in, built from the effect's registry entry: its sliders and
// check boxes with their labels, the OK button, "Color up" for the drawing styles, and the
// collapsible batch panel. An effect with behaviour of its own derives from it in its folder
// (effects/mono/bw_sketch_window.h); the rest use it as it is.
#pragma once

#include <QWidget>
#include <map>
#include <string>

#include "effects/registry.h"

class QBoxLayout;
class QCheckBox;
class QFrame;
class QHBoxLayout;
class QLabel;
class QLineEdit;
class QPushButton;
class QSlider;
class QToolButton;
class QVBoxLayout;

namespace quillane {

class TMyPicture;

class ToolWindow : public QWidget {
  Q_OBJECT

 public:
  // spec must outlive the window (registry entries live for the whole run).
  ToolWindow(const EffectSpec& spec, TMyPicture& main);

  const EffectSpec& Spec() const { return spec_; }
  int Number() const { return spec_.toolNumber; }

  // The settings the routine reads: every slider's position, every check box as 0 or 1, and
  // the hidden settings the controls select.
  EffectParams Params() const;
  // Sets a hidden setting (a slider or check box is set through its control).
  void SetHiddenParam(const std::string& name, int value);

  bool BatchPanelShown() const;

  // Runs the effect on the document as OK does: result into the working picture, a history
  // step when recordHistory, the status text, then the window's own steps. False when the
  // effect is not available or failed (the document is then unchanged).
  bool Apply(bool recordHistory);

  // Heights the batch toggle sets; windows without a batch panel keep the first.
  void SetWindowHeights(int collapsed, int expanded);

 public slots:
  void Button1Click();       // OK
  void Button2Click();       // "Color up"
  void SpeedButton1Click();  // show or hide the batch panel
  void SpeedButton2Click();  // Browse for the input folder
  void SpeedButton3Click();  // Browse for the output folder
  void SpeedButton4Click();  // Convert

 signals:
  // "Color up" was pressed: the freehand painting windows take over the working picture.
  void colorUpRequested();

 protected:
  // What showing and closing the window do; subclasses call the base version first.
  virtual void FormShow();
  virtual void FormClose();
  // After a successful apply (OK or each picture of a batch), once the document has the result.
  virtual void AfterApply() {}
  // Convert's own steps for the windows that have some: before the loop, and after a loop
  // that ran to its end (before the completion dialog shows).
  virtual void BeforeBatch() {}
  virtual void AfterBatch() {}
  // A slider or check box moved, after its number label and hidden selection were updated.
  virtual void ControlChanged(const ControlSpec& control, int value);

  TMyPicture& Main() { return main_; }
  // The rows of controls, top to bottom; subclasses may insert rows of their own.
  QVBoxLayout* ControlsLayout() { return controlsLayout_; }
  QLabel* FindLabel(const QString& name) const;
  QSlider* FindSlider(const QString& name) const;

  void showEvent(QShowEvent* event) override;
  void closeEvent(QCloseEvent* event) override;

 private:
  void AddSliderRow(const ControlSpec& control);
  void AddCheckBox(const ControlSpec& control);
  void BuildButtonRow(QBoxLayout* outer);
  void BuildBatchPanel(QBoxLayout* outer);
  void SelectFrom(const ControlSpec& control);
  // What follows the effect routine in OK and in every picture of a batch, but the history
  // step: the status line, "Color up", and the window's own steps.
  void AfterEffect();

  const EffectSpec& spec_;
  TMyPicture& main_;
  std::map<std::string, int> hidden_;
  int collapsedHeight_ = 0;
  int expandedHeight_ = 0;

  QVBoxLayout* controlsLayout_ = nullptr;
  QPushButton* button1_ = nullptr;
  QToolButton* button2_ = nullptr;
  QToolButton* batchToggle_ = nullptr;
  QFrame* panel2_ = nullptr;
  QLineEdit* edit1_ = nullptr;
  QLineEdit* edit2_ = nullptr;
};

}  // namespace quillane
