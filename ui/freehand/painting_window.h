// The two freehand windows as a pair, made once for the whole run: "Color up" in a drawing
// window opens them on the working picture.
#pragma once

#include <QObject>
#include <memory>

#include "freehand/painting_state.h"

namespace quillane {

class WorkAreaWindow;
class ControlPanelWindow;
class ToolHost;

class FreehandPainting : public QObject {
  Q_OBJECT

 public:
  // The windows are top-level windows of their own, not children of the main window, so that
  // disabling the main window while they are open leaves them working.
  FreehandPainting(ToolHost& host, QObject* parent);
  ~FreehandPainting() override;

  WorkAreaWindow& WorkArea() { return *workArea_; }
  ControlPanelWindow& ControlPanel() { return *controlPanel_; }
  const PaintingState& State() const { return state_; }

 public slots:
  // Shows the work area, then the control panel. With no picture to paint on it says so and
  // opens nothing.
  void ColorUp();

 private:
  ToolHost& host_;
  PaintingState state_;
  std::unique_ptr<WorkAreaWindow> workArea_;
  std::unique_ptr<ControlPanelWindow> controlPanel_;
};

}  // namespace quillane
