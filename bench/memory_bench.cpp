// Peak memory of the command line's apply on a 24-megapixel JPEG: loaded, made the document's
// picture, turned into a pencil sketch and written back. Each run is a child process of its
// own, so its high-water mark is its own; reported as megabytes per megapixel (a 32-bit
// picture is 4 MB per megapixel, so the figure counts copies of the picture times four).
#include <benchmark/benchmark.h>
#include <stdlib.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <string>

#include "bench/synthetic_photo.h"
#include "codecs/picture_file.h"
#include "document/document.h"
#include "effects/registry.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

constexpr int kWidth = 6000;
constexpr int kHeight = 4000;

// "VmHWM:" or "VmRSS:" of this process, in kilobytes.
long StatusKilobytes(const char* key) {
  std::ifstream status("/proc/self/status");
  std::string name;
  long value = 0;
  std::string rest;
  while (status >> name) {
    if (name == key) {
      status >> value;
      return value;
    }
    std::getline(status, rest);
  }
  return 0;
}

class Photo {
 public:
  Photo() {
    std::string pattern = (fs::temp_directory_path() / "quillane-memory-bench-XXXXXX").string();
    if (mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("no temporary folder");
    root_ = pattern;
    SaveJpeg(bench::SyntheticPhoto(kWidth, kHeight), In(), 90);
  }
  ~Photo() { fs::remove_all(root_); }
  std::string In() const { return (root_ / "photo.jpg").string(); }
  std::string Out() const { return (root_ / "result.jpg").string(); }

 private:
  fs::path root_;
};

// The child's growth of its resident set while doing what `quillane-cli apply` does.
long ApplyPeakKilobytes(const Photo& photo) {
  int pipeEnds[2];
  if (::pipe(pipeEnds) != 0) throw std::runtime_error("no pipe");
  const pid_t child = ::fork();
  if (child == 0) {
    const long before = StatusKilobytes("VmRSS:");
    {
      const EffectSpec& pencil = *FindEffectByCliName("pencil-sketch");
      PictureDocument document(*LoadPictureFile(photo.In()));
      document.SetWorking(
          pencil.routine({document.Source(), document.Working(), pencil.Defaults()}));
      SaveJpeg(document.Working(), photo.Out(), 90);
    }
    const long growth = StatusKilobytes("VmHWM:") - before;
    if (::write(pipeEnds[1], &growth, sizeof growth) != sizeof growth) ::_exit(1);
    ::_exit(0);
  }
  ::close(pipeEnds[1]);
  long growth = 0;
  const bool read = ::read(pipeEnds[0], &growth, sizeof growth) == sizeof growth;
  ::close(pipeEnds[0]);
  int status = 0;
  ::waitpid(child, &status, 0);
  if (!read || !WIFEXITED(status) || WEXITSTATUS(status) != 0) throw std::runtime_error("failed");
  return growth;
}

void BM_ApplyPeakMemoryPerMegapixel(benchmark::State& state) {
  static const Photo photo;
  long growth = 0;
  for (auto _ : state) growth = ApplyPeakKilobytes(photo);
  const double megapixels = kWidth * static_cast<double>(kHeight) / 1e6;
  state.counters["peak_MB"] = growth / 1024.0;
  state.counters["MB_per_megapixel"] = growth / 1024.0 / megapixels;
}
BENCHMARK(BM_ApplyPeakMemoryPerMegapixel)->Unit(benchmark::kMillisecond)->Iterations(2);

}  // namespace
}  // namespace quillane

BENCHMARK_MAIN();
