#include "effects/mono/bw_sketch.h"

#include "effects/registry.h"
#include "imaging/edge_map.h"
#include "imaging/numeric.h"
#include "imaging/tone.h"

namespace quillane {

Bitmap32 PencilSketch(const Bitmap32& source, PencilToneMode mode, int contrast, int lighting) {
  // Either tone turns each gray value of the edge map into one level: the lighting pass by
  // itself, the contrast pass because the gray copy it gets has hue and saturation 0.
  return GrayEdgeLevels(source, mode == PencilToneMode::Lighting
                                    ? PencilLightingLevels(lighting)
                                    : PencilContrastGrayLevels(contrast));
}

const EffectSpec& PencilSketchEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Mono,
      .menuPosition = 1,
      .menuEntry = "Pencil sketch",
      .menuObjectName = "Pencilsketch1",
      .windowObjectName = "TBack_and_White_Sketch",
      .caption = "Pencil_Sketch",
      .statusText = "Pencil Sketch",
      .cliName = "pencil-sketch",
      .batchTag = "PencilSketch",
      .collapsedHeight = 108,
      .expandedHeight = 184,
      .colorUp = true,
      .lineArtAfterApply = false,
      .params =
          {
              {.name = "contrast",
               .objectName = "TrackBar1",
               .captionLabel = "Label1",
               .caption = "Contrast:",
               .maximum = 89,
               .defaultValue = 45,
               .numberLabel = "Label4",
               .initialNumber = "50",
               .numberFor = [](int c) { return Round(static_cast<Extended>(c) * 100 / 89); },
               .selects = "tone-mode",
               .selectValue = static_cast<int>(PencilToneMode::Contrast),
               .help = "contrast curve position; giving it selects the contrast tone"},
              {.name = "lighting",
               .objectName = "TrackBar2",
               .captionLabel = "Label2",
               .caption = "Lighting:",
               .maximum = 255,
               .defaultValue = 128,
               .numberLabel = "Label3",
               .initialNumber = "50",
               .numberFor = [](int v) { return Round(static_cast<Extended>(v) * 100 / 255); },
               .selects = "tone-mode",
               .selectValue = static_cast<int>(PencilToneMode::Lighting),
               .help = "brightness shift, 128 neutral; giving it selects the lighting tone"},
              {.kind = ParamKind::Hidden,
               .name = "tone-mode",
               .maximum = 1,
               .defaultValue = static_cast<int>(PencilToneMode::Contrast),
               .help = "0 contrast, 1 lighting: the slider moved last",
               .resetOnShow = true},
          },
      .reference = {.hash = 0x4673dd25e5dddaf0,
                    .topLeft = 0xfcfcfc,
                    .centre = 0xe6e6e6,
                    .bottomRight = 0xffffff},
      .routine =
          [](const EffectInput& in) {
            return PencilSketch(in.source,
                                static_cast<PencilToneMode>(in.params.GetInt("tone-mode")),
                                in.params.GetInt("contrast"), in.params.GetInt("lighting"));
          },
  };
  return entry;
}

}  // namespace quillane
