#include "ui/effects/preview_window.h"

#include <QAbstractButton>
#include <QButtonGroup>
#include <QGridLayout>
#include <QHBoxLayout>
#include <QLayout>
#include <QVBoxLayout>
#include <algorithm>
#include <functional>

#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_variety.h"
#include "ui/clickable.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

constexpr int kThumbnailBox = 109;  // the 105 by 105 fitting area and its margins
const char* const kSwatches[] = {"Panel3", "Panel4", "Panel5", "Panel6", "Panel7", "Panel8"};
const char* const kSwatchColours[] = {"#ff0000", "#008000", "#0000ff",
                                      "#ffff00", "#008080", "#ff00ff"};

// The swatches as coloured squares in two rows of three.
void PlaceSwatches(QGridLayout& grid, const std::function<QWidget*(const char*)>& take) {
  for (int i = 0; i < 6; ++i) {
    QWidget* swatch = take(kSwatches[i]);
    if (swatch == nullptr) continue;
    swatch->setFixedSize(34, 22);
    swatch->setStyleSheet(QString("* { background-color: %1; border: 1px solid gray; }"
                                  " QRadioButton::indicator { width: 0px; height: 0px; }")
                              .arg(kSwatchColours[i]));
    grid.addWidget(swatch, i / 3, i % 3);
  }
}

}  // namespace

PreviewWindow::PreviewWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent)
    : ToolWindow(spec, host, parent) {
  auto* row = new QHBoxLayout;
  const auto box = [&](PictureView*& view, const char* name, bool clickable) {
    auto* frame = new QWidget(this);
    frame->setFixedSize(kThumbnailBox, kThumbnailBox);
    view = clickable ? new Clickable<PictureView>(frame, [this] { ShowBase(); })
                     : new PictureView(frame);
    view->setObjectName(name);
    row->addWidget(frame);
  };
  box(baseView_, "Image1", true);
  baseView_->setToolTip("Reset");
  box(previewView_, "Image2", false);
  row->addStretch(1);
  ControlsLayout()->insertLayout(0, row);
}

void PreviewWindow::setVisible(bool visible) {
  // The swatches' style sheets take effect once the window is polished; only then does the
  // layout know how tall the window must be. The height is set before the window is shown: a
  // window resized while it is first being shown takes the position it was placed at for its
  // inside rather than its frame, and opens a title bar higher than placed.
  if (visible && isHidden()) {
    ensurePolished();
    // The controls added after the base window was built count only once the layout has run.
    layout()->activate();
    SetWindowHeights(std::max(height(), sizeHint().height()), 0);
  }
  ToolWindow::setVisible(visible);
}

void PreviewWindow::OnShown() {
  // The shared steps uncheck "For current", which loads the source.
  ToolWindow::OnShown();
  LoadBase();
}

void PreviewWindow::LoadBase() {
  const bool current = Params().GetInt("for-current") != 0;
  base_ = current ? Host().Document().Working() : Host().Document().Source();
  baseView_->SetPicture(base_);
  Host().DisplayImage(*baseView_);
  ClearSwatches();
  SetPreview(base_);
}

void PreviewWindow::SetPreview(Bitmap32 preview) {
  preview_ = std::move(preview);
  previewView_->SetPicture(preview_);
  Host().DisplayImage(*previewView_);
}

void PreviewWindow::ControlChanged(const ParamSpec& param) {
  if (param.name == "for-current") LoadBase();
}

void PreviewWindow::ShowBase() {
  ClearSwatches();
  SetPreview(base_);
}

void PreviewWindow::OnApply() {
  Host().SetWorkingPicture(preview_, true);
  Host().SetStatusText(QString::fromStdString(Spec().statusText));
  close();
}

ColorFilterWindow::ColorFilterWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent)
    : PreviewWindow(spec, host, parent) {
  auto* grid = new QGridLayout;
  grid->setSpacing(6);
  PlaceSwatches(*grid, [this](const char* name) { return TakeControl(name); });
  ControlsLayout()->insertLayout(1, grid);
  ClearSwatches();
}

void ColorFilterWindow::ClearSwatches() {
  // No swatch is chosen, so that a click on any one filters.
  auto* first = findChild<QAbstractButton*>(kSwatches[0]);
  if (first == nullptr || first->group() == nullptr) return;
  QButtonGroup* group = first->group();
  group->setExclusive(false);
  for (QAbstractButton* b : group->buttons()) b->setChecked(false);
  group->setExclusive(true);
}

void ColorFilterWindow::ControlChanged(const ParamSpec& param) {
  PreviewWindow::ControlChanged(param);
  if (param.name != "filter") return;
  const int f = Params().GetInt("filter");
  if (f >= 1) SetPreview(ColorFilter(Base(), static_cast<ColorFilterKind>(f)));
}

ColorVarietyWindow::ColorVarietyWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent)
    : PreviewWindow(spec, host, parent) {
  auto* grid = new QGridLayout;
  grid->setSpacing(6);
  PlaceSwatches(*grid, [this](const char* name) { return TakeControl(name); });
  ControlsLayout()->insertLayout(1, grid);
}

void ColorVarietyWindow::ClearSwatches() {
  if (!Params().GetList("more").empty()) SetParam("more", {});
}

void ColorVarietyWindow::ControlChanged(const ParamSpec& param) {
  PreviewWindow::ControlChanged(param);
  if (param.name == "more") SetPreview(VarietyClicks(Base(), Params().GetList("more")));
}

}  // namespace quillane
