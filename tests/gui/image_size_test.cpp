// The image size dialog on the main window's picture.
#include <QCheckBox>
#include <QLineEdit>
#include <QPushButton>
#include <QTest>
#include <QToolButton>

#include "app/image_size_dialog.h"
#include "tests/gui/gui_fixture.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

const QString kInvalid = "Please input a valid integer value.";

class ImageSizeDialog : public GuiTest {
 protected:
  void SetUp() override {
    GuiTest::SetUp();
    Main().ShowNewPicture(TBitmap32(521, 346, Pixel{7, 8, 9, 255}), true);
    MainChild<QToolButton>("SpeedButton4")->click();
  }

  TImage_size& Dialog() { return Main().ImageSize(); }
  QLineEdit* Width() { return Dialog().findChild<QLineEdit*>("Edit1"); }
  QLineEdit* Height() { return Dialog().findChild<QLineEdit*>("Edit2"); }
  void Press(const char* button) { Dialog().findChild<QAbstractButton*>(button)->click(); }
  // Typing as a user does: the field emptied, then key by key.
  void Type(QLineEdit* field, const QString& text) {
    field->selectAll();
    QTest::keyClick(field, Qt::Key_Delete);
    QTest::keyClicks(field, text);
  }
  QSize Picture() {
    return QSize(Main().Document().Working().Width(), Main().Document().Working().Height());
  }
};

TEST_F(ImageSizeDialog, TypedWidthHoldsTheRatioAndEnterApplies) {
  ASSERT_TRUE(Dialog().isVisible());
  EXPECT_EQ(Dialog().windowTitle(), "Image_size");
  EXPECT_EQ(Width()->text(), "521");
  EXPECT_EQ(Height()->text(), "346");
  Type(Width(), "400");
  EXPECT_EQ(Height()->text(), "266");
  // The Tab that moves on arrives as a key release in the height field: nothing is recomputed.
  QTest::keyRelease(Height(), Qt::Key_Tab);
  EXPECT_EQ(Width()->text(), "400");

  QTest::keyClick(Width(), Qt::Key_Return);
  EXPECT_EQ(Picture(), QSize(399, 266));  // applied once: 400 / 521 rounds downward
  EXPECT_EQ(Main().Document().Source().Width(), 399);
  EXPECT_EQ(MainChild<PictureView>("Image1")->size(), QSize(399, 266));
  EXPECT_FALSE(Dialog().isVisible());
  EXPECT_EQ(Main().Document().UndoCount(), 1);
  Main().SpeedButton3Click();
  EXPECT_EQ(Picture(), QSize(521, 346));
  EXPECT_TRUE(platform_.messages.empty());
  EXPECT_TRUE(platform_.errors.empty());
}

TEST_F(ImageSizeDialog, HeightHoldsTheRatioBackUnlessTheBoxIsCleared) {
  Type(Height(), "173");
  EXPECT_EQ(Width()->text(), "260");  // Round(173 * 521 / 346) = Round(260.5)
  Dialog().findChild<QCheckBox*>("CheckBox1")->setChecked(false);
  Type(Height(), "100");
  EXPECT_EQ(Width()->text(), "260");
}

TEST_F(ImageSizeDialog, MinusAndPlusStepBothFields) {
  Press("SpeedButton1");
  EXPECT_EQ(Width()->text(), "417");
  EXPECT_EQ(Height()->text(), "277");
  Type(Width(), "521");
  Type(Height(), "346");
  Press("SpeedButton2");
  EXPECT_EQ(Width()->text(), "651");
  EXPECT_EQ(Height()->text(), "432");  // 432.5 to the even neighbour

  // A field that is not an integer stops the step there.
  Width()->setText("600");
  Height()->setText("x");
  Press("SpeedButton1");
  EXPECT_EQ(Width()->text(), "480");
  EXPECT_EQ(Height()->text(), "x");
  EXPECT_EQ(platform_.errors, std::vector<QString>{"'x' is not a valid integer value."});
}

TEST_F(ImageSizeDialog, RefusedSizesChangeNothingAndKeepTheDialogOpen) {
  struct Case {
    QString width, height;
    ScriptedPlatform::Message message;
    QString error;
  };
  const Case cases[] = {
      {"", "346", {"Quillane", kInvalid}, {}},
      {"4a0", "346", {"Quillane", kInvalid}, {}},
      {"-5", "346", {"Quillane", kInvalid}, {}},
      {"400", "0", {"Quillane", kInvalid}, {}},
      {"1", "346", {"Quillane", kInvalid}, {}},  // would resample to 0 pixels wide
      {"99999999999", "346", {}, "'99999999999' is not a valid integer value."},
      {"100000",
       "100000",
       {"Sorry", "A picture of 100000 by 100000 pixels is larger than the " +
                     QLocale().toString(qint64{268435456}) + " pixels a picture may have."},
       {}},
  };
  for (const Case& c : cases) {
    platform_.messages.clear();
    platform_.errors.clear();
    Width()->setText(c.width);
    Height()->setText(c.height);
    Press("Button1");
    EXPECT_EQ(Picture(), QSize(521, 346)) << c.width.toStdString();
    EXPECT_TRUE(Dialog().isVisible()) << c.width.toStdString();
    if (c.error.isEmpty()) {
      EXPECT_EQ(platform_.messages, std::vector<ScriptedPlatform::Message>{c.message});
    } else {
      EXPECT_EQ(platform_.errors, std::vector<QString>{c.error});
    }
  }
  EXPECT_FALSE(Main().Document().CanUndo());

  // Cancel closes without a change; showing it again shows the picture's size.
  Press("Button2");
  EXPECT_FALSE(Dialog().isVisible());
  EXPECT_EQ(Picture(), QSize(521, 346));
  Main().findChild<QAction*>("Imagesize1")->trigger();
  EXPECT_EQ(Width()->text(), "521");
  EXPECT_EQ(Height()->text(), "346");
}

}  // namespace
}  // namespace quillane
