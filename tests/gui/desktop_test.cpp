// The main window as a desktop program: keyboard, menus, drag and drop, the recent list, the
// place of its tool windows, and the boxes and dialogs of the real platform.
#include <QColorDialog>
#include <QFileDialog>
#include <QFileInfo>
#include <QHeaderView>
#include <QMessageBox>
#include <QMimeData>
#include <QSignalSpy>
#include <QTest>
#include <QTimer>
#include <QToolButton>
#include <QTreeView>
#include <functional>

#include "app/qt_messages.h"
#include "app/qt_platform.h"
#include "app/settings.h"
#include "codecs/picture_file.h"
#include "tests/gui/temp_folder.h"
#include "ui/batch_done_dialog.h"

namespace quillane {
namespace {

class Desktop : public FileGuiTest {
 protected:
  void SetUp() override {
    FileGuiTest::SetUp();
    ProgramSettings().clear();
    Activate(&Main());
  }
  static void Activate(QWidget* window) {
    window->activateWindow();
    QCoreApplication::processEvents();
    ASSERT_EQ(QApplication::activeWindow(), window);
  }
  // A bitmap file width pixels wide in the test's folder.
  QString Picture(const QString& name, int width) {
    SaveBitmap24(TestPicture(width, 3), LocalPath(name));
    return Path(name);
  }
  QMenu* RecentMenu(MainWindow& window) {
    return window.menuBar()->findChild<QMenu*>("OpenRecent1");
  }
  static QStringList Entries(QMenu* menu) {
    QStringList paths;
    for (QAction* a : menu->actions()) paths << a->data().toString();
    return paths;
  }
};

TEST_F(Desktop, StandardShortcutsRunTheirCommands) {
  ASSERT_TRUE(Main().ApplyEffect(Giving(TestPicture(5, 5), "Effect"), {}, true));
  // One table gives every command its keys: a menu entry's, two modifiers, and Print's, which
  // has no menu entry.
  QSignalSpy print(MainChild<QToolButton>("SpeedButton10"), &QToolButton::clicked);
  const std::pair<QKeyCombination, std::function<bool()>> cases[] = {
      {Qt::CTRL | Qt::Key_Z, [&] { return Main().StatusText() == "Undo"; }},
      {Qt::CTRL | Qt::SHIFT | Qt::Key_Z, [&] { return Main().StatusText() == "Redo"; }},
      {Qt::CTRL | Qt::Key_P, [&] { return print.count() == 1; }},
  };
  for (const auto& [keys, done] : cases) {
    SCOPED_TRACE(QKeySequence(keys).toString().toStdString());
    EXPECT_FALSE(done());
    QTest::keyClick(&Main(), keys.key(), keys.keyboardModifiers());
    EXPECT_TRUE(done());
  }
}

// Alt+V opened Veins, and the View menu had no letter at all.
TEST_F(Desktop, EveryMenuHasAnAltLetterOfItsOwn) {
  QMap<QKeySequence, QString> menus;
  for (QAction* menu : Main().menuBar()->actions()) {
    const QKeySequence alt = QKeySequence::mnemonic(menu->text());
    EXPECT_FALSE(alt.isEmpty()) << menu->text().toStdString();
    EXPECT_FALSE(menus.contains(alt))
        << menu->text().toStdString() << " and " << menus.value(alt).toStdString();
    menus.insert(alt, menu->menu()->objectName());
  }
  EXPECT_EQ(menus.size(), 8);
  const std::pair<QKeyCombination, const char*> cases[] = {{Qt::ALT | Qt::Key_V, "View1"},
                                                           {Qt::ALT | Qt::Key_I, "Veins1"}};
  for (const auto& [keys, name] : cases) {
    EXPECT_EQ(menus.value(QKeySequence(keys)), name);
    QTest::keyClick(&Main(), keys.key(), keys.keyboardModifiers());
    auto* menu = Main().menuBar()->findChild<QMenu*>(name);
    EXPECT_TRUE(menu->isVisible()) << name;
    menu->close();
  }
}

TEST_F(Desktop, ADroppedPictureFileOpensAsFileOpenDoes) {
  const QString picture = Picture("dropped.bmp", 7);
  Main().OpenTool(kEmboss);
  auto drop = [&](const QList<QUrl>& urls) {
    QMimeData data;
    data.setUrls(urls);
    QDragEnterEvent enter(QPoint(50, 50), Qt::CopyAction, &data, Qt::LeftButton, Qt::NoModifier);
    QCoreApplication::sendEvent(&Main(), &enter);
    QDropEvent dropped(QPointF(50, 50), Qt::CopyAction, &data, Qt::LeftButton, Qt::NoModifier);
    QCoreApplication::sendEvent(&Main(), &dropped);
    return enter.isAccepted();
  };
  EXPECT_FALSE(drop({QUrl::fromLocalFile(picture), QUrl::fromLocalFile(picture)}));
  EXPECT_EQ(Main().ActiveTool(), 15);
  EXPECT_TRUE(drop({QUrl::fromLocalFile(picture)}));
  EXPECT_EQ(Main().Document().Opened().Width(), 7);
  EXPECT_EQ(Main().ActiveTool(), 0);
  EXPECT_EQ(Main().RecentFiles(), QStringList{picture});
}

TEST_F(Desktop, OpenRecentListsTheLastTenPicturesNewestFirstAndDropsMissingOnes) {
  QStringList opened;
  for (int i = 1; i <= 12; ++i) {
    opened.prepend(Picture(QString("p%1.bmp").arg(i), i));
    ASSERT_TRUE(Main().OpenPictureFile(opened.first()));
  }
  ASSERT_TRUE(Main().OpenPictureFile(opened[5]));  // p7 again: back to the top, once
  QStringList expected = opened.mid(0, 10);
  expected.move(5, 0);
  EXPECT_EQ(Entries(RecentMenu(Main())), expected);
  ASSERT_TRUE(QFile::remove(expected[0]));
  RecentMenu(Main())->actions()[0]->trigger();
  EXPECT_EQ(platform_.messages,
            (std::vector<ScriptedPlatform::Message>{
                {"Sorry", expected[0] + " no longer exists; it was taken off the recent list."}}));
  EXPECT_EQ(Main().Document().Opened().Width(), 7);
  expected.removeFirst();
  EXPECT_EQ(Entries(RecentMenu(Main())), expected);
  // A window started later offers the same list.
  ScriptedPlatform otherPlatform;
  MainWindow other(otherPlatform, TestPicture());
  EXPECT_EQ(Entries(RecentMenu(other)), expected);
}

TEST_F(Desktop, GoOutputFolderSaysSoWhenNoFileManagerStarts) {
  Main().SetOutputFolder(Path("out"));
  platform_.fileManagerStarts = false;
  Main().BatchDone().OnOpenOutputFolder();
  EXPECT_EQ(platform_.openedFolders, std::vector<QString>{Path("out")});
  ASSERT_EQ(platform_.messages.size(), 1u);
  EXPECT_TRUE(platform_.messages[0].text.startsWith("No file manager could be started to show " +
                                                    Path("out")));
}

// Runs raise, which shows a modal dialog of the real platform; answer gets that dialog.
void WhileModal(const std::function<void()>& raise, const std::function<void(QDialog*)>& answer) {
  QTimer::singleShot(0, [&] { answer(qobject_cast<QDialog*>(QApplication::activeModalWidget())); });
  raise();
}

TEST_F(Desktop, MessageBoxesBelongToTheWindowThatRaisedThem) {
  QtPlatformServices real;
  Main().OpenTool(kEmboss);
  const std::pair<QWidget*, std::function<void()>> cases[] = {
      {&Tool(kEmboss), [&] { real.ShowMessage("Sorry", "from the tool window"); }},
      {&Tool(kEmboss), [&] { real.ShowError("an error in the tool window"); }},
      {&Main(), [&] { real.ShowMessage("Sorry", "from the main window"); }},
  };
  for (const auto& [active, raise] : cases) {
    Activate(active);
    QWidget* owner = nullptr;
    WhileModal(raise, [&](QDialog* box) {
      owner = box->parentWidget();
      box->done(0);
    });
    EXPECT_EQ(owner, active);
  }
}

// Through a main window on the real dialogs: the first save of a run started at home rather
// than beside the picture just opened.
TEST_F(Desktop, OpenAndSaveDialogsStartWhereTheUserWorks) {
  QtPlatformServices real;
  MainWindow window(real, TestPicture());
  window.show();
  QDir(Path("")).mkpath("opened");
  QDir(Path("")).mkpath("saved");
  Picture("opened/a.bmp", 2);
  const std::tuple<bool, QString, QString> steps[] = {// open?, file chosen, folder shown first
                                                      {true, "opened/a.bmp", ""},
                                                      {false, "saved/b.jpg", "opened"},
                                                      {true, "opened/a.bmp", "opened"},
                                                      {false, "saved/c.jpg", "saved"}};
  for (const auto& [open, file, startsIn] : steps) {
    WhileModal([&, open = open] { open ? window.OnOpen() : window.OnSave(); },
               [&, file = file, startsIn = startsIn](QDialog* d) {
                 auto* dialog = qobject_cast<QFileDialog*>(d);
                 if (!startsIn.isEmpty()) {
                   EXPECT_EQ(dialog->directory().path(), Path(startsIn)) << file.toStdString();
                 }
                 dialog->selectFile(Path(file));
                 QMetaObject::invokeMethod(dialog, "accept");
               });
  }
  EXPECT_TRUE(QFileInfo::exists(Path("saved/c.jpg")));
  EXPECT_EQ(ProgramSettings().value("dialogs/saveFolder").toString(), Path("saved"));
}

// The list cut its entries at the dialogs' first size ("73....KiB", "JPE...age").
TEST_F(Desktop, PictureDialogsShowTheirColumnsWhole) {
  QtPlatformServices real;
  QDir(Path("")).mkpath("pictures");
  WriteBytes(LocalPath("pictures/a.jpg"), std::string(75000, 'x'));
  WriteBytes(LocalPath("pictures/by the lake at dawn.jpg"), std::string(900, 'x'));
  ProgramSettings().setValue("dialogs/openFolder", Path("pictures"));
  ProgramSettings().setValue("dialogs/saveFolder", Path("pictures"));
  for (bool open : {true, false}) {
    WhileModal(
        [&] {
          open ? real.OpenPictureDialog("*.jpg|*.jpg") : real.SavePictureDialog("*.jpg|*.jpg", {});
        },
        [&](QDialog* dialog) {
          SCOPED_TRACE(open ? "open" : "save");
          auto* tree = dialog->findChild<QTreeView*>("treeView");
          const QAbstractItemView* view = tree;
          EXPECT_TRUE(
              QTest::qWaitFor([&] { return view->model()->rowCount(view->rootIndex()) == 2; }));
          QTest::qWait(20);  // the columns are fitted once the folder is read
          QHeaderView* header = tree->header();
          int total = 0;
          for (int i = 0; i < header->count(); ++i) {
            EXPECT_GE(header->sectionSize(i), view->sizeHintForColumn(i)) << i;
            EXPECT_GE(header->sectionSize(i), header->sectionSizeHint(i)) << i;
            total += header->sectionSize(i);
          }
          EXPECT_LE(total, view->viewport()->width()) << "no sideways scrolling";
          dialog->reject();
        });
  }
}

// Under GNOME the portal's colour dialog opened, without the custom colours.
TEST_F(Desktop, TheColourDialogIsTheToolkitsOwnWithItsCustomColours) {
  QtPlatformServices real;
  std::optional<std::uint32_t> chosen;
  WhileModal([&] { chosen = real.ChooseColor(0x0000FF); },
             [&](QDialog* d) {
               auto* dialog = qobject_cast<QColorDialog*>(d);
               ASSERT_NE(dialog, nullptr);
               EXPECT_TRUE(dialog->testOption(QColorDialog::DontUseNativeDialog));
               EXPECT_EQ(dialog->currentColor(), QColor(255, 0, 0));
               dialog->setCurrentColor(QColor(1, 2, 3));
               dialog->accept();
             });
  EXPECT_EQ(chosen, std::optional<std::uint32_t>(0x030201));
}

TEST(QtMessages, AMessageRepeatedAThousandTimesIsWrittenAFewTimes) {
  static int written = 0;
  qInstallMessageHandler([](QtMsgType, const QMessageLogContext&, const QString&) { ++written; });
  LimitRepeatedQtMessages(5);
  for (int i = 0; i < 1000; ++i) qWarning("QBuffer::seek: Invalid pos: %d", 100000 + i);
  qWarning("another kind of message");
  qInstallMessageHandler(nullptr);
  EXPECT_EQ(written, 5 + 1 + 1);  // five, the line saying the rest are not shown, the other one
}

}  // namespace
}  // namespace quillane
