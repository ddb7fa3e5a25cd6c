// Every effect on the 12-megapixel photo, as a multiple of a memcpy of the same picture timed in
// the same process, on one thread and on all of them, and beside it the OpenCV operation doing
// comparable work on the same picture on one thread (when OpenCV was found). Google Benchmark
// times each; the medians of the repetitions make one table at the end.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "bench/synthetic_photo.h"
#include "effects/registry.h"
#include "imaging/parallel.h"
#include "imaging/picture_memory.h"
#include "imaging/vector_dispatch.h"

#ifdef QUILLANE_HAVE_OPENCV
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>
#endif

namespace quillane {
namespace {

constexpr int kWidth = bench::kPhotoWidth;
constexpr int kHeight = bench::kPhotoHeight;
using bench::Photo;

void Memcpy(benchmark::State& state) {
  const Bitmap32& photo = Photo();
  Bitmap32 copy(kWidth, kHeight);
  for (auto _ : state) {
    std::memcpy(static_cast<void*>(copy.Data()), photo.Data(), photo.PixelCount() * sizeof(Pixel));
    benchmark::ClobberMemory();
  }
}

// The effect as OK runs it: the routine with its defaults, its result a new picture.
void Effect(benchmark::State& state, const EffectSpec* effect, int threads) {
  const EffectParams params = effect->Defaults();
  std::uint32_t seed = 0;
  SetRowSplit({threads, kParallelThreshold});
  // One run outside the timing: later runs find their memory kept, as they do in the program.
  effect->routine({Photo(), Photo(), params, &seed});
  for (auto _ : state) {
    const Bitmap32 result = effect->routine({Photo(), Photo(), params, &seed});
    benchmark::DoNotOptimize(result.Data());
  }
  SetRowSplit({});
}

// The comparable OpenCV operation for each effect; empty where there is none.
const std::map<std::string, std::string>& Comparable() {
  static const std::map<std::string, std::string> table{
      {"pencil-sketch", "Sobel chain"}, {"pen-sketch", "Sobel chain"},
      {"vuzorar", "Sobel chain"},       {"pen-and-ink", "Sobel chain"},
      {"realism", "filter2D 3x3"},      {"abstract", "filter2D 3x3"},
      {"pop-art", "filter2D 3x3"},      {"emboss", "filter2D 3x3"},
      {"water-color", "medianBlur 3"},  {"color-pencil", "HLS round trip"},
      {"hsl-adjust", "HLS round trip"}, {"texture", "HLS round trip"},
  };
  return table;
}

#ifdef QUILLANE_HAVE_OPENCV
cv::Mat PhotoMat() {
  const Bitmap32& p = Photo();
  return cv::Mat(kHeight, kWidth, CV_8UC4, const_cast<Pixel*>(p.Data()));
}

void OpenCv(benchmark::State& state, const std::string& name) {
  cv::setNumThreads(1);
  const cv::Mat src = PhotoMat();
  const cv::Mat kernel = (cv::Mat_<float>(3, 3) << 1, 2, 1, 0, 0, 0, -1, -1, -1);
  cv::Mat lut(1, 256, CV_8U);
  for (int i = 0; i < 256; ++i) lut.at<std::uint8_t>(i) = static_cast<std::uint8_t>(255 - i);
  // The results stay between rounds, so that OpenCV reuses their memory as a program calling
  // it in a loop would, rather than faulting in fresh pages every time.
  cv::Mat out, hls, gray, gx, gy, ax, ay, edges;
  const auto run = [&] {
    if (name == "filter2D 3x3") {
      cv::filter2D(src, out, -1, kernel);
    } else if (name == "medianBlur 3") {
      cv::medianBlur(src, out, 3);
    } else if (name == "HLS round trip") {
      cv::cvtColor(src, hls, cv::COLOR_BGR2HLS);
      cv::cvtColor(hls, out, cv::COLOR_HLS2BGR, 4);
    } else {
      cv::cvtColor(src, gray, cv::COLOR_BGRA2GRAY);
      cv::Sobel(gray, gx, CV_16S, 1, 0);
      cv::Sobel(gray, gy, CV_16S, 0, 1);
      cv::convertScaleAbs(gx, ax);
      cv::convertScaleAbs(gy, ay);
      cv::max(ax, ay, edges);
      cv::LUT(edges, lut, out);
    }
  };
  run();  // outside the timing, as each effect's first run
  for (auto _ : state) {
    run();
    benchmark::DoNotOptimize(out.data);
  }
}
#endif

// Keeps the median real time of every benchmark, in milliseconds, for the table.
class MedianReporter : public benchmark::ConsoleReporter {
 public:
  std::map<std::string, double> medians;
  std::map<std::string, double> cpuMedians;  // the process's processor time
  std::map<std::string, double> spreads;     // coefficient of variation, percent

