// Zoom, the mouse wheel, panning and the quarter turns of the main window.
#include <QLabel>
#include <QLocale>
#include <QMenu>
#include <QScrollArea>
#include <QScrollBar>
#include <QTest>
#include <QToolButton>
#include <QWheelEvent>

#include "tests/gui/gui_fixture.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

class View : public GuiTest {
 protected:
  PictureView* Image1() { return MainChild<PictureView>("Image1"); }
  QString ZoomLabel() { return MainChild<QLabel>("Label5")->text(); }
  void Click(const char* button) { MainChild<QToolButton>(button)->click(); }
  QScrollBar* Horizontal() { return MainChild<QScrollArea>("ScrollBox1")->horizontalScrollBar(); }
  QScrollBar* Vertical() { return MainChild<QScrollArea>("ScrollBox1")->verticalScrollBar(); }
  QMenu* PopupMenu() { return Main().findChild<QMenu*>("PopupMenu1"); }

  // One wheel message of the given turn (positive: away from the user) sent to widget.
  void Wheel(QWidget* widget, int turn, Qt::KeyboardModifiers modifiers = Qt::NoModifier) {
    QWheelEvent event(QPointF(5, 5), widget->mapToGlobal(QPointF(5, 5)), QPoint(), QPoint(0, turn),
                      Qt::NoButton, modifiers, Qt::NoScrollPhase, false,
                      Qt::MouseEventNotSynthesized, &TestMouse());
    QApplication::sendEvent(widget, &event);
  }

  void Mouse(QEvent::Type type, QPoint at, Qt::MouseButton button, Qt::MouseButtons held) {
    QMouseEvent event(type, at, Image1()->mapToGlobal(at), button, held, Qt::NoModifier,
                      &TestMouse());
    QApplication::sendEvent(Image1(), &event);
  }
};

TEST_F(View, ZoomStepsSetTheLabelAndTheDisplaySize) {
  struct Step {
    const char* button;
    double zoom;
    const char* label;
    QSize display;  // of the 24 by 16 test picture
  };
  const Step steps[] = {
      {"SpeedButton6", 125, "125.0%", {30, 20}},      {"SpeedButton6", 156.25, "156.3%", {38, 25}},
      {"SpeedButton6", 195.3125, "195.3%", {47, 31}}, {"SpeedButton5", 156.25, "156.3%", {38, 25}},
      {"SpeedButton5", 125, "125.0%", {30, 20}},      {"SpeedButton5", 100, "100.0%", {24, 16}},
      {"SpeedButton5", 80, "80.0%", {19, 13}},
  };
  EXPECT_EQ(ZoomLabel(), "100%");
  for (const Step& s : steps) {
    Click(s.button);
    EXPECT_NEAR(Main().ZoomPercent(), s.zoom, 1e-9) << s.label;
    EXPECT_EQ(ZoomLabel(), s.label);
    EXPECT_EQ(Image1()->size(), s.display) << s.label;
  }

  // The label follows the user's locale, without group separators.
  const QLocale previous;
  QLocale::setDefault(QLocale(QLocale::German));
  EXPECT_EQ(TMyPicture::ZoomLabelText(195.3125), "195,3%");
  EXPECT_EQ(TMyPicture::ZoomLabelText(14551.9), "14551,9%");
  QLocale::setDefault(previous);
}

TEST_F(View, UndoSizesByTheRoundedLabelAfterFourZoomOuts) {
  Main().SetWorkingPicture(TBitmap32(100, 50, Pixel{1, 2, 3, 255}), true);
  for (int i = 0; i < 4; ++i) Click("SpeedButton5");
  EXPECT_EQ(ZoomLabel(), "41.0%");
  EXPECT_EQ(Image1()->size(), QSize(41, 20));  // 40.96 % of 100 by 50
  Main().SpeedButton3Click();
  EXPECT_EQ(Image1()->size(), QSize(10, 7));  // 41.0 % of 24 by 16
}

TEST_F(View, ZoomStopsBeforeTheDisplayLeavesTheWidgetRange) {
  // 0.8^15 is the last step at which 16 rows still show as one.
  for (int i = 0; i < 20; ++i) Click("SpeedButton5");
  EXPECT_EQ(ZoomLabel(), "3.5%");
  EXPECT_EQ(Image1()->size(), QSize(1, 1));

  // A million pixels wide: 1.25^12 is the last step below the widget limit.
  Main().ZoomToActualSize();
  EXPECT_EQ(ZoomLabel(), "100.0%");
  Main().ShowNewPicture(TBitmap32(1000000, 1), true);
  for (int i = 0; i < 15; ++i) Click("SpeedButton6");
  EXPECT_EQ(Image1()->size(), QSize(14551915, 15));

  // A picture opened at that zoom is held at the limit, and zooming out still works.
  Main().ShowNewPicture(TBitmap32(2000000, 1), true);
  EXPECT_EQ(Image1()->size(), QSize(QWIDGETSIZE_MAX, 15));
  Click("SpeedButton5");
  EXPECT_EQ(Image1()->size(), QSize(QWIDGETSIZE_MAX, 12));
  Click("SpeedButton5");
  EXPECT_EQ(Image1()->size(), QSize(QWIDGETSIZE_MAX, 9));
  Click("SpeedButton5");
  EXPECT_EQ(Image1()->size(), QSize(14901161, 7));
}

