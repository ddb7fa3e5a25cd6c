// The fused pencil sketch against the plain one, on sizes that break vector loops and bands.
#include <gtest/gtest.h>

#include <random>

#include "effects/mono/bw_sketch.h"
#include "imaging/edge_map.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/tone.h"
#include "imaging/vector_dispatch.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

// Soft gradients with a little grain, so that the edge map has the mid-range values (and the
// exact halves of the gray value) that noise, whose edge map is all 0 and 255, lacks.
TBitmap32 SoftPicture(int w, int h, unsigned seed) {
  std::mt19937 rng(seed);
  TBitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const auto channel = [&](int slope) {
        return static_cast<std::uint8_t>(ClampByte(100 + slope * (x + y) % 120 + rng() % 9));
      };
      b.At(x, y) = Pixel{channel(1), channel(2), channel(3), static_cast<std::uint8_t>(rng())};
    }
  return b;
}

// Splits rows as given, with or without the AVX2 variants, while it lives.
class Variant {
 public:
  Variant(RowSplit split, bool avx2) {
    SetRowSplit(split);
    SetAvx2Allowed(avx2);
  }
  ~Variant() {
    SetRowSplit({});
    SetAvx2Allowed(true);
  }
};

struct Tone {
  PencilToneMode mode;
  int contrast;
  int lighting;
};
constexpr Tone kTones[] = {{PencilToneMode::Contrast, 45, 0},  {PencilToneMode::Contrast, 60, 0},
                           {PencilToneMode::Contrast, 20, 0},  {PencilToneMode::Lighting, 0, 128},
                           {PencilToneMode::Lighting, 0, 170}, {PencilToneMode::Lighting, 0, 90}};

TEST(PencilFastPath, EqualsThePlainSketchAtAwkwardSizes) {
  // Widths around the 32-pixel vector step and the 1024-pixel stretch (interior = width - 2);
  // heights below the number of bands.
  const std::pair<int, int> sizes[] = {{3, 3},    {4, 3},    {3, 9},   {5, 4},  {9, 5},
                                       {33, 4},   {34, 5},   {35, 3},  {66, 7}, {101, 13},
                                       {1026, 3}, {1027, 4}, {1060, 6}};
  for (const auto& [split, avx2] : {std::pair{RowSplit{1, kParallelThreshold}, true},
                                    {RowSplit{5, 0}, true},
                                    {RowSplit{3, 0}, false}}) {
    const Variant variant(split, avx2);
    unsigned seed = 0;
    for (const auto& [w, h] : sizes)
      for (const TBitmap32& in : {SoftPicture(w, h, ++seed), RandomPicture(w, h, ++seed)})
        for (const Tone& t : kTones)
          ASSERT_EQ(peccilsketch(in, t.mode, t.contrast, t.lighting),
                    PencilSketchReference(in, t.mode, t.contrast, t.lighting))
              << w << "x" << h << " threads " << split.threads << " avx2 " << avx2 << " lighting "
              << t.lighting << " contrast " << t.contrast;
  }
}

// Pictures without an interior pixel keep the results the passes gave them one by one.
TEST(PencilFastPath, PicturesWithoutInteriorAsThePassesGaveThem) {
  for (const auto& [w, h] : {std::pair{1, 1}, {1, 6}, {6, 1}, {2, 5}, {5, 2}, {2, 2}}) {
    const TBitmap32 in = RandomPicture(w, h, static_cast<unsigned>(w * 10 + h));
    TBitmap32 edges = in;
    picsobel(edges);
    EXPECT_EQ(peccilsketch(in, PencilToneMode::Lighting, 0, 150), PencilLightingPass(edges, 150));
    ConvertToGray(edges);
    EXPECT_EQ(peccilsketch(in, PencilToneMode::Contrast, 30, 0), PencilContrastPass(edges, 30));
  }
}

}  // namespace
}  // namespace quillane
