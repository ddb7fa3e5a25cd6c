// The dialog that tells the user a batch conversion has run to its end, and offers to show the
// output folder in the desktop's file manager. Created once, hidden, and shown without blocking
// the other windows.
#pragma once

#include <QDialog>
#include <QString>
#include <functional>

namespace quillane {

class PlatformServices;

class BatchDoneDialog : public QDialog {
  Q_OBJECT

 public:
  // outputFolder gives the folder "Go Output Folder" hands to the file manager, read when the
  // button is pressed.
  BatchDoneDialog(PlatformServices& platform, std::function<QString()> outputFolder,
                  QWidget* parent = nullptr);

 public slots:
  void OnClose();
  void OnOpenOutputFolder();  // "Go Output Folder"

 private:
  PlatformServices& platform_;
  std::function<QString()> outputFolder_;
};

}  // namespace quillane
