#include "app/about_box.h"

#include <QApplication>
#include <QHBoxLayout>
#include <QLabel>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QVBoxLayout>

namespace quillane {

namespace {
constexpr int kIconSide = 48;
}

AboutBox::AboutBox(QWidget* parent) : QDialog(parent) {
  setObjectName("TAboutus");
  setWindowTitle("About Quillane");
  setWindowFlag(Qt::WindowStaysOnTopHint);
  setWindowFlag(Qt::WindowContextHelpButtonHint, false);
  setModal(false);

  image_ = new QLabel(this);
  image_->setObjectName("Image1");
  image_->setFixedSize(kIconSide, kIconSide);
  image_->setAlignment(Qt::AlignCenter);

  memo_ = new QPlainTextEdit(this);
  memo_->setObjectName("Memo1");
  memo_->setReadOnly(true);
  memo_->setPlainText(Lines().join('\n'));
  memo_->setMinimumSize(300, 150);

  auto* ok = new QPushButton("OK", this);
  ok->setObjectName("Button1");
  ok->setDefault(true);
  connect(ok, &QPushButton::clicked, this, &QDialog::close);

  auto* top = new QHBoxLayout;
  top->addWidget(image_, 0, Qt::AlignTop);
  top->addWidget(memo_, 1);
  auto* layout = new QVBoxLayout(this);
  layout->addLayout(top);
  layout->addWidget(ok, 0, Qt::AlignRight);
  // A dialog border: the box keeps the size its contents give it.
  layout->setSizeConstraint(QLayout::SetFixedSize);
}

QStringList AboutBox::Lines() {
  return {"Name: Quillane",
          "",
          "Version: " QUILLANE_VERSION,
          "",
          "Release time: 08/27/2007",
          "",
          "Publisher: the Quillane developers",
          "Support and contact: see the README.md that comes with the program"};
}

void AboutBox::showEvent(QShowEvent* event) {
  // The icon is taken when shown, so the box carries whatever icon the program was given.
  const QIcon icon = QApplication::windowIcon();
  image_->setPixmap(icon.isNull() ? QPixmap() : icon.pixmap(kIconSide, kIconSide));
  QDialog::showEvent(event);
}

}  // namespace quillane
