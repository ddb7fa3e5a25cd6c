// Speed of a whole batch conversion: 20 photo-sized JPEGs (4000 by 3000) loaded, turned into
// pencil sketches and written back as JPEGs, as the batch panel's Convert does it.
#include <benchmark/benchmark.h>
#include <stdlib.h>

#include <filesystem>
#include <stdexcept>
#include <string>

#include "app/document.h"
#include "batch/batch_convert.h"
#include "codecs/picture_file.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

constexpr int kWidth = 4000;
constexpr int kHeight = 3000;
constexpr int kPictures = 20;

std::uint32_t Hash(std::uint32_t x) {
  x ^= x >> 16;
  x *= 0x7feb352dU;
  x ^= x >> 15;
  x *= 0x846ca68bU;
  x ^= x >> 16;
  return x;
}

// Soft gradients, a few hard-edged shapes and fine grain: roughly the work a photo gives the
// JPEG codec and the edge map.
TBitmap32 Photo() {
  TBitmap32 p(kWidth, kHeight);
  for (int y = 0; y < kHeight; ++y) {
    Pixel* row = p.ScanLine(y);
    for (int x = 0; x < kWidth; ++x) {
      const std::uint32_t noise = Hash(static_cast<std::uint32_t>(y * kWidth + x));
      const bool inDisc = (x - 1400) * (x - 1400) + (y - 1200) * (y - 1200) < 700 * 700;
      const bool inBar = (x / 250) % 5 == 0 && y > 2000;
      int r = 60 + x * 150 / kWidth, g = 90 + y * 120 / kHeight, b = 200 - y * 140 / kHeight;
      if (inDisc) r += 70, g -= 40;
      if (inBar) r -= 50, g -= 50, b -= 50;
      auto grain = [&](int v, int shift) {
        const int n = v + static_cast<int>((noise >> shift) & 15) - 8;
        return static_cast<std::uint8_t>(n < 0 ? 0 : n > 255 ? 255 : n);
      };
      row[x] = Pixel{grain(b, 0), grain(g, 4), grain(r, 8), 255};
    }
  }
  return p;
}

// The input folder, made once per run and removed at exit.
class BatchFolders {
 public:
  BatchFolders() {
    std::string pattern = (fs::temp_directory_path() / "quillane-batch-bench-XXXXXX").string();
    if (mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("no temporary folder");
    root_ = pattern;
    fs::create_directory(root_ / "in");
    const std::string first = (root_ / "in" / "photo00.jpg").string();
    SaveJpeg(Photo(), first, 90);
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
