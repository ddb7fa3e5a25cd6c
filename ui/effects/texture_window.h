// The texture window: the fifteen tiles in a grid, each above the radio button that chooses
// it, and the snapshot behaviour of the windows laid over the picture as shown.
#pragma once

#include "ui/effects/snapshot_window.h"

namespace quillane {

class TextureWindow : public SnapshotWindow {
  Q_OBJECT

 public:
  TextureWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent);
};

}  // namespace quillane
