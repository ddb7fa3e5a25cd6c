// Zoom, the mouse wheel, panning and the quarter turns of the main window.
#include <QLabel>
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
  QSize Display() { return MainChild<PictureView>("Image1")->size(); }
  QString ZoomLabel() { return MainChild<QLabel>("Label5")->text(); }
  void Click(const char* button, int times = 1) {
    for (int i = 0; i < times; ++i) MainChild<QToolButton>(button)->click();
  }
  QScrollBar* Bar(Qt::Orientation o) {
    auto* box = MainChild<QScrollArea>("ScrollBox1");
    return o == Qt::Horizontal ? box->horizontalScrollBar() : box->verticalScrollBar();
  }
  void Mouse(QEvent::Type type, QPoint at, Qt::MouseButton button, Qt::MouseButtons held) {
    auto* picture = MainChild<PictureView>("Image1");
    QMouseEvent event(type, at, picture->mapToGlobal(at), button, held, Qt::NoModifier,
                      &TestMouse());
    QApplication::sendEvent(picture, &event);
  }
};

TEST_F(View, ZoomStopsBeforeTheDisplayLeavesTheWidgetRange) {
  Click("SpeedButton5", 20);  // 0.8^15 is the last step at which 16 rows still show as one
  EXPECT_EQ(ZoomLabel(), "3.5%");
  EXPECT_EQ(Display(), QSize(1, 1));
  Main().ZoomToActualSize();
  Main().ShowNewPicture(Bitmap32(1000000, 1), true);
  Click("SpeedButton6", 15);  // 1.25^12 is the last step below the widget limit
  EXPECT_EQ(Display(), QSize(14551915, 15));
  // A wider picture opened at that zoom is held at the limit.
  Main().ShowNewPicture(Bitmap32(2000000, 1), true);
  EXPECT_EQ(Display(), QSize(QWIDGETSIZE_MAX, 15));
}

TEST_F(View, TheWheelZoomsOverThePictureOnlyAndCtrlWheelAnywhere) {
  Main().ShowNewPicture(Bitmap32(2000, 1500), true);
  const struct {
    const char* widget;
    int turn;  // positive: away from the user
    Qt::KeyboardModifiers modifiers;
    const char* label;
  } cases[] = {
      {"SpeedButton1", -120, Qt::NoModifier, "100%"},        // over the toolbar: nothing
      {"Image1", -120, Qt::NoModifier, "125.0%"},            // towards the user: in
      {"Image1", -1, Qt::NoModifier, "156.3%"},              // a step per message, however short
      {"ScrollBox1", 240, Qt::NoModifier, "125.0%"},         // away from the user: out
      {"SpeedButton1", 120, Qt::ControlModifier, "156.3%"},  // with Ctrl, away is in
      {"Image1", 60, Qt::ControlModifier, "156.3%"},         // half a notch waits for
      {"Image1", 60, Qt::ControlModifier, "195.3%"},         // the other half
  };
  for (const auto& c : cases) {
    QWidget* widget = MainChild<QWidget>(c.widget);
    QWheelEvent event(QPointF(5, 5), widget->mapToGlobal(QPointF(5, 5)), QPoint(),
                      QPoint(0, c.turn), Qt::NoButton, c.modifiers, Qt::NoScrollPhase, false,
                      Qt::MouseEventNotSynthesized, &TestMouse());
    QApplication::sendEvent(widget, &event);
    EXPECT_EQ(ZoomLabel(), c.label) << c.widget << " " << c.turn;
    EXPECT_EQ(Bar(Qt::Vertical)->value(), 0) << "the scroll box does not scroll";
  }
  // The View menu's entries run the buttons' zoom; Ctrl+= is the one key of its own.
  ASSERT_TRUE(QTest::qWaitForWindowActive(&Main()));
  QTest::keyClick(&Main(), Qt::Key_Equal, Qt::ControlModifier);
  EXPECT_EQ(ZoomLabel(), "244.1%");
}

TEST_F(View, RightDragPansAndOnlyAStillRightClickOpensTheContextMenu) {
  const struct {
    QSize picture;
    Qt::MouseButton button;
    QPoint to;
    QPoint scrolled;
    bool menu;
  } cases[] = {
      {{2000, 1500}, Qt::RightButton, {100, 100}, {0, 0}, true},   // a click
      {{2000, 1500}, Qt::RightButton, {60, 70}, {40, 30}, false},  // a drag that scrolls
      {{24, 16}, Qt::RightButton, {60, 70}, {0, 0}, true},         // the picture fits
      {{2000, 1500}, Qt::LeftButton, {60, 70}, {0, 0}, false},     // left does neither
  };
  auto* menu = Main().findChild<QMenu*>("PopupMenu1");
  for (const auto& c : cases) {
    Main().ShowNewPicture(Bitmap32(c.picture.width(), c.picture.height()), true);
    Mouse(QEvent::MouseButtonPress, {100, 100}, c.button, c.button);
    Mouse(QEvent::MouseMove, c.to, Qt::NoButton, c.button);
    Mouse(QEvent::MouseButtonRelease, c.to, c.button, Qt::NoButton);
    EXPECT_EQ(QPoint(Bar(Qt::Horizontal)->value(), Bar(Qt::Vertical)->value()), c.scrolled);
    EXPECT_EQ(menu->isVisible(), c.menu) << c.to.x();
    menu->hide();
  }
}

TEST_F(View, RotationTurnsBothPicturesAndResetsTheHistory) {
  Main().ShowNewPicture(Bitmap32(640, 480, Pixel{9, 9, 9, 255}), true);
  Main().SetWorkingPicture(Bitmap32(640, 480, Pixel{5, 5, 5, 255}), true);
  Click("SpeedButton6");
  Bar(Qt::Horizontal)->setValue(50);
  Click("SpeedButton12");
  EXPECT_EQ(Main().Document().Working(), Bitmap32(478, 640, Pixel{5, 5, 5, 255}));
  EXPECT_EQ(Main().Document().Source(), Bitmap32(478, 640, Pixel{9, 9, 9, 255}));
  EXPECT_FALSE(MainChild<QToolButton>("SpeedButton3")->isEnabled());
  EXPECT_EQ(Display(), QSize(598, 800));
  EXPECT_EQ(Bar(Qt::Horizontal)->value(), 0);
  // Too thin to turn: said so, and nothing changes.
  Main().ShowNewPicture(Bitmap32(2, 1, Pixel{1, 1, 1, 255}), true);
  Click("SpeedButton12");
  EXPECT_EQ(Main().Document().Working(), Bitmap32(2, 1, Pixel{1, 1, 1, 255}));
  EXPECT_EQ(platform_.messages.size(), 1u);
}

}  // namespace
}  // namespace quillane
