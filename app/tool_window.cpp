#include "app/tool_window.h"

#include <QCheckBox>
#include <QCloseEvent>
#include <QGridLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QShowEvent>
#include <QSlider>
#include <QToolButton>
#include <QVBoxLayout>

#include "app/glyphs.h"
#include "app/main_window.h"
#include "batch/batch_convert.h"

namespace quillane {
namespace {

constexpr int kWindowWidth = 300;
constexpr int kCaptionWidth = 62;
constexpr int kNumberWidth = 30;
// Windows without a batch panel are never shorter than this.
constexpr int kMinimumHeight = 90;

QString NumberText(const ControlSpec& control, int position) {
  return QString::number(control.numberFor ? control.numberFor(position) : position);
}

}  // namespace

ToolWindow::ToolWindow(const EffectSpec& spec, TMyPicture& main)
    : QWidget(&main, Qt::Tool | Qt::WindowStaysOnTopHint | Qt::CustomizeWindowHint |
                         Qt::WindowTitleHint | Qt::WindowCloseButtonHint),
      spec_(spec),
      main_(main) {
  setObjectName(QString::fromStdString(spec.windowClass));
  setWindowTitle(QString::fromStdString(spec.caption));

  auto* outer = new QVBoxLayout(this);
  outer->setContentsMargins(0, 0, 0, 0);
  outer->setSpacing(0);

  auto* body = new QVBoxLayout;
  body->setContentsMargins(10, 8, 10, 6);
  body->setSpacing(4);
  outer->addLayout(body);

  controlsLayout_ = new QVBoxLayout;
  controlsLayout_->setSpacing(2);
  body->addLayout(controlsLayout_);
  for (const ControlSpec& control : spec_.controls) {
    switch (control.kind) {
      case ControlKind::Slider:
        AddSliderRow(control);
        break;
      case ControlKind::CheckBox:
        AddCheckBox(control);
        break;
      case ControlKind::Hidden:
        hidden_[control.param] = control.defaultValue;
        break;
    }
  }
  body->addStretch(1);
  BuildButtonRow(body);
  if (spec_.HasBatchPanel()) BuildBatchPanel(outer);

  if (spec_.HasBatchPanel())
    SetWindowHeights(spec_.collapsedHeight, spec_.expandedHeight);
  else
    SetWindowHeights(std::max(kMinimumHeight, sizeHint().height()), 0);
}

void ToolWindow::AddSliderRow(const ControlSpec& control) {
  auto* row = new QHBoxLayout;
  row->setSpacing(6);
  auto* caption = new QLabel(QString::fromStdString(control.caption), this);
  if (!control.captionLabel.empty())
    caption->setObjectName(QString::fromStdString(control.captionLabel));
  caption->setFixedWidth(kCaptionWidth);
  row->addWidget(caption);

  auto* slider = new QSlider(Qt::Horizontal, this);
  slider->setObjectName(QString::fromStdString(control.objectName));
  slider->setRange(control.minimum, control.maximum);
  slider->setValue(control.defaultValue);
  if (control.pageStep > 0) slider->setPageStep(control.pageStep);
  row->addWidget(slider, 1);

  QLabel* number = nullptr;
  if (!control.numberLabel.empty()) {
    const QString initial = control.initialNumber.empty()
                                ? NumberText(control, control.defaultValue)
                                : QString::fromStdString(control.initialNumber);
    number = new QLabel(initial, this);
    number->setObjectName(QString::fromStdString(control.numberLabel));
    number->setFixedWidth(kNumberWidth);
    number->setAlignment(Qt::AlignRight | Qt::AlignVCenter);
    row->addWidget(number);
  }
  controlsLayout_->addLayout(row);

  connect(slider, &QSlider::valueChanged, this, [this, &control, number](int value) {
    if (number != nullptr) number->setText(NumberText(control, value));
    SelectFrom(control);
    ControlChanged(control, value);
  });
}

void ToolWindow::AddCheckBox(const ControlSpec& control) {
  auto* box = new QCheckBox(QString::fromStdString(control.caption), this);
  box->setObjectName(QString::fromStdString(control.objectName));
  box->setChecked(control.defaultValue != 0);
  controlsLayout_->addWidget(box);
  connect(box, &QCheckBox::toggled, this, [this, &control](bool checked) {
    SelectFrom(control);
    ControlChanged(control, checked ? 1 : 0);
  });
}

void ToolWindow::BuildButtonRow(QBoxLayout* outer) {
  auto* row = new QHBoxLayout;
  row->setSpacing(6);
  if (spec_.HasBatchPanel()) {
    batchToggle_ = new QToolButton(this);
    batchToggle_->setObjectName("SpeedButton1");
    batchToggle_->setAutoRaise(true);
    batchToggle_->setIcon(main_.DownArrowIcon());
    batchToggle_->setIconSize(QSize(16, 16));
    batchToggle_->setToolTip("Show batch convert");
    connect(batchToggle_, &QToolButton::clicked, this, &ToolWindow::SpeedButton1Click);
    row->addWidget(batchToggle_);
  }
  row->addStretch(1);
  if (spec_.colorUp) {
    button2_ = new QToolButton(this);
    button2_->setObjectName("Button2");
    button2_->setText("Color up");
    button2_->setToolTip("Color up");
    button2_->setIcon(GlyphIcon(Glyph::ColorUp));
    button2_->setIconSize(QSize(16, 16));
    button2_->setToolButtonStyle(Qt::ToolButtonTextBesideIcon);
    button2_->setEnabled(false);
    connect(button2_, &QToolButton::clicked, this, &ToolWindow::Button2Click);
    row->addWidget(button2_);
  }
  button1_ = new QPushButton("OK", this);
  button1_->setObjectName("Button1");
  button1_->setMinimumWidth(75);
  connect(button1_, &QPushButton::clicked, this, &ToolWindow::Button1Click);
  row->addWidget(button1_);
  outer->addLayout(row);
}

void ToolWindow::BuildBatchPanel(QBoxLayout* outer) {
  panel2_ = new QFrame(this);
  panel2_->setObjectName("Panel2");
  panel2_->setFrameShape(QFrame::StyledPanel);
  panel2_->setFixedHeight(spec_.expandedHeight - spec_.collapsedHeight);
  auto* grid = new QGridLayout(panel2_);
  grid->setContentsMargins(10, 6, 10, 6);
  grid->setHorizontalSpacing(6);
  grid->setVerticalSpacing(4);

  auto addRow = [&](int row, const char* labelName, const char* caption, const char* editName,
                    const char* buttonName) {
    auto* label = new QLabel(caption, panel2_);
    label->setObjectName(labelName);
    auto* edit = new QLineEdit(panel2_);
    edit->setObjectName(editName);
    auto* browse = new QToolButton(panel2_);
    browse->setObjectName(buttonName);
    browse->setText("Browse");
    grid->addWidget(label, row, 0);
    grid->addWidget(edit, row, 1);
    grid->addWidget(browse, row, 2);
    return std::make_pair(edit, browse);
  };
  auto [edit1, browseIn] = addRow(0, "Label6", "Input:", "Edit1", "SpeedButton2");
  auto [edit2, browseOut] = addRow(1, "Label7", "Output:", "Edit2", "SpeedButton3");
  edit1_ = edit1;
  edit2_ = edit2;
  connect(browseIn, &QToolButton::clicked, this, &ToolWindow::SpeedButton2Click);
  connect(browseOut, &QToolButton::clicked, this, &ToolWindow::SpeedButton3Click);

  auto* convert = new QToolButton(panel2_);
  convert->setObjectName("SpeedButton4");
  convert->setText("Convert");
  convert->setSizePolicy(QSizePolicy::Preferred, QSizePolicy::Expanding);
  grid->addWidget(convert, 0, 3, 2, 1);
  connect(convert, &QToolButton::clicked, this, &ToolWindow::SpeedButton4Click);

  panel2_->hide();
  outer->addWidget(panel2_);
}

void ToolWindow::SetWindowHeights(int collapsed, int expanded) {
  collapsedHeight_ = collapsed;
  expandedHeight_ = expanded;
  setFixedSize(kWindowWidth, BatchPanelShown() ? expandedHeight_ : collapsedHeight_);
}

// --- Settings --------------------------------------------------------------------------------

EffectParams ToolWindow::Params() const {
  EffectParams params;
  for (const ControlSpec& control : spec_.controls) {
    const QString name = QString::fromStdString(control.objectName);
    switch (control.kind) {
      case ControlKind::Slider:
        if (auto* slider = findChild<QSlider*>(name)) params.Set(control.param, slider->value());
        break;
      case ControlKind::CheckBox:
        if (auto* box = findChild<QCheckBox*>(name)) params.Set(control.param, box->isChecked());
        break;
      case ControlKind::Hidden:
        params.Set(control.param, hidden_.at(control.param));
        break;
    }
  }
  return params;
}

void ToolWindow::SetHiddenParam(const std::string& name, int value) {
  auto it = hidden_.find(name);
  if (it != hidden_.end()) it->second = value;
}

void ToolWindow::SelectFrom(const ControlSpec& control) {
  if (!control.selects.empty()) SetHiddenParam(control.selects, control.selectValue);
}

void ToolWindow::ControlChanged(const ControlSpec&, int) {}

QLabel* ToolWindow::FindLabel(const QString& name) const {
  return findChild<QLabel*>(name);
}
QSlider* ToolWindow::FindSlider(const QString& name) const {
  return findChild<QSlider*>(name);
}

// --- Showing and closing ---------------------------------------------------------------------

void ToolWindow::showEvent(QShowEvent* event) {
  QWidget::showEvent(event);
  // Only the program's own show counts, not the window system restoring the window.
  if (!event->spontaneous()) FormShow();
}

void ToolWindow::closeEvent(QCloseEvent* event) {
  FormClose();
  QWidget::closeEvent(event);
}

void ToolWindow::FormShow() {
  main_.SetActiveTool(Number());
  if (edit1_ != nullptr) edit1_->setText(main_.InputFolder());
  if (edit2_ != nullptr) edit2_->setText(main_.OutputFolder());
  if (button2_ != nullptr) button2_->setEnabled(false);
}

void ToolWindow::FormClose() {
  main_.SetActiveTool(0);
}

// --- Buttons ---------------------------------------------------------------------------------

bool ToolWindow::Apply(bool recordHistory) {
  if (!spec_.routine) return false;
  if (!main_.ApplyEffect(spec_.routine, Params(), QString::fromStdString(spec_.statusText),
                         recordHistory))
    return false;
  AfterEffect();
  return true;
}

void ToolWindow::AfterEffect() {
  main_.SetStatusText(QString::fromStdString(spec_.statusText));
  if (button2_ != nullptr) button2_->setEnabled(true);
  AfterApply();
}

void ToolWindow::Button1Click() {
  Apply(true);
}

void ToolWindow::Button2Click() {
  emit colorUpRequested();
}

bool ToolWindow::BatchPanelShown() const {
  return panel2_ != nullptr && !panel2_->isHidden();
}

void ToolWindow::SpeedButton1Click() {
  if (panel2_ == nullptr) return;
  if (panel2_->isHidden()) {
    setFixedHeight(expandedHeight_);
    panel2_->show();
    batchToggle_->setIcon(main_.UpArrowIcon());
    batchToggle_->setToolTip("Hide batch convert");
  } else {
    panel2_->hide();
    setFixedHeight(collapsedHeight_);
    batchToggle_->setIcon(main_.DownArrowIcon());
    batchToggle_->setToolTip("Show batch convert");
  }
}

void ToolWindow::SpeedButton2Click() {
  main_.OpenDir();
  // Refreshed even after a cancel: the shared folder may have been chosen in another window.
  if (edit1_ != nullptr) edit1_->setText(main_.InputFolder());
}

void ToolWindow::SpeedButton3Click() {
  main_.OpenDir2();
  if (edit2_ != nullptr) edit2_->setText(main_.OutputFolder());
}

void ToolWindow::SpeedButton4Click() {
  if (edit1_ == nullptr || edit2_ == nullptr || !spec_.routine) return;
  BeforeBatch();
  // The loop itself runs the routine (and the history step of the effects whose batch does);
  // the window adds its own steps after each picture.
  const BatchResult result = main_.ConvertBatchFolder(spec_, Params(), edit1_->text(),
                                                      edit2_->text(), [this] { AfterEffect(); });
  if (result.end != BatchResult::End::Completed) return;
  AfterBatch();
  main_.ShowBatchConvertOk();
}

}  // namespace quillane
