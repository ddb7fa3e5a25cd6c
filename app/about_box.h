// The About box: the program's icon and a short read-only text naming the program, its version
// and who makes it. Created hidden with the main window and shown without blocking it.
#pragma once

#include <QDialog>

class QLabel;
class QPlainTextEdit;

namespace quillane {

class AboutBox : public QDialog {
  Q_OBJECT

 public:
  explicit AboutBox(QWidget* parent = nullptr);

  // The lines of the text, in order.
  static QStringList Lines();

 protected:
  void showEvent(QShowEvent* event) override;

 private:
  QLabel* image_ = nullptr;
  QPlainTextEdit* memo_ = nullptr;
};

}  // namespace quillane
