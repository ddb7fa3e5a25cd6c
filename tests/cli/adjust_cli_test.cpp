// The colour adjustments and surface effects from the command line: what quillane-cli writes
// is what the routine gives in process for the same settings.
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/wait.h>

#include <QImage>
#include <cstring>
#include <filesystem>
#include <functional>
#include <string>

#include "codecs/picture_file.h"
#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "effects/adjust/color_variety.h"
#include "effects/adjust/hsl_adjust.h"
#include "effects/surface/emboss.h"
#include "effects/surface/stria.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

TBitmap32 FromPng(const std::string& path) {
  const QImage image =
      QImage(QString::fromStdString(path), "png").convertToFormat(QImage::Format_ARGB32);
  TBitmap32 p(image.width(), image.height());
  for (int y = 0; y < image.height(); ++y)
    std::memcpy(p.ScanLine(y), image.constScanLine(y), 4 * static_cast<std::size_t>(p.Width()));
  return p;
}

TEST(AdjustCli, ApplyWritesWhatTheRoutineGives) {
  std::string pattern = (fs::temp_directory_path() / "quillane-adjust-XXXXXX").string();
  ASSERT_NE(mkdtemp(pattern.data()), nullptr);
  const std::string dir = pattern;
  TBitmap32 picture(23, 17);
  for (int y = 0; y < 17; ++y)
    for (int x = 0; x < 23; ++x)
      picture.At(x, y) = Pixel{static_cast<std::uint8_t>(x * 11), static_cast<std::uint8_t>(y * 15),
                               static_cast<std::uint8_t>((x * y * 7) & 255), 255};
  SaveBitmap24(picture, dir + "/in.bmp");

  struct Case {
    std::string arguments;
    std::function<TBitmap32(const TBitmap32&)> expected;
  } const cases[] = {
      {"emboss --lighting 30 --depth 2", [](const TBitmap32& p) { return emboss(p, 30, 2); }},
      {"color-filter --filter cyan",
       [](const TBitmap32& p) { return filter(p, ColorFilterKind::Cyan); }},
      {"color-variety --more red,cyan,cyan",
       [](const TBitmap32& p) {
         return VarietyClicks(p, {1, 5, 5});
       }},
      {"color-panel --layout catercorner-16",
       [](const TBitmap32& p) { return ColorPanel(p, PanelLayout::Catercorner16); }},
      {"hsl-adjust --hue 40 --saturation 150 --lighting 80",
       [](const TBitmap32& p) { return HslAdjust(p, 40, 150, 80); }},
      {"stria --direction horizontal --thickness 3 --space 4 --transparent 60 --color '#ff8000'",
       [](const TBitmap32& p) {
         return stria(p, 23, 17, StriaDirection::Horizontal, 3, 4, 60, 0x0080FF);
       }},
  };
  for (const Case& c : cases) {
    const std::string command = std::string("'") + QUILLANE_CLI_PATH + "' apply " + c.arguments +
                                " '" + dir + "/in.bmp' -o '" + dir + "/out.png' >/dev/null";
    const int status = std::system(command.c_str());
    ASSERT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << c.arguments;
    EXPECT_EQ(FromPng(dir + "/out.png"), c.expected(picture)) << c.arguments;
  }
  fs::remove_all(dir);
}

}  // namespace
}  // namespace quillane