  void ReportRuns(const std::vector<Run>& runs) override {
    for (const Run& run : runs) {
      if (run.run_type != Run::RT_Aggregate) continue;
      const std::string name = run.run_name.function_name;
      if (run.aggregate_name == "median") {
        medians[name] = run.GetAdjustedRealTime();
        cpuMedians[name] = run.GetAdjustedCPUTime();
      }
      if (run.aggregate_name == "cv") spreads[name] = 100 * run.real_accumulated_time;
    }
    ConsoleReporter::ReportRuns(runs);
  }
};

double Load() {
  double load = 0;
  if (std::FILE* f = std::fopen("/proc/loadavg", "r")) {
    if (std::fscanf(f, "%lf", &load) != 1) load = 0;
    std::fclose(f);
  }
  return load;
}

void PrintTable(const MedianReporter& r) {
  const auto found = [](const std::map<std::string, double>& m, const std::string& name) {
    const auto it = m.find(name);
    return it == m.end() ? -1.0 : it->second;
  };
  const double floor = found(r.medians, "memcpy");
  const double cpuFloor = found(r.cpuMedians, "memcpy");
  if (floor <= 0 || cpuFloor <= 0) return;
  const unsigned cores = std::max(1u, std::thread::hardware_concurrency());
  std::printf(
      "\n12-megapixel photo (%d x %d): memcpy %.2f ms = 1x (spread %.0f%%), %.2f ms of "
      "processor time; load average %.1f on %u cores; widest vectors: %s.\n",
      kWidth, kHeight, floor, r.spreads.count("memcpy") ? r.spreads.at("memcpy") : 0.0, cpuFloor,
      Load(), cores,
      UseAvx512() ? (UseAvx512Gathers() ? "AVX-512 with gathers" : "AVX-512 without gathers")
                  : (UseAvx2() ? "AVX2" : "none"));
  std::printf(
      "Medians of 5 repetitions, wall-clock time as a multiple of the memcpy's; "
      "cpu x: one thread's processor time\nas a multiple of the memcpy's, which other "
      "processes on a busy machine disturb less.\n\n");
  std::printf("%-14s %8s %6s %6s %8s %6s   %-14s %8s %6s %6s\n", "effect", "1 thread", "x", "cpu x",
              "all", "x", "OpenCV, 1 thr", "ms", "x", "cpu x");
  const auto ratios = [&](const std::string& name) {
    const double ms = found(r.medians, name);
    std::printf(" %8.1f %5.1fx %5.1fx", ms, ms / floor, found(r.cpuMedians, name) / cpuFloor);
  };
  for (const EffectSpec* e : Effects()) {
    if (!e->routine || found(r.medians, "effect/" + e->cliName + "/1") < 0) continue;
    std::printf("%-14s", e->cliName.c_str());
    ratios("effect/" + e->cliName + "/1");
    const double all = found(r.medians, "effect/" + e->cliName + "/all");
    std::printf(" %8.1f %5.1fx", all, all / floor);
    const auto c = Comparable().find(e->cliName);
    if (c != Comparable().end()) {
      std::printf("   %-14s", c->second.c_str());
      if (found(r.medians, "opencv/" + c->second) > 0) ratios("opencv/" + c->second);
    }
    std::printf("\n");
  }
#ifndef QUILLANE_HAVE_OPENCV
  std::printf("\nOpenCV was not found when this was built: `make bench` installs it.\n");
#endif
}

}  // namespace
}  // namespace quillane

int main(int argc, char** argv) {
  using namespace quillane;
  // The set-up both programs make at start-up, so that the figures are the programs' own.
  SetUpPictureMemory();
  const auto add = [](const std::string& name, auto&& fn) {
    benchmark::RegisterBenchmark(name.c_str(), fn)
        ->Unit(benchmark::kMillisecond)
        ->UseRealTime()
        ->MeasureProcessCPUTime()
        ->Repetitions(5)
        ->ReportAggregatesOnly(true);
  };
  add("memcpy", Memcpy);
  for (const EffectSpec* e : Effects()) {
    if (!e->routine) continue;
    add("effect/" + e->cliName + "/1", [e](benchmark::State& s) { Effect(s, e, 1); });
    add("effect/" + e->cliName + "/all", [e](benchmark::State& s) { Effect(s, e, 0); });
  }
#ifdef QUILLANE_HAVE_OPENCV
  for (const char* op : {"Sobel chain", "filter2D 3x3", "medianBlur 3", "HLS round trip"})
    add(std::string("opencv/") + op, [op](benchmark::State& s) { OpenCv(s, op); });
#endif
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  MedianReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  PrintTable(reporter);
  benchmark::Shutdown();
  return 0;
}
