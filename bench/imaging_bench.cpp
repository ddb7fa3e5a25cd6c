// Speed of the pixel core and the effects on a 12-megapixel photo-like picture, with a plain
// memcpy of the same picture as the floor.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cmath>
#include <cstring>

#include "bench/synthetic_photo.h"
#include "data/texture_tiles.h"
#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "effects/adjust/color_variety.h"
#include "effects/adjust/hsl_adjust.h"
#include "effects/mono/bw_sketch.h"
#include "effects/mono/pen_and_ink.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"
#include "effects/paint/brume.h"
#include "effects/paint/color_pencil.h"
#include "effects/paint/kernel_gradient.h"
#include "effects/paint/realism.h"
#include "effects/paint/water_color.h"
#include "effects/surface/emboss.h"
#include "effects/surface/stria.h"
#include "effects/surface/texture.h"
#include "imaging/edge_map.h"
#include "imaging/orientation.h"
#include "imaging/picture_memory.h"
#include "imaging/rotate.h"
#include "imaging/tone.h"

namespace quillane {
namespace {

constexpr int kWidth = bench::kPhotoWidth;
constexpr int kHeight = bench::kPhotoHeight;
using bench::Photo;

const Bitmap32& EdgeMap() {
  static const Bitmap32 edges = [] {
    Bitmap32 e = Photo();
    InvertedSobelEdges(e);
    return e;
  }();
  return edges;
}

const Bitmap32& GrayEdgeMap() {
  static const Bitmap32 gray = [] {
    Bitmap32 g = EdgeMap();
    ConvertToGray(g);
    return g;
  }();
  return gray;
}

void SetBytes(benchmark::State& state) {
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) * kWidth * kHeight * 4);
}

void BM_Memcpy(benchmark::State& state) {
  const Bitmap32& photo = Photo();
  Bitmap32 copy(kWidth, kHeight);
  for (auto _ : state) {
    std::memcpy(copy.Data(), photo.Data(), photo.PixelCount() * sizeof(Pixel));
    benchmark::ClobberMemory();
  }
  SetBytes(state);
}
BENCHMARK(BM_Memcpy)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime();

// A copy into a fresh bitmap, as every routine that returns a new picture makes: the page
// faults of the new block, not the copying, set this floor.
void BM_FreshCopy(benchmark::State& state) {
  for (auto _ : state) {
    Bitmap32 copy = Photo();
    benchmark::DoNotOptimize(copy.Data());
  }
  SetBytes(state);
}
BENCHMARK(BM_FreshCopy)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime();

// Routines that work in place get a fresh copy each round, outside the timing.
template <typename Routine>
void InPlace(benchmark::State& state, const Bitmap32& input, Routine routine) {
  Bitmap32 work;
  for (auto _ : state) {
    state.PauseTiming();
    work = input;
    state.ResumeTiming();
    routine(work);
    benchmark::DoNotOptimize(work.Data());
  }
  SetBytes(state);
}

void BM_Picsobel(benchmark::State& state) {
  InPlace(state, Photo(), [](Bitmap32& b) { InvertedSobelEdges(b); });
}
BENCHMARK(BM_Picsobel)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime();

void BM_ConvertToGray(benchmark::State& state) {
  InPlace(state, EdgeMap(), [](Bitmap32& b) { ConvertToGray(b); });
}
BENCHMARK(BM_ConvertToGray)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime();

