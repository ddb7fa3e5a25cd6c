#include "effects/mono/bw_sketch.h"

#include "imaging/edge_map.h"
#include "imaging/tone.h"

namespace quillane {

TBitmap32 peccilsketch(const TBitmap32& source, PencilToneMode mode, int contrast, int lighting) {
  TBitmap32 edges = source;
  picsobel(edges);
  if (mode == PencilToneMode::Lighting) return PencilLightingPass(edges, lighting);
  ConvertToGray(edges);
  return PencilContrastPass(edges, contrast);
}

}  // namespace quillane
