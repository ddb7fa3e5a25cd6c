#include "effects/paint/pop_art.h"

#include <limits>

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
              {.kind = ParamKind::Cells,
               .name = "kernel",
               .captionLabel = "Label1",
               .caption = "You can change the figures",
               .minimum = std::numeric_limits<std::int32_t>::min(),
               .maximum = std::numeric_limits<std::int32_t>::max(),
               .cells = {"Edit1", "Edit2", "Edit3", "Edit4", "Edit5", "Edit6", "Edit7", "Edit8",
                         "Edit9"},
               .defaultList = {-1, -2, -1, 0, 0, 0, 1, 2, 1},
               .hint = "Change the number to get different effect",
               .help = "the 3 x 3 weights, row by row (top row first)"},
          },
      .routine =
          [](const EffectInput& in) {
            return popart(in.source, KernelFrom(in.params.GetList("kernel")));
          },
  };
  return entry;
}

}  // namespace quillane
