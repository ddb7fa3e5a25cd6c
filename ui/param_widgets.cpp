#include "ui/param_widgets.h"

#include <QButtonGroup>
#include <QCheckBox>
#include <QColor>
#include <QFrame>
#include <QGridLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QSlider>
#include <QVBoxLayout>
#include <algorithm>

#include "imaging/bitmap32.h"
#include "ui/clickable.h"
#include "ui/platform.h"

namespace quillane {
namespace {

constexpr int kCaptionWidth = 62;
constexpr int kNumberWidth = 30;

QString Text(const std::string& s) {
  return QString::fromStdString(s);
}

QLabel* CaptionLabel(const ParamSpec& p, QWidget& window) {
  auto* label = new QLabel(Text(p.caption), &window);
  if (!p.captionLabel.empty()) label->setObjectName(Text(p.captionLabel));
  return label;
}

// Every slider caption of a window as wide as the widest one (and at least kCaptionWidth), so
// that the window's sliders start and end at the same place, each caption shown whole.
void LineUpSliderCaptions(QWidget& window, QLabel& added) {
  static constexpr char kSliderCaption[] = "quillaneSliderCaption";
  added.setProperty(kSliderCaption, true);
  QList<QLabel*> captions;
  int width = kCaptionWidth;
  for (QLabel* label : window.findChildren<QLabel*>()) {
    if (!label->property(kSliderCaption).toBool()) continue;
    captions << label;
    width = std::max(width, label->sizeHint().width());
  }
  for (QLabel* label : captions) label->setFixedWidth(width);
}

class SliderParam : public ParamWidget {
 public:
  SliderParam(const ParamSpec& p, QWidget& window, QVBoxLayout& rows, std::function<void()> changed)
      : param_(p) {
    auto* row = new QHBoxLayout;
    row->setSpacing(6);
    QLabel* caption = CaptionLabel(p, window);
    LineUpSliderCaptions(window, *caption);
    row->addWidget(caption);
    slider_ = new QSlider(Qt::Horizontal, &window);
    slider_->setObjectName(Text(p.objectName));
    slider_->setRange(static_cast<int>(p.minimum), static_cast<int>(p.maximum));
    slider_->setValue(static_cast<int>(p.defaultValue));
    if (p.pageStep > 0) slider_->setPageStep(p.pageStep);
    row->addWidget(slider_, 1);
    if (!p.numberLabel.empty()) {
      number_ = new QLabel(
          p.initialNumber.empty() ? NumberText(slider_->value()) : Text(p.initialNumber), &window);
      number_->setObjectName(Text(p.numberLabel));
      number_->setFixedWidth(kNumberWidth);
      number_->setAlignment(Qt::AlignRight | Qt::AlignVCenter);
      row->addWidget(number_);
    }
    rows.addLayout(row);
    QObject::connect(slider_, &QSlider::valueChanged, slider_, [this, changed](int value) {
      if (number_ != nullptr) number_->setText(NumberText(value));
      changed();
    });
  }
  EffectParams::Values Value() const override { return {slider_->value()}; }
  void SetValue(const EffectParams::Values& v) override {
    slider_->setValue(static_cast<int>(v.at(0)));
  }

 private:
  QString NumberText(int position) const {
    return QString::number(param_.numberFor ? param_.numberFor(position) : position);
  }

  const ParamSpec& param_;
  QSlider* slider_ = nullptr;
  QLabel* number_ = nullptr;
};

class SwitchParam : public ParamWidget {
 public:
  SwitchParam(const ParamSpec& p, QWidget& window, QVBoxLayout& rows,
              std::function<void()> changed) {
    box_ = new QCheckBox(Text(p.caption), &window);
    box_->setObjectName(Text(p.objectName));
    box_->setChecked(p.defaultValue != 0);
    rows.addWidget(box_);
    QObject::connect(box_, &QCheckBox::toggled, box_, [changed](bool) { changed(); });
  }
  EffectParams::Values Value() const override { return {box_->isChecked() ? 1 : 0}; }
  void SetValue(const EffectParams::Values& v) override { box_->setChecked(v.at(0) != 0); }

