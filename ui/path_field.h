// A text field for a folder: while the user is not typing in it, a path too long for it is shown
// with its middle left out ("/home/anna/…/corpus/batch"), so both the start and the folder's
// own name stay in sight. The text itself is always the whole path.
#pragma once

#include <QLineEdit>

namespace quillane {

class PathField : public QLineEdit {
 public:
  explicit PathField(QWidget* parent);

  // What the field shows while it does not have the focus.
  QString ShownText() const;

 protected:
  void paintEvent(QPaintEvent* event) override;

 private:
  QRect TextArea() const;
};

}  // namespace quillane
