#include <QLabel>
#include <QLocale>
#include <QPushButton>
#include <QToolButton>
#include <stdexcept>

#include "data/startup_picture.h"
#include "tests/gui/gui_fixture.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

Bitmap32 Flat(int w, int h, std::uint8_t v) {
  return Bitmap32(w, h, Pixel{v, v, v, 255});
}

class MainWindowTest : public GuiTest {
 protected:
  PictureView* Image1() { return Main().findChild<PictureView*>("Image1"); }
  // Undo and Redo, each as toolbar button and menu entry, enabled as given.
  void ExpectUndoRedo(bool canUndo, bool canRedo) {
    EXPECT_EQ(MainChild<QToolButton>("SpeedButton3")->isEnabled(), canUndo);
    EXPECT_EQ(MenuAction("Undo1")->isEnabled(), canUndo);
    EXPECT_EQ(MainChild<QToolButton>("SpeedButton18")->isEnabled(), canRedo);
    EXPECT_EQ(MenuAction("Redo1")->isEnabled(), canRedo);
  }
  void Apply(const Bitmap32& result, const std::string& status) {
    ASSERT_TRUE(Main().ApplyEffect(Giving(result, status), {}, true));
  }
};

TEST(MainWindowStartUp, ShowsTheBuiltInPicture) {
  Application();
  ScriptedPlatform platform;
  MainWindow main(platform);
  main.show();
  const Bitmap32 startup = StartupPicture();
  EXPECT_EQ(main.Document().Opened(), startup);
  auto* picture = main.findChild<PictureView*>("Image1");
  EXPECT_EQ(picture->size(), QSize(521, 346));
  EXPECT_EQ(picture->Image(), OpaqueImage(startup));
  EXPECT_EQ(main.ActiveTool(), 0);
}

TEST_F(MainWindowTest, UndoAndRedoFollowTheHistoryWithTheFormerDisplaySize) {
  const Bitmap32 start = Main().Document().Working();
  Apply(Flat(60, 30, 10), "First");
  Apply(Flat(24, 16, 20), "Second");
  ExpectUndoRedo(true, false);

  MainChild<QToolButton>("SpeedButton3")->click();
  EXPECT_EQ(Image1()->size(), QSize(60, 30));
  EXPECT_EQ(Main().StatusText(), "Undo");
  MenuAction("Undo1")->trigger();
  EXPECT_EQ(Main().Document().Working(), start);
  EXPECT_EQ(Image1()->size(), QSize(24, 16));
  ExpectUndoRedo(false, true);

  MenuAction("Redo1")->trigger();
  EXPECT_EQ(Main().StatusText(), "Redo");
  EXPECT_EQ(Image1()->Image(), OpaqueImage(Flat(60, 30, 10)));
  EXPECT_EQ(Image1()->size(), QSize(60, 30));

  // A new step discards what Redo could still reach.
  Apply(Flat(24, 16, 30), "Third");
  ExpectUndoRedo(true, false);

  // Undo with nothing to undo changes nothing, not even the status line.
  Main().OnUndo();
  Main().OnUndo();
  Main().SetStatusText("kept");
  Main().OnUndo();
  EXPECT_EQ(Main().Document().Working(), start);
  EXPECT_EQ(Main().StatusText(), "kept");
}

TEST_F(MainWindowTest, UndoSizesThePictureByTheZoomLabel) {
  // The label shows the zoom rounded to one decimal in the user's locale; Undo and Redo read
  // it back from there, while Renew uses the zoom itself.
  const QLocale previous;
  QLocale::setDefault(QLocale(QLocale::German));
  EXPECT_EQ(MainWindow::ZoomLabelText(1455.19), "1455,2%");  // and no group separator
  Apply(Flat(30, 20, 1), "Changed");
  MainChild<QLabel>("Label5")->setText("41,0%");
  EXPECT_EQ(Main().ZoomFromLabel(), 41.0);
  Main().OnUndo();
  EXPECT_EQ(Image1()->size(), QSize(10, 7));  // Round(24 * 0.41), Round(16 * 0.41)
  Main().OnRedo();
  EXPECT_EQ(Image1()->size(), QSize(12, 8));
  Main().OnRenew();
  EXPECT_EQ(Image1()->size(), QSize(24, 16));
  QLocale::setDefault(previous);
}

TEST_F(MainWindowTest, ANewPictureAndRenewResetTheHistoryButNotTheStatusLine) {
  Apply(Flat(24, 16, 5), "Changed");
  Main().ShowNewPicture(Bitmap32(8, 6, Pixel{1, 2, 3, 0}), true);
  const Bitmap32 opened(8, 6, Pixel{1, 2, 3, 255});
  ExpectUndoRedo(false, false);  // opening a file keeps the status line: the files' test

  Apply(Flat(30, 10, 5), "Changed again");
  MainChild<QToolButton>("SpeedButton7")->click();
  EXPECT_EQ(Main().Document().Working(), opened);
  EXPECT_EQ(Main().Document().Source(), opened);
  EXPECT_EQ(Image1()->size(), QSize(8, 6));
  ExpectUndoRedo(false, false);
  EXPECT_EQ(Main().StatusText(), "Changed again");
}

TEST_F(MainWindowTest, AFailingEffectChangesNothing) {
  Apply(Flat(24, 16, 5), "Before");
  const Bitmap32 working = Main().Document().Working();
  const int slot = Main().Document().CurrentSlot();

  EffectSpec failing = *FindEffect(1);
  failing.toolNumber = 2;
  failing.routine = [](const EffectInput&) -> Bitmap32 {
    throw std::runtime_error("Scan line index out of range");
  };
  ToolWindow window(failing, Main(), &Main());
  window.show();
  window.findChild<QPushButton*>("Button1")->click();

  EXPECT_EQ(platform_.errors, std::vector<QString>{"Scan line index out of range"});
  EXPECT_EQ(Main().Document().Working(), working);
  EXPECT_EQ(Main().Document().CurrentSlot(), slot);
  EXPECT_EQ(Main().StatusText(), "Before");
  EXPECT_FALSE(window.findChild<QToolButton*>("Button2")->isEnabled());
  EXPECT_EQ(Image1()->Image(), OpaqueImage(working));
}

TEST_F(MainWindowTest, DisplayImageFitsThumbnailsIntoTheirSquare) {
  PictureView thumbnail;
  const std::vector<std::pair<QSize, QRect>> cases = {
      {QSize(300, 200), QRect(2, 19, 105, 72)},
      {QSize(200, 300), QRect(19, 2, 72, 105)},
      // MulDiv rounds the half away from zero: 105 * 1 / 2 = 52.5 gives 53.
      {QSize(2, 1), QRect(2, 28, 105, 55)},
  };
  for (const auto& [size, expected] : cases) {
    thumbnail.SetPicture(Bitmap32(size.width(), size.height(), Pixel{0, 0, 0, 255}));
    Main().DisplayImage(thumbnail);
    EXPECT_EQ(thumbnail.geometry(), expected) << size.width() << "x" << size.height();
  }
  // An empty picture gets an empty control instead of a division by zero.
  EXPECT_EQ(MainWindow::DisplayImageGeometry(0, 0).size(), QSize(0, 0));
}

}  // namespace
}  // namespace quillane