TEST_F(View, TheWheelZoomsOverThePictureOnlyAndCtrlWheelAnywhere) {
  Main().ShowNewPicture(TBitmap32(2000, 1500), true);
  struct Case {
    const char* widget;
    int turn;
    Qt::KeyboardModifiers modifiers;
    double zoom;
  };
  const Case cases[] = {
      {"SpeedButton1", -120, Qt::NoModifier, 100},         // over the toolbar: nothing
      {"Image1", -120, Qt::NoModifier, 125},               // towards the user: in
      {"Image1", -1, Qt::NoModifier, 156.25},              // one step per message, any distance
      {"ScrollBox1", 240, Qt::NoModifier, 125},            // away from the user: out
      {"SpeedButton1", 120, Qt::ControlModifier, 156.25},  // Ctrl: away zooms in
      {"Image1", 60, Qt::ControlModifier, 156.25},         // half a notch waits
      {"Image1", 60, Qt::ControlModifier, 195.3125},       // for the other half
      {"Label1", -240, Qt::ControlModifier, 125},          // two notches towards: out twice
  };
  for (const Case& c : cases) {
    Wheel(MainChild<QWidget>(c.widget), c.turn, c.modifiers);
    EXPECT_NEAR(Main().ZoomPercent(), c.zoom, 1e-9) << c.widget << " " << c.turn;
    EXPECT_EQ(Vertical()->value(), 0) << "the scroll box does not scroll";
  }
}

TEST_F(View, RightDragPansAndOnlyAStillRightClickOpensTheContextMenu) {
  struct Case {
    QSize picture;
    Qt::MouseButton button;
    QPoint moveTo;
    QPoint scrolled;
    bool menu;
  };
  const Case cases[] = {
      {{2000, 1500}, Qt::RightButton, {100, 100}, {0, 0}, true},   // a click
      {{2000, 1500}, Qt::RightButton, {60, 70}, {40, 30}, false},  // a drag that scrolls
      {{2000, 1500}, Qt::RightButton, {150, 100}, {0, 0}, true},   // nowhere to scroll to
      {{24, 16}, Qt::RightButton, {60, 70}, {0, 0}, true},         // the picture fits
      {{2000, 1500}, Qt::LeftButton, {60, 70}, {0, 0}, false},     // left does neither
  };
  for (const Case& c : cases) {
    Main().ShowNewPicture(TBitmap32(c.picture.width(), c.picture.height()), true);
    Mouse(QEvent::MouseButtonPress, {100, 100}, c.button, c.button);
    EXPECT_EQ(Image1()->cursor().shape(),
              c.button == Qt::RightButton ? Qt::ClosedHandCursor : Qt::ArrowCursor);
    Mouse(QEvent::MouseMove, c.moveTo, Qt::NoButton, c.button);
    Mouse(QEvent::MouseButtonRelease, c.moveTo, c.button, Qt::NoButton);
    EXPECT_EQ(QPoint(Horizontal()->value(), Vertical()->value()), c.scrolled) << c.moveTo.x();
    EXPECT_EQ(PopupMenu()->isVisible(), c.menu) << c.moveTo.x();
    EXPECT_EQ(Image1()->cursor().shape(), Qt::ArrowCursor);
    PopupMenu()->hide();
  }
}

TEST_F(View, RotationTurnsBothPicturesAndResetsTheHistory) {
  Main().ShowNewPicture(TBitmap32(640, 480, Pixel{9, 9, 9, 255}), true);
  Main().SetWorkingPicture(TBitmap32(640, 480, Pixel{5, 5, 5, 255}), true);
  Main().SetStatusText("kept");
  Click("SpeedButton6");
  Horizontal()->setValue(50);
  Click("SpeedButton12");
  EXPECT_EQ(Main().Document().Working(), TBitmap32(478, 640, Pixel{5, 5, 5, 255}));
  EXPECT_EQ(Main().Document().Source(), TBitmap32(478, 640, Pixel{9, 9, 9, 255}));
  EXPECT_EQ(Main().Document().Opened(), TBitmap32(640, 480, Pixel{9, 9, 9, 255}));
  EXPECT_FALSE(MainChild<QToolButton>("SpeedButton3")->isEnabled());
  EXPECT_EQ(Image1()->size(), QSize(598, 800));
  EXPECT_EQ(Horizontal()->value(), 0);
  EXPECT_EQ(Main().StatusText(), "kept");
  Click("SpeedButton8");
  EXPECT_EQ(Main().Document().Working().Width(), 640);
  EXPECT_TRUE(platform_.messages.empty());

  // Too thin to turn: said so, and nothing changes.
  Main().ShowNewPicture(TBitmap32(2, 1, Pixel{1, 1, 1, 255}), true);
  Click("SpeedButton12");
  EXPECT_EQ(Main().Document().Working(), TBitmap32(2, 1, Pixel{1, 1, 1, 255}));
  ASSERT_EQ(platform_.messages.size(), 1u);
  EXPECT_EQ(platform_.messages[0].caption, "Sorry");
}

TEST_F(View, TheViewMenuZoomsFromTheKeyboard) {
  QStringList menus;
  for (QAction* a : Main().menuBar()->actions()) menus << a->text();
  EXPECT_EQ(menus, QStringList({" File", " Edit", " View", " B&&W", " Color", " ColorAdjust",
                                " Veins", " Help"}));
  Main().activateWindow();
  ASSERT_TRUE(QTest::qWaitForWindowActive(&Main()));
  struct Key {
    QKeyCombination key;
    const char* label;
  };
  const Key keys[] = {{Qt::CTRL | Qt::Key_Plus, "125.0%"},
                      {Qt::CTRL | Qt::Key_Equal, "156.3%"},
                      {Qt::CTRL | Qt::Key_Minus, "125.0%"},
                      {Qt::CTRL | Qt::Key_0, "100.0%"}};
  for (const Key& k : keys) {
    QTest::keyClick(Image1(), k.key.key(), k.key.keyboardModifiers());
    EXPECT_EQ(ZoomLabel(), k.label);
  }
}

}  // namespace
}  // namespace quillane