void BM_ContrastPassGrayEdgeMap(benchmark::State& state) {
  for (auto _ : state) benchmark::DoNotOptimize(PencilContrastPass(GrayEdgeMap(), 60).Data());
  SetBytes(state);
}
BENCHMARK(BM_ContrastPassGrayEdgeMap)
    ->Unit(benchmark::kMillisecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

void BM_ContrastPassColourPhoto(benchmark::State& state) {
  for (auto _ : state) benchmark::DoNotOptimize(PencilContrastPass(Photo(), 60).Data());
  SetBytes(state);
}
BENCHMARK(BM_ContrastPassColourPhoto)
    ->Unit(benchmark::kMillisecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

void BM_LightingPass(benchmark::State& state) {
  for (auto _ : state) benchmark::DoNotOptimize(PencilLightingPass(EdgeMap(), 150).Data());
  SetBytes(state);
}
BENCHMARK(BM_LightingPass)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime();

void BM_PencilSketch(benchmark::State& state) {
  const auto mode = static_cast<PencilToneMode>(state.range(0));
  for (auto _ : state) benchmark::DoNotOptimize(PencilSketch(Photo(), mode, 60, 150).Data());
  SetBytes(state);
}
BENCHMARK(BM_PencilSketch)
    ->Arg(static_cast<int>(PencilToneMode::Contrast))
    ->Arg(static_cast<int>(PencilToneMode::Lighting))
    ->ArgName("lighting")
    ->Unit(benchmark::kMillisecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

void BM_PenSketch(benchmark::State& state) {
  for (auto _ : state) benchmark::DoNotOptimize(PenSketch(Photo(), 128).Data());
  SetBytes(state);
}
BENCHMARK(BM_PenSketch)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime();

void BM_Vuzorar(benchmark::State& state) {
  const int scope = static_cast<int>(state.range(0));
  for (auto _ : state)
    benchmark::DoNotOptimize(Vuzorar(Photo(), 128, scope, HatchDirection::Rising).Data());
  SetBytes(state);
}
BENCHMARK(BM_Vuzorar)
    ->Arg(1)
    ->Arg(3)
    ->Arg(10)
    ->ArgName("scope")
    ->Unit(benchmark::kMillisecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

void BM_PenAndInk(benchmark::State& state) {
  const bool colorInk = state.range(0) != 0;
  for (auto _ : state) benchmark::DoNotOptimize(PenAndInk(Photo(), 128, colorInk).Data());
  SetBytes(state);
}
BENCHMARK(BM_PenAndInk)
    ->Arg(0)
    ->Arg(1)
    ->ArgName("color_ink")
    ->Unit(benchmark::kMillisecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

// The effects of the Color menu with their default settings. Each effect's own work is timed
// into pictures made once (the *Into form of the routine); on this machine a fresh picture of
// this size costs far more than the work itself (the memory is faulted in page by page), which
// BM_FreshCopy shows and every call of the plain routine pays once more per picture it makes.
#define QUILLANE_EFFECT_BENCHMARK(name) \
  BENCHMARK(name)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime()

void BM_ColorPencil(benchmark::State& state) {
  Bitmap32 out(kWidth, kHeight);
  for (auto _ : state) {
    ColorSketchInto(Photo(), 45, out);
    benchmark::DoNotOptimize(out.Data());
  }
  SetBytes(state);
}
QUILLANE_EFFECT_BENCHMARK(BM_ColorPencil);

// One median pass on its own.
void BM_MedianPass(benchmark::State& state) {
  Bitmap32 out = Photo();
  for (auto _ : state) {
    MedianPass(Photo(), out);
    benchmark::DoNotOptimize(out.Data());
  }
  SetBytes(state);
}
QUILLANE_EFFECT_BENCHMARK(BM_MedianPass);

void BM_WaterColor(benchmark::State& state) {
  Bitmap32 out(kWidth, kHeight);
  for (auto _ : state) {
    WaterColorInto(Photo(), 3, out);
    benchmark::DoNotOptimize(out.Data());
  }
  SetBytes(state);
}
QUILLANE_EFFECT_BENCHMARK(BM_WaterColor);

void BM_Realism(benchmark::State& state) {
  Bitmap32 out(kWidth, kHeight);
  for (auto _ : state) {
    ConvolveInto(Photo(), {1, 2, 1, 0, 0, 0, -1, -1, -1}, 1, out);
    benchmark::DoNotOptimize(out.Data());
  }
  SetBytes(state);
}
QUILLANE_EFFECT_BENCHMARK(BM_Realism);

void BM_PopArt(benchmark::State& state) {
  Bitmap32 out(kWidth, kHeight);
  for (auto _ : state) {
    KernelGradientFilterInto(Photo(), {-1, -2, -1, 0, 0, 0, 1, 2, 1}, Gradient::RightMinusLeftSobel,
                             out);
    benchmark::DoNotOptimize(out.Data());
  }
  SetBytes(state);
}
QUILLANE_EFFECT_BENCHMARK(BM_PopArt);

void BM_Abstract(benchmark::State& state) {
  Bitmap32 out(kWidth, kHeight);
  for (auto _ : state) {
    KernelGradientFilterInto(Photo(), {-1, -1, -1, 0, 0, 0, -1, -1, -1}, Gradient::LeftMinusRight,
                             out);
    benchmark::DoNotOptimize(out.Data());
  }
  SetBytes(state);
}
QUILLANE_EFFECT_BENCHMARK(BM_Abstract);

void BM_Brume(benchmark::State& state) {
  Bitmap32 out(kWidth, kHeight);
  std::uint32_t seed = 0;
  for (auto _ : state) {
    BrumeInto(Photo(), 3, seed, out);
    benchmark::DoNotOptimize(out.Data());
  }
  SetBytes(state);
}
QUILLANE_EFFECT_BENCHMARK(BM_Brume);

// The colour adjustments and surface effects, each a whole effect from the photo to its result.
#define QUILLANE_EFFECT_BENCH(name, call)                       \
  void name(benchmark::State& state) {                          \
    for (auto _ : state) benchmark::DoNotOptimize(call.Data()); \
    SetBytes(state);                                            \
  }                                                             \
  BENCHMARK(name)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime()

// What every routine that returns a new picture pays before its own work.
QUILLANE_EFFECT_BENCH(BM_PictureCopy, Bitmap32(Photo()));
QUILLANE_EFFECT_BENCH(BM_Emboss, emboss(Photo(), 100, 3));
QUILLANE_EFFECT_BENCH(BM_ColorFilter, ColorFilter(Photo(), ColorFilterKind::Yellow));
QUILLANE_EFFECT_BENCH(BM_ColorVariety, VarietyClicks(Photo(), {1, 5, 5}));
QUILLANE_EFFECT_BENCH(BM_Panel2x2, ColorPanel(Photo(), PanelLayout::Panel2x2));
QUILLANE_EFFECT_BENCH(BM_Panel3x3, ColorPanel(Photo(), PanelLayout::Panel3x3));
QUILLANE_EFFECT_BENCH(BM_Pane3x3, ColorPanel(Photo(), PanelLayout::Pane3x3));
QUILLANE_EFFECT_BENCH(BM_Catercorner16, ColorPanel(Photo(), PanelLayout::Catercorner16));
QUILLANE_EFFECT_BENCH(BM_HslAdjust, HslAdjust(Photo(), 240, 130, 90));
QUILLANE_EFFECT_BENCH(BM_Stria,
                      stria(Photo(), kWidth, kHeight, StriaDirection::Vertical, 1, 2, 128, 0));
QUILLANE_EFFECT_BENCH(BM_Texture, texture(Photo(), TextureTile(4), 50));

// A quarter turn, as the rotation buttons make it, and the nearest-pixel resample of the image
// size dialog (400 / 521 of each side), against the fresh copy above.
void BM_RotatePicture(benchmark::State& state) {
  const auto turn = state.range(0) ? QuarterTurn::Clockwise : QuarterTurn::Anticlockwise;
  for (auto _ : state)
    benchmark::DoNotOptimize(
        RotatePicture(Photo(), RotationCentre(kWidth), RotationCentre(kHeight), turn)->Data());
  SetBytes(state);
}
BENCHMARK(BM_RotatePicture)
    ->Arg(1)
    ->Arg(0)
    ->Unit(benchmark::kMillisecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

// A photo stood upright by its EXIF orientation: mirrored in place (2), turned half round (3)
// and a quarter (6, transposed in tiles); each time includes the copy of the photo it starts
// from, as the fresh copy above measures it.
void BM_UprightPicture(benchmark::State& state) {
  const int orientation = static_cast<int>(state.range(0));
  for (auto _ : state) benchmark::DoNotOptimize(UprightPicture(Photo(), orientation).Data());
  SetBytes(state);
}
BENCHMARK(BM_UprightPicture)
    ->Arg(2)
    ->Arg(3)
    ->Arg(6)
    ->Unit(benchmark::kMillisecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

void BM_ZoomInandOut(benchmark::State& state) {
  InPlace(state, Photo(), [](Bitmap32& b) { ResampleNearest(b, 400.0L / 521, 400.0L / 521); });
}
BENCHMARK(BM_ZoomInandOut)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime();

}  // namespace
}  // namespace quillane

int main(int argc, char** argv) {
  // The set-up both programs make at start-up, so that the figures are the programs' own.
  quillane::SetUpPictureMemory();
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
