// Runs the built quillane-cli and checks what it writes against the routines run here. The
// parsing itself is cli_options_test's; these check that its results reach the routines.
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <functional>
#include <string>

#include "codecs/picture_file.h"
#include "data/startup_picture.h"
#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_variety.h"
#include "effects/mono/bw_sketch.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"
#include "effects/registry.h"
#include "tests/cli/cli_run.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

// Alpha varies; the document makes it 255.
Bitmap32 Picture(int width, int height) {
  return RandomPicture(width, height, 7);
}

Bitmap32 FromPng(const std::string& path) {
  return LoadPng(path).value_or(Bitmap32());
}

Bitmap32 Pencil(Bitmap32 picture, PencilToneMode mode, int contrast, int lighting) {
  SetAlphaChannel(picture, 255);
  return PencilSketch(picture, mode, contrast, lighting);
}

using Expected = std::function<Bitmap32(const Bitmap32&)>;

// The effect's table routine with these parameters set over its defaults.
Expected Routine(const char* effect, std::vector<std::pair<const char*, EffectParams::Values>> set,
                 std::uint32_t seed = 0) {
  return [=](const Bitmap32& input) {
    const EffectSpec& spec = *FindEffectByCliName(effect);
    EffectParams params = spec.Defaults();
    for (const auto& [name, value] : set) params.SetList(name, value);
    std::uint32_t s = seed;
    return spec.routine({input, input, params, &s});
  };
}

// A JPEG output is the same file our own encoder makes of the result.
TEST_F(CliRun, ApplyWritesAJpegAsOurOwnEncoderDoes) {
  SaveBitmap24(Picture(31, 22), Path("in.bmp"));
  const Bitmap32 loaded = *LoadPictureFile(Path("in.bmp"));
  ASSERT_EQ(Run("apply pencil-sketch " + Q("in.bmp") + " -o " + Q("out.jpeg")), 0) << err_;
  SaveJpeg(Pencil(loaded, PencilToneMode::Contrast, 45, 128), Path("expected.jpg"), 90);
  EXPECT_EQ(ReadText(Path("out.jpeg")), ReadText(Path("expected.jpg")));
}

// Parameters given on the command line reach the effect: the same bytes as its routine here.
TEST_F(CliRun, ParametersReachTheEffectsRoutine) {
  SaveBitmap24(Picture(23, 17), Path("in.bmp"));
  const Bitmap32 loaded = *LoadPictureFile(Path("in.bmp"));
  // The parsing is cli_options_test's and the windows check most routines' readings of their
  // values; these are the values only the command line reaches.
  const std::pair<std::string, Expected> cases[] = {
      {"pop-art --kernel -2147483648,0,0,0,0,0,0,0,2147483647",
       Routine("pop-art", {{"kernel", {-2147483648ll, 0, 0, 0, 0, 0, 0, 0, 2147483647}}})},
      {"brume --seed 4000000000", Routine("brume", {}, 4000000000u)},
      // Against the functions themselves, so the table's reading of the values counts too.
      {"pen-sketch --pen-pressure 200", [](const Bitmap32& p) { return PenSketch(p, 200); }},
      {"vuzorar --vuzorar-pressure 220 --scope 2 --direction falling",
       [](const Bitmap32& p) { return Vuzorar(p, 220, 2, HatchDirection::Falling); }},
      // The windows of these two apply their own preview.
      {"color-filter --filter cyan",
       [](const Bitmap32& p) { return ColorFilter(p, ColorFilterKind::Cyan); }},
      {"color-variety --more red,cyan,cyan",
       [](const Bitmap32& p) {
         return VarietyClicks(p, {1, 5, 5});
       }},
  };
  for (const auto& [arguments, expected] : cases) {
    ASSERT_EQ(Run("apply " + arguments + " " + Q("in.bmp") + " -o " + Q("out.bmp")), 0) << err_;
    Bitmap32 written = *LoadPictureFile(Path("out.bmp"));
    SetAlphaChannel(written, 255);
    EXPECT_EQ(written, expected(loaded)) << arguments;
  }
}

