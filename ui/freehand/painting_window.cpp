#include "ui/freehand/painting_window.h"

#include "ui/freehand/control_panel_window.h"
#include "ui/freehand/work_area_window.h"
#include "ui/platform.h"
#include "ui/tool_host.h"

namespace quillane {

FreehandPainting::FreehandPainting(ToolHost& host, QObject* parent)
    : QObject(parent),
      host_(host),
      workArea_(std::make_unique<WorkAreaWindow>(state_, host)),
      controlPanel_(std::make_unique<ControlPanelWindow>(state_, host, *workArea_)) {
  setObjectName("FreehandPainting");
  workArea_->SetControlPanel(controlPanel_.get());
}

FreehandPainting::~FreehandPainting() {
  // The panel refers to the work area: it goes first.
  controlPanel_.reset();
  workArea_.reset();
}

void FreehandPainting::ColorUp() {
  if (host_.Document().Working().Empty()) {
    host_.Platform().ShowMessage("Sorry", "There is no picture to color up.");
    return;
  }
  if (workArea_->isVisible()) {
    workArea_->raise();
    controlPanel_->raise();
    return;
  }
  workArea_->show();
  controlPanel_->show();
  controlPanel_->raise();
  controlPanel_->activateWindow();
}

}  // namespace quillane
