// The batch loop with its stages overlapped must be indistinguishable from the loop that takes
// one picture at a time: same messages and progress in the same order, same files, same history
// and random sequence, and a failure stops it at the same picture.
#include <gtest/gtest.h>
#include <stdlib.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <string>
#include <vector>

#include "batch/batch_convert.h"
#include "codecs/picture_file.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

std::string Hash(const std::string& bytes) {
  std::uint32_t hash = 2166136261u;
  for (char byte : bytes) hash = (hash ^ static_cast<std::uint8_t>(byte)) * 16777619u;
  return std::to_string(hash);
}

std::string Hex(const Bitmap32& picture) {
  const auto* bytes = reinterpret_cast<const char*>(picture.Data());
  return std::to_string(picture.Width()) + "x" + std::to_string(picture.Height()) + ":" +
         Hash(std::string(bytes, bytes + picture.PixelCount() * 4));
}

// Everything a run lets anyone see: what the observer heard, the result, the files left in the
// folders and the document with its whole history.
std::vector<std::string> Convert(const fs::path& root, const std::vector<std::string>& files,
                                 bool outputBeside, bool overlap) {
  fs::remove_all(root);
  fs::create_directories(root / "in");
  SaveJpeg(RandomPicture(40, 30, 1), (root / "in" / "a.jpg").string(), 90);
  SaveJpeg(RandomPicture(33, 21, 2), (root / "in" / "a.JPG").string(), 90);
  SaveBitmap24(RandomPicture(17, 40, 3), (root / "in" / "b.bmp").string());
  std::ofstream((root / "in" / "broken.jpg").string()) << "not a picture";
  SaveJpeg(RandomPicture(25, 25, 4), (root / "in" / "c.jpg").string(), 90);
  SaveJpeg(RandomPicture(19, 23, 5), (root / "in" / "d.jpg").string(), 90);
  const std::string out = (root / (outputBeside ? "in" : "out")).string();
  fs::create_directories(out + "/c-Brume.jpg");  // c's output cannot be written

  std::vector<std::string> seen;
  PictureDocument document(RandomPicture(9, 9, 0));
  BatchObserver observer;
  observer.message = [&](const std::string& caption, const std::string& text) {
    seen.push_back("message " + caption + " " + text);
  };
  observer.progress = [&](const BatchProgress& p) {
    seen.push_back("progress " + std::to_string(static_cast<int>(p.step)) + " " + p.name + " " +
                   p.reason + " " + Hex(document.Working()));
  };
  observer.afterEffect = [&](const BatchProgress& p, const PictureDocument& d) {
    seen.push_back("effect " + p.name + " " + std::to_string(d.RandomState()));
  };
  BatchJob job{(root / "in").string(), out, files};
  job.overlapStages = overlap;
  const EffectSpec& brume = *FindEffectByCliName("brume");
  const BatchResult result = ConvertBatch(document, brume, brume.Defaults(), job, observer);

  seen.push_back("end " + std::to_string(static_cast<int>(result.end)) + " " + result.error);
  for (const auto& o : result.outputs) seen.push_back("output " + o);
  for (const auto& s : result.skipped) seen.push_back("skipped " + s.reason);
  std::vector<std::string> listing;
  for (const auto& entry : fs::recursive_directory_iterator(root)) {
    std::ifstream in(entry.path(), std::ios::binary);
    listing.push_back(entry.path().string() + " " +
                      (entry.is_regular_file() ? Hash({std::istreambuf_iterator<char>(in), {}})
                                               : std::string("folder")));
  }
  std::sort(listing.begin(), listing.end());
  seen.insert(seen.end(), listing.begin(), listing.end());
  seen.push_back("random " + std::to_string(document.RandomState()) + " undo " +
                 std::to_string(document.UndoCount()));
  for (int slot = 1; slot <= PictureDocument::kSlots; ++slot)
    seen.push_back("slot " + Hex(document.Slot(slot)));
  seen.push_back("pictures " + Hex(document.Working()) + " " + Hex(document.Source()) + " " +
                 Hex(document.Opened()));
  return seen;
}

TEST(BatchOverlap, SeenExactlyAsOnePictureAtATime) {
  const struct {
    const char* what;
    std::vector<std::string> files;
    bool outputBeside;
  } cases[] = {
      {"a clash, an unreadable file and a failed write",
       {"a.jpg", "b.bmp", "broken.jpg", "missing.jpg", "a.JPG", "c.jpg", "d.jpg"},
       false},
      {"every entry converted", {"d.jpg", "a.jpg", "b.bmp", "a.JPG"}, false},
      // a-Brume.jpg is written by the first entry and read as the second.
      {"an input written by the run itself", {"a.jpg", "a-Brume.jpg", "b.bmp"}, true},
  };
  const fs::path root = fs::path(::testing::TempDir()) / "quillane-batch-overlap";
  for (const auto& c : cases) {
    const std::vector<std::string> alone = Convert(root, c.files, c.outputBeside, false);
    const std::vector<std::string> overlapped = Convert(root, c.files, c.outputBeside, true);
    EXPECT_EQ(overlapped, alone) << c.what;
  }
  fs::remove_all(root);
}

}  // namespace
}  // namespace quillane
