#include "batch/batch_convert.h"

#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/stat.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "codecs/picture_file.h"
#include "effects/mono/bw_sketch.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

// A fresh folder per test, removed afterwards.
class BatchFolder : public ::testing::Test {
 protected:
  void SetUp() override {
    std::string pattern = (fs::temp_directory_path() / "quillane-batch-XXXXXX").string();
    ASSERT_NE(mkdtemp(pattern.data()), nullptr);
    root_ = pattern;
    in_ = (root_ / "in").string();
    out_ = (root_ / "out").string();
    fs::create_directory(in_);
  }
  void TearDown() override { fs::remove_all(root_); }

  std::string In(const std::string& name) const { return in_ + "/" + name; }
  std::string Out(const std::string& name) const { return out_ + "/" + name; }

  fs::path root_;
  std::string in_;
  std::string out_;
};

// A small opaque picture, different for each seed.
Bitmap32 Picture(int width, int height, int seed) {
  Bitmap32 p = RandomPicture(width, height, static_cast<unsigned>(seed));
  SetAlphaChannel(p, 255);
  return p;
}

std::string ReadBytes(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

void WriteBytes(const std::string& path, const std::string& bytes) {
  std::ofstream(path, std::ios::binary) << bytes;
}

const EffectSpec& Pencil() {
  return *FindEffectByCliName("pencil-sketch");
}

EffectParams PencilLighting(int lighting) {
  EffectParams p;
  p.Set("tone-mode", static_cast<int>(PencilToneMode::Lighting));
  p.Set("lighting", lighting);
  return p;
}

// What the loop must write for the picture in file: the pencil sketch of it, as our own JPEG.
std::string ExpectedJpeg(const std::string& file, const EffectParams& params,
                         const std::string& scratch) {
  Bitmap32 picture = *LoadPictureFile(file);
  SetAlphaChannel(picture, 255);
  EffectParams settings = Pencil().Defaults();
  settings.Merge(params);
  SaveJpeg(Pencil().routine({picture, picture, settings}), scratch, 90);
  return ReadBytes(scratch);
}

struct Recorder {
  std::vector<std::string> messages;
  std::vector<std::string> steps;
  BatchObserver Observer() {
    BatchObserver o;
    o.message = [this](const std::string& caption, const std::string& text) {
      messages.push_back(caption + "|" + text);
    };
    o.progress = [this](const BatchProgress& p) {
      static const char* const names[] = {"load", "loaded", "converted", "written", "skipped"};
      steps.push_back(std::string(names[static_cast<int>(p.step)]) + " " + std::to_string(p.index) +
                      "/" + std::to_string(p.count) + " " + p.name);
    };
    return o;
  }
};

TEST_F(BatchFolder, ScanListsEachMaskInTurnIgnoringCaseAndSortedByName) {
  for (const char* name : {"b.JPG", "a.jpg", "A.JPG", "x.jpeg", "A.Jpeg", "c.bmp", "d.WMF", "e.emf",
                           "f.gif", "g.ico", "h.jpg.txt", "jpg", ".jpgx"})
    WriteBytes(In(name), "x");
  fs::create_symlink(In("a.jpg"), In("link.bmp"));  // entries that are no files: the next test

  // "*.jpg" does not also take the ".jpeg" names, so nothing is listed twice.
  EXPECT_EQ(ScanBatchFolder(in_),
            (std::vector<std::string>{"A.JPG", "a.jpg", "b.JPG", "A.Jpeg", "x.jpeg", "c.bmp",
                                      "link.bmp", "d.WMF"}));
  EXPECT_TRUE(ScanBatchFolder(in_ + "/nowhere").empty());
}

// Entries named like pictures that are no files were left out without a word.
TEST_F(BatchFolder, ScanTellsWhichMatchingEntriesAreNoFiles) {
  WriteBytes(In("a.jpg"), "x");
  fs::create_directory(In("folder.jpg"));
  fs::create_symlink("missing", In("dangling.jpg"));
  fs::create_symlink("loop.bmp", In("loop.bmp"));
  ASSERT_EQ(::mkfifo(In("pipe.wmf").c_str(), 0600), 0);
  fs::create_directory(In("ignored"));
  const BatchScan scan = ScanBatchFolderTelling(in_);
  EXPECT_EQ(scan.files, std::vector<std::string>{"a.jpg"});
  EXPECT_EQ(scan.error, "");
  const std::pair<std::string, std::string> want[] = {
      {"dangling.jpg", "it is a symbolic link to nothing"},
      {"folder.jpg", "it is a folder"},
      {"loop.bmp", "it is a symbolic link loop"},
      {"pipe.wmf", "it is a FIFO"}};
  ASSERT_EQ(scan.notFiles.size(), std::size(want));
  for (std::size_t i = 0; i < std::size(want); ++i) {
    EXPECT_EQ(scan.notFiles[i].first, want[i].first);
    EXPECT_NE(scan.notFiles[i].second.find(In(want[i].first) +
                                           " is not a picture file: " + want[i].second),
              std::string::npos)
        << scan.notFiles[i].second;
  }
  fs::create_symlink("self", In("self"));
  EXPECT_NE(ScanBatchFolderTelling(In("self")).error.find("Cannot read the folder " + In("self")),
            std::string::npos);
  EXPECT_EQ(ScanBatchFolderTelling(In("nowhere")).error, "");  // missing: the Sorry message says it
}

TEST_F(BatchFolder, ConvertsEveryPictureIntoAJpegNamedAfterItsInput) {
  SaveJpeg(Picture(23, 17, 1), In("a.jpg"));
  SaveBitmap24(Picture(19, 11, 2), In("b.bmp"));
  SaveJpeg(Picture(9, 8, 3), In("c.jpeg"));
  const std::vector<std::string> files = ScanBatchFolder(in_);
  ASSERT_EQ(files, (std::vector<std::string>{"a.jpg", "c.jpeg", "b.bmp"}));

  PictureDocument document;
  Recorder recorder;
  const EffectParams params = PencilLighting(150);
  // Blanks around typed folders are ignored; the nested output folder is created.
  const BatchResult result =
      ConvertBatch(document, Pencil(), params, {" " + in_ + " ", "\t" + out_ + "/deep/er/ ", files},
                   recorder.Observer());

  EXPECT_EQ(result.end, BatchResult::End::Completed);
  EXPECT_TRUE(result.AllConverted());
  const std::string deep = out_ + "/deep/er";
  ASSERT_EQ(result.outputs,
            (std::vector<std::string>{deep + "/a-PencilSketch.jpg", deep + "/c.-PencilSketch.jpg",
                                      deep + "/b-PencilSketch.jpg"}));
  for (std::size_t i = 0; i < 3; ++i)
    EXPECT_EQ(ReadBytes(result.outputs[i]), ExpectedJpeg(In(files[i]), params, root_ / "want.jpg"));
  EXPECT_TRUE(recorder.messages.empty());
  std::vector<std::string> steps;
  for (int i = 0; i < 3; ++i)
    for (const char* step : {"load ", "loaded ", "converted ", "written "})
      steps.push_back(step + std::to_string(i + 1) + "/3 " + files[i]);
  EXPECT_EQ(recorder.steps, steps);

  // The document holds the last picture: its result as working, the input as source and opened.
  Bitmap32 last = Picture(19, 11, 2);
  EXPECT_EQ(document.Source(), last);
  EXPECT_EQ(document.Opened(), last);
  EXPECT_EQ(document.Working(), PencilSketch(last, PencilToneMode::Lighting, 45, 150));
}

// The refusals of a missing input folder or an empty list are shown by the batch window's test.

// Regression: an entry that cannot be loaded used to be converted from the previous picture and
// written under its own name.
TEST_F(BatchFolder, UnloadableEntriesAreSkippedWithoutAnOutputFile) {
  SaveJpeg(Picture(14, 9, 5), In("a.jpg"));
  WriteBytes(In("x.jpg"), std::string("\xFF\xD8 this is no picture at all", 29));
  WriteBytes(In("y.bmp"), "");
  SaveBitmap24(Picture(8, 6, 6), In("z.bmp"));
  const std::vector<std::string> files = {"a.jpg", "x.jpg", "gone.jpg", "y.bmp", "z.bmp"};

  PictureDocument document;
  Recorder recorder;
  BatchObserver observer = recorder.Observer();
  std::vector<Bitmap32> sources;
  observer.afterEffect = [&](const BatchProgress&, const PictureDocument& d) {
    sources.push_back(d.Source());
  };
  const BatchResult result =
      ConvertBatch(document, Pencil(), EffectParams(), {in_, out_, files}, observer);

  EXPECT_EQ(result.end, BatchResult::End::Completed);
  EXPECT_FALSE(result.AllConverted());
  EXPECT_EQ(result.outputs,
            (std::vector<std::string>{Out("a-PencilSketch.jpg"), Out("z-PencilSketch.jpg")}));
  ASSERT_EQ(result.skipped.size(), 3u);
  EXPECT_EQ(result.skipped[0].name, "x.jpg");
  EXPECT_NE(result.skipped[0].reason.find(In("x.jpg")), std::string::npos);
  EXPECT_EQ(result.skipped[1].name, "gone.jpg");
  EXPECT_EQ(result.skipped[1].reason, In("gone.jpg") + " is not a valid format");
  EXPECT_EQ(result.skipped[2].name, "y.bmp");
  EXPECT_NE(result.skipped[2].reason.find(In("y.bmp")), std::string::npos);

  // The effect ran only on the pictures that loaded, each from its own source.
  ASSERT_EQ(sources.size(), 2u);
  EXPECT_EQ(sources[1], Picture(8, 6, 6));
  EXPECT_TRUE(recorder.messages.empty());
}

// a.JPG, a.jpg and a.bmp once wrote one output in turn ("Converted 3 of 3"), and with the output
// folder the input folder, an input named like another's output was overwritten.
TEST_F(BatchFolder, OutputsAlreadyWrittenOrListedAsInputsAreNeverOverwritten) {
  for (const char* name : {"a.JPG", "a.jpg", "x-PencilSketch.jpg", "x.jpg"})
    SaveJpeg(Picture(8, 8, name[1]), In(name));
  SaveBitmap24(Picture(8, 8, 3), In("a.bmp"));
  const std::string input = ReadBytes(In("x-PencilSketch.jpg"));
  PictureDocument document;
  const BatchResult result =
      ConvertBatch(document, Pencil(), EffectParams(), {in_, in_, ScanBatchFolder(in_)});
  EXPECT_EQ(result.outputs, (std::vector<std::string>{In("a-PencilSketch.jpg"),
                                                      In("x-PencilSketch-PencilSketch.jpg")}));
  ASSERT_EQ(result.skipped.size(), 3u);
  const std::pair<std::string, std::string> want[] = {
      {"a.jpg", "already written for a.JPG"},
      {"x.jpg", "is one of the pictures being converted"},
      {"a.bmp", "already written for a.JPG"}};
  for (std::size_t i = 0; i < 3; ++i) {
    EXPECT_EQ(result.skipped[i].name, want[i].first);
    EXPECT_NE(result.skipped[i].reason.find(want[i].second), std::string::npos)
        << result.skipped[i].reason;
  }
  EXPECT_EQ(ReadBytes(In("x-PencilSketch.jpg")), input);
}

// An output name of 238 to 255 bytes failed for its longer hidden temporary name, and one
// output that could not be written stopped the whole batch.
TEST_F(BatchFolder, AnOutputThatCannotBeWrittenIsSkippedAndTheBatchGoesOn) {
  const std::string longest(238, 'l');  // its output name is 255 bytes, the most there can be
  const std::string tooLong(251, 'm');  // its output name would be 268 bytes
  fs::create_directories(Out("c-PencilSketch.jpg"));
  for (const std::string& stem :
       {std::string("a"), std::string("c"), longest, tooLong, std::string("z")})
    SaveJpeg(Picture(6, 5, static_cast<int>(stem.size())), In(stem + ".jpg"));
  for (const bool overlap : {false, true}) {
    BatchJob job{in_, out_, ScanBatchFolder(in_)};
    job.overlapStages = overlap;
    PictureDocument document;
    const BatchResult result = ConvertBatch(document, Pencil(), EffectParams(), job);
    EXPECT_EQ(result.end, BatchResult::End::Completed);
    EXPECT_EQ(result.outputs, (std::vector<std::string>{Out("a-PencilSketch.jpg"),
                                                        Out(longest + "-PencilSketch.jpg"),
                                                        Out("z-PencilSketch.jpg")}));
    ASSERT_EQ(result.skipped.size(), 2u);
    EXPECT_EQ(result.skipped[0].name, "c.jpg");
    EXPECT_NE(result.skipped[0].reason.find(Out("c-PencilSketch.jpg")), std::string::npos);
    EXPECT_EQ(result.skipped[1].name, tooLong + ".jpg");
    EXPECT_NE(result.skipped[1].reason.find("File name too long"), std::string::npos)
        << result.skipped[1].reason;
    EXPECT_TRUE(fs::is_directory(Out("c-PencilSketch.jpg")));
    EXPECT_EQ(std::distance(fs::directory_iterator(out_), fs::directory_iterator()), 4);
  }
}

// A link planted in a shared output folder turned the file it named into a JPEG.
TEST_F(BatchFolder, ALinkPlantedAtAnOutputNameIsSkippedAndItsFileLeftAlone) {
  WriteBytes(root_ / "victim.conf", "secret");
  fs::create_directory(out_);
  fs::create_symlink("../victim.conf", Out("a-PencilSketch.jpg"));
  fs::create_symlink("nowhere.jpg", Out("b-PencilSketch.jpg"));
  for (const char* name : {"a.jpg", "b.jpg", "c.jpg"}) SaveJpeg(Picture(5, 4, name[0]), In(name));
  PictureDocument document;
  const BatchResult result =
      ConvertBatch(document, Pencil(), EffectParams(), {in_, out_, ScanBatchFolder(in_)});
  EXPECT_EQ(result.outputs, std::vector<std::string>{Out("c-PencilSketch.jpg")});
  ASSERT_EQ(result.skipped.size(), 2u);
  for (const BatchSkipped& s : result.skipped)
    EXPECT_NE(s.reason.find("is a symbolic link"), std::string::npos) << s.reason;
  EXPECT_EQ(ReadBytes((root_ / "victim.conf").string()), "secret");
  EXPECT_TRUE(fs::is_symlink(Out("a-PencilSketch.jpg")));
  EXPECT_FALSE(fs::exists(out_ + "/nowhere.jpg"));
}

// On a FAT stick "a-PencilSketch.jpg" and "A-PencilSketch.jpg" are one file, and the check by
// name let the second entry overwrite the first's output. The stick is a FAT image mounted
// through FUSE, once as it comes (the file system makes up an identity per name) and once
// with the identities it keeps (use_ino). Saving over a file there failed: fchmod is ENOSYS.
TEST_F(BatchFolder, OutputsThatAreOneFileOnADriveIgnoringCaseAreNotOverwritten) {
  if (std::system("command -v fusefat mkfs.fat >/dev/null") != 0)
    GTEST_SKIP() << "fusefat and mkfs.fat are needed (packages fusefat, dosfstools)";
  SaveJpeg(Picture(6, 5, 1), In("a.jpg"));
  SaveBitmap24(Picture(7, 5, 2), In("A.bmp"));
  SaveBitmap24(Picture(8, 5, 3), In("b.bmp"));
  const std::string image = (root_ / "stick.img").string();
  fs::create_directory(out_);
  for (const char* options : {"rw+", "rw+,use_ino"}) {
    fs::remove(image);
    ASSERT_EQ(std::system(("mkfs.fat -C '" + image + "' 4096 >/dev/null").c_str()), 0);
    if (std::system(("fusefat -o " + std::string(options) + " '" + image + "' '" + out_ +
                     "' >/dev/null 2>&1")
                        .c_str()) != 0)
      GTEST_SKIP() << "FUSE cannot mount here";
    PictureDocument document;
    const BatchJob job{in_, out_, ScanBatchFolder(in_)};
    ConvertBatch(document, Pencil(), EffectParams(), job);
    // Again over the outputs written before, on a file system without Unix modes.
    const BatchResult result = ConvertBatch(document, Pencil(), EffectParams(), job);
    const std::string written = ReadBytes(Out("a-PencilSketch.jpg"));
    EXPECT_EQ(std::system(("umount '" + out_ + "'").c_str()), 0);
    EXPECT_EQ(result.outputs,
              (std::vector<std::string>{Out("a-PencilSketch.jpg"), Out("b-PencilSketch.jpg")}))
        << options;
    ASSERT_EQ(result.skipped.size(), 1u) << options;
    EXPECT_EQ(result.skipped[0].name, "A.bmp");
    EXPECT_NE(result.skipped[0].reason.find("already written for a.jpg"), std::string::npos)
        << result.skipped[0].reason;
    EXPECT_EQ(written, ExpectedJpeg(In("a.jpg"), EffectParams(), (root_ / "want.jpg").string()));
  }
}

TEST_F(BatchFolder, HistoryGrowsPerPictureOnlyForEffectsThatRecordBatchSteps) {
  SaveBitmap24(Picture(10, 7, 7), In("a.bmp"));
  SaveBitmap24(Picture(11, 8, 8), In("b.bmp"));
  WriteBytes(In("bad.bmp"), "BM");
  const BatchJob job{in_, out_, {"a.bmp", "bad.bmp", "b.bmp"}};

  // The pencil's batch routine records no step: the history is as it was before the batch,
  // not reset either.
  PictureDocument quiet(Picture(5, 5, 1));
  quiet.SetWorking(Picture(5, 5, 2));
  quiet.Backup();
  ASSERT_FALSE(Pencil().batchPushesHistory);
  ASSERT_TRUE(ConvertBatch(quiet, Pencil(), EffectParams(), job).end ==
              BatchResult::End::Completed);
  EXPECT_EQ(quiet.UndoCount(), 1);
  EXPECT_EQ(quiet.Slot(quiet.CurrentSlot()), Picture(5, 5, 2));
  ASSERT_TRUE(quiet.Undo());
  EXPECT_EQ(quiet.Working(), Picture(5, 5, 1));

  // One that does records one step per converted picture, holding that picture's result.
  EffectSpec recording = Pencil();
  recording.batchPushesHistory = true;
  PictureDocument loud(Picture(5, 5, 1));
  ASSERT_TRUE(ConvertBatch(loud, recording, EffectParams(), job).AllConverted() == false);
  EXPECT_EQ(loud.UndoCount(), 2);
  EXPECT_EQ(loud.Slot(loud.CurrentSlot()), loud.Working());
  ASSERT_TRUE(loud.Undo());
  Bitmap32 first = Picture(10, 7, 7);
  EXPECT_EQ(loud.Working(), PencilSketch(first, PencilToneMode::Contrast, 45, 128));
}

// An effect error and an output folder in the way of a file stop the loop: the
// overlap test compares those runs event by event, the window and command line tests show
// their messages. A blank output folder is not read as the current one.
TEST_F(BatchFolder, ABlankOutputFolderStopsBeforeAnyPicture) {
  SaveBitmap24(Picture(9, 9, 1), In("a.bmp"));
  PictureDocument document;
  const BatchResult result =
      ConvertBatch(document, Pencil(), EffectParams(), {in_, "  ", {"a.bmp"}});
  EXPECT_EQ(result.end, BatchResult::End::Stopped);
  EXPECT_TRUE(result.outputs.empty());
}

TEST(ConvertBatchTest, RefusesEffectsWithoutABatchRoutine) {
  PictureDocument document;
  EffectSpec none = Pencil();
  none.routine = nullptr;
  const EffectSpec* const effects[] = {&none, FindEffectByCliName("hsl-adjust")};
  for (const EffectSpec* effect : effects)
    EXPECT_THROW(ConvertBatch(document, *effect, EffectParams(), {"/", "/tmp", {"a.jpg"}}),
                 std::invalid_argument);
}

}  // namespace
}  // namespace quillane
