// The loader's choice by name, the writers' round trips and their behaviour on failure.
#include "codecs/picture_file.h"

#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <functional>

#include "tests/codecs/test_support.h"
#include "tests/file_size_limit.h"

namespace quillane::testing {
namespace {

using PictureFiles = TempFolder;

TEST_F(PictureFiles, ChoosesTheDecoderByTheLastFourCharacters) {
  const Bitmap32 picture = PatternPicture(20, 10);
  SaveJpeg(picture, Path("photo.jpeg"));
  for (const char* copy : {"photo.JPEG", "photo.Jpg", "photo.jpe"})
    std::filesystem::copy_file(Path("photo.jpeg"), Path(copy));
  for (const char* name : {"photo.jpeg", "photo.JPEG", "photo.Jpg"}) {
    const auto loaded = LoadPictureFile(Path(name));
    ASSERT_TRUE(loaded.has_value()) << name;
    EXPECT_EQ(loaded->Width(), 20) << name;
  }
  // Known content under an unknown ending gives the empty picture, not "no file".
  const auto jpe = LoadPictureFile(Path("photo.jpe"));
  ASSERT_TRUE(jpe.has_value());
  EXPECT_TRUE(jpe->Empty());
  SavePng(picture, Path("picture.png"));
  ASSERT_TRUE(LoadPictureFile(Path("picture.png")).has_value());
  EXPECT_TRUE(LoadPictureFile(Path("picture.png"))->Empty());
  EXPECT_FALSE(LoadPictureFile(Path("missing.jpg")).has_value());
}

// A FIFO put where a picture was expected once blocked the loader for good.
TEST_F(PictureFiles, FoldersAndFifosAreNotPictureFilesAndNeverBlock) {
  std::filesystem::create_directory(Path("folder.bmp"));
  ASSERT_EQ(::mkfifo(Path("fifo.jpg").c_str(), 0600), 0);
  for (const char* name : {"folder.bmp", "fifo.jpg"})
    EXPECT_EQ(ErrorOf([&] { LoadPictureFile(Path(name)); }), Path(name) + " is not a picture file");
}

TEST_F(PictureFiles, ContentUnderAWrongNameIsAnErrorNamingTheFile) {
  for (const char* name : {"fake.jpg", "fake.bmp", "fake.gif", "fake.wmf"}) {
    SavePng(PatternPicture(8, 8), Path(name));
    const std::string error = ErrorOf([&] { LoadPictureFile(Path(name)); });
    EXPECT_TRUE(Contains(error, Path(name)) && Contains(error, "holds a PNG picture")) << error;
  }
}

TEST_F(PictureFiles, UnreadableIconIsReportedThroughTheNoticeAndGivesEmpty) {
  WriteBytes(Path("broken.ico"), {0, 0, 1, 0, 1, 0, 16, 16});
  std::vector<std::pair<std::string, std::string>> notices;
  const auto loaded =
      LoadPictureFile(Path("broken.ico"), [&](const std::string& caption, const std::string& text) {
        notices.emplace_back(caption, text);
      });
  ASSERT_TRUE(loaded.has_value());
  EXPECT_TRUE(loaded->Empty());
  ASSERT_EQ(notices.size(), 1u);
  EXPECT_EQ(notices[0].first, "Exit");
  const std::string prefix = "Input picture" + Path("broken.ico") + "Error.";
  EXPECT_EQ(notices[0].second.substr(0, prefix.size()), prefix);
  EXPECT_GT(notices[0].second.size(), prefix.size());
  // Without a notice the icon still just gives the empty picture.
  EXPECT_TRUE(LoadPictureFile(Path("broken.ico"))->Empty());
}

// Every writer, under the name it is tested with; JPEG's loss is bounded on smooth pictures.
struct Writer {
  const char* name;
  void (*save)(const Bitmap32&, const std::string&);
  int tolerance;
};
const Writer kWriters[] = {
    {"out.bmp", [](const Bitmap32& p, const std::string& f) { SaveBitmap24(p, f); }, 0},
    {"out.jpg", [](const Bitmap32& p, const std::string& f) { SaveJpeg(p, f); }, 8},
    {"out.wmf", [](const Bitmap32& p, const std::string& f) { SaveMetafile(p, f); }, 0},
    {"out.EMF", [](const Bitmap32& p, const std::string& f) { SaveMetafile(p, f); }, 0},
    {"out.png", [](const Bitmap32& p, const std::string& f) { SavePng(p, f); }, 0}};

// Only PNG keeps alpha; the others come back opaque.
TEST_F(PictureFiles, EachWriterRoundTripsAtEverySize) {
  for (const auto& [w, h] : {std::pair{1, 1}, {3, 2}, {101, 57}, {640, 3}}) {
    Bitmap32 picture(w, h);
    for (int y = 0; y < h; ++y)
      for (int x = 0; x < w; ++x)
        picture.At(x, y) = Pixel{
            static_cast<std::uint8_t>(x * 200 / std::max(w, 100)), static_cast<std::uint8_t>(y * 3),
            static_cast<std::uint8_t>((x + y) * 255 / std::max(w + h, 200)), 200};
    picture.At(0, 0).a = 0;
    picture.At(w - 1, h - 1).a = 1;
    for (const Writer& writer : kWriters) {
      SCOPED_TRACE(std::string(writer.name) + " " + std::to_string(w) + "x" + std::to_string(h));
      writer.save(picture, Path(writer.name));
      EXPECT_TRUE(writer.name[4] != 'E' || ReadBytes(Path(writer.name)).size() % 4 == 0);
      const bool png = std::string(writer.name) == "out.png";
      const auto back = png ? LoadPng(Path(writer.name)) : LoadPictureFile(Path(writer.name));
      ASSERT_TRUE(back.has_value());
      ASSERT_EQ(std::pair(back->Width(), back->Height()), std::pair(w, h));
      EXPECT_LE(MaxColourDifference(*back, picture), writer.tolerance);
      EXPECT_EQ(back->At(w - 1, h - 1).a, png ? 1 : 255);
      EXPECT_TRUE(!png || *back == picture);
    }
  }
  EXPECT_EQ(ReadBytes(Path("out.bmp"))[28], 24);  // bits per pixel
}

TEST(ReplaceExtension, ReplacesOnlyARealExtension) {
  EXPECT_EQ(ReplaceExtension("result.bmp", ".jpg"), "result.jpg");
  EXPECT_EQ(ReplaceExtension("result", ".jpg"), "result.jpg");
  EXPECT_EQ(ReplaceExtension("dir.v2/result", ".jpg"), "dir.v2/result.jpg");
  EXPECT_EQ(ReplaceExtension("/home/me/a.b.c", ".wmf"), "/home/me/a.b.wmf");
  EXPECT_EQ(ReplaceExtension("C:\\pics.old\\shot", ".bmp"), "C:\\pics.old\\shot.bmp");
  EXPECT_EQ(ReplaceExtension("D:name", ".jpg"), "D:name.jpg");
  EXPECT_EQ(ReplaceExtension("photo.", ".jpg"), "photo.jpg");
  EXPECT_EQ(ReplaceExtension("", ".jpg"), ".jpg");
}

TEST_F(PictureFiles, SaveIntoAMissingFolderFailsClearly) {
  const std::string target = Path("no such folder/result.jpg");
  const std::string error = ErrorOf([&] { SaveJpeg(PatternPicture(4, 4), target); });
  EXPECT_TRUE(Contains(error, target) && Contains(error, "does not exist")) << error;
  EXPECT_TRUE(Entries().empty());
}

// Saving replaced the file by a new one at the umask's mode, a link by a file, overwrote a
// read-only file, and a save cut short by a crash left its ".name.tmp" behind.
TEST_F(PictureFiles, SaveKeepsModeLinksAndReadOnlyFilesAndLeavesNoTemporaryFile) {
  // A restrictive umask shapes new files only: a replaced file keeps its own bits.
  WriteBytes(Path("shared.jpg"), {1});
  ::chmod(Path("shared.jpg").c_str(), 0664);
  const mode_t umaskBefore = ::umask(027);
  SaveJpeg(PatternPicture(8, 8), Path("shared.jpg"));
  SaveJpeg(PatternPicture(8, 8), Path("new.jpg"));
  ::umask(umaskBefore);
  struct stat info {};
  for (const auto& [name, mode] : {std::pair{"shared.jpg", 0664u}, std::pair{"new.jpg", 0640u}}) {
    ASSERT_EQ(::stat(Path(name).c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 07777, mode) << name;
    std::filesystem::remove(Path(name));
  }

  WriteBytes(Path("private.jpg"), {1});
  std::filesystem::create_symlink("private.jpg", Path("link.jpg"));
  SaveJpeg(PatternPicture(5, 5), Path("link.jpg"));
  EXPECT_TRUE(std::filesystem::is_symlink(Path("link.jpg")));
  EXPECT_EQ(LoadPictureFile(Path("private.jpg"))->Width(), 5);

  WriteBytes(Path("locked.jpg"), {1});
  ::chmod(Path("locked.jpg").c_str(), 0444);
  EXPECT_TRUE(
      Contains(ErrorOf([&] { SaveJpeg(PatternPicture(8, 8), Path("locked.jpg")); }), "read-only"));
  EXPECT_EQ(ReadBytes(Path("locked.jpg")), std::vector<std::uint8_t>{1});

  const pid_t child = ::fork();
  if (child == 0) {  // killed by the file-size signal part way through writing
    rlimit small{};
    ::getrlimit(RLIMIT_FSIZE, &small);
    small.rlim_cur = 4096;
    ::setrlimit(RLIMIT_FSIZE, &small);
    SaveBitmap24(PatternPicture(300, 300), Path("killed.bmp"));
    ::_exit(0);
  }
  int status = 0;
  ASSERT_EQ(::waitpid(child, &status, 0), child);
  EXPECT_TRUE(WIFSIGNALED(status));
  EXPECT_EQ(Entries(), (std::vector<std::string>{"link.jpg", "locked.jpg", "private.jpg"}));
}

// The hidden temporary name was 18 bytes longer than the target's, so names of 238 to 255
// bytes could not be saved.
TEST_F(PictureFiles, EveryNameTheFileSystemTakesCanBeSaved) {
  for (const std::size_t length : {238u, 254u, 255u}) {
    const std::string name = std::string(length - 4, 'n') + ".bmp";
    SaveBitmap24(PatternPicture(3, 2), Path(name));
    SaveBitmap24(PatternPicture(4, 2), Path(name));  // over an existing file too
    EXPECT_EQ(LoadPictureFile(Path(name))->Width(), 4) << length;
    EXPECT_EQ(Entries(), std::vector<std::string>{name});
    std::filesystem::remove(Path(name));
  }
}

TEST_F(PictureFiles, WritersAskedToRefuseLinksWriteNothingThroughOne) {
  WriteBytes(Path("victim"), {7});
  std::filesystem::create_symlink("victim", Path("link.png"));
  const Bitmap32 picture = PatternPicture(3, 3);
  const std::function<void()> saves[] = {
      [&] { SavePng(picture, Path("link.png"), LinkAtTarget::Refuse); },
      [&] { SaveJpeg(picture, Path("link.png"), 90, LinkAtTarget::Refuse); },
      [&] { SaveTextFile("<html>", Path("link.png"), LinkAtTarget::Refuse); }};
  for (const auto& save : saves) EXPECT_TRUE(Contains(ErrorOf(save), "it is a symbolic link"));
  EXPECT_EQ(ReadBytes(Path("victim")), std::vector<std::uint8_t>{7});
  SaveTextFile("<html>", Path("page.html"), LinkAtTarget::Refuse);
  EXPECT_EQ(ReadBytes(Path("page.html")),
            (std::vector<std::uint8_t>{'<', 'h', 't', 'm', 'l', '>'}));
  EXPECT_EQ(Entries(), (std::vector<std::string>{"link.png", "page.html", "victim"}));
}

// Run by root, a save over another user's file made root its owner, and then the owner's own
// saves were refused.
TEST_F(PictureFiles, SaveByRootKeepsTheFilesOwner) {
  if (::geteuid() != 0) GTEST_SKIP() << "only root may give a file to another user";
  WriteBytes(Path("theirs.bmp"), {1});
  ASSERT_EQ(::chown(Path("theirs.bmp").c_str(), 4321, 4322), 0);
  ::chmod(Path("theirs.bmp").c_str(), 02640);
  SaveBitmap24(PatternPicture(2, 2), Path("theirs.bmp"));
  struct stat info {};
  ASSERT_EQ(::stat(Path("theirs.bmp").c_str(), &info), 0);
  EXPECT_EQ(info.st_uid, 4321u);
  EXPECT_EQ(info.st_gid, 4322u);
  EXPECT_EQ(info.st_mode & 07777, 02640u);
  EXPECT_EQ(LoadPictureFile(Path("theirs.bmp"))->Width(), 2);
}

TEST_F(PictureFiles, EmptyPictureIsNotSaved) {
  WriteBytes(Path("keep.bmp"), {1, 2, 3});
  EXPECT_THROW(SaveBitmap24(Bitmap32(), Path("keep.bmp")), PictureFileError);
  EXPECT_THROW(SaveJpeg(Bitmap32(), Path("keep.bmp")), PictureFileError);
  EXPECT_EQ(ReadBytes(Path("keep.bmp")), (std::vector<std::uint8_t>{1, 2, 3}));
}

// A file-size limit makes the write fail part way, as a full disk would: the old file must
// keep its bytes and no temporary file may be left behind.
TEST_F(PictureFiles, FailedWriteLeavesTheOldFileUntouched) {
  const std::vector<std::uint8_t> old = {'o', 'l', 'd', ' ', 'f', 'i', 'l', 'e'};
  const Bitmap32 picture = PatternPicture(300, 300);

  for (const Writer& writer : kWriters) {
    const std::string path = Path(writer.name);
    WriteBytes(path, old);
    const std::string message = ErrorOf([&] {
      const FileSizeLimit full(4096);
      writer.save(picture, path);
    });
    EXPECT_TRUE(Contains(message, "Cannot save \"" + path + "\"")) << message;
    EXPECT_EQ(ReadBytes(path), old) << path;
  }
  EXPECT_EQ(Entries(),
            (std::vector<std::string>{"out.EMF", "out.bmp", "out.jpg", "out.png", "out.wmf"}));
}

}  // namespace
}  // namespace quillane::testing
