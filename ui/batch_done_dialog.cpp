#include "ui/batch_done_dialog.h"

#include <QHBoxLayout>
#include <QLabel>
#include <QToolButton>
#include <QVBoxLayout>
#include <utility>

#include "ui/platform.h"

namespace quillane {

BatchDoneDialog::BatchDoneDialog(PlatformServices& platform, std::function<QString()> outputFolder,
                                 QWidget* parent)
    // Above its parent, the main window, but not above every other program.
    : QDialog(parent, Qt::Dialog | Qt::CustomizeWindowHint | Qt::WindowTitleHint |
                          Qt::WindowCloseButtonHint),
      platform_(platform),
      outputFolder_(std::move(outputFolder)) {
  setObjectName("TBatchConvertOk");
  setWindowTitle("BatchConvertOk");
  setModal(false);

  auto* layout = new QVBoxLayout(this);
  layout->setContentsMargins(16, 16, 16, 12);
  layout->setSpacing(14);

  auto* text = new QLabel("The batch convert is successful.", this);
  text->setObjectName("Label1");
  text->setAlignment(Qt::AlignCenter);
  layout->addWidget(text);

  auto* row = new QHBoxLayout;
  row->setSpacing(10);
  auto addButton = [&](const char* name, const char* caption) {
    auto* button = new QToolButton(this);
    button->setObjectName(name);
    button->setText(caption);
    button->setMinimumWidth(110);
    row->addWidget(button);
    return button;
  };
  connect(addButton("SpeedButton1", "Close"), &QToolButton::clicked, this,
          &BatchDoneDialog::OnClose);
  connect(addButton("SpeedButton2", "Go Output Folder"), &QToolButton::clicked, this,
          &BatchDoneDialog::OnOpenOutputFolder);
  layout->addLayout(row);

  setFixedSize(sizeHint().expandedTo(QSize(260, 100)));
}

void BatchDoneDialog::OnClose() {
  close();
}

void BatchDoneDialog::OnOpenOutputFolder() {
  const QString folder = outputFolder_ ? outputFolder_() : QString();
  close();
  if (!platform_.OpenFolder(folder))
    platform_.ShowMessage("Sorry", "No file manager could be started to show " + folder +
                                       ". The converted pictures are there.");
}

}  // namespace quillane
