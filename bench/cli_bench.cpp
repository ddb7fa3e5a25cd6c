// The one-shot commands of quillane-cli on a 20-megapixel JPEG, each run as the user runs it
// (a process of its own, wall time to its exit), beside decoding and encoding the same files
// in this process in the same run: the file read and decoded, and the result encoded and
// written without the safe-write's fsyncs. Medians of a few runs.
#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <functional>
#include <string>
#include <vector>

#include "bench/synthetic_photo.h"
#include "bench/wall_clock.h"
#include "codecs/codec_internal.h"
#include "codecs/picture_file.h"
#include "effects/registry.h"
#include "imaging/picture_memory.h"
#include "imaging/rotate.h"

extern char** environ;

namespace quillane {
namespace {

constexpr int kWidth = 6028;
constexpr int kHeight = 3391;
constexpr int kRuns = 5;

void WriteBytes(const std::string& path, const std::vector<std::uint8_t>& bytes) {
  std::ofstream(path, std::ios::binary)
      .write(reinterpret_cast<const char*>(bytes.data()),
             static_cast<std::streamsize>(bytes.size()));
}

void RunCli(const std::vector<std::string>& args) {
  std::vector<char*> argv;
  // QUILLANE_CLI names another build of the program to compare with.
  const char* chosen = std::getenv("QUILLANE_CLI");
  std::string program = chosen != nullptr ? chosen : QUILLANE_CLI_PATH;
  argv.push_back(program.data());
  std::vector<std::string> copies = args;
  for (std::string& a : copies) argv.push_back(a.data());
  argv.push_back(nullptr);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
  pid_t pid = 0;
  if (posix_spawn(&pid, program.c_str(), &actions, nullptr, argv.data(), environ) != 0) {
    std::perror("posix_spawn");
    std::exit(1);
  }
  posix_spawn_file_actions_destroy(&actions);
  int status = 0;
  waitpid(pid, &status, 0);
  if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
    std::fprintf(stderr, "quillane-cli %s failed\n", args.front().c_str());
    std::exit(1);
  }
}

}  // namespace
}  // namespace quillane

int main() {
  using namespace quillane;
  SetUpPictureMemory();
  char folderTemplate[] = "/tmp/quillane-cli-bench-XXXXXX";
  const std::string folder = mkdtemp(folderTemplate);
  const std::string photo = folder + "/photo.jpg";
  WriteBytes(photo, codecs::EncodeJpeg(bench::SyntheticPhoto(kWidth, kHeight), 90));
  const std::string out = folder + "/out.jpg";

  std::printf("quillane-cli on a %d x %d JPEG, median of %d\n", kWidth, kHeight, kRuns);
  const auto decode = [&] { return *LoadPictureFile(photo); };
  const auto report = [](const char* what, double cli, double floor) {
    std::printf("%s: %.1f ms (floor decode + encode %.1f ms, %.2fx)\n", what, cli, floor,
                cli / floor);
    std::fflush(stdout);
  };

  {
    const double floor =
        MedianOf(kRuns, [&] { WriteBytes(out, codecs::EncodeJpeg(decode(), 90)); });
    const double cli = MedianOf(kRuns, [&] { RunCli({"convert", photo, "-o", out}); });
    report("convert to JPEG", cli, floor);
  }
  {
    const EffectSpec& emboss = *FindEffectByCliName("emboss");
    const double routine = MedianOf(kRuns, [&] {
      const Bitmap32 picture = decode();
      std::uint32_t random = 0;
      (void)emboss.routine({picture, picture, emboss.Defaults(), &random});
    });
    const double floor =
        MedianOf(kRuns, [&] { WriteBytes(out, codecs::EncodeJpeg(decode(), 90)); });
    const double cli = MedianOf(kRuns, [&] { RunCli({"apply", "emboss", photo, "-o", out}); });
    std::printf("(emboss: decode + routine %.1f ms)\n", routine);
    report("apply emboss", cli, floor);
  }
  {
    const double floor = MedianOf(kRuns, [&] {
      const Bitmap32 picture = decode();
      WriteBytes(out, codecs::EncodeJpeg(
                          *RotatePicture(picture, RotationCentre(picture.Width()),
                                         RotationCentre(picture.Height()), QuarterTurn::Clockwise),
                          90));
    });
    const double cli = MedianOf(kRuns, [&] { RunCli({"rotate", "cw", photo, "-o", out}); });
    report("rotate (floor with the turn)", cli, floor);
  }
  {
    const double floor = MedianOf(kRuns, [&] {
      Bitmap32 picture = decode();
      ResampleNearest(picture, 0.5, 0.5);
      WriteBytes(out, codecs::EncodeJpeg(picture, 90));
    });
    const double cli = MedianOf(kRuns, [&] {
      RunCli({"resize", std::to_string(kWidth / 2), std::to_string(kHeight / 2), photo, "-o", out});
    });
    report("resize to half (floor with the resample)", cli, floor);
  }
  std::remove(photo.c_str());
  std::remove(out.c_str());
  rmdir(folder.c_str());
  return 0;
}
