#include "effects/paint/abstract.h"

#include "effects/registry.h"

namespace quillane {

TBitmap32 doabstract(const TBitmap32& source, const Kernel& k) {
  return KernelGradientFilter(source, k, Gradient::LeftMinusRight);
}

const EffectSpec& AbstractEffect() {
  static const EffectSpec entry{
      .toolNumber = 7,
      .menu = EffectMenu::Color,
      .menuPosition = 4,
      .menuEntry = "Abstract",
      .menuHandler = "Abstract1Click",
      .windowClass = "TFormOfFringe2",
      .caption = "Setup for Abstract",
      .statusText = "Abstract art",
      .cliName = "abstract",
      .batchTag = "Abstract",
      .collapsedHeight = 157,
      .expandedHeight = 240,
      .batchPushesHistory = true,
      .apply = {"Button1", "Convert", "Convert with this setup"},
      .restoreDefaults = {"Button3", "Default", "Default setup"},
      .inputField = "Edit10",
      .outputField = "Edit11",
      .params =
          {
              KernelParam({-1, -1, -1, 0, 0, 0, -1, -1, -1}),
          },
      .routine =
          [](const EffectInput& in) {
            return doabstract(in.source, KernelFrom(in.params.GetList("kernel")));
          },
  };
  return entry;
}

}  // namespace quillane
