#include "effects/paint/pop_art.h"

#include "effects/registry.h"

namespace quillane {

TBitmap32 popart(const TBitmap32& source, const Kernel& k) {
  return KernelGradientFilter(source, k, Gradient::RightMinusLeftSobel);
}

const EffectSpec& PopArtEffect() {
  static const EffectSpec entry{
      .toolNumber = 8,
      .menu = EffectMenu::Color,
      .menuPosition = 3,
      .menuEntry = "Pop art",
      .menuHandler = "Popart1Click",
      .windowClass = "TFormOfFringe3",
      .caption = "Setup for Pop art",
      .statusText = "Pop art",
      .cliName = "pop-art",
      .batchTag = "Pop-art",
      .collapsedHeight = 157,
      .expandedHeight = 240,
      .batchPushesHistory = true,
      .apply = {"Button1", "Convert", "Convert with your setup"},
      .restoreDefaults = {"Button3", "Default", "Convert with default setup"},
      .inputField = "Edit10",
      .outputField = "Edit11",
      .params =
          {
              KernelParam({-1, -2, -1, 0, 0, 0, 1, 2, 1}),
          },
      .routine =
          [](const EffectInput& in) {
            return popart(in.source, KernelFrom(in.params.GetList("kernel")));
          },
  };
  return entry;
}

}  // namespace quillane
