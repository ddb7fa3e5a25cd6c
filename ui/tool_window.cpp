#include "ui/tool_window.h"

#include <QCloseEvent>
#include <QGridLayout>
#include <QHBoxLayout>
#include <QKeyEvent>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QShowEvent>
#include <QToolButton>
#include <QVBoxLayout>

#include "batch/batch_convert.h"
#include "ui/glyphs.h"
#include "ui/path_field.h"
#include "ui/platform.h"

namespace quillane {
namespace {

constexpr int kWindowWidth = 300;
// Windows without a batch panel are never shorter than this.
constexpr int kMinimumHeight = 90;

}  // namespace

ToolWindow::ToolWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent)
    // A tool window of its parent, the main window: it floats above that window only, so the
    // dialogs of the program and every other program's windows can come on top of it.
    : QWidget(parent,
              Qt::Tool | Qt::CustomizeWindowHint | Qt::WindowTitleHint | Qt::WindowCloseButtonHint),
      spec_(spec),
      host_(host) {
  setObjectName(QString::fromStdString(spec.windowObjectName));
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
  for (const ParamSpec& param : spec_.params)
    params_[param.name] = BuildParamWidget(param, *this, *controlsLayout_, host_.Platform(),
                                           [this, &param] { ParamChanged(param); });
  body->addStretch(1);
  BuildButtonRow(body);
  if (spec_.HasBatchPanel()) BuildBatchPanel(outer);

  if (spec_.HasBatchPanel())
    SetWindowHeights(spec_.collapsedHeight, spec_.expandedHeight);
  else
    SetWindowHeights(std::max(kMinimumHeight, sizeHint().height()), 0);
}

ToolWindow::~ToolWindow() = default;

void ToolWindow::BuildButtonRow(QBoxLayout* outer) {
  auto* row = new QHBoxLayout;
  row->setSpacing(6);
  if (spec_.HasBatchPanel()) {
    batchToggle_ = new QToolButton(this);
    batchToggle_->setObjectName("SpeedButton1");
    batchToggle_->setAutoRaise(true);
    batchToggle_->setIcon(host_.DownArrowIcon());
    batchToggle_->setIconSize(QSize(16, 16));
    batchToggle_->setToolTip("Show batch convert");
    connect(batchToggle_, &QToolButton::clicked, this, &ToolWindow::ToggleBatchPanel);
    row->addWidget(batchToggle_);
  }
  row->addStretch(1);
  if (spec_.colorUp) {
    colorUp_ = new QToolButton(this);
    colorUp_->setObjectName("Button2");
    colorUp_->setText("Color up");
    colorUp_->setToolTip("Color up");
    colorUp_->setIcon(GlyphIcon(Glyph::ColorUp));
    colorUp_->setIconSize(QSize(16, 16));
    colorUp_->setToolButtonStyle(Qt::ToolButtonTextBesideIcon);
    colorUp_->setEnabled(false);
    connect(colorUp_, &QToolButton::clicked, this, &ToolWindow::OpenColorUp);
    row->addWidget(colorUp_);
  }
  auto addButton = [&](const ButtonSpec& b, void (ToolWindow::*click)()) {
    auto* button = new QPushButton(QString::fromStdString(b.caption), this);
    button->setObjectName(QString::fromStdString(b.objectName));
    if (!b.hint.empty()) button->setToolTip(QString::fromStdString(b.hint));
    button->setMinimumWidth(75);
    connect(button, &QPushButton::clicked, this, click);
    row->addWidget(button);
  };
  if (!spec_.apply.objectName.empty()) addButton(spec_.apply, &ToolWindow::OnApply);
  if (!spec_.restoreDefaults.objectName.empty())
    addButton(spec_.restoreDefaults, &ToolWindow::RestoreDefaultsAndApply);
  outer->addLayout(row);
}

