// The tool window every effect runs in, built from the effect's table entry: a row of controls
// per parameter, the apply button (and "Default" where the entry has one), "Color up" for the
// drawing styles, and the collapsible batch panel. An effect with behaviour of its own derives
// from it in its folder (effects/mono/bw_sketch_window.h); the rest use it as it is.
#pragma once

#include <QWidget>
#include <map>
#include <memory>
#include <optional>
#include <string>

#include "ui/param_widgets.h"
#include "ui/tool_host.h"

class QBoxLayout;
class QFrame;
class QLabel;
class QLineEdit;
class QToolButton;
class QVBoxLayout;

namespace quillane {

class ToolWindow : public QWidget {
  Q_OBJECT

 public:
  // spec must outlive the window (table entries live for the whole run).
  ToolWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent);
  ~ToolWindow() override;

  const EffectSpec& Spec() const { return spec_; }
  int Number() const { return spec_.toolNumber; }

  // The settings the routine reads, one value per parameter. ParamError when a cell holds
  // no whole number.
  EffectParams Params() const;
  // Sets one parameter as if the user had (a hidden one directly).
  void SetParam(const std::string& name, const EffectParams::Values& value);

  bool BatchPanelShown() const;

  // Runs the effect on the document as the apply button does: result into the working
  // picture, a history step when recordHistory, the status text, then the window's own steps.
  // False when the effect is not available or failed (the document is then unchanged and the
  // error has been shown).
  bool Apply(bool recordHistory);

  // Heights the batch toggle sets; windows without a batch panel keep the first.
  void SetWindowHeights(int collapsed, int expanded);

 public slots:
  // The apply button (OK, or "Convert" in the kernel windows).
  virtual void OnApply();
  void RestoreDefaultsAndApply();  // "Default": every parameter back to its default, then apply
  void OpenColorUp();              // "Color up"
  void ToggleBatchPanel();
  void BrowseInputFolder();
  void BrowseOutputFolder();
  void ConvertBatch();

 signals:
  // "Color up" was pressed: the freehand painting windows take over the working picture.
  void colorUpRequested();

 protected:
  // What showing and closing the window do; subclasses call the base version first.
  virtual void OnShown();
  virtual void OnClosed();
  // After a successful apply (OK or each picture of a batch), once the document has the result.
  virtual void AfterApply() {}
  // Convert's own steps for the windows that have some: before anything else (even before the
  // settings are read), and after a loop that ran to its end (before the completion dialog
  // shows).
  virtual void BeforeBatch() {}
  virtual void AfterBatch(const BatchResult& /*result*/) {}
  // A parameter changed, after the one it selects was set.
  virtual void ControlChanged(const ParamSpec& param);

  ToolHost& Host() { return host_; }
  // The rows of controls, top to bottom; subclasses may insert rows of their own.
  QVBoxLayout* ControlsLayout() { return controlsLayout_; }
  QLabel* FindLabel(const QString& name) const;
  // The control named name taken out of the rows of controls, for a window that places it
  // itself; null when there is none.
  QWidget* TakeControl(const QString& name);

  void showEvent(QShowEvent* event) override;
  void closeEvent(QCloseEvent* event) override;
  void keyPressEvent(QKeyEvent* event) override;

 private:
  void BuildButtonRow(QBoxLayout* outer);
  void BuildBatchPanel(QBoxLayout* outer);
  void ParamChanged(const ParamSpec& param);
  // Reports a value the controls cannot give (a cell that is no number) and gives nothing.
  std::optional<EffectParams> CheckedParams();
  // What follows the effect routine in OK and in every picture of a batch, but the history
  // step: the status line, the line-art flag, "Color up", and the window's own steps.
  void AfterEffect();

  const EffectSpec& spec_;
  ToolHost& host_;
  std::map<std::string, std::unique_ptr<ParamWidget>> params_;
  int collapsedHeight_ = 0;
  int expandedHeight_ = 0;

  QVBoxLayout* controlsLayout_ = nullptr;
  QToolButton* colorUp_ = nullptr;
  QToolButton* batchToggle_ = nullptr;
  QFrame* batchPanel_ = nullptr;
  QLineEdit* inputField_ = nullptr;
  QLineEdit* outputField_ = nullptr;
};

}  // namespace quillane
