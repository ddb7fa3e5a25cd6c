#include <QLabel>
#include <QLocale>
#include <QMenu>
#include <QPushButton>
#include <QScrollArea>
#include <QSignalSpy>
#include <QStatusBar>
#include <QToolButton>
#include <stdexcept>

#include "ui/picture_view.h"
#include "data/startup_picture.h"
#include "tests/gui/gui_fixture.h"

namespace quillane {
namespace {

TBitmap32 Flat(int w, int h, std::uint8_t v) {
  return TBitmap32(w, h, Pixel{v, v, v, 255});
}

QStringList Captions(const QList<QAction*>& actions) {
  QStringList captions;
  for (const QAction* a : actions)
    if (!a->isSeparator()) captions << a->text();
  return captions;
}

using MainWindow = GuiTest;

TEST(MainWindowStartUp, ShowsTheBuiltInPictureAsDesigned) {
  Application();
  ScriptedPlatform platform;
  TMyPicture main(platform);
  main.show();

  EXPECT_EQ(main.objectName(), "TMyPicture");
  EXPECT_EQ(main.windowTitle(), "Quillane v4.36");
  EXPECT_EQ(main.size(), QSize(540, 473));
  EXPECT_EQ(main.pos(), QPoint(4, 3));

  const TBitmap32 startup = StartupPicture();
  EXPECT_EQ(main.Document().Working(), startup);
  EXPECT_EQ(main.Document().Source(), startup);
  EXPECT_EQ(main.Document().Opened(), startup);
  auto* image1 = main.findChild<PictureView*>("Image1");
  ASSERT_NE(image1, nullptr);
  EXPECT_EQ(image1->size(), QSize(521, 346));
  EXPECT_EQ(image1->Image(), OpaqueImage(startup));
  EXPECT_EQ(image1->toolTip(), "scroll the mouse-wheel to zoom out or zoom in");
  EXPECT_EQ(image1->parentWidget(), main.findChild<QScrollArea*>("ScrollBox1")->viewport());

  auto* status = main.findChild<QLabel*>("Label1");
  ASSERT_NE(status, nullptr);
  EXPECT_EQ(status->text(), "New picture");
  EXPECT_EQ(status->palette().color(QPalette::WindowText), QColor(128, 128, 128));
  EXPECT_EQ(main.findChild<QLabel*>("Label5")->text(), "100%");
  EXPECT_EQ(main.ZoomPercent(), 100.0);
  EXPECT_EQ(main.ActiveTool(), 0);
  ASSERT_NE(main.findChild<QStatusBar*>("StatusBar1"), nullptr);
  EXPECT_TRUE(main.findChild<QStatusBar*>("StatusBar1")->currentMessage().isEmpty());
  EXPECT_FALSE(main.findChild<QWidget*>("Panel1")->isVisible());
}

TEST_F(MainWindow, MenusListTheirEntriesInOrder) {
  EXPECT_EQ(Captions(Main().menuBar()->actions()),
            QStringList({" File", " Edit", " B&&W", " Color", " ColorAdjust", " Veins", " Help"}));
  const std::vector<std::pair<const char*, QStringList>> menus = {
      {"File1", {"Open", "Save", "Exit"}},
      {"Edit1", {"Undo", "Redo", "Image size"}},
      {"BW1", {"Pencil sketch", "Pen sketch", "Vuzorar", "Pen && Ink"}},
      {"Color1", {"Color Pencil", "Realism", "Pop art", "Abstract", "Water color", "Brume"}},
      {"ColorAdjust1", {"Color panel", "HSL adjust", "Color Filter", "Color variety"}},
      {"Veins1", {"Emboss", "Texture", "Stria"}},
      {"Help1", {"Online", "About"}},
  };
  for (const auto& [name, entries] : menus) {
    auto* menu = Main().menuBar()->findChild<QMenu*>(name);
    ASSERT_NE(menu, nullptr) << name;
    EXPECT_EQ(Captions(menu->actions()), entries) << name;
  }
  // "&&" is the escaped ampersand: the entry reads with one.
  EXPECT_EQ(MenuAction("PenInk1")->iconText(), "Pen & Ink");
  EXPECT_EQ(Main().menuBar()->findChild<QMenu*>("BW1")->menuAction()->iconText(), "B&W");

  auto* popup = Main().findChild<QMenu*>("PopupMenu1");
  ASSERT_NE(popup, nullptr);
  EXPECT_EQ(Captions(popup->actions()),
            QStringList({"Open a new picture", "Image size", "Save as"}));
  EXPECT_EQ(Main().findChild<PictureView*>("Image1")->contextMenuPolicy(), Qt::CustomContextMenu);
}

TEST_F(MainWindow, ToolbarButtonsCarryTheirHints) {
  const std::vector<std::pair<const char*, const char*>> panel4 = {
      {"SpeedButton1", "Open a picture as foreground"},
      {"SpeedButton2", "Save"},
      {"SpeedButton7", "Renew"},
      {"SpeedButton3", "Undo"},
      {"SpeedButton18", "Redo"},
      {"SpeedButton4", "Image size"},
      {"SpeedButton5", "Zoom out the view"},
      {"SpeedButton6", "Zoom in the view"}};
  const std::vector<std::pair<const char*, const char*>> panel8 = {
      {"SpeedButton12", "Rotate Clockwise"},
      {"SpeedButton8", "Rotate anticlockwise"},
      {"SpeedButton9", "Set as wallpaper"},
      {"SpeedButton10", "Print"},
      {"SpeedButton11", "Mail to friend"}};
  auto check = [&](const char* panelName, const auto& buttons) {
    auto* panel = MainChild<QWidget>(panelName);
    ASSERT_NE(panel, nullptr) << panelName;
    EXPECT_EQ(panel->parentWidget()->objectName(), "ControlBar1");
    int lastX = -1;
    for (const auto& [name, hint] : buttons) {
      auto* button = panel->findChild<QToolButton*>(name);
      ASSERT_NE(button, nullptr) << name;
      EXPECT_EQ(button->toolTip(), hint) << name;
      EXPECT_FALSE(button->icon().isNull()) << name;
      EXPECT_GT(button->x(), lastX) << name << " is out of order";
      lastX = button->x();
    }
  };
  check("Panel4", panel4);
  check("Panel8", panel8);
  EXPECT_EQ(MainChild<QLabel>("Label5")->parentWidget()->objectName(), "Panel8");
}

TEST_F(MainWindow, ResizingKeepsTheViewAndStatusLineInPlace) {
  Main().resize(700, 600);
  EXPECT_EQ(MainChild<QScrollArea>("ScrollBox1")->geometry(), QRect(2, 32, 687, 480));
  auto* controlBar = MainChild<QWidget>("ControlBar1");
  EXPECT_EQ(controlBar->width(), 690);
  EXPECT_EQ(MainChild<QWidget>("Panel8")->width(),
            690 - MainChild<QWidget>("Panel4")->width() - 32);
  EXPECT_EQ(MainChild<QLabel>("Label1")->pos(), QPoint(5, 480 + 34));
}

TEST_F(MainWindow, ExitClosesTheMainWindow) {
  QSignalSpy closed(&Main(), &TMyPicture::closed);
  MenuAction("Exit1")->trigger();
  EXPECT_EQ(closed.count(), 1);
  EXPECT_FALSE(Main().isVisible());
}

TEST_F(MainWindow, UndoAndRedoFollowTheHistory) {
  auto* undoButton = MainChild<QToolButton>("SpeedButton3");
  auto* redoButton = MainChild<QToolButton>("SpeedButton18");
  QAction* undo = MenuAction("Undo1");
  QAction* redo = MenuAction("Redo1");
  auto expectEnabled = [&](bool canUndo, bool canRedo) {
    EXPECT_EQ(undoButton->isEnabled(), canUndo);
    EXPECT_EQ(undo->isEnabled(), canUndo);
    EXPECT_EQ(redoButton->isEnabled(), canRedo);
    EXPECT_EQ(redo->isEnabled(), canRedo);
  };
  expectEnabled(false, false);
  const TBitmap32 start = Main().Document().Working();

  ASSERT_TRUE(Main().ApplyEffect(Giving(Flat(24, 16, 10), "First"), {}, true));
  ASSERT_TRUE(Main().ApplyEffect(Giving(Flat(24, 16, 20), "Second"), {}, true));
  EXPECT_EQ(Main().StatusText(), "Second");
  expectEnabled(true, false);

  undoButton->click();
  EXPECT_EQ(Main().Document().Working(), Flat(24, 16, 10));
  EXPECT_EQ(Main().StatusText(), "Undo");
  expectEnabled(true, true);

  undo->trigger();
  EXPECT_EQ(Main().Document().Working(), start);
  expectEnabled(false, true);

  redo->trigger();
  EXPECT_EQ(Main().Document().Working(), Flat(24, 16, 10));
  EXPECT_EQ(Main().StatusText(), "Redo");
  EXPECT_EQ(Main().findChild<PictureView*>("Image1")->Image(), OpaqueImage(Flat(24, 16, 10)));
  expectEnabled(true, true);

  // A new step discards what Redo could still reach.
  ASSERT_TRUE(Main().ApplyEffect(Giving(Flat(24, 16, 30), "Third"), {}, true));
  expectEnabled(true, false);

  // Undo with nothing to undo changes nothing, not even the status line.
  Main().SpeedButton3Click();
  Main().SpeedButton3Click();
  EXPECT_EQ(Main().Document().Working(), start);
  Main().SetStatusText("kept");
  Main().SpeedButton3Click();
  EXPECT_EQ(Main().StatusText(), "kept");
  expectEnabled(false, true);
}

TEST_F(MainWindow, UndoGivesThePictureItsFormerDisplaySize) {
  auto* image1 = Main().findChild<PictureView*>("Image1");
  EXPECT_EQ(image1->size(), QSize(24, 16));
  ASSERT_TRUE(Main().ApplyEffect(Giving(Flat(60, 30, 1), "Bigger"), {}, true));
  EXPECT_EQ(image1->size(), QSize(60, 30));
  Main().SpeedButton3Click();
  EXPECT_EQ(image1->size(), QSize(24, 16));
  Main().SpeedButton18Click();
  EXPECT_EQ(image1->size(), QSize(60, 30));
}

TEST_F(MainWindow, UndoSizesThePictureByTheZoomLabel) {
  // The label shows the zoom rounded to one decimal in the user's locale; Undo and Redo read
  // it back from there, while Renew uses the zoom itself.
  const QLocale previous;
  QLocale::setDefault(QLocale(QLocale::German));
  auto* image1 = Main().findChild<PictureView*>("Image1");
  ASSERT_TRUE(Main().ApplyEffect(Giving(Flat(30, 20, 1), "Changed"), {}, true));
  MainChild<QLabel>("Label5")->setText("41,0%");
  EXPECT_EQ(Main().ZoomFromLabel(), 41.0);
  Main().SpeedButton3Click();
  EXPECT_EQ(image1->size(), QSize(10, 7));  // Round(24 * 0.41), Round(16 * 0.41)
  Main().SpeedButton18Click();
  EXPECT_EQ(image1->size(), QSize(12, 8));
  Main().SpeedButton7Click();
  EXPECT_EQ(image1->size(), QSize(24, 16));
  QLocale::setDefault(previous);
}

TEST_F(MainWindow, RenewReturnsToTheOpenedPictureAndResetsTheHistory) {
  const TBitmap32 opened = Main().Document().Opened();
  ASSERT_TRUE(Main().ApplyEffect(Giving(Flat(30, 10, 5), "Changed"), {}, true));
  MainChild<QToolButton>("SpeedButton7")->click();
  EXPECT_EQ(Main().Document().Working(), opened);
  EXPECT_EQ(Main().Document().Source(), opened);
  EXPECT_EQ(Main().findChild<PictureView*>("Image1")->size(), QSize(24, 16));
  EXPECT_FALSE(MainChild<QToolButton>("SpeedButton3")->isEnabled());
  EXPECT_FALSE(MenuAction("Undo1")->isEnabled());
  EXPECT_EQ(Main().StatusText(), "Changed");
}

TEST_F(MainWindow, ANewPictureResetsTheHistoryButNotTheStatusLine) {
  ASSERT_TRUE(Main().ApplyEffect(Giving(Flat(24, 16, 5), "Changed"), {}, true));
  Main().ShowNewPicture(TBitmap32(8, 6, Pixel{1, 2, 3, 0}), true);
  const TBitmap32 expected(8, 6, Pixel{1, 2, 3, 255});
  EXPECT_EQ(Main().Document().Working(), expected);
  EXPECT_EQ(Main().Document().Opened(), expected);
  EXPECT_FALSE(Main().Document().CanUndo());
  EXPECT_FALSE(MainChild<QToolButton>("SpeedButton3")->isEnabled());
  EXPECT_EQ(Main().findChild<PictureView*>("Image1")->size(), QSize(8, 6));
  EXPECT_EQ(Main().StatusText(), "Changed");
}

TEST_F(MainWindow, AFailingEffectChangesNothing) {
  ASSERT_TRUE(Main().ApplyEffect(Giving(Flat(24, 16, 5), "Before"), {}, true));
  const TBitmap32 working = Main().Document().Working();
  const int slot = Main().Document().CurrentSlot();

  EffectSpec failing = *FindEffect(1);
  failing.toolNumber = 2;
  failing.routine = [](const EffectInput&) -> TBitmap32 {
    throw std::runtime_error("Scan line index out of range");
  };
  ToolWindow window(failing, Main(), &Main());
  window.show();
  window.findChild<QPushButton*>("Button1")->click();

  EXPECT_EQ(platform_.errors, std::vector<QString>{"Scan line index out of range"});
  EXPECT_EQ(Main().Document().Working(), working);
  EXPECT_EQ(Main().Document().CurrentSlot(), slot);
  EXPECT_EQ(Main().Document().UndoCount(), 1);
  EXPECT_EQ(Main().StatusText(), "Before");
  EXPECT_FALSE(window.findChild<QToolButton*>("Button2")->isEnabled());
  EXPECT_EQ(Main().findChild<PictureView*>("Image1")->Image(), OpaqueImage(working));
}

TEST_F(MainWindow, DisplayImageFitsThumbnailsIntoTheirSquare) {
  PictureView thumbnail;
  const std::vector<std::pair<QSize, QRect>> cases = {
      {QSize(300, 200), QRect(2, 19, 105, 72)},
      {QSize(200, 300), QRect(19, 2, 72, 105)},
      {QSize(150, 150), QRect(2, 2, 105, 107)},
      {QSize(1, 1), QRect(2, 2, 105, 107)},
      // MulDiv rounds the half away from zero: 105 * 1 / 2 = 52.5 gives 53.
      {QSize(2, 1), QRect(2, 28, 105, 55)},
  };
  for (const auto& [size, expected] : cases) {
    thumbnail.SetPicture(TBitmap32(size.width(), size.height(), Pixel{0, 0, 0, 255}));
    Main().DisplayImage(thumbnail);
    EXPECT_EQ(thumbnail.geometry(), expected) << size.width() << "x" << size.height();
  }
  // An empty picture gets an empty control instead of a division by zero.
  EXPECT_EQ(TMyPicture::DisplayImageGeometry(0, 0).size(), QSize(0, 0));
}

}  // namespace
}  // namespace quillane

namespace quillane {
namespace {

TEST(PictureViewPainting, StretchesTheWholePictureOpaque) {
  Application();
  TBitmap32 picture(2, 1);
  picture.At(0, 0) = Pixel{10, 20, 30, 0};  // fully transparent, still shown
  picture.At(1, 0) = Pixel{200, 100, 50, 128};
  PictureView view;
  view.SetPicture(picture);
  EXPECT_EQ(view.PictureSize(), QSize(2, 1));
  view.resize(4, 2);
  const QImage shown = view.grab().toImage();
  ASSERT_EQ(shown.size(), QSize(4, 2));
  for (int y = 0; y < 2; ++y) {
    EXPECT_EQ(shown.pixel(0, y), qRgb(30, 20, 10));
    EXPECT_EQ(shown.pixel(1, y), qRgb(30, 20, 10));
    EXPECT_EQ(shown.pixel(2, y), qRgb(50, 100, 200));
    EXPECT_EQ(shown.pixel(3, y), qRgb(50, 100, 200));
  }
}

}  // namespace
}  // namespace quillane