 private:
  QCheckBox* box_ = nullptr;
};

// Radio buttons in a row under their caption; the value is the checked one's position.
class ChoiceParam : public ParamWidget {
 public:
  ChoiceParam(const ParamSpec& p, QWidget& window, QVBoxLayout& rows,
              std::function<void()> changed) {
    auto* row = new QHBoxLayout;
    row->setSpacing(6);
    if (!p.caption.empty()) row->addWidget(CaptionLabel(p, window));
    group_ = new QButtonGroup(&window);
    for (std::size_t i = 0; i < p.options.size(); ++i) {
      auto* button = new QRadioButton(Text(p.options[i].caption), &window);
      button->setObjectName(Text(p.options[i].objectName));
      if (!p.options[i].hint.empty()) button->setToolTip(Text(p.options[i].hint));
      group_->addButton(button, static_cast<int>(i + 1));
      row->addWidget(button);
    }
    row->addStretch(1);
    rows.addLayout(row);
    SetValue({p.defaultValue});
    QObject::connect(group_, &QButtonGroup::idToggled, group_, [changed](int, bool checked) {
      if (checked) changed();
    });
  }
  EffectParams::Values Value() const override { return {group_->checkedId()}; }
  void SetValue(const EffectParams::Values& v) override {
    if (QAbstractButton* button = group_->button(static_cast<int>(v.at(0))))
      button->setChecked(true);
  }

 private:
  QButtonGroup* group_ = nullptr;
};

// A grid of text cells holding whole numbers, read only when the effect runs.
class CellsParam : public ParamWidget {
 public:
  CellsParam(const ParamSpec& p, QWidget& window, QVBoxLayout& rows,
             std::function<void()> changed) {
    if (!p.caption.empty()) rows.addWidget(CaptionLabel(p, window));
    auto* grid = new QGridLayout;
    grid->setSpacing(4);
    const int columns = std::max(1, p.columns);
    for (std::size_t i = 0; i < p.cells.size(); ++i) {
      auto* cell = new QLineEdit(&window);
      cell->setObjectName(Text(p.cells[i]));
      if (!p.hint.empty()) cell->setToolTip(Text(p.hint));
      cell->setAlignment(Qt::AlignRight);
      grid->addWidget(cell, static_cast<int>(i) / columns, static_cast<int>(i) % columns);
      QObject::connect(cell, &QLineEdit::textEdited, cell, [changed] { changed(); });
      cells_.push_back(cell);
    }
    rows.addLayout(grid);
    SetValue(p.defaultList);
  }
  EffectParams::Values Value() const override {
    EffectParams::Values values;
    for (const QLineEdit* cell : cells_)
      values.push_back(ParseWholeNumber(cell->text().toStdString()));
    return values;
  }
  void SetValue(const EffectParams::Values& v) override {
    for (std::size_t i = 0; i < cells_.size() && i < v.size(); ++i)
      cells_[i]->setText(QString::number(v[i]));
  }

 private:
  std::vector<QLineEdit*> cells_;
};

// A panel filled with the colour; a click opens the colour dialog.
class ColourParam : public ParamWidget {
 public:
  ColourParam(const ParamSpec& p, QWidget& window, QVBoxLayout& rows, PlatformServices& platform,
              std::function<void()> changed)
      : platform_(platform), changed_(std::move(changed)) {
    auto* row = new QHBoxLayout;
    row->setSpacing(6);
    if (!p.caption.empty()) row->addWidget(CaptionLabel(p, window));
    panel_ = new Clickable<QFrame>(&window, [this] { Choose(); });
    panel_->setObjectName(Text(p.objectName));
    panel_->setFrameShape(QFrame::Panel);
    panel_->setFrameShadow(QFrame::Sunken);
    panel_->setFixedSize(40, 20);
    panel_->setAutoFillBackground(true);
    if (!p.hint.empty()) panel_->setToolTip(Text(p.hint));
    row->addWidget(panel_);
    row->addStretch(1);
    rows.addLayout(row);
    Show(static_cast<std::uint32_t>(p.defaultValue));
  }
  EffectParams::Values Value() const override { return {colour_}; }
  void SetValue(const EffectParams::Values& v) override {
    Show(static_cast<std::uint32_t>(v.at(0)));
    changed_();
  }

