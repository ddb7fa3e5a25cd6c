// Undo for the work area. A stroke keeps only the pixels it changed: before a tool writes into
// part of the picture, the tiles of that part that this stroke has not yet touched are saved,
// so a stroke costs memory in proportion to what it covered and undoing it restores just those
// tiles. Old strokes are forgotten once the kept pixels pass a memory budget.
#pragma once

#include <cstddef>
#include <deque>
#include <vector>

#include "freehand/strokes.h"
#include "imaging/bitmap32.h"

namespace quillane {

class StrokeHistory {
 public:
  static constexpr int kTile = 64;

  explicit StrokeHistory(std::size_t budgetBytes = std::size_t{256} << 20)
      : budgetBytes_(budgetBytes) {}

  // Starts a stroke on picture (one that is still open is closed first).
  void Begin(const Bitmap32& picture);
  // Called before the open stroke writes into area of picture. Without an open stroke, or for
  // a picture of another size than the stroke began on, nothing is kept.
  void Keep(const Bitmap32& picture, const PaintRect& area);
  // Closes the open stroke; one that kept nothing is dropped.
  void End();
  bool Open() const { return open_; }

  bool CanUndo() const { return !strokes_.empty(); }
  std::size_t Count() const { return strokes_.size(); }
  // Puts back the pixels the last stroke changed and forgets it; the area it restored, empty
  // when there was nothing to undo (or picture has another size than the stroke's).
  PaintRect Undo(Bitmap32& picture);
  void Clear();

 private:
  struct SavedTile {
    int index;
    std::vector<Pixel> pixels;
  };
  struct Stroke {
    int width = 0;
    int height = 0;
    PaintRect area;
    std::vector<unsigned char> saved;  // one flag per tile
    std::vector<SavedTile> tiles;
    std::size_t bytes = 0;
  };
  PaintRect TileRect(const Stroke& stroke, int index) const;

  std::size_t budgetBytes_;
  std::size_t keptBytes_ = 0;
  bool open_ = false;
  std::deque<Stroke> strokes_;
};

}  // namespace quillane
