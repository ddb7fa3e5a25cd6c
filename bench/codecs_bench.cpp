// JPEG decoding and encoding of a 24-megapixel photo-like picture (6000 x 4000), through the
// same calls the program makes.
#include <benchmark/benchmark.h>
#include <unistd.h>

#include <cstdint>
#include <filesystem>
#include <string>

#include "bench/synthetic_photo.h"
#include "codecs/codec_internal.h"
#include "codecs/picture_file.h"

namespace {

using quillane::Bitmap32;
using quillane::Pixel;

constexpr int kWidth = 6000, kHeight = 4000;

const Bitmap32& Photo() {
  static const Bitmap32 photo = quillane::bench::SyntheticPhoto(kWidth, kHeight);
  return photo;
}

// The photo saved once as a quality-90 JPEG; removed when the program ends.
struct PhotoFile {
  std::filesystem::path folder;
  std::string path;
  PhotoFile() {
    std::string pattern = (std::filesystem::temp_directory_path() / "codecs-bench-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("no temporary folder");
    folder = pattern;
    path = (folder / "photo.jpg").string();
    quillane::SaveJpeg(Photo(), path);
  }
  ~PhotoFile() {
    std::error_code ignored;
    std::filesystem::remove_all(folder, ignored);
  }
};

const PhotoFile& SavedPhoto() {
  static const PhotoFile file;
  return file;
}

void BM_JpegDecode24Mpx(benchmark::State& state) {
  const std::string& path = SavedPhoto().path;
  for (auto _ : state) {
    auto picture = quillane::LoadPictureFile(path);
    benchmark::DoNotOptimize(picture->Data());
  }
  state.SetItemsProcessed(state.iterations() * kWidth * kHeight);
  state.counters["file_MB"] = static_cast<double>(std::filesystem::file_size(path)) / 1e6;
}
BENCHMARK(BM_JpegDecode24Mpx)->Unit(benchmark::kMillisecond)->MinTime(3);

void BM_JpegEncode24Mpx(benchmark::State& state) {
  const Bitmap32& photo = Photo();
  for (auto _ : state) {
    auto bytes = quillane::codecs::EncodeJpeg(photo, 90);
    benchmark::DoNotOptimize(bytes.data());
  }
  state.SetItemsProcessed(state.iterations() * kWidth * kHeight);
}
BENCHMARK(BM_JpegEncode24Mpx)->Unit(benchmark::kMillisecond)->MinTime(3);

// Encoding plus the safe write: temporary file, fsync and rename.
void BM_SaveJpeg24Mpx(benchmark::State& state) {
  const Bitmap32& photo = Photo();
  const std::string path = (SavedPhoto().folder / "saved.jpg").string();
  for (auto _ : state) quillane::SaveJpeg(photo, path);
  state.SetItemsProcessed(state.iterations() * kWidth * kHeight);
}
BENCHMARK(BM_SaveJpeg24Mpx)->Unit(benchmark::kMillisecond)->MinTime(3);

}  // namespace

BENCHMARK_MAIN();