void ToolWindow::BuildBatchPanel(QBoxLayout* outer) {
  batchPanel_ = new QFrame(this);
  batchPanel_->setObjectName("Panel2");
  batchPanel_->setFrameShape(QFrame::StyledPanel);
  batchPanel_->setFixedHeight(spec_.expandedHeight - spec_.collapsedHeight);
  auto* grid = new QGridLayout(batchPanel_);
  grid->setContentsMargins(10, 6, 10, 6);
  grid->setHorizontalSpacing(6);
  grid->setVerticalSpacing(4);

  auto addRow = [&](int row, const char* labelName, const char* caption, const char* editName,
                    const char* buttonName) {
    auto* label = new QLabel(caption, batchPanel_);
    label->setObjectName(labelName);
    auto* edit = new PathField(batchPanel_);
    edit->setObjectName(editName);
    auto* browse = new QToolButton(batchPanel_);
    browse->setObjectName(buttonName);
    browse->setText("Browse");
    grid->addWidget(label, row, 0);
    grid->addWidget(edit, row, 1);
    grid->addWidget(browse, row, 2);
    return std::make_pair(edit, browse);
  };
  auto [input, browseIn] = addRow(0, "Label6", "Input:", spec_.inputField.c_str(), "SpeedButton2");
  auto [output, browseOut] =
      addRow(1, "Label7", "Output:", spec_.outputField.c_str(), "SpeedButton3");
  inputField_ = input;
  outputField_ = output;
  // A long folder does not fit the field, which leaves out its middle; the tooltip shows the
  // whole of it.
  for (QLineEdit* field : {input, output})
    connect(field, &QLineEdit::textChanged, field, &QLineEdit::setToolTip);
  connect(browseIn, &QToolButton::clicked, this, &ToolWindow::BrowseInputFolder);
  connect(browseOut, &QToolButton::clicked, this, &ToolWindow::BrowseOutputFolder);

  auto* convert = new QToolButton(batchPanel_);
  convert->setObjectName("SpeedButton4");
  convert->setText("Convert");
  convert->setSizePolicy(QSizePolicy::Preferred, QSizePolicy::Expanding);
  grid->addWidget(convert, 0, 3, 2, 1);
  connect(convert, &QToolButton::clicked, this, &ToolWindow::ConvertBatch);

  batchPanel_->hide();
  outer->addWidget(batchPanel_);
}

void ToolWindow::SetWindowHeights(int collapsed, int expanded) {
  collapsedHeight_ = collapsed;
  expandedHeight_ = expanded;
  setFixedSize(kWindowWidth, BatchPanelShown() ? expandedHeight_ : collapsedHeight_);
}

// --- Settings --------------------------------------------------------------------------------

EffectParams ToolWindow::Params() const {
  EffectParams values;
  for (const ParamSpec& param : spec_.params)
    values.SetList(param.name, params_.at(param.name)->Value());
  return values;
}

void ToolWindow::SetParam(const std::string& name, const EffectParams::Values& value) {
  if (auto it = params_.find(name); it != params_.end()) it->second->SetValue(value);
}

void ToolWindow::ParamChanged(const ParamSpec& param) {
  if (!param.selects.empty()) SetParam(param.selects, {param.selectValue});
  ControlChanged(param);
}

void ToolWindow::ControlChanged(const ParamSpec&) {}

std::optional<EffectParams> ToolWindow::CheckedParams() {
  try {
    return Params();
  } catch (const ParamError& e) {
    host_.Platform().ShowError(QString::fromStdString(e.what()));
    return std::nullopt;
  }
}

QLabel* ToolWindow::FindLabel(const QString& name) const {
  return findChild<QLabel*>(name);
}

namespace {

bool TakeFromLayout(QLayout* layout, QWidget* widget) {
  if (layout->indexOf(widget) >= 0) {
    layout->removeWidget(widget);
    return true;
  }
  for (int i = 0; i < layout->count(); ++i)
    if (QLayout* inner = layout->itemAt(i)->layout(); inner && TakeFromLayout(inner, widget))
      return true;
  return false;
}

}  // namespace

QWidget* ToolWindow::TakeControl(const QString& name) {
  auto* widget = findChild<QWidget*>(name);
  if (widget != nullptr) TakeFromLayout(controlsLayout_, widget);
  return widget;
}

// --- Showing and closing ---------------------------------------------------------------------

void ToolWindow::showEvent(QShowEvent* event) {
  QWidget::showEvent(event);
  // Only the program's own show counts, not the window system restoring the window.
  if (!event->spontaneous()) OnShown();
}

