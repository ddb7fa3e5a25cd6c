#include <QPushButton>
#include <QScrollArea>
#include <QScrollBar>
#include <QToolButton>

#include "ui/picture_view.h"
#include "codecs/picture_file.h"
#include "tests/file_size_limit.h"
#include "tests/gui/temp_folder.h"

namespace quillane {
namespace {

TBitmap32 Opaque(TBitmap32 picture) {
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
    TBitmap32 working, source, opened;
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
  // Scrolled into a large picture, with a history and a status text, and a tool window open.
  ChangeTheDocument(900, 700);
  ChangeTheDocument(900, 700);
  auto* scrollBox = MainChild<QScrollArea>("ScrollBox1");
  scrollBox->horizontalScrollBar()->setValue(200);
  scrollBox->verticalScrollBar()->setValue(150);
  ASSERT_EQ(Image1()->pos(), QPoint(-200, -150));
  MenuAction("Pencilsketch1")->trigger();

  // Its alpha bytes are lost in the 24-bit file; the picture comes back opaque.
  const TBitmap32 picture = TestPicture(700, 500);
  SaveBitmap24(picture, LocalPath("photo.bmp"));
  Open("photo.bmp");

  EXPECT_EQ(platform_.openFilters.size(), 1u);
  ExpectNoMessage();
  EXPECT_FALSE(Tool(1).isVisible());
  EXPECT_EQ(Main().ActiveTool(), 0);

  const TBitmap32 expected = Opaque(picture);
  EXPECT_EQ(State(), (DocumentState{expected, expected, expected, 1, 0, 0, "Changed"}));
  EXPECT_EQ(Main().Document().Slot(1), expected);
  EXPECT_FALSE(MainChild<QToolButton>("SpeedButton3")->isEnabled());
  EXPECT_FALSE(MenuAction("Undo1")->isEnabled());
  EXPECT_EQ(Image1()->size(), QSize(700, 500));
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
  EXPECT_FALSE(Tool(1).isVisible());
  EXPECT_EQ(Main().ActiveTool(), 0);
  ExpectNoMessage();

  // The menu entries run the same command.
  MenuAction("Open1")->trigger();
  Main().findChild<QAction*>("Openanewpicture1")->trigger();
  EXPECT_EQ(platform_.openFilters.size(), 3u);
}

TEST_F(PictureFiles, TheTypeComesFromTheNameAlone) {
  ChangeTheDocument();
  const DocumentState before = State();
  const TBitmap32 picture = TestPicture(12, 9);
  SavePng(picture, LocalPath("picture.png"));
  SaveJpeg(picture, LocalPath("photo.jpe"));

  // A real picture under a name the loader does not know, and a name with no file at all.
  Open("picture.png");
  Open("photo.jpe");
  Open("missing.jpg");
  EXPECT_EQ(platform_.messages, (std::vector<ScriptedPlatform::Message>{
                                    {"Sorry", Path("picture.png") + " is not a valid format"},
                                    {"Sorry", Path("photo.jpe") + " is not a valid format"},
                                    {"Sorry", Path("missing.jpg") + " is not a valid format"}}));
  EXPECT_EQ(State(), before);

  // "JPEG" in capitals chooses the JPEG decoder.
  SaveJpeg(picture, LocalPath("photo.JPEG"));
  Open("photo.JPEG");
  EXPECT_EQ(Main().Document().Working().Width(), 12);
  EXPECT_EQ(Main().Document().Working().Height(), 9);
}

TEST_F(PictureFiles, AnUnreadableIconIsReportedThenRefused) {
  ChangeTheDocument();
  const DocumentState before = State();
  WriteBytes(LocalPath("bad.ico"), "not an icon");
  Open("bad.ico");
  ASSERT_EQ(platform_.messages.size(), 2u);
  EXPECT_EQ(platform_.messages[0].caption, "Exit");
  EXPECT_TRUE(platform_.messages[0].text.startsWith("Input picture" + Path("bad.ico") + "Error."));
  EXPECT_EQ(platform_.messages[1],
            (ScriptedPlatform::Message{"Sorry", Path("bad.ico") + " is not a valid format"}));
  EXPECT_EQ(State(), before);
}

TEST_F(PictureFiles, ACorruptFileShowsTheErrorAndKeepsTheDocument) {
  ChangeTheDocument();
  const DocumentState before = State();
  WriteBytes(LocalPath("broken.jpg"), "\xFF\xD8\xFF\xE0 this is not really a JPEG");
  SaveBitmap24(TestPicture(), LocalPath("bitmap-named.jpg"));
  // Half a JPEG.
  SaveJpeg(TestPicture(200, 100), LocalPath("cut.jpg"));
  std::vector<std::uint8_t> cut = ReadBytes(LocalPath("cut.jpg"));
  WriteBytes(LocalPath("cut.jpg"), std::string(cut.begin(), cut.begin() + cut.size() / 2));

  for (const char* name : {"broken.jpg", "bitmap-named.jpg", "cut.jpg"}) {
    platform_.errors.clear();
    Open(name);
    ASSERT_EQ(platform_.errors.size(), 1u) << name;
    EXPECT_TRUE(platform_.errors[0].contains(Path(name))) << platform_.errors[0].toStdString();
    EXPECT_EQ(State(), before) << name;
  }
  EXPECT_TRUE(platform_.messages.empty());
}

TEST_F(PictureFiles, SaveWritesTheChosenTypeUnderItsOwnExtension) {
  MenuAction("Pencilsketch1")->trigger();
  ToolChild<QPushButton>(1, "Button1")->click();
  const TBitmap32& working = Main().Document().Working();
  const DocumentState before = State();

  // JPEG, quality 90, whatever extension the name had; an old file is replaced.
  WriteBytes(LocalPath("result.jpg"), "old content");
  Save("result.bmp", 1);
  Save("plain", 1);
  SaveJpeg(working, LocalPath("reference.jpg"), 90);
  EXPECT_EQ(ReadBytes(LocalPath("result.jpg")), ReadBytes(LocalPath("reference.jpg")));
  EXPECT_EQ(ReadBytes(LocalPath("plain.jpg")), ReadBytes(LocalPath("reference.jpg")));
  EXPECT_FALSE(Exists("result.bmp"));

  // A 24-bit bitmap, though the working picture has 32 bits.
  Save("result.jpg", 2);
  const std::vector<std::uint8_t> bmp = ReadBytes(LocalPath("result.bmp"));
  ASSERT_GT(bmp.size(), 30u);
  EXPECT_EQ(bmp[0], 'B');
  EXPECT_EQ(bmp[28] | bmp[29] << 8, 24);
  EXPECT_EQ(LoadPictureFile(LocalPath("result.bmp")), working);

  // A metafile holding the picture.
  Save("drawing", 3);
  const std::optional<TBitmap32> metafile = LoadPictureFile(LocalPath("drawing.wmf"));
  ASSERT_TRUE(metafile.has_value());
  EXPECT_EQ(metafile->Width(), working.Width());
  EXPECT_EQ(metafile->Height(), working.Height());

  EXPECT_EQ(platform_.saveFilters.size(), 4u);
  ExpectNoMessage();
  EXPECT_EQ(State(), before);
  // Saving leaves the tool window open.
  EXPECT_TRUE(Tool(1).isVisible());
  EXPECT_EQ(Entries(), (std::vector<std::string>{"drawing.wmf", "plain.jpg", "reference.jpg",
                                                 "result.bmp", "result.jpg"}));

  // Cancelled: nothing written.
  MenuAction("Save1")->trigger();
  EXPECT_EQ(Entries().size(), 5u);
}

// A file-size limit makes the write fail part way, as a full disk would.
TEST_F(PictureFiles, AFailedSaveKeepsTheOldFile) {
  Main().ShowNewPicture(TestPicture(300, 300), true);
  WriteBytes(LocalPath("result.bmp"), "old file");
  {
    const FileSizeLimit full(4096);
    Save("result.bmp", 2);
  }

  ASSERT_EQ(platform_.errors.size(), 1u);
  EXPECT_TRUE(platform_.errors[0].contains(Path("result.bmp")));
  const std::vector<std::uint8_t> old = ReadBytes(LocalPath("result.bmp"));
  EXPECT_EQ(std::string(old.begin(), old.end()), "old file");
  EXPECT_EQ(Entries(), std::vector<std::string>{"result.bmp"});

  // A folder that does not exist.
  Save("missing/result.jpg", 1);
  ASSERT_EQ(platform_.errors.size(), 2u);
  EXPECT_TRUE(platform_.errors[1].contains(Path("missing/result.jpg")));
  EXPECT_FALSE(Exists("missing"));
  EXPECT_TRUE(platform_.messages.empty());
}

}  // namespace
}  // namespace quillane
