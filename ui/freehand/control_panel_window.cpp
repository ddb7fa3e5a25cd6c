#include "ui/freehand/control_panel_window.h"

#include <QButtonGroup>
#include <QCloseEvent>
#include <QCursor>
#include <QFrame>
#include <QGridLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QMouseEvent>
#include <QPainter>
#include <QPainterPath>
#include <QPixmap>
#include <QPushButton>
#include <QShowEvent>
#include <QSlider>
#include <QStyle>
#include <QToolButton>
#include <algorithm>
#include <cmath>
#include <vector>

#include "imaging/numeric.h"
#include "ui/clickable.h"
#include "ui/freehand/work_area_window.h"
#include "ui/picture_view.h"
#include "ui/platform.h"
#include "ui/tool_host.h"

namespace quillane {
namespace {

// The pointer over the photo while the eyedropper is chosen: a pipette whose tip, at the
// bottom left, is the picked point.
QCursor EyedropCursor() {
  QPixmap pixmap(32, 32);
  pixmap.fill(Qt::transparent);
  QPainter painter(&pixmap);
  painter.setRenderHint(QPainter::Antialiasing);
  painter.setPen(QPen(Qt::white, 4, Qt::SolidLine, Qt::RoundCap));
  painter.drawLine(QPointF(2, 29), QPointF(20, 11));
  painter.setPen(QPen(Qt::black, 2, Qt::SolidLine, Qt::RoundCap));
  painter.drawLine(QPointF(2, 29), QPointF(20, 11));
  painter.setPen(QPen(Qt::white, 1));
  painter.setBrush(Qt::black);
  painter.drawEllipse(QPointF(24, 7), 5.5, 5.5);
  painter.drawLine(QPointF(16, 8), QPointF(23, 15));
  painter.end();
  return QCursor(pixmap, 1, 30);
}

QString ColorStyle(Pixel color) {
  return QStringLiteral("background-color: rgb(%1, %2, %3); border: 1px solid gray;")
      .arg(color.r)
      .arg(color.g)
      .arg(color.b);
}

// Round(a * b / c) with the product taken whole and divided in floating point.
int ScaledRound(int a, int b, int c) {
  return Round(static_cast<Extended>(static_cast<std::int64_t>(a) * b) / c);
}

struct ToolButtonSpec {
  const char* name;
  const char* text;
  const char* hint;
  int tool;
  int penSize;  // 0: left as it is
};
constexpr ToolButtonSpec kToolButtons[] = {
    {"SpeedButton14", "Brush", "Brush to scrawl the picture", PaintingState::kBrush, 16},
    {"SpeedButton12", "Pen", "Pen to draw line", PaintingState::kPen, 2},
    {"SpeedButton1", "Line", "Draw a beeline", PaintingState::kBeeline, 2},
    {"SpeedButton15", "Rubber", "Rubber to clear", PaintingState::kRubber, 16},
    {"SpeedButton11", "Pick", "Pick a color from the photo", PaintingState::kEyedropper, 0},
};

}  // namespace

ControlPanelWindow::ControlPanelWindow(PaintingState& state, ToolHost& host,
                                       WorkAreaWindow& workArea)
    : QWidget(nullptr, Qt::Window | Qt::WindowStaysOnTopHint | Qt::CustomizeWindowHint |
                           Qt::WindowTitleHint | Qt::WindowCloseButtonHint),
      state_(state),
      host_(host),
      workArea_(workArea) {
  setObjectName("TFreehand_control");
  setWindowTitle("Original photo");
  setGeometry(8, 39, 226, 598);

  photoView_ = new PictureView(this);
  photoView_->setObjectName("Image2");
  photoView_->setGeometry(4, 4, kViewWidth, kViewHeight);
  photoView_->installEventFilter(this);

  toolPanel_ = new QFrame(this);
  toolPanel_->setObjectName("Panel1");
  toolPanel_->setGeometry(4, kViewHeight + 20, kViewWidth, 330);
  auto* grid = new QGridLayout(toolPanel_);
  grid->setContentsMargins(2, 2, 2, 2);
  grid->setVerticalSpacing(8);

  auto* toolRow = new QHBoxLayout;
  toolRow->setSpacing(2);
  tools_ = new QButtonGroup(this);
  tools_->setExclusive(true);
  for (const ToolButtonSpec& spec : kToolButtons) {
    auto* button = new QToolButton(toolPanel_);
    button->setObjectName(spec.name);
    button->setText(spec.text);
    button->setToolTip(spec.hint);
    button->setCheckable(true);
    tools_->addButton(button, spec.tool);
    connect(button, &QToolButton::clicked, this,
            [this, spec] { ChooseTool(spec.tool, spec.penSize); });
    toolRow->addWidget(button);
  }
  grid->addLayout(toolRow, 0, 0, 1, 3);
  // Each button as wide as its caption with the frame around it, or "Rubber" is cut on both
  // sides, and what is left of the row shared out equally.
  const QList<QAbstractButton*> toolButtons = tools_->buttons();
  std::vector<int> widths;
  int spare = kViewWidth - grid->contentsMargins().left() - grid->contentsMargins().right() -
              toolRow->spacing() * static_cast<int>(toolButtons.size() - 1);
  for (QAbstractButton* button : toolButtons) {
    const int frame = button->style()->pixelMetric(QStyle::PM_DefaultFrameWidth, nullptr, button);
    widths.push_back(button->fontMetrics().horizontalAdvance(button->text()) + 2 * (frame + 2));
    spare -= widths.back();
  }
  for (int i = 0; i < static_cast<int>(toolButtons.size()); ++i) {
    const int share = std::max(0, spare) / static_cast<int>(toolButtons.size());
    toolButtons[i]->setFixedWidth(widths[static_cast<std::size_t>(i)] + share);
  }

  auto* panel = new Clickable<QFrame>(toolPanel_, [this] { ChooseBrushColor(); });
  panel->setObjectName("ColorPanel");
  panel->setToolTip("Select a color from ColorPanel");
  panel->setFixedHeight(28);
  panel->setStyleSheet(ColorStyle(state_.brushColor));
  colorPanel_ = panel;
  grid->addWidget(colorPanel_, 1, 0, 1, 3);

  auto* label2 = new QLabel("Dia.", toolPanel_);
  label2->setObjectName("Label2");
  penSizeSlider_ = new QSlider(Qt::Horizontal, toolPanel_);
  penSizeSlider_->setObjectName("TrackBar1");
  penSizeSlider_->setRange(PaintingState::kMinPenSize, PaintingState::kMaxPenSize);
  penSizeSlider_->setValue(state_.penSize);
  penSizeLabel_ = new QLabel(QString::number(state_.penSize), toolPanel_);
  penSizeLabel_->setObjectName("Label1");
  penSizeLabel_->setMinimumWidth(24);
  connect(penSizeSlider_, &QSlider::valueChanged, this, &ControlPanelWindow::OnPenSizeChanged);
  grid->addWidget(label2, 2, 0);
  grid->addWidget(penSizeSlider_, 2, 1);
  grid->addWidget(penSizeLabel_, 2, 2);

  auto* buttons = new QGridLayout;
  const auto addButton = [&](const char* name, const char* text, const char* hint, int row,
                             int column, void (ControlPanelWindow::*click)()) {
    auto* button = new QPushButton(text, toolPanel_);
    button->setObjectName(name);
    if (hint != nullptr) button->setToolTip(hint);
    connect(button, &QPushButton::clicked, this, click);
    buttons->addWidget(button, row, column);
    return button;
  };
  thin_ = addButton("Button8", "Thin", "Thin the line", 0, 0, &ControlPanelWindow::OnThin);
  thick_ = addButton("Button4", "Thick", "Thick the line", 0, 1, &ControlPanelWindow::OnThick);
  addButton("Button1", "OK", nullptr, 1, 0, &ControlPanelWindow::OnOk);
  addButton("Button2", "Cancel", nullptr, 1, 1, &ControlPanelWindow::OnCancel);
  grid->addLayout(buttons, 3, 0, 1, 3);
  grid->setRowStretch(4, 1);

  // After a click on a tool or Thin the focus is here, and Ctrl+Z must still take back a step.
  addAction(workArea_.UndoStrokeAction());
}

// --- Opening and closing -----------------------------------------------------------------------

void ControlPanelWindow::showEvent(QShowEvent* event) {
  QWidget::showEvent(event);
  if (!event->spontaneous()) OnShown();
}

void ControlPanelWindow::closeEvent(QCloseEvent* event) {
  OnClosed();
  QWidget::closeEvent(event);
}

void ControlPanelWindow::OnShown() {
  source_ = host_.Document().Source();
  photoView_->SetPicture(source_);
  const int w = source_.Width(), h = source_.Height();
  if (w > 0 && h > 0) {
    if (h >= w)
      photoView_->resize(ScaledRound(w, photoView_->height(), h), photoView_->height());
    else
      photoView_->resize(photoView_->width(), ScaledRound(h, photoView_->width(), w));
  }
  state_.controlPanelOpen = true;
  toolPanel_->move(toolPanel_->x(), photoView_->height() + 20);
  thin_->setEnabled(host_.LineArt());
  thick_->setEnabled(host_.LineArt());
  picking_ = false;
}

void ControlPanelWindow::OnClosed() {
  host_.SetMainWindowEnabled(true);
  state_.controlPanelOpen = false;
  picking_ = false;
  photoView_->resize(kViewWidth, kViewHeight);
  source_ = Bitmap32();
  photoView_->SetPicture(source_);
  workArea_.close();
}

// --- Buttons -----------------------------------------------------------------------------------

void ControlPanelWindow::OnOk() {
  host_.SetMainWindowEnabled(true);
  host_.SetWorkingPicture(workArea_.Picture(), true);
  host_.SetStatusText("Color up");
  close();
}

void ControlPanelWindow::OnCancel() {
  close();
}

void ControlPanelWindow::OnThin() {
  workArea_.ThinPicture();
}

void ControlPanelWindow::OnThick() {
  workArea_.ThickPicture();
}

void ControlPanelWindow::ChooseTool(int tool, int penSize) {
  state_.tool = tool;
  photoView_->setCursor(tool == PaintingState::kEyedropper ? EyedropCursor() : QCursor());
  workArea_.UpdateToolCursor();
  if (penSize > 0) penSizeSlider_->setValue(penSize);
}

void ControlPanelWindow::OnPenSizeChanged(int position) {
  state_.penSize = position;
  penSizeLabel_->setText(QString::number(position));
  workArea_.PenSizeChanged();
}

void ControlPanelWindow::ChooseBrushColor() {
  const std::optional<std::uint32_t> color =
      host_.Platform().ChooseColor(ColorRefFromPixel(state_.brushColor));
  if (color) SetBrushColor(PixelFromColorRef(*color));
}

void ControlPanelWindow::SetBrushColor(Pixel color) {
  state_.SetBrushColor(color);
  colorPanel_->setStyleSheet(ColorStyle(state_.brushColor));
}

// --- The eyedropper ----------------------------------------------------------------------------

bool ControlPanelWindow::eventFilter(QObject* watched, QEvent* event) {
  if (watched != photoView_ || state_.tool != PaintingState::kEyedropper)
    return QWidget::eventFilter(watched, event);
  const auto at = [event] {
    const QPointF p = static_cast<QMouseEvent*>(event)->position();
    return QPoint(static_cast<int>(std::floor(p.x())), static_cast<int>(std::floor(p.y())));
  };
  switch (event->type()) {
    case QEvent::MouseButtonPress:
      picking_ = true;
      Pick(at());
      return true;
    case QEvent::MouseMove:
      if (picking_) Pick(at());
      return true;
    case QEvent::MouseButtonRelease:
      picking_ = false;
      return true;
    default:
      return QWidget::eventFilter(watched, event);
  }
}

void ControlPanelWindow::Pick(QPoint at) {
  const int w = source_.Width(), h = source_.Height();
  if (w == 0 || h == 0 || photoView_->width() <= 0 || photoView_->height() <= 0) return;
  // A point that rounds past the photo's last column or row (a photo less than half the view's
  // size), or a drag that left the view, picks the nearest pixel of the photo.
  const int x = std::clamp(at.x(), 0, photoView_->width());
  const int y = std::clamp(at.y(), 0, photoView_->height());
  const int px = std::min(ScaledRound(w, x, photoView_->width()), w - 1);
  const int py = std::min(ScaledRound(h, y, photoView_->height()), h - 1);
  SetBrushColor(source_.At(px, py));
}

}  // namespace quillane