 private:
  void Choose() {
    if (const auto colour = platform_.ChooseColor(colour_)) SetValue({*colour});
  }
  void Show(std::uint32_t colour) {
    colour_ = colour;
    const Pixel p = PixelFromColorRef(colour);
    QPalette palette = panel_->palette();
    palette.setColor(QPalette::Window, QColor(p.r, p.g, p.b));
    panel_->setPalette(palette);
  }

  PlatformServices& platform_;
  std::function<void()> changed_;
  QFrame* panel_ = nullptr;
  std::uint32_t colour_ = 0;
};

// A button per option; each click adds that option to the sequence.
class ClicksParam : public ParamWidget {
 public:
  ClicksParam(const ParamSpec& p, QWidget& window, QVBoxLayout& rows, std::function<void()> changed)
      : changed_(std::move(changed)), clicks_(p.defaultList) {
    auto* grid = new QGridLayout;
    grid->setSpacing(4);
    const int columns = std::max(1, p.columns);
    for (std::size_t i = 0; i < p.options.size(); ++i) {
      auto* button = new QPushButton(Text(p.options[i].caption), &window);
      button->setObjectName(Text(p.options[i].objectName));
      if (!p.options[i].hint.empty()) button->setToolTip(Text(p.options[i].hint));
      grid->addWidget(button, static_cast<int>(i) / columns, static_cast<int>(i) % columns);
      const auto option = static_cast<std::int64_t>(i + 1);
      QObject::connect(button, &QPushButton::clicked, button, [this, option] {
        clicks_.push_back(option);
        changed_();
      });
    }
    rows.addLayout(grid);
  }
  EffectParams::Values Value() const override { return clicks_; }
  void SetValue(const EffectParams::Values& v) override {
    clicks_ = v;
    changed_();
  }

 private:
  std::function<void()> changed_;
  EffectParams::Values clicks_;
};

// A setting the other controls choose.
class HiddenParam : public ParamWidget {
 public:
  HiddenParam(const ParamSpec& p, std::function<void()> changed)
      : changed_(std::move(changed)), value_{p.defaultValue} {}
  EffectParams::Values Value() const override { return value_; }
  void SetValue(const EffectParams::Values& v) override {
    value_ = v;
    changed_();
  }

 private:
  std::function<void()> changed_;
  EffectParams::Values value_;
};

}  // namespace

std::unique_ptr<ParamWidget> BuildParamWidget(const ParamSpec& param, QWidget& window,
                                              QVBoxLayout& rows, PlatformServices& platform,
                                              std::function<void()> changed) {
  switch (param.kind) {
    case ParamKind::Slider:
      return std::make_unique<SliderParam>(param, window, rows, std::move(changed));
    case ParamKind::Switch:
      return std::make_unique<SwitchParam>(param, window, rows, std::move(changed));
    case ParamKind::Choice:
      return std::make_unique<ChoiceParam>(param, window, rows, std::move(changed));
    case ParamKind::Cells:
      return std::make_unique<CellsParam>(param, window, rows, std::move(changed));
    case ParamKind::Colour:
      return std::make_unique<ColourParam>(param, window, rows, platform, std::move(changed));
    case ParamKind::Clicks:
      return std::make_unique<ClicksParam>(param, window, rows, std::move(changed));
    case ParamKind::Hidden:
      return std::make_unique<HiddenParam>(param, std::move(changed));
  }
  return nullptr;
}

}  // namespace quillane