void ToolWindow::keyPressEvent(QKeyEvent* event) {
  // As in a dialog: Enter presses the apply button, Escape closes the window.
  switch (event->key()) {
    case Qt::Key_Return:
    case Qt::Key_Enter:
      if (auto* apply = findChild<QPushButton*>(QString::fromStdString(spec_.apply.objectName));
          apply != nullptr && !spec_.apply.objectName.empty() && apply->isEnabled()) {
        apply->click();
        return;
      }
      break;
    case Qt::Key_Escape:
      close();
      return;
    default:
      break;
  }
  QWidget::keyPressEvent(event);
}

void ToolWindow::closeEvent(QCloseEvent* event) {
  OnClosed();
  QWidget::closeEvent(event);
}

void ToolWindow::OnShown() {
  host_.SetActiveTool(Number());
  for (const ParamSpec& param : spec_.params)
    if (param.resetOnShow) SetParam(param.name, DefaultValue(param));
  if (inputField_ != nullptr) inputField_->setText(host_.InputFolder());
  if (outputField_ != nullptr) outputField_->setText(host_.OutputFolder());
  if (colorUp_ != nullptr) colorUp_->setEnabled(false);
}

void ToolWindow::OnClosed() {
  host_.SetActiveTool(0);
}

// --- Buttons ---------------------------------------------------------------------------------

bool ToolWindow::Apply(bool recordHistory) {
  if (!spec_.routine) return false;
  const std::optional<EffectParams> params = CheckedParams();
  if (!params || !host_.ApplyEffect(spec_, *params, recordHistory)) return false;
  AfterEffect();
  return true;
}

void ToolWindow::AfterEffect() {
  host_.SetStatusText(QString::fromStdString(spec_.statusText));
  if (spec_.lineArtAfterApply) host_.SetLineArt(*spec_.lineArtAfterApply);
  if (colorUp_ != nullptr) colorUp_->setEnabled(true);
  AfterApply();
}

void ToolWindow::OnApply() {
  Apply(true);
}

void ToolWindow::RestoreDefaultsAndApply() {
  for (const ParamSpec& param : spec_.params) SetParam(param.name, DefaultValue(param));
  Apply(true);
}

void ToolWindow::OpenColorUp() {
  emit colorUpRequested();
}

bool ToolWindow::BatchPanelShown() const {
  return batchPanel_ != nullptr && !batchPanel_->isHidden();
}

void ToolWindow::ToggleBatchPanel() {
  if (batchPanel_ == nullptr) return;
  if (batchPanel_->isHidden()) {
    setFixedHeight(expandedHeight_);
    batchPanel_->show();
    batchToggle_->setIcon(host_.UpArrowIcon());
    batchToggle_->setToolTip("Hide batch convert");
  } else {
    batchPanel_->hide();
    setFixedHeight(collapsedHeight_);
    batchToggle_->setIcon(host_.DownArrowIcon());
    batchToggle_->setToolTip("Show batch convert");
  }
}

void ToolWindow::BrowseInputFolder() {
  host_.ChooseInputFolder();
  // Refreshed even after a cancel: the shared folder may have been chosen in another window.
  if (inputField_ != nullptr) inputField_->setText(host_.InputFolder());
}

void ToolWindow::BrowseOutputFolder() {
  host_.ChooseOutputFolder();
  if (outputField_ != nullptr) outputField_->setText(host_.OutputFolder());
}

void ToolWindow::ConvertBatch() {
  if (inputField_ == nullptr || outputField_ == nullptr || !spec_.routine) return;
  // The window's own first step may change a setting ("For current" is cleared).
  BeforeBatch();
  // Every setting is checked before the first picture is loaded, so a bad one converts nothing.
  const std::optional<EffectParams> params = CheckedParams();
  if (!params) return;
  // The loop itself runs the effect (and the history step of the effects whose batch does);
  // the window adds its own steps after each picture.
  const BatchResult result = host_.ConvertBatchFolder(
      spec_, *params, inputField_->text(), outputField_->text(), [this] { AfterEffect(); });
  if (result.end != BatchResult::End::Completed) return;
  AfterBatch(result);
  host_.ShowBatchDone();
}

}  // namespace quillane
