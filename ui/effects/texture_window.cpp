#include "ui/effects/texture_window.h"

#include <QGridLayout>
#include <QLabel>
#include <QMouseEvent>
#include <QPixmap>
#include <QVBoxLayout>
#include <algorithm>
#include <functional>
#include <string>
#include <utility>

#include "data/texture_tiles.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

constexpr int kShown = 41;
// The tiles by grid position, row by row.
constexpr int kGrid[3][5] = {{4, 3, 5, 7, 8}, {2, 1, 6, 9, 10}, {11, 12, 13, 14, 15}};

class TileLabel : public QLabel {
 public:
  TileLabel(QWidget* parent, std::function<void()> clicked)
      : QLabel(parent), clicked_(std::move(clicked)) {}

 protected:
  void mouseReleaseEvent(QMouseEvent* event) override {
    if (event->button() == Qt::LeftButton) clicked_();
  }

 private:
  std::function<void()> clicked_;
};

}  // namespace

TextureWindow::TextureWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent)
    : SnapshotWindow(spec, host, parent) {
  auto* grid = new QGridLayout;
  grid->setSpacing(4);
  for (int row = 0; row < 3; ++row)
    for (int column = 0; column < 5; ++column) {
      const int n = kGrid[row][column];
      auto* tile = new TileLabel(this, [this, n] { SetParam("texture", {n}); });
      tile->setObjectName(QString("texture%1").arg(n));
      tile->setFixedSize(kShown, kShown);
      tile->setPixmap(QPixmap::fromImage(
          OpaqueImage(TextureTile(n))
              .scaled(kShown, kShown, Qt::IgnoreAspectRatio, Qt::SmoothTransformation)));
      if (n <= 4) tile->setCursor(Qt::PointingHandCursor);
      grid->addWidget(tile, 2 * row, column, Qt::AlignHCenter);
      if (QWidget* button = TakeControl(QString("RadioButton%1").arg(n)))
        grid->addWidget(button, 2 * row + 1, column, Qt::AlignHCenter);
    }
  ControlsLayout()->insertLayout(0, grid);
  const int collapsed = std::max(spec.collapsedHeight, sizeHint().height());
  SetWindowHeights(collapsed, collapsed + spec.expandedHeight - spec.collapsedHeight);
}

}  // namespace quillane
