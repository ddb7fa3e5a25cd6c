#include <QPushButton>
#include <QScrollArea>
#include <QScrollBar>
#include <QToolButton>

#include "codecs/picture_file.h"
#include "tests/gui/temp_folder.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

Bitmap32 Opaque(Bitmap32 picture) {
  SetAlphaChannel(picture, 255);
  return picture;
}

class PictureFiles : public FileGuiTest {
 protected:
  void Open(const QString& name) {
    platform_.openAnswers.push_back(FileChoice{Path(name), 1});
    MainChild<QToolButton>("SpeedButton1")->click();
  }
  void Save(const QString& name, int filterIndex) {
    platform_.saveAnswers.push_back(FileChoice{Path(name), filterIndex});
    MainChild<QToolButton>("SpeedButton2")->click();
  }

  // A history step and a status text of its own, to show what opening keeps.
  void ChangeTheDocument(int width = 40, int height = 30) {
    ASSERT_TRUE(Main().ApplyEffect(Giving(TestPicture(width, height), "Changed"), {}, true));
  }

  // Everything the document holds, to compare before and after a refused command.
  struct DocumentState {
    Bitmap32 working, source, opened;
    int slot, undo, redo;
    QString status;
    bool operator==(const DocumentState&) const = default;
  };
  DocumentState State() {
    const PictureDocument& d = Main().Document();
    return {d.Working(),   d.Source(),    d.Opened(),         d.CurrentSlot(),
            d.UndoCount(), d.RedoCount(), Main().StatusText()};
  }

  PictureView* Image1() { return Main().findChild<PictureView*>("Image1"); }
  void ExpectNoMessage() {
    EXPECT_TRUE(platform_.messages.empty());
    EXPECT_TRUE(platform_.errors.empty());
  }
};

TEST_F(PictureFiles, OpenMakesTheFileTheNewPictureFromTheTopLeft) {
  // Scrolled into a large picture, with a history and a status text.
  ChangeTheDocument(900, 700);
  ChangeTheDocument(900, 700);
  auto* scrollBox = MainChild<QScrollArea>("ScrollBox1");
  scrollBox->horizontalScrollBar()->setValue(200);
  scrollBox->verticalScrollBar()->setValue(150);
  ASSERT_EQ(Image1()->pos(), QPoint(-200, -150));

  // Its alpha bytes are lost in the 24-bit file; the picture comes back opaque.
  const Bitmap32 picture = TestPicture(700, 500);
  SaveBitmap24(picture, LocalPath("photo.bmp"));
  Open("photo.bmp");

  ExpectNoMessage();
  const Bitmap32 expected = Opaque(picture);
  EXPECT_EQ(State(), (DocumentState{expected, expected, expected, 1, 0, 0, "Changed"}));
  EXPECT_EQ(Main().Document().Slot(1), expected);
  EXPECT_EQ(Image1()->pos(), QPoint(0, 0));
  EXPECT_EQ(Image1()->Image(), OpaqueImage(expected));
}

TEST_F(PictureFiles, CancellingTheOpenDialogChangesNothingButTheClosedToolWindow) {
  ChangeTheDocument();
  MenuAction("Pencilsketch1")->trigger();
  const DocumentState before = State();

  MainChild<QToolButton>("SpeedButton1")->click();  // the dialog answers "cancelled"
  EXPECT_EQ(platform_.openFilters.size(), 1u);
  EXPECT_EQ(State(), before);
  EXPECT_FALSE(Tool(kPencilSketch).isVisible());
  EXPECT_EQ(Main().ActiveTool(), 0);
  ExpectNoMessage();

  // The menu entries run the same command.
  MenuAction("Open1")->trigger();
  Main().findChild<QAction*>("Openanewpicture1")->trigger();
  EXPECT_EQ(platform_.openFilters.size(), 3u);
}

