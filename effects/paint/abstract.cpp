#include "effects/paint/abstract.h"

#include <limits>

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
              {.kind = ParamKind::Cells,
               .name = "kernel",
               .captionLabel = "Label1",
               .caption = "You can change the figures",
               .minimum = std::numeric_limits<std::int32_t>::min(),
               .maximum = std::numeric_limits<std::int32_t>::max(),
               .cells = {"Edit1", "Edit2", "Edit3", "Edit4", "Edit5", "Edit6", "Edit7", "Edit8",
                         "Edit9"},
               .defaultList = {-1, -1, -1, 0, 0, 0, -1, -1, -1},
               .hint = "Change the number to get different effect",
               .help = "the 3 x 3 weights, row by row (top row first)"},
          },
      .routine =
          [](const EffectInput& in) {
            return doabstract(in.source, KernelFrom(in.params.GetList("kernel")));
          },
  };
  return entry;
}

}  // namespace quillane
