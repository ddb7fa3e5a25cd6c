// Water colour: cycles of one sharpening pass and two median passes, which wash fine texture
// out into patches of even colour.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

// cycles (1..5) times: SharpenPass, then MedianPass twice. Both passes change only the
// interior (rows 1..H-2, columns 1..W-2), so the one-pixel frame keeps the source's colours;
// neither writes alpha, which stays the source's. A picture under 3 pixels wide or high comes
// back unchanged.
Bitmap32 WaterColor(const Bitmap32& source, int cycles);

// The same into out, which must already have source's size and be another picture. The passes
// run fused over bands of rows and tiles of columns that stay in the cache, so no picture is
// made in between.
void WaterColorInto(const Bitmap32& source, int cycles, Bitmap32& out);

// The interior of out becomes, per colour channel c of in:
//   clamp(5 c(x, y) - c(x, y-1) - c(x-1, y) - c(x+1, y) - c(x, y+1)) to 0..255.
// out must have in's size and be another picture; its frame is not written and the alpha of its
// interior becomes in's.
void SharpenPass(const Bitmap32& in, Bitmap32& out);

// The interior of out becomes, per colour channel, the median of the nine values of in in the
// 3 x 3 block around the pixel. out must have in's size and be another picture; its frame is not
// written and the alpha of its interior becomes in's.
void MedianPass(const Bitmap32& in, Bitmap32& out);

}  // namespace quillane