TEST_F(CliRun, ApplyReadsPngStandardInputAndTheBuiltInPicture) {
  const Bitmap32 input = Picture(17, 13);
  SavePng(input, Path("in.png"));
  ASSERT_EQ(Run("apply pencil-sketch " + Q("in.png") + " -o " + Q("out.png")), 0) << err_;
  EXPECT_EQ(FromPng(Path("out.png")), Pencil(input, PencilToneMode::Contrast, 45, 128));
  // "-" both ways: the picture comes in and goes out as bytes, PNG by default.
  ASSERT_EQ(Run("apply pencil-sketch - -o - < " + Q("in.png")), 0) << err_;
  EXPECT_EQ(FromPng(Path("stdout.txt")), Pencil(input, PencilToneMode::Contrast, 45, 128));

  ASSERT_EQ(Run("apply pencil-sketch --lighting 90 -o " + Q("builtin.png")), 0) << err_;
  EXPECT_EQ(FromPng(Path("builtin.png")),
            Pencil(StartupPicture(), PencilToneMode::Lighting, 45, 90));
}

TEST_F(CliRun, BadParametersExitWithTwoAndUnreadableInputWithOneWritingNothing) {
  EXPECT_EQ(Run("apply pencil-sketch --contrast 90 -o " + Q("o.png")), 2);
  EXPECT_NE(err_.find("--contrast must be an integer from 0 to 89"), std::string::npos) << err_;

  // A true header, then image data that does not inflate: libpng printed its own line for it.
  std::ofstream(Path("broken.png"), std::ios::binary) << std::string(
      "\x89PNG\r\n\x1a\n\0\0\0\rIHDR\0\0\0\x10\0\0\0\x10\x08\x02\0\0\0\x90\x91h6"
      "\0\0\0\x05IDATxxxxx\0\0\0\0",
      46);
  std::ofstream(Path("picture.tga"), std::ios::binary) << "whatever";
  for (const char* name : {"broken.png", "picture.tga", "missing.bmp"}) {
    EXPECT_EQ(Run("apply pencil-sketch " + Q(name) + " -o " + Q("o.png")), 1) << name;
    EXPECT_NE(err_.find(Path(name)), std::string::npos) << err_;
    EXPECT_EQ(err_.find("libpng"), std::string::npos) << err_;
  }
  EXPECT_FALSE(fs::exists(Path("o.png")));
}

