// Memory and speed of the history: twenty effect steps on a 24-megapixel photo (line drawings
// and colour pictures in turn), then the resident memory of the whole process and the time of
// each Undo and Redo over all twenty steps.
#include <benchmark/benchmark.h>
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <fstream>
#include <string>

#include "bench/resident_memory.h"
#include "bench/synthetic_photo.h"
#include "document/document.h"
#include "document/run_effect.h"
#include "effects/registry.h"

namespace quillane {
namespace {

constexpr int kWidth = 6000;
constexpr int kHeight = 4000;
constexpr int kSteps = 20;

// Processor time of the whole process, every thread: unlike the clock on the wall it does not
// count the time other programs on a busy machine take.
double ProcessCpuMilliseconds() {
  timespec now{};
  clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) * 1e3 + static_cast<double>(now.tv_nsec) / 1e6;
}

double Milliseconds(std::chrono::steady_clock::time_point since) {
  return std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - since)
      .count();
}

void BM_HistoryOfTwentySteps(benchmark::State& state) {
  const char* effects[] = {"pencil-sketch", "hsl-adjust", "emboss", "pen-sketch", "color-filter"};
  for (auto _ : state) {
    PictureDocument document(bench::SyntheticPhoto(kWidth, kHeight));
    const double opened = ResidentMegabytes();
    for (int step = 0; step < kSteps; ++step) {
      const EffectSpec& effect = *FindEffectByCliName(effects[step % std::size(effects)]);
      RunEffect(document, effect, effect.Defaults(), true);
    }
    PictureDocument::WaitForHistoryPacking();
    state.counters["resident_MB_opened"] = opened;
    state.counters["resident_MB_after_20_steps"] = ResidentMegabytes();

    double undoTotal = 0, undoWorst = 0, redoTotal = 0, redoWorst = 0;
    const double cpuBefore = ProcessCpuMilliseconds();
    for (int step = 0; step < kSteps; ++step) {
      const auto start = std::chrono::steady_clock::now();
      if (!document.Undo()) state.SkipWithError("Undo refused");
      const double ms = Milliseconds(start);
      undoTotal += ms;
      undoWorst = std::max(undoWorst, ms);
    }
    for (int step = 0; step < kSteps; ++step) {
      const auto start = std::chrono::steady_clock::now();
      if (!document.Redo()) state.SkipWithError("Redo refused");
      const double ms = Milliseconds(start);
      redoTotal += ms;
      redoWorst = std::max(redoWorst, ms);
    }
    state.counters["undo_redo_cpu_ms_mean"] = (ProcessCpuMilliseconds() - cpuBefore) / (2 * kSteps);
    state.counters["undo_ms_mean"] = undoTotal / kSteps;
    state.counters["undo_ms_worst"] = undoWorst;
    state.counters["redo_ms_mean"] = redoTotal / kSteps;
    state.counters["redo_ms_worst"] = redoWorst;
    state.counters["resident_MB_after_undo_redo"] = ResidentMegabytes();
  }
}
BENCHMARK(BM_HistoryOfTwentySteps)->Iterations(1)->Unit(benchmark::kSecond)->UseRealTime();

}  // namespace
}  // namespace quillane

BENCHMARK_MAIN();
