// The texture window, driven by its control names.
#include <QCheckBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QSlider>
#include <QToolButton>

#include "batch/batch_convert_ok.h"
#include "codecs/picture_file.h"
#include "data/texture_tiles.h"
#include "effects/surface/snapshot_window.h"
#include "effects/surface/texture.h"
#include "tests/gui/temp_folder.h"

namespace quillane {
namespace {

constexpr int kTexture = 14;

class TextureWindow : public FileGuiTest {
 protected:
  void SetUp() override {
    FileGuiTest::SetUp();
    MenuAction("exture1")->trigger();
  }
  template <typename T>
  T* Child(const QString& name) {
    return ToolChild<T>(kTexture, name.toUtf8().constData());
  }
  const TBitmap32& Source() { return Main().Document().Source(); }
  const TBitmap32& Working() { return Main().Document().Working(); }
};

TEST_F(TextureWindow, TileClicksChooseAndOkStartsFromTheSnapshot) {
  for (int n = 1; n <= kTextureTiles; ++n) {
    auto* tile = Child<QLabel>(QString("texture%1").arg(n));
    ASSERT_NE(tile, nullptr) << n;
    EXPECT_EQ(tile->size(), QSize(41, 41));
    EXPECT_EQ(tile->cursor().shape(), n <= 4 ? Qt::PointingHandCursor : Qt::ArrowCursor);
    EXPECT_EQ(Child<QRadioButton>(QString("RadioButton%1").arg(n))->isChecked(), n == 4);
  }
  Child<QSlider>("TrackBar1")->setValue(80);
  EXPECT_EQ(Child<QLabel>("Label9")->text(), "80");
  ClickOn(Child<QLabel>("texture7"));
  EXPECT_TRUE(Child<QRadioButton>("RadioButton7")->isChecked());

  // Two presses with different tiles do not pile up: both start from the picture as shown.
  const TBitmap32 shown = Working();
  for (int n : {7, 12}) {
    Child<QRadioButton>(QString("RadioButton%1").arg(n))->setChecked(true);
    Child<QPushButton>("Button1")->click();
    EXPECT_EQ(Working(), texture(shown, TextureTile(n), 80));
    EXPECT_EQ(Main().StatusText(), "Made texture");
  }
  EXPECT_EQ(Main().Document().UndoCount(), 2);
}

TEST_F(TextureWindow, BatchTexturesEachSourceAndRefreshesTheSnapshot) {
  std::filesystem::create_directory(LocalPath("in"));
  SaveBitmap24(TestPicture(13, 9), LocalPath("in/p.bmp"));
  platform_.folderAnswers.push_back(Path("in"));
  Child<QToolButton>("SpeedButton1")->click();
  Child<QToolButton>("SpeedButton2")->click();
  Child<QLineEdit>("Edit2")->setText(Path("out"));
  Child<QToolButton>("SpeedButton4")->click();
  EXPECT_TRUE(Main().BatchConvertOk().isVisible());
  EXPECT_EQ(Entries("out"), std::vector<std::string>{"p-Texture.jpg"});
  EXPECT_FALSE(Child<QCheckBox>("CheckBox1")->isChecked());
  EXPECT_EQ(Source().Width(), 13);
  EXPECT_EQ(Working(), texture(Source(), TextureTile(4), 50));
  EXPECT_EQ(dynamic_cast<SnapshotWindow&>(Tool(kTexture)).Snapshot(), Working());
}

}  // namespace
}  // namespace quillane
