#include "effects/registry.h"

#include <algorithm>

namespace quillane {

// Each effect's entry is defined beside its routine. This list is the only place that names them
// all; its order is the tool numbers' and the gallery's.
#define QUILLANE_EFFECTS(X)                                                                        \
  X(PencilSketch)                                                                                  \
  X(PenSketch)                                                                                     \
  X(Vuzorar)                                                                                       \
  X(PenAndInk)                                                                                     \
  X(ColorPencil)                                                                                   \
  X(Realism)                                                                                       \
  X(Abstract)                                                                                      \
  X(PopArt) X(WaterColor) X(Brume) X(HslAdjust) X(ColorVariety) X(ColorPanel) X(Texture) X(Emboss) \
      X(ColorFilter) X(Stria)

#define QUILLANE_DECLARE_EFFECT(name) const EffectSpec& name##Effect();
QUILLANE_EFFECTS(QUILLANE_DECLARE_EFFECT)
#undef QUILLANE_DECLARE_EFFECT

const std::vector<const EffectSpec*>& Effects() {
  // Each entry is taken once, with its place in the list as its tool number, so that inserting
  // an effect never renumbers another file.
  static const std::vector<EffectSpec> numbered = [] {
#define QUILLANE_LIST_EFFECT(name) name##Effect(),
    std::vector<EffectSpec> entries = {QUILLANE_EFFECTS(QUILLANE_LIST_EFFECT)};
#undef QUILLANE_LIST_EFFECT
    for (std::size_t i = 0; i < entries.size(); ++i)
      entries[i].toolNumber = static_cast<int>(i) + 1;
    return entries;
  }();
  static const std::vector<const EffectSpec*> all = [] {
    std::vector<const EffectSpec*> pointers;
    for (const EffectSpec& e : numbered) pointers.push_back(&e);
    return pointers;
  }();
  return all;
}

namespace {

struct MenuNames {
  const char* caption;
  const char* objectName;
};
// In the order of EffectMenu.
constexpr MenuNames kMenuNames[] = {
    {" B&&W", "BW1"}, {" Color", "Color1"}, {" ColorAdjust", "ColorAdjust1"}, {" Veins", "Veins1"}};

}  // namespace

const char* MenuCaption(EffectMenu menu) {
  return kMenuNames[static_cast<int>(menu)].caption;
}

const char* MenuObjectName(EffectMenu menu) {
  return kMenuNames[static_cast<int>(menu)].objectName;
}

const ParamSpec* EffectSpec::FindParam(const std::string& name) const {
  for (const ParamSpec& p : params)
    if (p.name == name) return &p;
  return nullptr;
}

EffectParams EffectSpec::Defaults() const {
  EffectParams values;
  for (const ParamSpec& p : params) values.SetList(p.name, DefaultValue(p));
  return values;
}

const EffectSpec* FindEffect(int toolNumber) {
  const auto& all = Effects();
  if (toolNumber < 1 || toolNumber > static_cast<int>(all.size())) return nullptr;
  return all[static_cast<std::size_t>(toolNumber - 1)];
}

const EffectSpec* FindEffectByCliName(const std::string& cliName) {
  for (const EffectSpec* e : Effects())
    if (e->cliName == cliName) return e;
  return nullptr;
}

std::vector<const EffectSpec*> MenuEffects(EffectMenu menu) {
  std::vector<const EffectSpec*> entries;
  for (const EffectSpec* e : Effects())
    if (e->menu == menu) entries.push_back(e);
  std::sort(entries.begin(), entries.end(), [](const EffectSpec* a, const EffectSpec* b) {
    return a->menuPosition < b->menuPosition;
  });
  return entries;
}

}  // namespace quillane
