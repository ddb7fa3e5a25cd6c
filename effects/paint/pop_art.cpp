#include "effects/paint/pop_art.h"

#include "effects/registry.h"

namespace quillane {

Bitmap32 PopArt(const Bitmap32& source, const Kernel& k) {
  return KernelGradientFilter(source, k, Gradient::RightMinusLeftSobel);
}

const EffectSpec& PopArtEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Color,
      .menuPosition = 3,
      .menuEntry = "Pop art",
      .menuObjectName = "Popart1",
      .windowObjectName = "TFormOfFringe3",
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
      .reference = {.hash = 0x0ac48edf0124145b,
                    .topLeft = 0xf7f5f4,
                    .centre = 0xffffff,
                    .bottomRight = 0xe5a6af},
      .routine =
          [](const EffectInput& in) {
            return PopArt(in.source, KernelFrom(in.params.GetList("kernel")));
          },
  };
  return entry;
}

}  // namespace quillane
