// Freehand painting driven as the user does: "Color up", mouse strokes on the work area, the
// control panel's tools, OK and Cancel.
#include <QAction>
#include <QLabel>
#include <QPushButton>
#include <QScrollArea>
#include <QSlider>
#include <QTest>
#include <QToolButton>

#include "tests/gui/gui_fixture.h"
#include "ui/freehand/control_panel_window.h"
#include "ui/freehand/painting_window.h"
#include "ui/freehand/work_area_window.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

constexpr Pixel kWhite{255, 255, 255, 255};
constexpr Pixel kBlack{0, 0, 0, 255};
constexpr Pixel kRed{0, 0, 250, 255};

class FreehandWindows : public GuiTest {
 protected:
  // White paper with a black bar across rows 10..12 and a tinted pixel inside it.
  void SetUp() override {
    GuiTest::SetUp();
    Bitmap32 drawing(40, 30, kWhite);
    for (int y = 10; y <= 12; ++y)
      for (int x = 0; x < 40; ++x) drawing.At(x, y) = kBlack;
    drawing.At(20, 11) = kPaperTint;
    Main().ShowNewPicture(drawing, true);
  }

  FreehandPainting& Painting() { return *Main().findChild<FreehandPainting*>(); }
  WorkAreaWindow& Area() { return Painting().WorkArea(); }
  ControlPanelWindow& Panel() { return Painting().ControlPanel(); }
  template <typename T>
  T* Control(const char* name) {
    return Panel().findChild<T*>(name);
  }
  void Press(const char* name) { Control<QAbstractButton>(name)->click(); }

  void Mouse(QEvent::Type type, QPoint at, Qt::MouseButton button, Qt::MouseButtons held) {
    QMouseEvent event(type, at, at, at, button, held, Qt::NoModifier, &TestMouse());
    QCoreApplication::sendEvent(Area().Canvas(), &event);
  }
  // Down at the first point, moves through the rest, up at the last.
  void Stroke(std::initializer_list<QPoint> points) {
    Mouse(QEvent::MouseButtonPress, *points.begin(), Qt::LeftButton, Qt::LeftButton);
    for (QPoint at : points) Mouse(QEvent::MouseMove, at, Qt::NoButton, Qt::LeftButton);
    Mouse(QEvent::MouseButtonRelease, *(points.end() - 1), Qt::LeftButton, Qt::NoButton);
  }
  void RedBrush(int size) {
    platform_.colorAnswers.push_back(0x0000FF);
    ClickOn(Control<QWidget>("ColorPanel"));
    Press("SpeedButton14");
    Control<QSlider>("TrackBar1")->setValue(size);
  }
};

TEST_F(FreehandWindows, EveryWayOfClosingEnablesTheMainWindowAgainAndOnlyOkWritesBack) {
  struct Case {
    const char* how;
    std::function<void()> close;
    bool written;
  };
  for (const Case& c : {Case{"OK", [this] { Press("Button1"); }, true},
                        Case{"Cancel", [this] { Press("Button2"); }, false},
                        Case{"panel's close box", [this] { Panel().close(); }, false},
                        Case{"work area's close box", [this] { Area().close(); }, false}}) {
    SCOPED_TRACE(c.how);
    Main().SetStatusText("Before");
    const int undoCount = Main().Document().UndoCount();
    const Pixel before = Main().Document().Working().At(5, 11);
    Painting().ColorUp();
    EXPECT_FALSE(Main().isEnabled());
    EXPECT_TRUE(Area().isVisible() && Panel().isVisible());
    RedBrush(3);
    Stroke({{5, 11}, {8, 11}});
    c.close();
    EXPECT_TRUE(Main().isEnabled());
    EXPECT_FALSE(Area().isVisible() || Panel().isVisible());
    EXPECT_EQ(Main().Document().Working().At(5, 11), c.written ? kRed : before);
    EXPECT_EQ(Main().Document().UndoCount(), undoCount + (c.written ? 1 : 0));
    EXPECT_EQ(Main().StatusText(), c.written ? "Color up" : "Before");
  }
}

TEST_F(FreehandWindows, ColorUpOfADrawingWindowOpensThePair) {
  MenuAction("Pensketch1")->trigger();
  ToolChild<QPushButton>(kPenSketch, "Button1")->click();
  ToolChild<QToolButton>(kPenSketch, "Button2")->click();
  EXPECT_TRUE(Area().isVisible() && Panel().isVisible() && Tool(kPenSketch).isVisible());
  EXPECT_EQ(Area().Picture(), Main().Document().Working());
  EXPECT_TRUE(Control<QPushButton>("Button8")->isEnabled()) << "pen sketch makes line art";
  Press("Button2");
  Main().SetLineArt(false);
  Painting().ColorUp();
  EXPECT_FALSE(Control<QPushButton>("Button4")->isEnabled());
}

TEST_F(FreehandWindows, BrushRecoloursStrokesOnlyAndCtrlZTakesTheStrokeBack) {
  Painting().ColorUp();
  RedBrush(16);
  EXPECT_EQ(Control<QLabel>("Label1")->text(), "16") << "the brush button sets its size";
  Control<QSlider>("TrackBar1")->setValue(4);
  const Bitmap32 before = Area().Picture();
  Stroke({{20, 11}, {24, 12}, {60, 50}});  // the last point lies outside the picture
  // Which pixels a disc recolours is the painting's own test.
  EXPECT_EQ(Area().Picture().At(28, 12), kRed);
  QAction* undo = Area().findChild<QAction*>("UndoStroke");
  EXPECT_EQ(undo->shortcut(), QKeySequence(QKeySequence::Undo));
  undo->trigger();
  EXPECT_EQ(Area().Picture(), before);
  Mouse(QEvent::MouseButtonRelease, {3, 3}, Qt::LeftButton, Qt::NoButton);  // no press first
  EXPECT_EQ(Area().Picture(), before);
}

