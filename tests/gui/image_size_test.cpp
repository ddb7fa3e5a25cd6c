// The image size dialog on the main window's picture.
#include <QLineEdit>
#include <QTest>
#include <QToolButton>

#include "app/image_size_dialog.h"
#include "tests/gui/gui_fixture.h"

namespace quillane {
namespace {

class ImageSizeDialog : public GuiTest {
 protected:
  void SetUp() override {
    GuiTest::SetUp();
    Main().ShowNewPicture(Bitmap32(521, 346, Pixel{7, 8, 9, 255}), true);
    MainChild<QToolButton>("SpeedButton4")->click();
  }
  QLineEdit* Field(const char* name) { return Main().ImageSize().findChild<QLineEdit*>(name); }
  void Press(const char* name) { Main().ImageSize().findChild<QAbstractButton*>(name)->click(); }
  QSize Picture() {
    return QSize(Main().Document().Working().Width(), Main().Document().Working().Height());
  }
};

TEST_F(ImageSizeDialog, TypedWidthHoldsTheRatioAndEnterAppliesOnce) {
  EXPECT_EQ(Field("Edit1")->text() + " " + Field("Edit2")->text(), "521 346");
  Field("Edit1")->clear();
  QTest::keyClicks(Field("Edit1"), "400");
  EXPECT_EQ(Field("Edit2")->text(), "266");
  // The Tab that moves on arrives as a key release in the height field: nothing is recomputed.
  QTest::keyRelease(Field("Edit2"), Qt::Key_Tab);
  EXPECT_EQ(Field("Edit1")->text(), "400");
  QTest::keyClick(Field("Edit1"), Qt::Key_Return);
  EXPECT_EQ(Picture(), QSize(399, 266));  // 400 / 521 rounds downward
  EXPECT_EQ(Main().Document().Source().Width(), 399);
  EXPECT_FALSE(Main().ImageSize().isVisible());
  Main().OnUndo();
  EXPECT_EQ(Picture(), QSize(521, 346));

  // Shown again, it starts from the picture; "-" and "+" step both fields.
  Main().findChild<QAction*>("Imagesize2")->trigger();
  Press("SpeedButton1");
  EXPECT_EQ(Field("Edit1")->text() + " " + Field("Edit2")->text(), "417 277");
  Field("Edit1")->setText("521");
  Field("Edit2")->setText("346");
  Press("SpeedButton2");
  EXPECT_EQ(Field("Edit1")->text() + " " + Field("Edit2")->text(), "651 432");
  EXPECT_TRUE(platform_.messages.empty() && platform_.errors.empty());
}

TEST_F(ImageSizeDialog, RefusedSizesChangeNothingAndKeepTheDialogOpen) {
  const QString invalid = "Please input a valid integer value.";
  const struct {
    QString width, height, message, error;
  } cases[] = {
      {"4a0", "346", invalid, {}},
      {"400", "0", invalid, {}},
      {"1", "346", invalid, {}},  // would resample to 0 pixels wide
      {"99999999999", "346", {}, "'99999999999' is not a valid integer value."},
      {"100000",
       "100000",
       "A picture of 100000 by 100000 pixels is larger than the " +
           QLocale().toString(qint64{268435456}) + " pixels a picture may have.",
       {}},
  };
  for (const auto& c : cases) {
    platform_.messages.clear();
    platform_.errors.clear();
    Field("Edit1")->setText(c.width);
    Field("Edit2")->setText(c.height);
    Press("Button1");
    EXPECT_EQ(Picture(), QSize(521, 346)) << c.width.toStdString();
    EXPECT_TRUE(Main().ImageSize().isVisible());
    EXPECT_EQ(platform_.messages.empty() ? QString() : platform_.messages[0].text, c.message);
    EXPECT_EQ(platform_.errors,
              c.error.isEmpty() ? std::vector<QString>{} : std::vector<QString>{c.error});
  }
  Press("Button2");
  EXPECT_FALSE(Main().ImageSize().isVisible());
  EXPECT_FALSE(Main().Document().CanUndo());
}

}  // namespace
}  // namespace quillane
