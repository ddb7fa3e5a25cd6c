// The picture control shows the document's working picture itself, while history states are
// packed and made ready in the background: after every action it must show exactly the
// working picture, whether the action came while that work was still running or after it
// ended, and a picture once shown must never change under anyone still holding it.
#include <QAbstractButton>
#include <QLineEdit>
#include <functional>
#include <string>
#include <vector>

#include "app/image_size_dialog.h"
#include "tests/gui/gui_fixture.h"
#include "tests/imaging/random_picture.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

class ShownPicture : public GuiTest {
 protected:
  PictureView& View() { return *Main().findChild<PictureView*>("Image1"); }

  void Resize(int w, int h) {
    Main().OnImageSize();
    Main().ImageSize().findChild<QLineEdit*>("Edit1")->setText(QString::number(w));
    Main().ImageSize().findChild<QLineEdit*>("Edit2")->setText(QString::number(h));
    Main().ImageSize().findChild<QAbstractButton*>("Button1")->click();
  }

  // Runs the actions from a freshly opened picture, each checked as it is shown; the working
  // pictures in turn.
  std::vector<Bitmap32> RunActions(bool waitForBackground) {
    const EffectSpec& emboss = *FindEffectByCliName("emboss");
    const EffectSpec& hsl = *FindEffectByCliName("hsl-adjust");
    const std::vector<std::pair<std::string, std::function<void()>>> actions = {
        {"OK emboss", [&] { Main().ApplyEffect(emboss, emboss.Defaults(), true); }},
        {"OK HSL", [&] { Main().ApplyEffect(hsl, hsl.Defaults(), true); }},
        {"OK emboss again", [&] { Main().ApplyEffect(emboss, emboss.Defaults(), true); }},
        {"undo", [&] { Main().OnUndo(); }},
        {"undo again", [&] { Main().OnUndo(); }},
        {"redo", [&] { Main().OnRedo(); }},
        {"undo after redo", [&] { Main().OnUndo(); }},
        {"OK after undo", [&] { Main().ApplyEffect(hsl, hsl.Defaults(), true); }},
        {"resize", [&] { Resize(157, 93); }},
        {"undo the resize", [&] { Main().OnUndo(); }},
        {"redo the resize", [&] { Main().OnRedo(); }},
        {"rotate", [&] { Main().OnRotateClockwise(); }},
        {"OK after rotate", [&] { Main().ApplyEffect(emboss, emboss.Defaults(), true); }},
        {"undo after rotate", [&] { Main().OnUndo(); }},
        {"renew", [&] { Main().OnRenew(); }},
        {"undo after renew", [&] { Main().OnUndo(); }},
    };
    Main().ShowNewPicture(RandomPicture(311, 187, 4), true);
    std::vector<Bitmap32> states;
    std::vector<QImage> held;  // what a painting in progress might still hold
    for (const auto& [name, action] : actions) {
      if (waitForBackground) PictureDocument::WaitForHistoryPacking();
      action();
      const Bitmap32& working = Main().Document().Working();
      EXPECT_EQ(View().Image(), OpaqueImage(working)) << name;
      EXPECT_EQ(View().size(), QSize(working.Width(), working.Height())) << name;
      states.push_back(working);
      held.push_back(View().Image());
    }
    PictureDocument::WaitForHistoryPacking();
    for (std::size_t i = 0; i < held.size(); ++i)
      EXPECT_EQ(held[i], OpaqueImage(states[i])) << actions[i].first << " held";
    return states;
  }
};

TEST_F(ShownPicture, IsTheWorkingPictureAfterEveryActionDuringAndAfterBackgroundWork) {
  const std::vector<Bitmap32> during = RunActions(false);
  const std::vector<Bitmap32> after = RunActions(true);
  ASSERT_EQ(during.size(), after.size());
  for (std::size_t i = 0; i < during.size(); ++i) EXPECT_EQ(during[i], after[i]) << i;
  // Each step back or forward gives the state it names.
  const std::pair<std::size_t, std::size_t> same[] = {{3, 1}, {4, 0},  {5, 1},   {6, 0},
                                                      {9, 7}, {10, 8}, {13, 11}, {15, 14}};
  for (auto [step, state] : same) EXPECT_EQ(during[step], during[state]) << step;
  Bitmap32 opened = RandomPicture(311, 187, 4);
  SetAlphaChannel(opened, 255);
  EXPECT_EQ(during[14], opened);
  EXPECT_TRUE(platform_.errors.empty());
  EXPECT_TRUE(platform_.messages.empty());
}

}  // namespace
}  // namespace quillane
