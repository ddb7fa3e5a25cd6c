#include <QApplication>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QSignalSpy>
#include <QSlider>
#include <QStatusBar>
#include <QToolButton>
#include <filesystem>
#include <stdexcept>

#include "codecs/picture_file.h"
#include "effects/mono/bw_sketch.h"
#include "tests/gui/window_helpers.h"
#include "ui/batch_done_dialog.h"
#include "ui/path_field.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

// The Pencil sketch window with its batch panel open, and an input folder holding three
// pictures the scan lists, a text file and a subfolder it does not.
class BatchWindow : public WindowTest {
 protected:
  void SetUp() override {
    WindowTest::SetUp();
    std::filesystem::create_directories(LocalPath("in/d.jpg"));
    SaveJpeg(TestPicture(30, 20), LocalPath("in/a.jpg"));
    SaveBitmap24(TestPicture(17, 11), LocalPath("in/b.bmp"));
    SaveJpeg(TestPicture(25, 25), LocalPath("in/c.jpeg"));
    WriteBytes(LocalPath("in/notes.txt"), "not a picture");
    MenuAction("Pencilsketch1")->trigger();
    Press(kPencilSketch, "SpeedButton1");
  }

  QListWidget* ListView1() { return MainChild<QListWidget>("ListView1"); }
  BatchDoneDialog& Completion() { return Main().BatchDone(); }

  void BrowseInput(const QString& folder) {
    platform_.folderAnswers.push_back(folder);
    Press(kPencilSketch, "SpeedButton2");
  }
  void Convert(const QString& input, const QString& output) {
    Child<QLineEdit>(kPencilSketch, "Edit1")->setText(input);
    Child<QLineEdit>(kPencilSketch, "Edit2")->setText(output);
    Press(kPencilSketch, "SpeedButton4");
  }
};

// The pointer each time a control is enabled or disabled.
class CursorAtEnabledChange : public QObject {
 public:
  QList<Qt::CursorShape> shapes;
  bool eventFilter(QObject*, QEvent* event) override {
    if (event->type() == QEvent::EnabledChange)
      shapes << (QApplication::overrideCursor() ? QApplication::overrideCursor()->shape()
                                                : Qt::ArrowCursor);
    return false;
  }
};

QStringList Items(QListWidget* list) {
  QStringList names;
  for (int i = 0; i < list->count(); ++i) names << list->item(i)->text();
  return names;
}

TEST_F(BatchWindow, BrowseListsThePicturesOfTheChosenFolder) {
  EXPECT_TRUE(ListView1()->isHidden());
  BrowseInput(Path("in"));
  // One scan per mask, in the order *.jpg, *.jpeg, *.bmp, *.wmf.
  const QStringList expected = {"a.jpg", "c.jpeg", "b.bmp"};
  EXPECT_EQ(Items(ListView1()), expected);
  EXPECT_EQ(Main().BatchFiles(), expected);

  // Another folder replaces the list.
  std::filesystem::create_directories(LocalPath("other"));
  SaveBitmap24(TestPicture(), LocalPath("other/Z.BMP"));
  BrowseInput(Path("other"));
  EXPECT_EQ(Items(ListView1()), QStringList{"Z.BMP"});

  // A link loop is no folder: the user is told why at once, and nothing is listed.
  std::filesystem::create_symlink("loop", LocalPath("loop"));
  BrowseInput(Path("loop"));
  EXPECT_TRUE(Items(ListView1()).empty());
  ASSERT_EQ(platform_.messages.size(), 1u);
  EXPECT_TRUE(platform_.messages[0].text.contains("loop"))
      << platform_.messages[0].text.toStdString();
}

TEST_F(BatchWindow, ConvertWritesOnePencilSketchPerPicture) {
  Main().SetLineArt(true);
  Slide(kPencilSketch, "TrackBar1", 70);
  BrowseInput(Path("in"));
  QSignalSpy barMessages(Main().statusBar(), &QStatusBar::messageChanged);
  // "Color up" becomes available after the first picture is converted.
  CursorAtEnabledChange cursor;
  Child<QToolButton>(1, "Button2")->installEventFilter(&cursor);

  // The output folder does not exist yet, several levels deep; blanks around the names go.
  Convert("  " + Path("in") + " ", Path("out/deeper/still") + "  ");

  // The folder named like a picture is told as skipped, with what it is.
  EXPECT_TRUE(platform_.errors.empty());
  ASSERT_EQ(platform_.messages.size(), 1u);
  EXPECT_EQ(platform_.messages[0].text, "These pictures were skipped and have no output file:\n" +
                                            Path("in/d.jpg") +
                                            " is not a picture file: it is a folder");
  EXPECT_EQ(Entries("out/deeper/still"),
            (std::vector<std::string>{"a-PencilSketch.jpg", "b-PencilSketch.jpg",
                                      "c.-PencilSketch.jpg"}));
  // The view shows the last picture's result; the document and the bytes are the batch loop's
  // own tests.
  EXPECT_EQ(Main().findChild<PictureView*>("Image1")->Image(),
            OpaqueImage(PencilSketch(Input("b.bmp"), PencilToneMode::Contrast, 70, 128)));
  EXPECT_FALSE(Main().LineArt());
  EXPECT_TRUE(Child<QToolButton>(kPencilSketch, "Button2")->isEnabled());
  EXPECT_EQ(Main().OutputFolder(), Path("out/deeper/still"));

  // The busy cursor while it ran, and no text in the status bar.
  EXPECT_EQ(cursor.shapes, QList<Qt::CursorShape>{Qt::WaitCursor});
  EXPECT_EQ(QApplication::overrideCursor(), nullptr);
  EXPECT_EQ(barMessages.count(), 0);

  // The notice's button to the output folder is the desktop test's.
  ASSERT_TRUE(Completion().isVisible());
  EXPECT_FALSE(Completion().isModal());
  Completion().findChild<QToolButton*>("SpeedButton1")->click();
  EXPECT_FALSE(Completion().isVisible());
}

