#include "app/image_size_dialog.h"

#include <QCheckBox>
#include <QGridLayout>
#include <QHBoxLayout>
#include <QKeyEvent>
#include <QLabel>
#include <QLineEdit>
#include <QLocale>
#include <QPushButton>
#include <QShowEvent>
#include <QToolButton>
#include <QVBoxLayout>
#include <cmath>
#include <cstdint>
#include <new>
#include <optional>
#include <utility>

#include "imaging/memory_budget.h"
#include "imaging/numeric.h"
#include "ui/platform.h"

namespace quillane {
namespace {

const QString kInvalidValue = "Please input a valid integer value.";

// A field the dialog accepts: one or more of the digits 0 to 9 and nothing else.
bool IsValidField(const QString& text) {
  if (text.isEmpty()) return false;
  for (QChar c : text)
    if (c < u'0' || c > u'9') return false;
  return true;
}

// The field as a 32-bit integer: an optional sign and decimal digits.
std::optional<int> ToInt(const QString& text) {
  qsizetype i = 0;
  const bool negative = text.startsWith(u'-');
  if (negative || text.startsWith(u'+')) i = 1;
  if (i == text.size()) return std::nullopt;
  std::int64_t value = 0;
  for (; i < text.size(); ++i) {
    const QChar c = text[i];
    if (c < u'0' || c > u'9') return std::nullopt;
    value = value * 10 + (c.unicode() - u'0');
    if (value > std::int64_t{1} << 31) return std::nullopt;
  }
  if (negative) value = -value;
  if (value < INT32_MIN || value > INT32_MAX) return std::nullopt;
  return static_cast<int>(value);
}

QString NotAnInteger(const QString& text) {
  return "'" + text + "' is not a valid integer value.";
}

// Round(numerator / denominator) in extended precision, the product formed in 64 bits so that
// no typed number overflows it.
QString RoundedQuotient(std::int64_t numerator, std::int64_t denominator) {
  const Extended q = static_cast<Extended>(numerator) / static_cast<Extended>(denominator);
  return QString::number(static_cast<qint64>(std::nearbyintl(q)));
}

}  // namespace

ImageSizeDialog::ImageSizeDialog(PlatformServices& platform, std::function<QSize()> pictureSize,
                                 std::function<ResizeResult(int, int)> resize, QWidget* parent)
    : QDialog(parent, Qt::Dialog | Qt::WindowStaysOnTopHint | Qt::CustomizeWindowHint |
                          Qt::WindowTitleHint),
      platform_(platform),
      pictureSize_(std::move(pictureSize)),
      resize_(std::move(resize)) {
  setObjectName("TImage_size");
  setWindowTitle("Image_size");

  auto* grid = new QGridLayout;
  auto addRow = [&](int row, const QString& caption, const char* name) {
    auto* edit = new QLineEdit(this);
    edit->setObjectName(name);
    grid->addWidget(new QLabel(caption, this), row, 0);
    grid->addWidget(edit, row, 1);
    grid->addWidget(new QLabel("Pixels", this), row, 2);
    edit->installEventFilter(this);
    // Enter runs OK; no button is a default button, so it runs once.
    connect(edit, &QLineEdit::returnPressed, this, &ImageSizeDialog::OnOk);
    return edit;
  };
  widthField_ = addRow(0, "Width:", "Edit1");
  heightField_ = addRow(1, "Height:", "Edit2");
  connect(widthField_, &QLineEdit::textEdited, this, [this] { widthEdited_ = true; });
  connect(heightField_, &QLineEdit::textEdited, this, [this] { heightEdited_ = true; });

  holdAspect_ = new QCheckBox("Hold in width and height", this);
  holdAspect_->setObjectName("CheckBox1");
  holdAspect_->setChecked(true);
  grid->addWidget(holdAspect_, 2, 0, 1, 3);

  auto* steps = new QHBoxLayout;
  auto addStep = [&](const QString& caption, const char* name) {
    auto* button = new QToolButton(this);
    button->setObjectName(name);
    button->setText(caption);
    button->setMinimumWidth(32);
    steps->addWidget(button);
    return button;
  };
  connect(addStep("-", "SpeedButton1"), &QToolButton::clicked, this, &ImageSizeDialog::OnShrink);
  connect(addStep("+", "SpeedButton2"), &QToolButton::clicked, this, &ImageSizeDialog::OnEnlarge);
  steps->addStretch();

  auto* buttons = new QHBoxLayout;
  buttons->addStretch();
  auto addButton = [&](const QString& caption, const char* name) {
    auto* button = new QPushButton(caption, this);
    button->setObjectName(name);
    button->setAutoDefault(false);
    buttons->addWidget(button);
    return button;
  };
  connect(addButton("OK", "Button1"), &QPushButton::clicked, this, &ImageSizeDialog::OnOk);
  connect(addButton("Cancel", "Button2"), &QPushButton::clicked, this, &ImageSizeDialog::OnCancel);

  auto* layout = new QVBoxLayout(this);
  layout->addLayout(grid);
  layout->addLayout(steps);
  layout->addLayout(buttons);
  setFixedSize(sizeHint());
}

void ImageSizeDialog::showEvent(QShowEvent* event) {
  // Shown by the program, not shown again by the desktop (another workspace and back), which
  // must not wipe what was typed.
  if (!event->spontaneous()) {
    const QSize size = pictureSize_();
    widthField_->setText(QString::number(size.width()));
    heightField_->setText(QString::number(size.height()));
    widthEdited_ = heightEdited_ = false;
  }
  QDialog::showEvent(event);
}

bool ImageSizeDialog::eventFilter(QObject* watched, QEvent* event) {
  if (event->type() == QEvent::KeyRelease) {
    if (watched == widthField_ && std::exchange(widthEdited_, false))
      HoldAspect(widthField_, heightField_, true);
    if (watched == heightField_ && std::exchange(heightEdited_, false))
      HoldAspect(heightField_, widthField_, false);
  }
  return QDialog::eventFilter(watched, event);
}

void ImageSizeDialog::HoldAspect(QLineEdit* typed, QLineEdit* other, bool fromWidth) {
  if (!holdAspect_->isChecked() || !IsValidField(typed->text())) return;
  const std::optional<int> n = ToInt(typed->text());
  if (!n) return;  // more digits than an integer holds: OK says so
  const QSize size = pictureSize_();
  if (size.isEmpty()) return;
  const std::int64_t from = fromWidth ? size.width() : size.height();
  const std::int64_t to = fromWidth ? size.height() : size.width();
  other->setText(RoundedQuotient(*n * to, from));
}

bool ImageSizeDialog::ScaleFields(int percent) {
  for (QLineEdit* edit : {widthField_, heightField_}) {
    const std::optional<int> n = ToInt(edit->text());
    if (!n) {
      platform_.ShowError(NotAnInteger(edit->text()));
      return false;
    }
    edit->setText(RoundedQuotient(std::int64_t{*n} * percent, 100));
  }
  return true;
}

void ImageSizeDialog::OnShrink() {
  ScaleFields(80);
}

void ImageSizeDialog::OnEnlarge() {
  ScaleFields(125);
}

void ImageSizeDialog::OnOk() {
  if (!IsValidField(widthField_->text()) || !IsValidField(heightField_->text())) {
    platform_.ShowMessage("Quillane", kInvalidValue);
    return;
  }
  for (QLineEdit* edit : {widthField_, heightField_}) {
    if (!ToInt(edit->text())) {
      platform_.ShowError(NotAnInteger(edit->text()));
      return;
    }
  }
  const int w = *ToInt(widthField_->text());
  const int h = *ToInt(heightField_->text());
  ResizeResult result = ResizeResult::TooSmall;
  try {
    result = resize_(w, h);
  } catch (const NotEnoughMemory& e) {
    platform_.ShowError(QString::fromStdString(e.what()));
    return;
  } catch (const std::bad_alloc&) {
    platform_.ShowError(QStringLiteral("A picture of %1 by %2 pixels ").arg(w).arg(h) +
                        QString::fromStdString(MemoryNeedText(OperationBytes(w, h))));
    return;
  }
  switch (result) {
    case ResizeResult::Resized:
      close();
      break;
    case ResizeResult::TooSmall:
      platform_.ShowMessage("Quillane", kInvalidValue);
      break;
    case ResizeResult::TooLarge:
      platform_.ShowMessage(
          "Sorry", QStringLiteral("A picture of %1 by %2 pixels is larger than the %3 pixels a "
                                  "picture may have.")
                       .arg(w)
                       .arg(h)
                       .arg(QLocale().toString(static_cast<qint64>(Bitmap32::kMaxPixels))));
      break;
  }
}

void ImageSizeDialog::OnCancel() {
  close();
}

}  // namespace quillane