// Running out of memory ended in std::terminate, and a batch died without its summary.
TEST_F(CliRun, PictureTooLargeForTheMemoryLimitIsAMessageAndTheBatchGoesOn) {
#if defined(__SANITIZE_ADDRESS__)
  GTEST_SKIP() << "no address-space limit under ASan";
#endif
  fs::create_directory(Path("in"));
  SaveJpeg(Picture(20, 15), Path("in/a.jpg"));
  // 7000 x 7000 pixels announced by a small file's header.
  std::string big = ReadText(Path("in/a.jpg"));
  const std::size_t frame = big.find("\xFF\xC0");
  ASSERT_NE(frame, std::string::npos);
  big.replace(frame + 5, 4, "\x1B\x58\x1B\x58");
  big.insert(big.size() - 2, 100'000, '\0');  // as much coded data as so many blocks need
  std::ofstream(Path("in/big.jpg"), std::ios::binary) << big;
  // The message itself is jpeg_test's.
  EXPECT_EQ(Run("batch pencil-sketch --input in --output out", "ulimit -v 600000; "), 1);
  EXPECT_NE(out_.find("Converted 1 of 2 pictures"), std::string::npos) << out_;
  EXPECT_NE(err_.find("big.jpg: "), std::string::npos) << err_;
  EXPECT_NE(err_.find("7000 by 7000 pixels needs 748 MB; "), std::string::npos) << err_;
}

// An effect's name with an escape sequence in it set the terminal's title.
TEST_F(CliRun, NamesAreShownEscapedInEveryMessage) {
  EXPECT_EQ(Run("apply \"$(printf 'pen\\033]0;TITLE\\007')\" -o o.png"), 2);
  EXPECT_NE(err_.find("unknown effect 'pen\\x1b]0;TITLE\\x07'"), std::string::npos) << err_;
  EXPECT_EQ(Run("gallery \"$(printf 'g\\033[2J')\""), 0) << err_;
  EXPECT_NE(out_.find("into g\\x1b[2J; open g\\x1b[2J/index.html"), std::string::npos) << out_;
  for (const std::string& text : {out_, err_}) EXPECT_EQ(text.find('\x1b'), std::string::npos);
}

// An unreadable folder said there was no picture, a link loop that there was no such file,
// and entries named like pictures that are no files were left out silently.
TEST_F(CliRun, MessagesSayWhatIsReallyWrong) {
  fs::create_directory(Path("in"));
  SaveJpeg(Picture(6, 5), Path("in/a.jpg"));
  fs::create_directory(Path("in/x.jpg"));
  fs::create_symlink("nowhere.jpg", Path("in/gone.jpg"));
  EXPECT_EQ(Run("batch pencil-sketch --input in --output out"), 1);
  EXPECT_NE(out_.find("Converted 1 of 3 pictures"), std::string::npos) << out_;
  EXPECT_NE(err_.find("  gone.jpg: in/gone.jpg is not a picture file: it is a symbolic link to "
                      "nothing\n  x.jpg: in/x.jpg is not a picture file: it is a folder\n"),
            std::string::npos)
      << err_;

  fs::create_symlink("loop.jpg", Path("loop.jpg"));
  EXPECT_EQ(Run("convert loop.jpg -o o.png"), 1);
  EXPECT_NE(err_.find("loop.jpg: a symbolic link loop"), std::string::npos) << err_;

  // Read as someone else when run by root, who may read any folder.
  fs::permissions(dir_, fs::perms::others_exec, fs::perm_options::add);
  fs::permissions(Path("in"), fs::perms::none);
  if (::geteuid() == 0) launcher_ = "setpriv --reuid=65534 --regid=65534 --clear-groups ";
  EXPECT_EQ(Run("batch pencil-sketch --input in --output out"), 1);
  launcher_.clear();
  EXPECT_NE(err_.find("Cannot read the folder in: Permission denied"), std::string::npos) << err_;
  fs::permissions(Path("in"), fs::perms::owner_all);
}

TEST_F(CliRun, ListShowsEveryEffectWithRangesAndDefaults) {
  ASSERT_EQ(Run("list"), 0);
  EXPECT_NE(out_.find("pencil-sketch"), std::string::npos);
  EXPECT_NE(out_.find("--contrast N"), std::string::npos) << out_;
  EXPECT_NE(out_.find("0..89, default 45"), std::string::npos) << out_;
  EXPECT_NE(out_.find("(Pen & Ink)"), std::string::npos) << out_;  // "&&" shows one "&"
  for (const EffectSpec* effect : Effects()) {
    const EffectSpec& e = *effect;
    const std::size_t at = out_.find("  " + e.cliName + "  ");
    ASSERT_NE(at, std::string::npos) << e.cliName;
    const std::string line = out_.substr(at, out_.find('\n', at) - at);
    EXPECT_EQ(line.find("not yet available") != std::string::npos, !e.routine) << line;
  }
}

TEST_F(CliRun, GalleryWritesAPngPerAvailableEffectAndAContactSheet) {
  const std::string gallery = Path("gallery/nested");
  ASSERT_EQ(Run("gallery " + Q("gallery/nested")), 0) << err_;
  const std::string html = ReadText(gallery + "/index.html");
  EXPECT_EQ(FromPng(gallery + "/original.png"), StartupPicture());
  EXPECT_NE(html.find("src=\"original.png\""), std::string::npos);
  EXPECT_NE(html.find("B&amp;W"), std::string::npos);
  EXPECT_EQ(html.find("&&"), std::string::npos);
  int pictures = 0;
  for (const EffectSpec* effect : Effects()) {
    const EffectSpec& e = *effect;
    const std::string file = gallery + "/" + e.cliName + ".png";
    EXPECT_EQ(fs::exists(file), static_cast<bool>(e.routine)) << file;
    if (!e.routine) continue;
    ++pictures;
    EXPECT_NE(html.find("src=\"" + e.cliName + ".png\""), std::string::npos) << e.cliName;
  }
  EXPECT_GE(pictures, 1);

  // Another picture, named in the sheet with its characters escaped.
  SaveBitmap24(Picture(12, 9), Path("a<b>.bmp"));
  ASSERT_EQ(Run("gallery " + Q("g2") + " --input " + Q("a<b>.bmp")), 0) << err_;
  EXPECT_NE(ReadText(Path("g2/index.html")).find("a&lt;b&gt;.bmp"), std::string::npos);
}

// index.html was written by a truncating stream: through a planted link, and over a read-only
// file.
TEST_F(CliRun, GalleryNeverWritesThroughALinkNorOverAReadOnlyFile) {
  fs::create_directory(Path("g"));
  std::ofstream(Path("victim")) << "kept";
  fs::create_symlink("../victim", Path("g/index.html"));
  fs::create_symlink("../victim", Path("g/pencil-sketch.png"));
  EXPECT_EQ(Run("gallery g"), 1);
  EXPECT_NE(err_.find("g/pencil-sketch.png: Cannot save"), std::string::npos) << err_;
  EXPECT_NE(err_.find("g/index.html: Cannot save"), std::string::npos) << err_;
  EXPECT_EQ(ReadText(Path("victim")), "kept");
  EXPECT_TRUE(fs::is_regular_file(Path("g/pen-sketch.png")));

  fs::remove(Path("g/index.html"));
  std::ofstream(Path("g/index.html")) << "kept";
  fs::permissions(Path("g/index.html"), fs::perms::owner_read);
  EXPECT_EQ(Run("gallery g"), 1);
  EXPECT_NE(err_.find("index.html\": the file is read-only"), std::string::npos) << err_;
  EXPECT_EQ(ReadText(Path("g/index.html")), "kept");
}

TEST_F(CliRun, BatchConvertsTheFolderAndListsSkippedFiles) {
  fs::create_directory(Path("in"));
  SaveJpeg(Picture(20, 15), Path("in/a.jpg"));
  SaveBitmap24(Picture(9, 7), Path("in/b.BMP"));
  const std::string out = Path("out/deep");
  const auto batch = [&](const std::string& options, const std::string& input) {
    return Run("batch pencil-sketch " + options + " --input " + Q(input) + " --output " +
               Q("out/deep"));
  };

  ASSERT_EQ(batch("--lighting 100", "in"), 0) << err_;
  EXPECT_NE(out_.find("The batch convert is successful."), std::string::npos) << out_;
  // Not a terminal: one plain line per picture. The pictures' bytes are the batch loop's tests.
  EXPECT_NE(err_.find("picture 1 of 2: a.jpg -> " + out + "/a-PencilSketch.jpg"), std::string::npos)
      << err_;

  // A name that is not UTF-8 and holds an escape sequence is shown escaped, never raw.
  std::ofstream(Path("in/x\x1b[2J\xff.jpg"), std::ios::binary) << "not a picture";
  EXPECT_EQ(Run("batch pencil-sketch --input '" + Path("in") + "' --output '" + out + "'"), 1);
  EXPECT_NE(err_.find("Skipped 1 picture:\n  x\\x1b[2J\\xff.jpg: "), std::string::npos) << err_;
  EXPECT_EQ(err_.find('\x1b'), std::string::npos);

  EXPECT_EQ(batch("", "nowhere"), 1);
  EXPECT_NE(err_.find("Sorry: Input Director in not exist."), std::string::npos) << err_;
}

}  // namespace
}  // namespace quillane
