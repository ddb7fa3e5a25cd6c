// An effect runs on a thread of its own while the windows wait: the caller still sees the
// result at once, a second apply meanwhile is ignored, and nothing lands differently.
#include <QApplication>
#include <QLabel>
#include <QPushButton>
#include <QStatusBar>
#include <QTest>
#include <QTimer>
#include <chrono>
#include <future>

#include "document/run_effect.h"
#include "tests/gui/gui_fixture.h"

namespace quillane {
namespace {

using EffectWhileBusy = GuiTest;

Bitmap32 Flat(std::uint8_t v) {
  return Bitmap32(24, 16, Pixel{v, v, v, 255});
}

TEST_F(EffectWhileBusy, ASecondApplyWhileOneRunsIsIgnored) {
  std::promise<void> release;
  std::shared_future<void> released = release.get_future().share();
  EffectSpec slow{.statusText = "First", .routine = [released](const EffectInput&) {
                    // Bounded so that a fault cannot hang the suite.
                    released.wait_for(std::chrono::seconds(60));
                    return Flat(1);
                  }};
  bool runningMeanwhile = false, secondApplied = true;
  Qt::CursorShape cursorMeanwhile = Qt::ArrowCursor;
  QString barMeanwhile = "not read", statusMeanwhile;
  Main().SetStatusText("Before");
  QTimer::singleShot(0, [&] {
    runningMeanwhile = Main().EffectRunning();
    barMeanwhile = Main().statusBar()->currentMessage();
    statusMeanwhile = Main().StatusText();
    cursorMeanwhile =
        QApplication::overrideCursor() ? QApplication::overrideCursor()->shape() : Qt::ArrowCursor;
    secondApplied = Main().ApplyEffect(Giving(Flat(2), "Second"), {}, true);
    release.set_value();
  });
  ASSERT_TRUE(Main().ApplyEffect(slow, {}, true));
  EXPECT_TRUE(runningMeanwhile);
  EXPECT_EQ(cursorMeanwhile, Qt::WaitCursor);
  // One text says what was done last: the status line's. The bar below it stays empty.
  EXPECT_EQ(barMeanwhile, "");
  EXPECT_EQ(statusMeanwhile, "Before");
  EXPECT_FALSE(secondApplied);
  EXPECT_FALSE(Main().EffectRunning());
  EXPECT_EQ(QApplication::overrideCursor(), nullptr);
  EXPECT_EQ(Main().Document().Working(), Flat(1));
  EXPECT_EQ(Main().StatusText(), "First");
}

// Through the tool windows' OK buttons, for an effect that draws from the random sequence and
// one that does not: the same pictures, steps and random state as running them directly.
TEST_F(EffectWhileBusy, LandsAsTheEffectRunDirectly) {
  PictureDocument direct = Main().Document();
  for (const char* name : {"brume", "pencil-sketch", "brume"}) {
    const EffectSpec& effect = *FindEffectByCliName(name);
    Main().OpenTool(effect.toolNumber);
    Tool(effect.toolNumber).findChild<QPushButton*>("Button1")->click();
    RunEffect(direct, effect, {}, true);
    EXPECT_EQ(Main().Document().Working(), direct.Working()) << name;
    EXPECT_EQ(Main().Document().RandomState(), direct.RandomState()) << name;
    EXPECT_EQ(Main().Document().UndoCount(), direct.UndoCount()) << name;
    EXPECT_EQ(Main().StatusText().toStdString(), effect.statusText);
  }
}

}  // namespace
}  // namespace quillane