// The loader's choice by name and its refusals are its own tests; the window shows each kind
// of refusal once (a message, an icon's notice, an error) and keeps the document.
TEST_F(PictureFiles, RefusedFilesAreShownAndKeepTheDocument) {
  ChangeTheDocument();
  const DocumentState before = State();
  SavePng(TestPicture(12, 9), LocalPath("picture.png"));
  WriteBytes(LocalPath("bad.ico"), "not an icon");
  WriteBytes(LocalPath("broken.jpg"), "\xFF\xD8\xFF\xE0 this is not really a JPEG");
  for (const char* name : {"picture.png", "missing.jpg", "bad.ico", "broken.jpg"}) Open(name);

  using Message = ScriptedPlatform::Message;
  ASSERT_EQ(platform_.messages.size(), 4u);
  EXPECT_EQ(platform_.messages[0],
            (Message{"Sorry", Path("picture.png") + " is not a valid format"}));
  EXPECT_EQ(platform_.messages[1],
            (Message{"Sorry", Path("missing.jpg") + " is not a valid format"}));
  EXPECT_EQ(platform_.messages[2].caption, "Exit");
  EXPECT_TRUE(platform_.messages[2].text.startsWith("Input picture" + Path("bad.ico") + "Error."));
  EXPECT_EQ(platform_.messages[3], (Message{"Sorry", Path("bad.ico") + " is not a valid format"}));
  ASSERT_EQ(platform_.errors.size(), 1u);
  EXPECT_TRUE(platform_.errors[0].contains(Path("broken.jpg")))
      << platform_.errors[0].toStdString();
  EXPECT_EQ(State(), before);
}

TEST_F(PictureFiles, SaveWritesTheChosenTypeUnderItsOwnExtension) {
  MenuAction("Pencilsketch1")->trigger();
  ToolChild<QPushButton>(kPencilSketch, "Button1")->click();
  const Bitmap32& working = Main().Document().Working();
  const DocumentState before = State();

  // JPEG, quality 90, whatever extension the name had; an old file is replaced.
  WriteBytes(LocalPath("result.jpg"), "old content");
  Save("result.bmp", 1);
  Save("plain", 1);
  SaveJpeg(working, LocalPath("reference.jpg"), 90);
  EXPECT_EQ(ReadBytes(LocalPath("result.jpg")), ReadBytes(LocalPath("reference.jpg")));
  EXPECT_EQ(ReadBytes(LocalPath("plain.jpg")), ReadBytes(LocalPath("reference.jpg")));
  EXPECT_FALSE(Exists("result.bmp"));

  // A bitmap; its 24 bits are the writer's own tests.
  Save("result.jpg", 2);
  EXPECT_EQ(LoadPictureFile(LocalPath("result.bmp")), working);

  // A metafile holding the picture.
  Save("drawing", 3);
  const std::optional<Bitmap32> metafile = LoadPictureFile(LocalPath("drawing.wmf"));
  ASSERT_TRUE(metafile.has_value());
  EXPECT_EQ(QSize(metafile->Width(), metafile->Height()), QSize(working.Width(), working.Height()));

  ExpectNoMessage();
  EXPECT_EQ(State(), before);
  // Saving leaves the tool window open.
  EXPECT_TRUE(Tool(kPencilSketch).isVisible());
  EXPECT_EQ(Entries(), (std::vector<std::string>{"drawing.wmf", "plain.jpg", "reference.jpg",
                                                 "result.bmp", "result.jpg"}));

  // Cancelled: nothing written. Failed: the error is shown; how the old file is kept is the
  // writer's own test.
  MenuAction("Save1")->trigger();
  Save("missing/result.jpg", 1);
  EXPECT_EQ(Entries().size(), 5u);
  ASSERT_EQ(platform_.errors.size(), 1u);
  EXPECT_TRUE(platform_.errors[0].contains(Path("missing/result.jpg")));
  EXPECT_TRUE(platform_.messages.empty());
}

}  // namespace
}  // namespace quillane
