#include <QFrame>
#include <QLineEdit>
#include <QPushButton>
#include <QToolButton>

#include "tests/gui/gui_fixture.h"

namespace quillane {
namespace {

using ToolWindows = GuiTest;

QString EntryName(const EffectSpec& spec) {
  QString name = QString::fromStdString(spec.menuHandler);
  name.chop(5);  // "Click"
  return name;
}

int VisibleToolWindows(TMyPicture& main) {
  int visible = 0;
  for (const EffectSpec* spec : Effects())
    if (main.ToolWindowAt(spec->toolNumber)->isVisible()) ++visible;
  return visible;
}

TEST_F(ToolWindows, EveryMenuEntryOpensItsOwnWindowAloneBesideTheMainWindow) {
  const QRect main = Main().frameGeometry();
  for (const EffectSpec* spec : Effects()) {
    QAction* entry = MenuAction(EntryName(*spec));
    ASSERT_NE(entry, nullptr) << spec->menuHandler;
    entry->trigger();
    EXPECT_TRUE(Tool(spec->toolNumber).isVisible()) << spec->windowClass;
    EXPECT_EQ(Main().ActiveTool(), spec->toolNumber) << spec->windowClass;
    EXPECT_EQ(VisibleToolWindows(Main()), 1) << spec->windowClass;
    // Above the main window only, not above every other program.
    EXPECT_EQ(Tool(spec->toolNumber).parentWidget(), &Main());
    const Qt::WindowFlags flags = Tool(spec->toolNumber).windowFlags();
    EXPECT_EQ(flags & Qt::WindowType_Mask, Qt::Tool);
    EXPECT_FALSE(flags.testFlag(Qt::WindowStaysOnTopHint));
    const QRect frame = Tool(spec->toolNumber).frameGeometry();
    EXPECT_EQ(frame.topLeft(), QPoint(main.right() - frame.width() - 24, main.top() + 84));
  }
}

TEST_F(ToolWindows, OpeningAnotherWindowClosesTheOpenOne) {
  MenuAction("Pencilsketch1")->trigger();
  ASSERT_EQ(Main().ActiveTool(), 1);

  // The pencil window closes first (the number is 0 then), and only then Emboss opens.
  int activeWhenPencilClosed = -1;
  struct CloseWatcher : QObject {
    TMyPicture* main;
    int* seen;
    bool eventFilter(QObject*, QEvent* event) override {
      if (event->type() == QEvent::Hide) *seen = main->ActiveTool();
      return false;
    }
  } watcher;
  watcher.main = &Main();
  watcher.seen = &activeWhenPencilClosed;
  Tool(1).installEventFilter(&watcher);

  MenuAction("Emboss1")->trigger();
  EXPECT_EQ(activeWhenPencilClosed, 0);
  EXPECT_FALSE(Tool(1).isVisible());
  EXPECT_TRUE(Tool(15).isVisible());
  EXPECT_EQ(Main().ActiveTool(), 15);
  Tool(1).removeEventFilter(&watcher);
  // The close box clears the number; with nothing open, closing the open tool closes nothing.
  Tool(15).close();
  EXPECT_EQ(Main().ActiveTool(), 0);
  EXPECT_FALSE(Tool(15).isVisible());
  Main().closetool();
  EXPECT_EQ(Main().ActiveTool(), 0);
}

TEST_F(ToolWindows, ChoosingTheOpenWindowAgainShowsItAfresh) {
  MenuAction("Pencilsketch1")->trigger();
  Tool(1).findChild<QPushButton*>("Button1")->click();
  auto* colorUp = Tool(1).findChild<QToolButton*>("Button2");
  ASSERT_TRUE(colorUp->isEnabled());
  MenuAction("Pencilsketch1")->trigger();
  EXPECT_TRUE(Tool(1).isVisible());
  EXPECT_EQ(Main().ActiveTool(), 1);
  EXPECT_FALSE(colorUp->isEnabled());
}

TEST_F(ToolWindows, BatchPanelFoldsOutAndBackIn) {
  for (const EffectSpec* spec : Effects()) {
    ToolWindow& window = Tool(spec->toolNumber);
    auto* toggle = window.findChild<QToolButton*>("SpeedButton1");
    auto* panel = window.findChild<QFrame*>("Panel2");
    if (!spec->HasBatchPanel()) {
      EXPECT_EQ(toggle, nullptr) << spec->windowClass;
      EXPECT_EQ(panel, nullptr) << spec->windowClass;
      continue;
    }
    ASSERT_NE(toggle, nullptr) << spec->windowClass;
    ASSERT_NE(panel, nullptr) << spec->windowClass;
    const auto expectOpen = [&](bool open) {
      EXPECT_EQ(window.height(), open ? spec->expandedHeight : spec->collapsedHeight)
          << spec->windowClass;
      EXPECT_EQ(panel->isVisible(), open) << spec->windowClass;
      EXPECT_EQ(toggle->icon().cacheKey(),
                (open ? Main().UpArrowIcon() : Main().DownArrowIcon()).cacheKey());
    };
    MenuAction(EntryName(*spec))->trigger();
    expectOpen(false);
    toggle->click();
    expectOpen(true);
    toggle->click();
    expectOpen(false);
  }
}

TEST_F(ToolWindows, FoldersAreSharedBetweenWindows) {
  MenuAction("Emboss1")->trigger();
  platform_.folderAnswers.push_back(QString("/photos/in"));
  ToolChild<QToolButton>(15, "SpeedButton2")->click();
  EXPECT_EQ(ToolChild<QLineEdit>(15, "Edit10")->text(), "/photos/in");
  ASSERT_EQ(platform_.folderRequests.size(), 1u);
  EXPECT_EQ(platform_.folderRequests[0].startFolder, "");

  // The output folder dialog opens at the input folder.
  platform_.folderAnswers.push_back(QString("/photos/out"));
  ToolChild<QToolButton>(15, "SpeedButton3")->click();
  EXPECT_EQ(ToolChild<QLineEdit>(15, "Edit11")->text(), "/photos/out");
  EXPECT_EQ(platform_.folderRequests[1].startFolder, "/photos/in");

  MenuAction("Pencilsketch1")->trigger();
  EXPECT_EQ(ToolChild<QLineEdit>(1, "Edit1")->text(), "/photos/in");
  EXPECT_EQ(ToolChild<QLineEdit>(1, "Edit2")->text(), "/photos/out");

  // A cancelled dialog keeps the folder, and the field shows the shared folder again.
  ToolChild<QLineEdit>(1, "Edit1")->setText("typed");
  ToolChild<QToolButton>(1, "SpeedButton2")->click();
  EXPECT_EQ(Main().InputFolder(), "/photos/in");
  EXPECT_EQ(ToolChild<QLineEdit>(1, "Edit1")->text(), "/photos/in");
}

}  // namespace
}  // namespace quillane
