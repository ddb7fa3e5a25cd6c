#include "freehand/control_panel_window.h"

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
#include <QToolButton>
#include <algorithm>
#include <cmath>

#include "freehand/work_area_window.h"
#include "imaging/numeric.h"
#include "ui/clickable.h"
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

TFreehand_control::TFreehand_control(PaintingState& state, ToolHost& host, TFreehand& workArea)
    : QWidget(nullptr, Qt::Window | Qt::WindowStaysOnTopHint | Qt::CustomizeWindowHint |
                           Qt::WindowTitleHint | Qt::WindowCloseButtonHint),
      state_(state),
      host_(host),
      workArea_(workArea) {
  setObjectName("TFreehand_control");
  setWindowTitle("Original photo");
  setGeometry(8, 39, 226, 598);

  image2_ = new PictureView(this);
  image2_->setObjectName("Image2");
  image2_->setGeometry(4, 4, kViewWidth, kViewHeight);
  image2_->installEventFilter(this);

  panel1_ = new QFrame(this);
  panel1_->setObjectName("Panel1");
  panel1_->setGeometry(4, kViewHeight + 20, kViewWidth, 330);
  auto* grid = new QGridLayout(panel1_);
  grid->setContentsMargins(2, 2, 2, 2);
  grid->setVerticalSpacing(8);

  auto* toolRow = new QHBoxLayout;
  toolRow->setSpacing(2);
  tools_ = new QButtonGroup(this);
  tools_->setExclusive(true);
  for (const ToolButtonSpec& spec : kToolButtons) {
    auto* button = new QToolButton(panel1_);
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

  auto* panel = new Clickable<QFrame>(panel1_, [this] { ColorPanelClick(); });
  panel->setObjectName("ColorPanel");
  panel->setToolTip("Select a color from ColorPanel");
  panel->setFixedHeight(28);
  panel->setStyleSheet(ColorStyle(state_.brushColor));
  colorPanel_ = panel;
  grid->addWidget(colorPanel_, 1, 0, 1, 3);

  auto* label2 = new QLabel("Dia.", panel1_);
  label2->setObjectName("Label2");
  trackBar1_ = new QSlider(Qt::Horizontal, panel1_);
  trackBar1_->setObjectName("TrackBar1");
  trackBar1_->setRange(PaintingState::kMinPenSize, PaintingState::kMaxPenSize);
  trackBar1_->setValue(state_.penSize);
  label1_ = new QLabel(QString::number(state_.penSize), panel1_);
  label1_->setObjectName("Label1");
  label1_->setMinimumWidth(24);
  connect(trackBar1_, &QSlider::valueChanged, this, &TFreehand_control::TrackBar1Change);
  grid->addWidget(label2, 2, 0);
  grid->addWidget(trackBar1_, 2, 1);
  grid->addWidget(label1_, 2, 2);

  auto* buttons = new QGridLayout;
  const auto addButton = [&](const char* name, const char* text, const char* hint, int row,
                             int column, void (TFreehand_control::*click)()) {
    auto* button = new QPushButton(text, panel1_);
    button->setObjectName(name);
    if (hint != nullptr) button->setToolTip(hint);
    connect(button, &QPushButton::clicked, this, click);
    buttons->addWidget(button, row, column);
    return button;
  };
  thin_ = addButton("Button8", "Thin", "Thin the line", 0, 0, &TFreehand_control::Button8Click);
  thick_ = addButton("Button4", "Thick", "Thick the line", 0, 1, &TFreehand_control::Button4Click);
  addButton("Button1", "OK", nullptr, 1, 0, &TFreehand_control::Button1Click);
  addButton("Button2", "Cancel", nullptr, 1, 1, &TFreehand_control::Button2Click);
  grid->addLayout(buttons, 3, 0, 1, 3);
  grid->setRowStretch(4, 1);
}

// --- Opening and closing -----------------------------------------------------------------------

void TFreehand_control::showEvent(QShowEvent* event) {
  QWidget::showEvent(event);
  if (!event->spontaneous()) FormShow();
}

void TFreehand_control::closeEvent(QCloseEvent* event) {
  FormClose();
  QWidget::closeEvent(event);
}

void TFreehand_control::FormShow() {
  source_ = host_.Document().Source();
  image2_->SetPicture(source_);
  const int w = source_.Width(), h = source_.Height();
  if (w > 0 && h > 0) {
    if (h >= w)
      image2_->resize(ScaledRound(w, image2_->height(), h), image2_->height());
    else
      image2_->resize(image2_->width(), ScaledRound(h, image2_->width(), w));
  }
  state_.controlPanelOpen = true;
  panel1_->move(panel1_->x(), image2_->height() + 20);
  thin_->setEnabled(host_.LineArt());
  thick_->setEnabled(host_.LineArt());
  picking_ = false;
}

void TFreehand_control::FormClose() {
  host_.SetMainWindowEnabled(true);
  state_.controlPanelOpen = false;
  picking_ = false;
  image2_->resize(kViewWidth, kViewHeight);
  source_ = TBitmap32();
  image2_->SetPicture(source_);
  workArea_.close();
}

// --- Buttons -----------------------------------------------------------------------------------

void TFreehand_control::Button1Click() {
  host_.SetMainWindowEnabled(true);
  host_.SetWorkingPicture(workArea_.Picture(), true);
  host_.SetStatusText("Color up");
  close();
}

void TFreehand_control::Button2Click() {
  close();
}

void TFreehand_control::Button8Click() {
  workArea_.ThinPicture();
}

void TFreehand_control::Button4Click() {
  workArea_.ThickPicture();
}

void TFreehand_control::ChooseTool(int tool, int penSize) {
  state_.tool = tool;
  image2_->setCursor(tool == PaintingState::kEyedropper ? EyedropCursor() : QCursor());
  workArea_.setcursorimage2();
  if (penSize > 0) trackBar1_->setValue(penSize);
}

void TFreehand_control::TrackBar1Change(int position) {
  state_.penSize = position;
  label1_->setText(QString::number(position));
  workArea_.PenSizeChanged();
}

void TFreehand_control::ColorPanelClick() {
  const std::optional<std::uint32_t> color =
      host_.Platform().ChooseColor(ColorRefFromPixel(state_.brushColor));
  if (color) SetBrushColor(PixelFromColorRef(*color));
}

void TFreehand_control::SetBrushColor(Pixel color) {
  state_.SetBrushColor(color);
  colorPanel_->setStyleSheet(ColorStyle(state_.brushColor));
}

// --- The eyedropper ----------------------------------------------------------------------------

bool TFreehand_control::eventFilter(QObject* watched, QEvent* event) {
  if (watched != image2_ || state_.tool != PaintingState::kEyedropper)
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

void TFreehand_control::Pick(QPoint at) {
  const int w = source_.Width(), h = source_.Height();
  if (w == 0 || h == 0 || image2_->width() <= 0 || image2_->height() <= 0) return;
  // A point that rounds past the photo's last column or row (a photo less than half the view's
  // size), or a drag that left the view, picks the nearest pixel of the photo.
  const int x = std::clamp(at.x(), 0, image2_->width());
  const int y = std::clamp(at.y(), 0, image2_->height());
  const int px = std::min(ScaledRound(w, x, image2_->width()), w - 1);
  const int py = std::min(ScaledRound(h, y, image2_->height()), h - 1);
  SetBrushColor(source_.At(px, py));
}

}  // namespace quillane
