#include <QLineEdit>
#include <QPushButton>
#include <QSlider>
#include <QToolButton>

#include "tests/gui/gui_fixture.h"

namespace quillane {
namespace {

using ToolWindows = GuiTest;

QString EntryName(const EffectSpec& spec) {
  return QString::fromStdString(spec.menuObjectName);
}

int VisibleToolWindows(MainWindow& main) {
  int visible = 0;
  for (const EffectSpec* spec : Effects())
    if (main.ToolWindowAt(spec->toolNumber)->isVisible()) ++visible;
  return visible;
}

TEST_F(ToolWindows, EveryMenuEntryOpensItsOwnWindowAlone) {
  for (const EffectSpec* spec : Effects()) {
    QAction* entry = MenuAction(EntryName(*spec));
    ASSERT_NE(entry, nullptr) << spec->menuObjectName;
    entry->trigger();
    EXPECT_TRUE(Tool(spec->toolNumber).isVisible()) << spec->windowObjectName;
    EXPECT_EQ(Main().ActiveTool(), spec->toolNumber) << spec->windowObjectName;
    EXPECT_EQ(VisibleToolWindows(Main()), 1) << spec->windowObjectName;
  }
}

// Switching windows is the menu test's; here the close box clears the number, and with nothing
// open, closing the open tool closes nothing.
TEST_F(ToolWindows, TheCloseBoxClearsTheOpenWindow) {
  MenuAction("Emboss1")->trigger();
  Tool(kEmboss).close();
  EXPECT_EQ(Main().ActiveTool(), 0);
  Main().CloseToolWindow();
  EXPECT_EQ(Main().ActiveTool(), 0);
}

TEST_F(ToolWindows, ChoosingTheOpenWindowAgainShowsItAfresh) {
  MenuAction("Pencilsketch1")->trigger();
  Tool(kPencilSketch).findChild<QPushButton*>("Button1")->click();
  auto* colorUp = Tool(kPencilSketch).findChild<QToolButton*>("Button2");
  ASSERT_TRUE(colorUp->isEnabled());
  MenuAction("Pencilsketch1")->trigger();
  EXPECT_TRUE(Tool(kPencilSketch).isVisible());
  EXPECT_EQ(Main().ActiveTool(), 1);
  EXPECT_FALSE(colorUp->isEnabled());
}

// The size a window has when its show event arrives.
class SizeWhenShown : public QObject {
 public:
  QSize size;
  bool eventFilter(QObject* watched, QEvent* event) override {
    if (event->type() == QEvent::Show) size = static_cast<QWidget*>(watched)->size();
    return false;
  }
};

// Color Filter and Color variety grew while first being shown, which on a desktop took the
// position for the window's inside and opened them a title bar higher than placed.
TEST_F(ToolWindows, EveryWindowHasItsSizeAndPlaceBeforeItIsFirstShown) {
  for (const EffectSpec* spec : Effects()) {
    SCOPED_TRACE(spec->windowObjectName);
    ToolWindow& window = Tool(spec->toolNumber);
    SizeWhenShown shown;
    window.installEventFilter(&shown);
    Main().OpenTool(spec->toolNumber);
    window.removeEventFilter(&shown);
    EXPECT_EQ(window.size(), shown.size);
    EXPECT_GE(window.height(), window.minimumSizeHint().height()) << "nothing cut off";
    const QRect main = Main().frameGeometry();
    EXPECT_EQ(window.frameGeometry().topLeft(),
              QPoint(main.right() + 1 - window.frameGeometry().width() - 25, main.top() + 84));
  }
}

// In Vuzorar, HSL adjust and Stria each slider started where its own caption ended.
TEST_F(ToolWindows, TheSlidersOfAWindowLineUp) {
  int windowsWithSeveral = 0;
  for (const EffectSpec* spec : Effects()) {
    SCOPED_TRACE(spec->windowObjectName);
    ToolWindow& window = Tool(spec->toolNumber);
    Main().OpenTool(spec->toolNumber);
    const QList<QSlider*> sliders = window.findChildren<QSlider*>();
    if (sliders.size() < 2) continue;
    ++windowsWithSeveral;
    const QRect first(sliders[0]->mapTo(&window, QPoint()), sliders[0]->size());
    for (QSlider* slider : sliders) {
      EXPECT_EQ(slider->mapTo(&window, QPoint()).x(), first.x())
          << slider->objectName().toStdString();
      EXPECT_EQ(slider->width(), first.width()) << slider->objectName().toStdString();
    }
  }
  EXPECT_GE(windowsWithSeveral, 4);
}

TEST_F(ToolWindows, FoldersAreSharedBetweenWindows) {
  MenuAction("Emboss1")->trigger();
  platform_.folderAnswers.push_back(QString("/photos/in"));
  ToolChild<QToolButton>(kEmboss, "SpeedButton2")->click();
  EXPECT_EQ(ToolChild<QLineEdit>(kEmboss, "Edit10")->text(), "/photos/in");

  // The output folder dialog opens at the input folder.
  platform_.folderAnswers.push_back(QString("/photos/out"));
  ToolChild<QToolButton>(kEmboss, "SpeedButton3")->click();
  EXPECT_EQ(ToolChild<QLineEdit>(kEmboss, "Edit11")->text(), "/photos/out");
  EXPECT_EQ(platform_.folderRequests[1].startFolder, "/photos/in");

  MenuAction("Pencilsketch1")->trigger();
  EXPECT_EQ(ToolChild<QLineEdit>(kPencilSketch, "Edit1")->text(), "/photos/in");
  EXPECT_EQ(ToolChild<QLineEdit>(kPencilSketch, "Edit2")->text(), "/photos/out");

  // A cancelled dialog keeps the folder, and the field shows the shared folder again.
  ToolChild<QLineEdit>(kPencilSketch, "Edit1")->setText("typed");
  ToolChild<QToolButton>(kPencilSketch, "SpeedButton2")->click();
  EXPECT_EQ(Main().InputFolder(), "/photos/in");
  EXPECT_EQ(ToolChild<QLineEdit>(kPencilSketch, "Edit1")->text(), "/photos/in");
}

}  // namespace
}  // namespace quillane
