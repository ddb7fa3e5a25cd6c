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

TEST(CliLineArt, ApplyGivesTheRoutinesBytes) {
  std::string dir = (std::filesystem::temp_directory_path() / "quillane-bw-XXXXXX").string();
  ASSERT_NE(mkdtemp(dir.data()), nullptr);
  TBitmap32 input(41, 29);
  for (int i = 0; i < 41 * 29; ++i)
    input.Data()[i] = Pixel{static_cast<std::uint8_t>(i * 29), static_cast<std::uint8_t>(i / 7),
                            static_cast<std::uint8_t>(i * i % 251), 255};
  SaveBitmap24(input, dir + "/in.bmp");
  const std::pair<std::string, TBitmap32> cases[] = {
      {"pen-sketch --pen-pressure 200", PenSketch(input, 200)},
      {"vuzorar --vuzorar-pressure 220 --scope 2 --direction falling",
       Vuzorar(input, 220, 2, HatchDirection::Falling)},
      {"vuzorar --direction 4", Vuzorar(input, 128, 3, HatchDirection::Horizontal)},
      {"pen-and-ink --adjust-thread 100 --color-ink 1", Pen_and_Ink(input, 100, true)},
  };
  for (const auto& [arguments, expected] : cases) {
    const std::string command = std::string("'") + QUILLANE_CLI_PATH + "' apply " + arguments +
                                " '" + dir + "/in.bmp' -o '" + dir + "/out.bmp'";
    ASSERT_EQ(std::system(command.c_str()), 0) << command;
    EXPECT_EQ(*LoadPictureFile(dir + "/out.bmp"), expected) << arguments;
  }
  std::filesystem::remove_all(dir);
}

}  // namespace
}  // namespace quillane
