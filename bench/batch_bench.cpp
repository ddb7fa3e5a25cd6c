// Speed of a whole batch conversion: 20 photo-sized JPEGs (4000 by 3000) loaded, turned into
// pencil sketches and written back as JPEGs, as the batch panel's Convert does it.
#include <benchmark/benchmark.h>
#include <stdlib.h>

#include <filesystem>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "batch/batch_convert.h"
#include "bench/synthetic_photo.h"
#include "codecs/picture_file.h"
#include "document/document.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

constexpr int kWidth = 4000;
constexpr int kHeight = 3000;
constexpr int kPictures = 20;

// The input folder, made once per run and removed at exit.
class BatchFolders {
 public:
  BatchFolders() {
    std::string pattern = (fs::temp_directory_path() / "quillane-batch-bench-XXXXXX").string();
    if (mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("no temporary folder");
    root_ = pattern;
    fs::create_directory(root_ / "in");
    const std::string first = (root_ / "in" / "photo00.jpg").string();
    SaveJpeg(bench::SyntheticPhoto(kWidth, kHeight), first, 90);
    for (int i = 1; i < kPictures; ++i) {
      const std::string name = std::string("photo") + (i < 10 ? "0" : "") + std::to_string(i);
      fs::copy_file(first, root_ / "in" / (name + ".jpg"));
    }
  }
  ~BatchFolders() { fs::remove_all(root_); }
  std::string In() const { return (root_ / "in").string(); }
  std::string Out() const { return (root_ / "out").string(); }

 private:
  fs::path root_;
};

const BatchFolders& Folders() {
  static const BatchFolders folders;
  return folders;
}

// Argument 1: the stages overlap (the program's way); 0: one picture at a time.
void BM_BatchPencilSketch(benchmark::State& state) {
  const BatchFolders& folders = Folders();
  const EffectSpec& pencil = *FindEffectByCliName("pencil-sketch");
  BatchJob job{folders.In(), folders.Out(), ScanBatchFolder(folders.In())};
  job.overlapStages = state.range(0) != 0;
  if (static_cast<int>(job.files.size()) != kPictures) {
    state.SkipWithError("the input folder is incomplete");
    return;
  }
  PictureDocument document;
  for (auto _ : state) {
    const BatchResult result = ConvertBatch(document, pencil, pencil.Defaults(), job);
    if (!result.AllConverted()) {
      state.SkipWithError(result.error.c_str());
      return;
    }
  }
  state.counters["pictures_per_second"] = benchmark::Counter(
      static_cast<double>(kPictures), benchmark::Counter::kIsIterationInvariantRate);
  state.counters["megapixels_per_second"] = benchmark::Counter(
      kPictures * (kWidth * kHeight / 1e6), benchmark::Counter::kIsIterationInvariantRate);
}
BENCHMARK(BM_BatchPencilSketch)
    ->Arg(0)
    ->Arg(1)
    ->Iterations(1)
    ->Unit(benchmark::kSecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

// What the conversion cannot go below on one thread: the same files decoded and written back
// without any effect.
void BM_DecodeAndEncodeAlone(benchmark::State& state) {
  const BatchFolders& folders = Folders();
  const std::vector<std::string> files = ScanBatchFolder(folders.In());
  fs::create_directories(folders.Out());
  for (auto _ : state) {
    for (const std::string& name : files) {
      const std::optional<Bitmap32> picture = LoadPictureFile(folders.In() + "/" + name);
      if (!picture) {
        state.SkipWithError("a picture did not load");
        return;
      }
      SaveJpeg(*picture, folders.Out() + "/" + name, 90);
    }
  }
}
BENCHMARK(BM_DecodeAndEncodeAlone)
    ->Iterations(1)
    ->Unit(benchmark::kSecond)
    ->MeasureProcessCPUTime()
    ->UseRealTime();

}  // namespace
}  // namespace quillane

BENCHMARK_MAIN();