// The fields showed only the end of a long folder ("orpus/batch").
TEST_F(BatchWindow, ALongFolderShowsItsStartAndItsEnd) {
  const QString folder = "/home/somebody/Pictures/holidays 2026/corpus/batch";
  auto* field = Child<PathField>(1, "Edit1");
  field->setText(folder);
  // The start of the path, then the folder's own name whole.
  const QString shown = field->ShownText();
  const qsizetype gap = shown.indexOf(QChar(0x2026));
  EXPECT_GT(gap, 1) << shown.toStdString();
  EXPECT_TRUE(folder.startsWith(shown.left(gap))) << shown.toStdString();
  EXPECT_EQ(shown.mid(gap + 1), "/batch");
  EXPECT_EQ(field->text(), folder) << "the field keeps the whole path";
  field->setText("/in");
  EXPECT_EQ(field->ShownText(), "/in");
}

// The loop's refusals and stops are its own tests; the window shows them and changes nothing.
TEST_F(BatchWindow, RefusalsAndStopsAreShownAndChangeNothing) {
  const Bitmap32 before = Main().Document().Working();
  Convert(Path("nowhere"), Path("out"));
  // Without a Browse the list is empty, whatever folder is typed.
  Convert(" " + Path("in") + " ", Path("out"));
  EXPECT_EQ(platform_.messages,
            (std::vector<ScriptedPlatform::Message>{{"Sorry", "Input Director in not exist."},
                                                    {"Sorry", "There is no picture to convert."}}));
  // The typed input folder is the shared one now; the output folder is not taken.
  EXPECT_EQ(Main().InputFolder(), Path("in"));
  EXPECT_EQ(Main().OutputFolder(), "");

  BrowseInput(Path("in"));
  WriteBytes(LocalPath("taken"), "a file where the output folder should be");
  Convert(Path("in"), Path("taken"));
  ASSERT_EQ(platform_.errors.size(), 1u);
  EXPECT_TRUE(platform_.errors[0].contains(Path("taken")));
  EXPECT_FALSE(Completion().isVisible());
  EXPECT_EQ(Main().Document().Working(), before);
}

TEST_F(BatchWindow, PicturesThatCannotBeLoadedAreSkippedAndListedAfterwards) {
  WriteBytes(LocalPath("in/bad.jpg"), "\xFF\xD8 not a JPEG at all");
  SaveBitmap24(TestPicture(), LocalPath("in/gone.bmp"));
  BrowseInput(Path("in"));
  std::filesystem::remove(LocalPath("in/gone.bmp"));

  Convert(Path("in"), Path("out"));
  ASSERT_EQ(platform_.messages.size(), 1u);
  const QStringList lines = platform_.messages[0].text.split('\n');
  ASSERT_EQ(lines.size(), 4);
  EXPECT_EQ(lines[0], "These pictures were skipped and have no output file:");
  EXPECT_EQ(lines[1], Path("in/d.jpg") + " is not a picture file: it is a folder");
  EXPECT_TRUE(lines[2].startsWith("\"" + Path("in/bad.jpg") + "\": ")) << lines[2].toStdString();
  EXPECT_EQ(lines[3], Path("in/gone.bmp") + " is not a valid format");
  // The rest converted, so the loop ran to its end.
  EXPECT_TRUE(Completion().isVisible());
}

// An effect whose batch routine records a history step, then one that fails.
TEST_F(BatchWindow, EachConvertedPictureGoesThroughTheWindowsOwnSteps) {
  BrowseInput(Path("in"));
  EffectSpec recording = *FindEffect(1);
  recording.batchPushesHistory = true;
  recording.statusText = "Recorded";
  recording.routine = [](const EffectInput& in) {
    return Bitmap32(in.source.Width(), 3, Pixel{0, 0, 0, 255});
  };
  ToolWindow window(recording, Main(), &Main());
  window.show();
  window.findChild<QToolButton*>("SpeedButton1")->click();
  window.findChild<QLineEdit*>("Edit2")->setText(Path("out"));
  window.findChild<QToolButton*>("SpeedButton4")->click();
  EXPECT_EQ(Main().Document().UndoCount(), 3);
  EXPECT_EQ(Main().StatusText(), "Recorded");
  Completion().close();

  // The picture the effect failed on stays loaded, and the view shows it.
  recording.routine = [](const EffectInput&) -> Bitmap32 { throw std::runtime_error("no"); };
  window.findChild<QToolButton*>("SpeedButton4")->click();
  EXPECT_EQ(platform_.errors.size(), 1u);
  EXPECT_EQ(Main().findChild<PictureView*>("Image1")->Image(), OpaqueImage(Input("a.jpg")));
}

}  // namespace
}  // namespace quillane
