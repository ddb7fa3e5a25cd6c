#include "ui/effects/bw_sketch_window.h"

#include <QLabel>
#include <QPainter>
#include <QVBoxLayout>

namespace quillane {
namespace {

const QColor kUnchosenGray(128, 128, 128);

// The dashed line that separates the two sliders.
class DashedSeparator : public QLabel {
 public:
  explicit DashedSeparator(QWidget* parent) : QLabel(parent) { setFixedHeight(7); }

 protected:
  void paintEvent(QPaintEvent*) override {
    QPainter p(this);
    p.setPen(QPen(palette().color(QPalette::Mid), 1, Qt::DashLine));
    const int y = height() / 2;
    p.drawLine(0, y, width() - 1, y);
  }
};

void SetTextColor(QLabel* label, const QColor& color) {
  if (label == nullptr) return;
  QPalette palette = label->palette();
  palette.setColor(QPalette::WindowText, color);
  label->setPalette(palette);
}

}  // namespace

BwSketchWindow::BwSketchWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent)
    : ToolWindow(spec, host, parent) {
  auto* separator = new DashedSeparator(this);
  separator->setObjectName("Label5");
  ControlsLayout()->insertWidget(1, separator);
  MarkToneMode(PencilToneMode::Contrast);
}

PencilToneMode BwSketchWindow::ToneMode() const {
  return static_cast<PencilToneMode>(Params().GetInt("tone-mode"));
}

void BwSketchWindow::OnShown() {
  // The shared steps put the tone mode back to Contrast; the labels follow it.
  ToolWindow::OnShown();
  MarkToneMode(ToneMode());
  Host().SetLineArt(false);
}

void BwSketchWindow::ControlChanged(const ParamSpec&) {
  MarkToneMode(ToneMode());
}

void BwSketchWindow::MarkToneMode(PencilToneMode mode) {
  const QColor text = palette().color(QPalette::WindowText);
  const bool contrast = mode == PencilToneMode::Contrast;
  SetTextColor(FindLabel("Label1"), contrast ? text : kUnchosenGray);
  SetTextColor(FindLabel("Label4"), contrast ? text : kUnchosenGray);
  SetTextColor(FindLabel("Label2"), contrast ? kUnchosenGray : text);
  SetTextColor(FindLabel("Label3"), contrast ? kUnchosenGray : text);
}

}  // namespace quillane
