// The command line's pen drawings give the bytes of the routines run here.
#include <gtest/gtest.h>
#include <stdlib.h>

#include <filesystem>

#include "codecs/picture_file.h"
#include "effects/mono/pen_and_ink.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

TEST(CliLineArt, ApplyGivesTheRoutinesBytes) {
  std::string dir = (fs::temp_directory_path() / "quillane-bw-XXXXXX").string();
  ASSERT_NE(mkdtemp(dir.data()), nullptr);
  TBitmap32 input(41, 29);
  for (int y = 0; y < 29; ++y)
    for (int x = 0; x < 41; ++x)
      input.At(x, y) =
          Pixel{static_cast<std::uint8_t>(x * 29 + y), static_cast<std::uint8_t>(y * 41 ^ x * 3),
                static_cast<std::uint8_t>((x * y * 7) & 255), 255};
  SaveBitmap24(input, dir + "/in.bmp");
  const TBitmap32 loaded = *LoadPictureFile(dir + "/in.bmp");

  const std::pair<std::string, TBitmap32> cases[] = {
      {"pen-sketch --pen-pressure 200", PenSketch(loaded, 200)},
      {"vuzorar --vuzorar-pressure 220 --scope 2 --direction falling",
       Vuzorar(loaded, 220, 2, HatchDirection::Falling)},
      {"vuzorar --direction 4", Vuzorar(loaded, 128, 3, HatchDirection::Horizontal)},
      {"pen-and-ink --adjust-thread 100 --color-ink 1", Pen_and_Ink(loaded, 100, true)},
  };
  for (const auto& [arguments, expected] : cases) {
    const std::string out = dir + "/out.bmp";
    const std::string command = std::string("'") + QUILLANE_CLI_PATH + "' apply " + arguments +
                                " '" + dir + "/in.bmp' -o '" + out + "'";
    ASSERT_EQ(std::system(command.c_str()), 0) << command;
    EXPECT_EQ(*LoadPictureFile(out), expected) << arguments;
  }
  fs::remove_all(dir);
}

}  // namespace
}  // namespace quillane
