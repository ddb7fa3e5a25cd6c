#include "freehand/stroke_history.h"

#include <algorithm>

namespace quillane {
namespace {

int TilesAcross(int size) {
  return (size + StrokeHistory::kTile - 1) / StrokeHistory::kTile;
}

}  // namespace

PaintRect StrokeHistory::TileRect(const Stroke& stroke, int index) const {
  const int across = TilesAcross(stroke.width);
  const int left = index % across * kTile, top = index / across * kTile;
  return PaintRect{left, top, std::min(left + kTile, stroke.width),
                   std::min(top + kTile, stroke.height)};
}

void StrokeHistory::Begin(const Bitmap32& picture) {
  End();
  Stroke stroke;
  stroke.width = picture.Width();
  stroke.height = picture.Height();
  stroke.saved.assign(static_cast<std::size_t>(TilesAcross(stroke.width)) *
                          static_cast<std::size_t>(TilesAcross(stroke.height)),
                      0);
  strokes_.push_back(std::move(stroke));
  open_ = true;
}

void StrokeHistory::Keep(const Bitmap32& picture, const PaintRect& area) {
  if (!open_) return;
  Stroke& stroke = strokes_.back();
  if (picture.Width() != stroke.width || picture.Height() != stroke.height) return;
  const PaintRect clipped = area.ClippedTo(picture);
  if (clipped.Empty()) return;
  stroke.area = stroke.area.United(clipped);
  const int across = TilesAcross(stroke.width);
  for (int ty = clipped.top / kTile; ty <= (clipped.bottom - 1) / kTile; ++ty) {
    for (int tx = clipped.left / kTile; tx <= (clipped.right - 1) / kTile; ++tx) {
      const int index = ty * across + tx;
      unsigned char& saved = stroke.saved[static_cast<std::size_t>(index)];
      if (saved) continue;
      saved = 1;
      const PaintRect tile = TileRect(stroke, index);
      SavedTile copy{index, {}};
      copy.pixels.reserve(static_cast<std::size_t>(tile.Width()) *
                          static_cast<std::size_t>(tile.Height()));
      for (int y = tile.top; y < tile.bottom; ++y) {
        const Pixel* row = picture.ScanLine(y);
        copy.pixels.insert(copy.pixels.end(), row + tile.left, row + tile.right);
      }
      const std::size_t bytes = copy.pixels.size() * sizeof(Pixel);
      stroke.bytes += bytes;
      keptBytes_ += bytes;
      stroke.tiles.push_back(std::move(copy));
    }
  }
}

void StrokeHistory::End() {
  if (!open_) return;
  open_ = false;
  if (strokes_.back().tiles.empty()) {
    strokes_.pop_back();
    return;
  }
  // The newest stroke always stays, however large.
  while (keptBytes_ > budgetBytes_ && strokes_.size() > 1) {
    keptBytes_ -= strokes_.front().bytes;
    strokes_.pop_front();
  }
}

PaintRect StrokeHistory::Undo(Bitmap32& picture) {
  End();
  if (strokes_.empty()) return {};
  Stroke stroke = std::move(strokes_.back());
  strokes_.pop_back();
  keptBytes_ -= stroke.bytes;
  if (picture.Width() != stroke.width || picture.Height() != stroke.height) return {};
  for (const SavedTile& saved : stroke.tiles) {
    const PaintRect tile = TileRect(stroke, saved.index);
    const Pixel* from = saved.pixels.data();
    for (int y = tile.top; y < tile.bottom; ++y, from += tile.Width())
      std::copy(from, from + tile.Width(), picture.ScanLine(y) + tile.left);
  }
  return stroke.area;
}

void StrokeHistory::Clear() {
  strokes_.clear();
  keptBytes_ = 0;
  open_ = false;
}

}  // namespace quillane
