// The fused pencil sketch against the plain one, on sizes that break vector loops and bands.
#include <gtest/gtest.h>

#include "effects/mono/bw_sketch.h"
#include "imaging/edge_map.h"
#include "imaging/tone.h"
#include "tests/imaging/fast_path_support.h"
#include "tests/reference/mono_reference.h"

namespace quillane {
namespace {

struct Tone {
  PencilToneMode mode;
  int contrast;
  int lighting;
};
constexpr Tone kTones[] = {{PencilToneMode::Contrast, 45, 0},  {PencilToneMode::Contrast, 60, 0},
                           {PencilToneMode::Contrast, 20, 0},  {PencilToneMode::Lighting, 0, 128},
                           {PencilToneMode::Lighting, 0, 170}, {PencilToneMode::Lighting, 0, 90}};

TEST(PencilFastPath, EqualsThePlainSketchAtAwkwardSizes) {
  ForEachSplit([] {
    unsigned seed = 0;
    for (const auto& [w, h] : kAwkwardSizes) {
      if (w < 3 || h < 3) continue;  // the next test takes those without an interior
      for (const Bitmap32& in : {SoftPicture(w, h, ++seed), RandomPicture(w, h, ++seed)})
        for (const Tone& t : kTones)
          ASSERT_EQ(PencilSketch(in, t.mode, t.contrast, t.lighting),
                    PencilSketchReference(in, t.mode, t.contrast, t.lighting))
              << w << "x" << h << " lighting " << t.lighting << " contrast " << t.contrast;
    }
  });
}

// Pictures without an interior pixel keep the results the passes gave them one by one.
TEST(PencilFastPath, PicturesWithoutInteriorAsThePassesGaveThem) {
  for (const auto& [w, h] : {std::pair{1, 1}, {1, 6}, {6, 1}, {2, 5}, {5, 2}, {2, 2}}) {
    const Bitmap32 in = RandomPicture(w, h, static_cast<unsigned>(w * 10 + h));
    Bitmap32 edges = in;
    InvertedSobelEdges(edges);
    EXPECT_EQ(PencilSketch(in, PencilToneMode::Lighting, 0, 150), PencilLightingPass(edges, 150));
    ConvertToGray(edges);
    EXPECT_EQ(PencilSketch(in, PencilToneMode::Contrast, 30, 0), PencilContrastPass(edges, 30));
  }
}

}  // namespace
}  // namespace quillane
