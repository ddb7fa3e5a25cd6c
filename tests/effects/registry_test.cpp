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
  int position = 0;
  for (const EffectSpec* e : Effects()) {
    SCOPED_TRACE(e->cliName);
    EXPECT_EQ(e->toolNumber, ++position);
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
  EXPECT_EQ(position, 17);

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
std::uint64_t Hash(const TBitmap32& picture) {
  std::uint64_t h = 14695981039346656037ull;
  for (int y = 0; y < picture.Height(); ++y) {
    const auto* bytes = reinterpret_cast<const std::uint8_t*>(picture.ScanLine(y));
    for (int i = 0; i < picture.Width() * 4; ++i) h = (h ^ bytes[i]) * 1099511628211ull;
  }
  return h;
}

struct Reference {
  const char* effect;
  std::uint64_t hash;
  // Opaque pixels at (0, 0), (260, 173) and (520, 345), as 0xBBGGRR in memory order.
  std::uint32_t topLeft, centre, bottomRight;
};

// Each effect with its default settings on the built-in picture (521 x 346).
const Reference kReferences[] = {
    {"pencil-sketch", 0x4673dd25e5dddaf0, 0xfcfcfc, 0xe6e6e6, 0xffffff},
    {"pen-sketch", 0xedfda84988e366d5, 0xffffff, 0xffffff, 0xffffff},
    {"vuzorar", 0x5b8ebaf6b6b5a3a4, 0xffffff, 0xffffff, 0xffffff},
    {"pen-and-ink", 0xf80d1c482dce032c, 0x000000, 0xffffff, 0x000000},
    {"color-pencil", 0x47ffeeb9b5b445d0, 0xfefcfb, 0xf5f5f4, 0xffffff},
    {"water-color", 0xe2b296672cd83970, 0x88522e, 0x928c87, 0x1c4930},
    {"realism", 0xf59929b4aacceff2, 0x88522e, 0xaaa294, 0x1c4930},
    {"pop-art", 0x0ac48edf0124145b, 0xf7f5f4, 0xffffff, 0xe5a6af},
    {"abstract", 0x420f922fe65bc838, 0xfefcff, 0xf5f5fc, 0xffffff},
    {"brume", 0x7a58c4f68df92c52, 0x88522e, 0x969388, 0x1c4930},
    {"color-variety", 0x2847434fb20bf9df, 0x88522e, 0x97968c, 0x1c4930},
    {"color-panel", 0x0bcdb3260dab7c46, 0x88522e, 0x97968c, 0x1c4930},
    {"hsl-adjust", 0xefd517a0fc12dbf8, 0x89532f, 0x97968d, 0x1c4a31},
    {"emboss", 0x9b93a73ce25c71c1, 0x959595, 0x9e9e9e, 0x1c4930},
    {"color-filter", 0xdadfc27f50184b9b, 0x4d4dff, 0x9393ff, 0x3d3dff},
    {"stria", 0x63d58d2b0864063c, 0x442917, 0x97968c, 0x1c4930},
    {"texture", 0xdeb5264a77da691f, 0xba7140, 0xc5c4bf, 0x3c9f69},
};

TEST(EffectTable, EveryEffectGivesItsReferenceResultOnTheBuiltInPicture) {
  const PictureDocument opened(StartupPicture());
  for (const EffectSpec* e : Effects()) {
    if (!e->routine) continue;
    SCOPED_TRACE(e->cliName);
    const Reference* ref = nullptr;
    for (const Reference& r : kReferences)
      if (e->cliName == r.effect) ref = &r;
    ASSERT_NE(ref, nullptr) << "no reference result";
    PictureDocument document = opened;
    RunEffect(document, *e, {}, false);
    const TBitmap32& result = document.Working();
    ASSERT_EQ(result.Width(), 521);
    ASSERT_EQ(result.Height(), 346);
    const auto opaque = [](std::uint32_t bgr) {
      return Pixel{static_cast<std::uint8_t>(bgr >> 16), static_cast<std::uint8_t>(bgr >> 8),
                   static_cast<std::uint8_t>(bgr), 255};
    };
    EXPECT_EQ(result.At(0, 0), opaque(ref->topLeft));
    EXPECT_EQ(result.At(260, 173), opaque(ref->centre));
    EXPECT_EQ(result.At(520, 345), opaque(ref->bottomRight));
    EXPECT_EQ(Hash(result), ref->hash) << std::hex << "0x" << Hash(result);
  }
}

}  // namespace
}  // namespace quillane
