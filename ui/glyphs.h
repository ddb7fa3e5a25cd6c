// The small pictures on the toolbar buttons and the batch-panel arrows, drawn in code so that
// they stay sharp at any screen scale and need no image files.
#pragma once

#include <QIcon>

namespace quillane {

enum class Glyph {
  Open,
  Save,
  Renew,
  Undo,
  Redo,
  ImageSize,
  ZoomOut,
  ZoomIn,
  RotateClockwise,
  RotateAnticlockwise,
  Wallpaper,
  Print,
  Mail,
  ArrowDown,
  ArrowUp,
  ColorUp,
};

QIcon GlyphIcon(Glyph glyph);

}  // namespace quillane
