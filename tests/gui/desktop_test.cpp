// The main window as a desktop program: keyboard, menus, drag and drop, the recent list, its
// tool windows' place among the windows, and the boxes and dialogs of the real platform.
#include <QDropEvent>
#include <QFileDialog>
#include <QHeaderView>
#include <QLineEdit>
#include <QMessageBox>
#include <QMimeData>
#include <QSignalSpy>
#include <QTest>
#include <QTimer>
#include <QToolButton>
#include <QTreeView>
#include <QUrl>
#include <functional>

#include "app/qt_messages.h"
#include "app/qt_platform.h"
#include "app/settings.h"
#include "batch/batch_convert_ok.h"
#include "codecs/picture_file.h"
#include "tests/gui/temp_folder.h"

namespace quillane {
namespace {

class Desktop : public FileGuiTest {
 protected:
  void SetUp() override {
    FileGuiTest::SetUp();
    ProgramSettings().clear();
    Main().activateWindow();
    ASSERT_TRUE(QTest::qWaitForWindowActive(&Main()));
  }

  // A picture file of the given width written into the test's folder.
  QString Picture(const QString& name, int width) {
    SaveBitmap24(TestPicture(width, 3), LocalPath(name));
    return Path(name);
  }

  static QStringList RecentMenuTexts(QMenu* menu) {
    QStringList texts;
    for (QAction* a : menu->actions()) texts << a->data().toString();
    return texts;
  }
};

TEST_F(Desktop, StandardShortcutsRunTheirCommands) {
  ASSERT_TRUE(Main().ApplyEffect(Giving(TestPicture(5, 5), "Effect"), {}, true));
  QSignalSpy print(MainChild<QToolButton>("SpeedButton10"), &QToolButton::clicked);
  QSignalSpy closed(&Main(), &TMyPicture::closed);
  struct Case {
    Qt::Key key;
    Qt::KeyboardModifiers modifiers;
    std::function<bool()> done;
  };
  const Case cases[] = {
      {Qt::Key_O, Qt::ControlModifier, [&] { return platform_.openFilters.size() == 1; }},
      {Qt::Key_S, Qt::ControlModifier, [&] { return platform_.saveFilters.size() == 1; }},
      {Qt::Key_Z, Qt::ControlModifier, [&] { return Main().StatusText() == "Undo"; }},
      {Qt::Key_Z, Qt::ControlModifier | Qt::ShiftModifier,
       [&] { return Main().StatusText() == "Redo"; }},
      {Qt::Key_P, Qt::ControlModifier, [&] { return print.count() == 1; }},
      {Qt::Key_Q, Qt::ControlModifier, [&] { return closed.count() == 1; }},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(QKeySequence(c.key | c.modifiers).toString().toStdString());
    EXPECT_FALSE(c.done());
    QTest::keyClick(&Main(), c.key, c.modifiers);
    EXPECT_TRUE(c.done());
  }
  // The menus show them beside their entries.
  EXPECT_EQ(MenuAction("Open1")->shortcut(), QKeySequence(QKeySequence::Open));
  EXPECT_EQ(MenuAction("Exit1")->shortcut(), QKeySequence(Qt::CTRL | Qt::Key_Q));
}

TEST_F(Desktop, MenusOpenWithAltLettersAndShowTheirCaptionsUnchanged) {
  struct Case {
    const char* menu;
    const char* shown;
    Qt::Key letter;
  };
  const Case cases[] = {{"File1", " File", Qt::Key_F},
                        {"Edit1", " Edit", Qt::Key_E},
                        {"BW1", " B&W", Qt::Key_B},
                        {"Color1", " Color", Qt::Key_C},
                        {"ColorAdjust1", " ColorAdjust", Qt::Key_A},
                        {"Veins1", " Veins", Qt::Key_V},
                        {"Help1", " Help", Qt::Key_H}};
  for (const Case& c : cases) {
    SCOPED_TRACE(c.menu);
    auto* menu = Main().menuBar()->findChild<QMenu*>(c.menu);
    ASSERT_NE(menu, nullptr);
    EXPECT_EQ(QKeySequence::mnemonic(menu->title()), QKeySequence(Qt::ALT | c.letter));
    QString shown = menu->title();
    shown.replace("&&", "\x01").remove('&').replace('\x01', '&');
    EXPECT_EQ(shown, c.shown);
  }
}

TEST_F(Desktop, ADroppedPictureFileOpensAsFileOpenDoes) {
  const QString picture = Picture("dropped.bmp", 7);
  Main().OpenTool(15);
  auto drop = [&](const QList<QUrl>& urls) {
    QMimeData data;
    data.setUrls(urls);
    QDragEnterEvent enter(QPoint(50, 50), Qt::CopyAction, &data, Qt::LeftButton, Qt::NoModifier);
    QCoreApplication::sendEvent(&Main(), &enter);
    QDropEvent dropped(QPointF(50, 50), Qt::CopyAction, &data, Qt::LeftButton, Qt::NoModifier);
    QCoreApplication::sendEvent(&Main(), &dropped);
    return enter.isAccepted();
  };
  // Two files, or a file that is not on this computer, are refused and change nothing.
  EXPECT_FALSE(drop({QUrl::fromLocalFile(picture), QUrl::fromLocalFile(picture)}));
  EXPECT_FALSE(drop({QUrl("https://example.org/dropped.bmp")}));
  EXPECT_EQ(Main().Document().Working().Width(), 24);
  EXPECT_EQ(Main().ActiveTool(), 15);

  EXPECT_TRUE(drop({QUrl::fromLocalFile(picture)}));
  EXPECT_EQ(Main().Document().Working(), Main().Document().Opened());
  EXPECT_EQ(Main().Document().Working().Width(), 7);
  EXPECT_EQ(Main().ActiveTool(), 0);
  EXPECT_EQ(Main().RecentFiles(), QStringList{picture});
}

TEST_F(Desktop, OpenRecentListsTheLastTenPicturesNewestFirst) {
  QStringList opened;
  for (int i = 1; i <= 12; ++i) {
    opened.prepend(Picture(QString("p%1.bmp").arg(i), i));
    ASSERT_TRUE(Main().OpenPictureFile(opened.first()));
  }
  ASSERT_TRUE(Main().OpenPictureFile(opened[5]));  // p7 again: back to the top, once
  QStringList expected = opened.mid(0, 10);
  expected.move(5, 0);
  EXPECT_EQ(Main().RecentFiles(), expected);
  auto* menu = Main().menuBar()->findChild<QMenu*>("OpenRecent1");
  ASSERT_NE(menu, nullptr);
  EXPECT_EQ(RecentMenuTexts(menu), expected);

  // An unreadable picture is not listed.
  WriteBytes(LocalPath("bad.bmp"), "not a bitmap");
  EXPECT_FALSE(Main().OpenPictureFile(Path("bad.bmp")));
  EXPECT_EQ(Main().RecentFiles(), expected);

  // A window started later offers the same list; choosing an entry opens that picture.
  ScriptedPlatform otherPlatform;
  TMyPicture other(otherPlatform, TestPicture());
  auto* otherMenu = other.menuBar()->findChild<QMenu*>("OpenRecent1");
  ASSERT_EQ(RecentMenuTexts(otherMenu), expected);
  otherMenu->actions()[2]->trigger();
  EXPECT_EQ(other.Document().Working().Width(), QFileInfo(expected[2]).baseName().mid(1).toInt());
}

TEST_F(Desktop, AMissingRecentPictureIsDroppedWithAMessage) {
  const QString kept = Picture("kept.bmp", 4);
  const QString gone = Picture("gone.bmp", 6);
  ASSERT_TRUE(Main().OpenPictureFile(kept));
  ASSERT_TRUE(Main().OpenPictureFile(gone));
  ASSERT_TRUE(QFile::remove(gone));

  auto* menu = Main().menuBar()->findChild<QMenu*>("OpenRecent1");
  menu->actions()[0]->trigger();
  EXPECT_EQ(platform_.messages,
            (std::vector<ScriptedPlatform::Message>{
                {"Sorry", gone + " no longer exists; it was taken off the recent list."}}));
  EXPECT_EQ(Main().RecentFiles(), QStringList{kept});
  EXPECT_EQ(RecentMenuTexts(menu), QStringList{kept});
  EXPECT_EQ(Main().Document().Working().Width(), 6);  // unchanged
}

TEST_F(Desktop, ToolWindowsFloatAboveTheMainWindowOnly) {
  for (int number = 1; number <= 17; ++number) {
    SCOPED_TRACE(number);
    const Qt::WindowFlags flags = Tool(number).windowFlags();
    EXPECT_EQ(flags & Qt::WindowType_Mask, Qt::Tool);
    EXPECT_FALSE(flags.testFlag(Qt::WindowStaysOnTopHint));
    EXPECT_EQ(Tool(number).parentWidget(), &Main());
  }
  EXPECT_FALSE(Main().BatchConvertOk().windowFlags().testFlag(Qt::WindowStaysOnTopHint));
  EXPECT_EQ(Main().BatchConvertOk().parentWidget(), &Main());
}

TEST_F(Desktop, EnterPressesTheToolWindowsOkAndEscapeClosesIt) {
  Main().OpenTool(15);
  QTest::keyClick(&Tool(15), Qt::Key_Return);
  EXPECT_EQ(Main().StatusText(), "Emboss");
  EXPECT_TRUE(Main().findChild<QAction*>("Undo1")->isEnabled());
  QTest::keyClick(&Tool(15), Qt::Key_Escape);
  EXPECT_FALSE(Tool(15).isVisible());
  EXPECT_EQ(Main().ActiveTool(), 0);
}

TEST_F(Desktop, BatchFolderFieldsShowTheWholePathAsTooltip) {
  const QString longFolder = Path(QString(120, 'x'));
  Main().SetInputFolder(longFolder);
  Main().OpenTool(15);
  auto* field = ToolChild<QLineEdit>(15, Tool(15).Spec().inputField.c_str());
  ASSERT_NE(field, nullptr);
  EXPECT_EQ(field->toolTip(), longFolder);
}

TEST_F(Desktop, GoOutputFolderSaysSoWhenNoFileManagerStarts) {
  Main().SetOutputFolder(Path("out"));
  platform_.fileManagerStarts = false;
  Main().ShowBatchConvertOk();
  Main().BatchConvertOk().findChild<QToolButton*>("SpeedButton2")->click();
  EXPECT_EQ(platform_.openedFolders, std::vector<QString>{Path("out")});
  ASSERT_EQ(platform_.messages.size(), 1u);
  EXPECT_TRUE(platform_.messages[0].text.startsWith("No file manager could be started to show " +
                                                    Path("out")));
  EXPECT_FALSE(Main().BatchConvertOk().isVisible());
}

// The real platform: what owns the message box that a call raises, found while it is shown.
QWidget* OwnerOfMessageBox(const std::function<void()>& raise) {
  QWidget* owner = nullptr;
  QTimer::singleShot(0, [&] {
    if (auto* box = qobject_cast<QMessageBox*>(QApplication::activeModalWidget())) {
      owner = box->parentWidget();
      box->done(0);
    }
  });
  raise();
  return owner;
}

TEST_F(Desktop, MessageBoxesBelongToTheWindowThatRaisedThem) {
  QtPlatformServices real;
  Main().OpenTool(15);
  struct Case {
    QWidget* active;
    std::function<void()> raise;
  };
  const Case cases[] = {
      {&Tool(15), [&] { real.ShowMessage("Sorry", "from the tool window"); }},
      {&Tool(15), [&] { real.ShowError("an error in the tool window"); }},
      {&Main(), [&] { real.ShowMessage("Sorry", "from the main window"); }},
  };
  for (const Case& c : cases) {
    c.active->activateWindow();
    QCoreApplication::processEvents();
    ASSERT_EQ(QApplication::activeWindow(), c.active);
    EXPECT_EQ(OwnerOfMessageBox(c.raise), c.active);
  }
}

TEST_F(Desktop, OpenAndSaveDialogsRememberTheirOwnFoldersAndShowWholeColumnTitles) {
  QtPlatformServices real;
  ASSERT_TRUE(QDir(Path("")).mkpath("opened"));
  ASSERT_TRUE(QDir(Path("")).mkpath("saved"));
  Picture("opened/a.bmp", 2);
  // Answers the dialog shown next with path, after noting the folder it opened in and checking
  // that every column title fits.
  auto answer = [&](const QString& path, QString& startedIn) {
    QTimer::singleShot(0, [&, path] {
      auto* dialog = qobject_cast<QFileDialog*>(QApplication::activeModalWidget());
      ASSERT_NE(dialog, nullptr);
      startedIn = dialog->directory().absolutePath();
      auto* view = dialog->findChild<QTreeView*>("treeView");
      ASSERT_NE(view, nullptr);
      QHeaderView* header = view->header();
      for (int i = 0; i < header->count(); ++i) {
        const QString title = view->model()->headerData(i, Qt::Horizontal).toString();
        EXPECT_GT(header->sectionSize(i), header->fontMetrics().horizontalAdvance(title))
            << title.toStdString();
      }
      dialog->selectFile(path);
      QMetaObject::invokeMethod(dialog, "accept");
    });
  };
  QString startedIn;
  answer(Path("opened/a.bmp"), startedIn);
  ASSERT_TRUE(real.OpenPictureDialog("*.bmp|*.bmp"));
  answer(Path("saved/b.jpg"), startedIn);
  ASSERT_TRUE(real.SavePictureDialog("*.jpg|*.jpg"));
  EXPECT_NE(startedIn, Path("opened"));  // the save dialog has a folder of its own

  answer(Path("opened/a.bmp"), startedIn);
  ASSERT_TRUE(real.OpenPictureDialog("*.bmp|*.bmp"));
  EXPECT_EQ(startedIn, Path("opened"));
  answer(Path("saved/c.jpg"), startedIn);
  ASSERT_TRUE(real.SavePictureDialog("*.jpg|*.jpg"));
  EXPECT_EQ(startedIn, Path("saved"));
}

TEST(QtMessages, AMessageRepeatedAThousandTimesIsWrittenAFewTimes) {
  static int written = 0;
  written = 0;
  qInstallMessageHandler([](QtMsgType, const QMessageLogContext&, const QString&) { ++written; });
  LimitRepeatedQtMessages(5);
  for (int i = 0; i < 1000; ++i) qWarning("QBuffer::seek: Invalid pos: %d", 100000 + i);
  qWarning("another kind of message");
  qInstallMessageHandler(nullptr);
  EXPECT_EQ(written, 5 + 1 + 1);  // five, the line saying the rest is not shown, the other one
}

}  // namespace
}  // namespace quillane
