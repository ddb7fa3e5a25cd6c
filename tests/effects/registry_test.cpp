// The effect table as a whole: the rules every entry must keep, and each effect's result on the
// built-in picture, pinned so that a change to any effect's bytes cannot pass unseen.
#include "effects/registry.h"

#include <gtest/gtest.h>

#include <set>

#include "data/startup_picture.h"
#include "document/run_effect.h"

namespace quillane {
namespace {

TEST(EffectTable, EntriesKeepTheTableRules) {
  std::set<std::string> cliNames, tags;
  std::set<std::pair<EffectMenu, int>> menuPlaces;
  for (const EffectSpec* e : Effects()) {
    SCOPED_TRACE(e->cliName);
    EXPECT_TRUE(cliNames.insert(e->cliName).second);
    if (e->HasBatchPanel()) {
      EXPECT_TRUE(tags.insert(e->batchTag).second);
      EXPECT_LT(e->collapsedHeight, e->expandedHeight);
    }
    EXPECT_TRUE(menuPlaces.insert({e->menu, e->menuPosition}).second);
    EXPECT_EQ(FindEffect(e->toolNumber), e);
    EXPECT_EQ(FindEffectByCliName(e->cliName), e);

    std::set<std::string> controls = {e->apply.objectName, e->inputField, e->outputField};
    for (const ParamSpec& p : e->params) {
      SCOPED_TRACE(p.name);
      switch (p.kind) {
        case ParamKind::Slider:
        case ParamKind::Hidden:
        case ParamKind::Switch:
          EXPECT_LE(p.minimum, p.defaultValue);
          EXPECT_LE(p.defaultValue, p.maximum);
          break;
        case ParamKind::Choice:
          EXPECT_GE(p.defaultValue, 1);
          EXPECT_LE(p.defaultValue, static_cast<std::int64_t>(p.options.size()));
          break;
        case ParamKind::Cells:
          EXPECT_EQ(p.defaultList.size(), p.cells.size());
          break;
        case ParamKind::Clicks:
        case ParamKind::Colour:
          break;
      }
      if (!p.selects.empty()) {
        ASSERT_NE(e->FindParam(p.selects), nullptr);
        EXPECT_EQ(e->FindParam(p.selects)->kind, ParamKind::Hidden);
      }
      std::vector<std::string> names = p.cells;
      for (const ParamOption& o : p.options) names.push_back(o.objectName);
      for (const std::string& n : {p.objectName, p.captionLabel, p.numberLabel}) names.push_back(n);
      for (const std::string& n : names)
        EXPECT_TRUE(n.empty() || controls.insert(n).second) << n << " names two controls";
    }
  }

  // Every entry in exactly one menu, in places 1, 2, 3 ... of it.
  std::size_t listed = 0;
  for (EffectMenu menu : kEffectMenus) {
    const std::vector<const EffectSpec*> entries = MenuEffects(menu);
    for (std::size_t i = 0; i < entries.size(); ++i)
      EXPECT_EQ(entries[i]->menuPosition, static_cast<int>(i + 1));
    listed += entries.size();
  }
  EXPECT_EQ(listed, Effects().size());
}

// FNV-1a over the pixel bytes: enough to notice any changed byte.
std::uint64_t Hash(const Bitmap32& picture) {
  std::uint64_t h = 14695981039346656037ull;
  for (int y = 0; y < picture.Height(); ++y) {
    const auto* bytes = reinterpret_cast<const std::uint8_t*>(picture.ScanLine(y));
    for (int i = 0; i < picture.Width() * 4; ++i) h = (h ^ bytes[i]) * 1099511628211ull;
  }
  return h;
}

TEST(EffectTable, EveryEffectGivesItsReferenceResultOnTheBuiltInPicture) {
  const PictureDocument opened(StartupPicture());
  for (const EffectSpec* e : Effects()) {
    if (!e->routine) continue;
    SCOPED_TRACE(e->cliName);
    const ReferenceResult& ref = e->reference;
    ASSERT_NE(ref.hash, 0u) << "no reference result";
    PictureDocument document = opened;
    RunEffect(document, *e, {}, false);
    const Bitmap32& result = document.Working();
    ASSERT_EQ(result.Width(), 521);
    ASSERT_EQ(result.Height(), 346);
    const auto opaque = [](std::uint32_t bgr) {
      return Pixel{static_cast<std::uint8_t>(bgr >> 16), static_cast<std::uint8_t>(bgr >> 8),
                   static_cast<std::uint8_t>(bgr), 255};
    };
    EXPECT_EQ(result.At(0, 0), opaque(ref.topLeft));
    EXPECT_EQ(result.At(260, 173), opaque(ref.centre));
    EXPECT_EQ(result.At(520, 345), opaque(ref.bottomRight));
    EXPECT_EQ(Hash(result), ref.hash) << std::hex << "0x" << Hash(result);
  }
}

}  // namespace
}  // namespace quillane
