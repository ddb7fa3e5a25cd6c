// Speed of a whole batch conversion: 20 photo-sized JPEGs (4000 by 3000) loaded, turned into
// pencil sketches and written back as JPEGs, as the batch panel's Convert does it.
#include <benchmark/benchmark.h>
#include <stdlib.h>

#include <filesystem>
#include <stdexcept>
#include <string>

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

void BM_BatchPencilSketch(benchmark::State& state) {
  static const BatchFolders folders;
  const EffectSpec& pencil = *FindEffectByCliName("pencil-sketch");
  const BatchJob job{folders.In(), folders.Out(), ScanBatchFolder(folders.In())};
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
BENCHMARK(BM_BatchPencilSketch)->Iterations(1)->Unit(benchmark::kSecond)->UseRealTime();

}  // namespace
}  // namespace quillane

BENCHMARK_MAIN();