TEST_F(FreehandWindows, BeelineDrawsOnlyOnReleaseAndPenFollowsTheMouse) {
  Painting().ColorUp();
  Press("SpeedButton1");
  const Bitmap32 before = Area().Picture();
  Mouse(QEvent::MouseButtonPress, {2, 2}, Qt::LeftButton, Qt::LeftButton);
  Mouse(QEvent::MouseMove, {7, 2}, Qt::NoButton, Qt::LeftButton);
  EXPECT_EQ(Area().BandEnd(), QPoint(8, 2)) << "an odd distance goes one further";
  EXPECT_EQ(Area().Picture(), before) << "the rubber band lies over the picture";
  Mouse(QEvent::MouseButtonRelease, {7, 2}, Qt::LeftButton, Qt::NoButton);
  EXPECT_EQ(Area().Picture().At(7, 2), kBlack);
  EXPECT_EQ(Area().Picture().At(8, 2), kWhite);
  Press("SpeedButton12");
  Stroke({{2, 20}, {30, 20}});
  EXPECT_EQ(Area().Picture().At(29, 20), kBlack);
  EXPECT_EQ(Area().Strokes().Count(), 2u);
}

TEST_F(FreehandWindows, PhotoFitsTheViewAndTheEyedropperPicksFromIt) {
  Bitmap32 portrait(600, 800, kWhite);
  portrait.At(599, 799) = Pixel{1, 2, 3, 255};
  Main().ShowNewPicture(portrait, true);
  Painting().ColorUp();
  EXPECT_EQ(Panel().PhotoView()->size(), QSize(145, 193));
  Press("SpeedButton11");
  QMouseEvent press(QEvent::MouseButtonPress, QPointF(145, 193), QPointF(145, 193),
                    QPointF(145, 193), Qt::RightButton, Qt::RightButton, Qt::NoModifier,
                    &TestMouse());
  QCoreApplication::sendEvent(Panel().PhotoView(), &press);
  EXPECT_EQ(Painting().State().brushColor, (Pixel{1, 2, 3, 255}))
      << "the edge picks the last pixel";
  Press("Button2");
  Main().ShowNewPicture(Bitmap32(800, 600, kWhite), true);
  Painting().ColorUp();
  EXPECT_EQ(Panel().PhotoView()->size(), QSize(217, 163));
}

// Once a tool button or Thin had the focus, Ctrl+Z did nothing until the work area was clicked.
TEST_F(FreehandWindows, CtrlZTakesBackOneStepWhicheverWindowHasTheFocus) {
  Main().SetLineArt(true);
  Painting().ColorUp();
  const std::pair<const char*, QWidget*> cases[] = {
      {"Pen button", Control<QWidget>("SpeedButton12")},
      {"Thin button", Control<QWidget>("Button8")},
      {"work area", Area().Canvas()}};
  for (const auto& [where, focus] : cases) {
    SCOPED_TRACE(where);
    Press("SpeedButton12");
    Stroke({{2, 20}, {30, 20}});
    const Bitmap32 afterStroke = Area().Picture();
    Press("Button8");
    ASSERT_NE(Area().Picture(), afterStroke);
    EXPECT_EQ(Area().Picture().At(38, 10), kWhite) << "the bar's last interior column thinned";
    EXPECT_EQ(Area().Picture().At(39, 10), kBlack) << "the border column left";
    focus->window()->activateWindow();
    focus->setFocus();
    ASSERT_TRUE(QTest::qWaitForWindowActive(focus->window()));
    QTest::keyClick(focus, Qt::Key_Z, Qt::ControlModifier);
    EXPECT_EQ(Area().Picture(), afterStroke) << "Thin taken back, and only Thin";
  }
}

// "Rubber" was cut on both sides: the five tool buttons were narrower than their captions.
TEST_F(FreehandWindows, EveryToolButtonShowsItsWholeCaption) {
  Painting().ColorUp();
  int right = 0;
  for (const char* name :
       {"SpeedButton14", "SpeedButton12", "SpeedButton1", "SpeedButton15", "SpeedButton11"}) {
    auto* button = Control<QToolButton>(name);
    EXPECT_GE(button->width(), button->fontMetrics().horizontalAdvance(button->text()) + 4) << name;
    EXPECT_GT(button->x(), right) << name << " in its place in the row";
    right = button->geometry().right();
  }
  EXPECT_LE(right, Control<QWidget>("Panel1")->width()) << "the row fits its panel";
}

TEST_F(FreehandWindows, NoPictureNoPainting) {
  Main().SetWorkingPicture(Bitmap32(), false);
  Painting().ColorUp();
  EXPECT_FALSE(Area().isVisible());
  EXPECT_TRUE(Main().isEnabled());
  ASSERT_EQ(platform_.messages.size(), 1u);
  EXPECT_EQ(platform_.messages[0].caption, "Sorry");
}

}  // namespace
}  // namespace quillane
