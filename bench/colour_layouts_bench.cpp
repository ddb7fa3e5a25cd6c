// The colour effects' settings that the side-by-side table does not reach (it runs each
// effect's defaults): every colour panel layout, both stria directions, every colour filter.
// Compare with the memcpy of the same picture, timed here too.
#include <benchmark/benchmark.h>

#include <cstring>

#include "bench/synthetic_photo.h"
#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "effects/surface/stria.h"
#include "imaging/parallel.h"
#include "imaging/picture_memory.h"

namespace quillane {
namespace {

using bench::Photo;

void Memcpy(benchmark::State& state) {
  const Bitmap32& photo = Photo();
  Bitmap32 copy(photo.Width(), photo.Height());
  for (auto _ : state) {
    std::memcpy(static_cast<void*>(copy.Data()), photo.Data(), photo.PixelCount() * sizeof(Pixel));
    benchmark::ClobberMemory();
  }
}
BENCHMARK(Memcpy)->Unit(benchmark::kMillisecond)->UseRealTime();

// range(1): 1 for one thread, 0 for all of them.
template <typename Routine>
void Run(benchmark::State& state, Routine routine) {
  SetRowSplit({static_cast<int>(state.range(1)), kParallelThreshold});
  routine();  // later runs find their memory kept, as they do in the program
  for (auto _ : state) {
    const Bitmap32 result = routine();
    benchmark::DoNotOptimize(result.Data());
  }
  SetRowSplit({});
}

void Panel(benchmark::State& state) {
  Run(state, [&] { return ColorPanel(Photo(), PanelLayout(state.range(0))); });
}
BENCHMARK(Panel)
    ->ArgsProduct({{1, 2, 3, 4, 5, 6}, {1, 0}})
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime();

void Stria(benchmark::State& state) {
  Run(state, [&] {
    return stria(Photo(), Photo().Width(), Photo().Height(), StriaDirection(state.range(0)), 1, 2,
                 128, 0x000000);
  });
}
BENCHMARK(Stria)->ArgsProduct({{1, 2}, {1, 0}})->Unit(benchmark::kMillisecond)->UseRealTime();

void Filter(benchmark::State& state) {
  Run(state, [&] { return ColorFilter(Photo(), ColorFilterKind(state.range(0))); });
}
BENCHMARK(Filter)->ArgsProduct({{1, 4}, {1, 0}})->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace
}  // namespace quillane

int main(int argc, char** argv) {
  // Results reuse kept picture memory, as in the program.
  quillane::SetUpPictureMemory();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
