#include "ui/effects/color_panel_window.h"

#include <QButtonGroup>
#include <QGridLayout>
#include <QRadioButton>
#include <QVBoxLayout>

#include "effects/adjust/color_panel.h"

namespace quillane {
namespace {

const char* StatusFor(PanelLayout layout) {
  switch (layout) {
    case PanelLayout::Pane2x2:
    case PanelLayout::Pane3x3:
      return "Color Pane";
    case PanelLayout::Catercorner4:
    case PanelLayout::Catercorner16:
      return "Color Catercorner";
    default:
      return "Color Panels";
  }
}

}  // namespace

ColorPanelWindow::ColorPanelWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent)
    : ToolWindow(spec, host, parent) {
  // Left column: Panel 2 x 2, Pane 2 x 2, Catercorner (4); right: the 3 x 3 ones and (16).
  static const char* const kColumns[2][3] = {{"RadioButton1", "RadioButton2", "RadioButton3"},
                                             {"RadioButton4", "RadioButton5", "RadioButton6"}};
  auto* grid = new QGridLayout;
  grid->setHorizontalSpacing(12);
  for (int column = 0; column < 2; ++column)
    for (int row = 0; row < 3; ++row) {
      if (QWidget* button = TakeControl(kColumns[column][row]))
        grid->addWidget(button, row, column);
    }
  ControlsLayout()->addLayout(grid);
  // Nothing is selected at first, so that the first click on any layout applies it.
  if (auto* first = findChild<QRadioButton*>("RadioButton1"); first && first->group()) {
    QButtonGroup* group = first->group();
    group->setExclusive(false);
    first->setChecked(false);
    group->setExclusive(true);
  }
  SetWindowHeights(std::max(height(), sizeHint().height()), 0);
}

void ColorPanelWindow::ControlChanged(const ParamSpec&) {
  if (!Apply(true)) return;
  Host().SetStatusText(StatusFor(static_cast<PanelLayout>(Params().GetInt("layout"))));
}

}  // namespace quillane
