// A phone's portrait photo, tagged "turn a quarter clockwise", opens upright in the window.
#include <QToolButton>

#include "codecs/codec_internal.h"
#include "codecs/picture_file.h"
#include "tests/gui/temp_folder.h"

namespace quillane {
namespace {

// An APP1 EXIF block (little-endian TIFF) holding Orientation = 6 and nothing else.
constexpr char kTurnClockwise[] = {'\xFF', '\xE1', 0, 34, 'E', 'x', 'i', 'f', 0,    0,    'I', 'I',
                                   42,     0,      8, 0,  0,   0,   1,   0,   0x12, 0x01, 3,   0,
                                   1,      0,      0, 0,  6,   0,   0,   0,   0,    0,    0,   0};

TEST_F(FileGuiTest, OpenShowsATaggedPortraitPhotoUpright) {
  const std::vector<std::uint8_t> plain = codecs::EncodeJpeg(TestPicture(45, 30), 90);
  std::string file(plain.begin(), plain.end());
  file.insert(2, kTurnClockwise, sizeof kTurnClockwise);
  WriteBytes(LocalPath("portrait.jpg"), file);
  platform_.openAnswers.push_back(FileChoice{Path("portrait.jpg"), 1});
  MainChild<QToolButton>("SpeedButton1")->click();
  EXPECT_TRUE(platform_.errors.empty());
  EXPECT_EQ(Main().Document().Working().Width(), 30);
  EXPECT_EQ(Main().Document().Working().Height(), 45);
  EXPECT_EQ(Main().Document().Working(), *LoadPictureFile(LocalPath("portrait.jpg")));
}

}  // namespace
}  // namespace quillane
