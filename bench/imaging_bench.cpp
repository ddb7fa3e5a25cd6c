// Speed of the pixel core and the pencil sketch on a 12-megapixel photo-like picture, with a
// plain memcpy of the same picture as the floor.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cmath>
#include <cstring>

#include "data/startup_picture.h"
#include "effects/mono/bw_sketch.h"
#include "imaging/edge_map.h"
#include "imaging/tone.h"

namespace quillane {
namespace {

constexpr int kWidth = 4000;
constexpr int kHeight = 3000;

std::uint32_t Hash(std::uint32_t x) {
  x ^= x >> 16;
  x *= 0x7feb352dU;
  x ^= x >> 15;
  x *= 0x846ca68bU;
  x ^= x >> 16;
  return x;
}

// The start-up picture enlarged smoothly to 4000 by 3000 with a little per-channel grain, so
// that it has the soft gradients, edges and noise (and the many distinct colours) of a photo.
const TBitmap32& Photo() {
  static const TBitmap32 photo = [] {
    const TBitmap32 small = StartupPicture();
    TBitmap32 big(kWidth, kHeight);
    const int sw = small.Width(), sh = small.Height();
    for (int y = 0; y < kHeight; ++y) {
      const double fy = (y + 0.5) * sh / kHeight - 0.5;
      const int y0 = std::clamp(static_cast<int>(std::floor(fy)), 0, sh - 1);
      const int y1 = std::min(y0 + 1, sh - 1);
      const double ty = std::clamp(fy - y0, 0.0, 1.0);
      const Pixel* r0 = small.ScanLine(y0);
      const Pixel* r1 = small.ScanLine(y1);
      Pixel* out = big.ScanLine(y);
      for (int x = 0; x < kWidth; ++x) {
        const double fx = (x + 0.5) * sw / kWidth - 0.5;
        const int x0 = std::clamp(static_cast<int>(std::floor(fx)), 0, sw - 1);
        const int x1 = std::min(x0 + 1, sw - 1);
        const double tx = std::clamp(fx - x0, 0.0, 1.0);
        const std::uint32_t noise = Hash(static_cast<std::uint32_t>(y * kWidth + x));
        const auto channel = [&](std::uint8_t Pixel::*c, int shift) {
          const double top = r0[x0].*c + (r0[x1].*c - r0[x0].*c) * tx;
          const double bottom = r1[x0].*c + (r1[x1].*c - r1[x0].*c) * tx;
          const double v = top + (bottom - top) * ty + static_cast<int>((noise >> shift) & 7) - 3.5;
          return static_cast<std::uint8_t>(std::clamp(static_cast<int>(std::lround(v)), 0, 255));
        };
        out[x] = Pixel{channel(&Pixel::b, 0), channel(&Pixel::g, 3), channel(&Pixel::r, 6), 255};
      }
    }
    return big;
  }();
  return photo;
}

const TBitmap32& EdgeMap() {
  static const TBitmap32 edges = [] {
    TBitmap32 e = Photo();
    picsobel(e);
    return e;
  }();
  return edges;
}

const TBitmap32& GrayEdgeMap() {
  static const TBitmap32 gray = [] {
    TBitmap32 g = EdgeMap();
    ConvertToGray(g);
    return g;
  }();
  return gray;
}

void SetBytes(benchmark::State& state) {
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) * kWidth * kHeight * 4);
}

void BM_Memcpy(benchmark::State& state) {
  const TBitmap32& photo = Photo();
  TBitmap32 copy(kWidth, kHeight);
  for (auto _ : state) {
    std::memcpy(copy.Data(), photo.Data(), photo.PixelCount() * sizeof(Pixel));
    benchmark::ClobberMemory();
  }
  SetBytes(state);
}
BENCHMARK(BM_Memcpy)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime();

// Routines that work in place get a fresh copy each round, outside the timing.
template <typename Routine>
void InPlace(benchmark::State& state, const TBitmap32& input, Routine routine) {
  TBitmap32 work;
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
  InPlace(state, Photo(), [](TBitmap32& b) { picsobel(b); });
}
BENCHMARK(BM_Picsobel)->Unit(benchmark::kMillisecond)->MeasureProcessCPUTime()->UseRealTime();

void BM_ConvertToGray(benchmark::State& state) {
  InPlace(state, EdgeMap(), [](TBitmap32& b) { ConvertToGray(b); });
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
  for (auto _ : state) benchmark::DoNotOptimize(peccilsketch(Photo(), mode, 60, 150).Data());
  SetBytes(state);
}
BENCHMARK(BM_PencilSketch)
    ->Arg(static_cast<int>(PencilToneMode::Contrast))
    ->Arg(static_cast<int>(PencilToneMode::Lighting))
    ->ArgName("lighting")
    ->Unit(benchmark::kMillisecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

}  // namespace
}  // namespace quillane

BENCHMARK_MAIN();
