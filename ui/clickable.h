// A widget that runs an action when the left button is released over it, as a plain click on
// a swatch, a colour panel or a thumbnail does.
#pragma once

#include <QMouseEvent>
#include <QWidget>
#include <functional>
#include <utility>

namespace quillane {

template <typename Base>
class Clickable : public Base {
 public:
  Clickable(QWidget* parent, std::function<void()> clicked)
      : Base(parent), clicked_(std::move(clicked)) {}

 protected:
  void mouseReleaseEvent(QMouseEvent* event) override {
    if (event->button() == Qt::LeftButton && this->rect().contains(event->position().toPoint()))
      clicked_();
  }

 private:
  std::function<void()> clicked_;
};

}  // namespace quillane
