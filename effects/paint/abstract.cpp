#include "effects/paint/abstract.h"

#include "effects/registry.h"

namespace quillane {

Bitmap32 Abstract(const Bitmap32& source, const Kernel& k) {
  return KernelGradientFilter(source, k, Gradient::LeftMinusRight);
}

const EffectSpec& AbstractEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Color,
      .menuPosition = 4,
      .menuEntry = "Abstract",
      .menuObjectName = "Abstract1",
      .windowObjectName = "TFormOfFringe2",
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
      .reference = {.hash = 0x420f922fe65bc838,
                    .topLeft = 0xfefcff,
                    .centre = 0xf5f5fc,
                    .bottomRight = 0xffffff},
      .routine =
          [](const EffectInput& in) {
            return Abstract(in.source, KernelFrom(in.params.GetList("kernel")));
          },
  };
  return entry;
}

}  // namespace quillane
