// The shape most effects take: a new picture made row by row from the rows of another, the rows
// split in bands over the processor's threads. Built on it, an effect gets by construction what
// makes such passes fast here: its result in kept picture memory, not cleared first, and the
// rows shared out between the threads in short runs.
#pragma once

#include <cstddef>

#include "imaging/bitmap32.h"
#include "imaging/parallel.h"

namespace quillane {

// A picture for a pass's result or its intermediate steps, from the kept picture memory and
// not cleared: the pass must write every pixel.
inline Bitmap32 ScratchPicture(int width, int height) {
  return Bitmap32::ForOverwrite(width, height);
}

// A new picture of in's size whose row y is written by row(in.ScanLine(y), out.ScanLine(y),
// width, y); row must write all width pixels of out from nothing but in's rows and data that no
// band changes. workPerPixel estimates the cost of one pixel, for the split.
template <typename RowFunction>
Bitmap32 MapRows(const Bitmap32& in, std::size_t workPerPixel, RowFunction&& row) {
  const int w = in.Width();
  Bitmap32 out = ScratchPicture(w, in.Height());
  ParallelRowRuns(0, in.Height(), static_cast<std::size_t>(w) * workPerPixel, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) row(in.ScanLine(y), out.ScanLine(y), w, y);
  });
  return out;
}

}  // namespace quillane
