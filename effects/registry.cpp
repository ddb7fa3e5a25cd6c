#include "effects/registry.h"

#include <algorithm>

#include "effects/mono/bw_sketch.h"
#include "imaging/numeric.h"

namespace quillane {
namespace {

EffectSpec Window(int number, std::string menu, std::string entry, std::string handler,
                  std::string windowClass, std::string caption, std::string status,
                  std::string cliName, std::string tag, int collapsed, int expanded, bool colorUp) {
  EffectSpec e;
  e.toolNumber = number;
  e.menu = std::move(menu);
  e.menuEntry = std::move(entry);
  e.menuHandler = std::move(handler);
  e.windowClass = std::move(windowClass);
  e.caption = std::move(caption);
  e.statusText = std::move(status);
  e.cliName = std::move(cliName);
  e.batchTag = std::move(tag);
  e.collapsedHeight = collapsed;
  e.expandedHeight = expanded;
  e.colorUp = colorUp;
  return e;
}

const char* const kMono = " B&&W";
const char* const kColor = " Color";
const char* const kAdjust = " ColorAdjust";
const char* const kVeins = " Veins";

void AddPencilSketch(EffectSpec& e) {
  ControlSpec contrast;
  contrast.param = "contrast";
  contrast.objectName = "TrackBar1";
  contrast.captionLabel = "Label1";
  contrast.caption = "Contrast:";
  contrast.minimum = 0;
  contrast.maximum = 89;
  contrast.defaultValue = 45;
  contrast.numberLabel = "Label4";
  contrast.initialNumber = "50";
  contrast.numberFor = [](int c) { return Round(static_cast<Extended>(c) * 100 / 89); };
  contrast.selects = "tone-mode";
  contrast.selectValue = static_cast<int>(PencilToneMode::Contrast);
  contrast.help = "contrast curve position; giving it selects the contrast tone";

  ControlSpec lighting;
  lighting.param = "lighting";
  lighting.objectName = "TrackBar2";
  lighting.captionLabel = "Label2";
  lighting.caption = "Lighting:";
  lighting.minimum = 0;
  lighting.maximum = 255;
  lighting.defaultValue = 128;
  lighting.numberLabel = "Label3";
  lighting.initialNumber = "50";
  lighting.numberFor = [](int v) { return Round(static_cast<Extended>(v) * 100 / 255); };
  lighting.selects = "tone-mode";
  lighting.selectValue = static_cast<int>(PencilToneMode::Lighting);
  lighting.help = "brightness shift, 128 neutral; giving it selects the lighting tone";

  ControlSpec mode;
  mode.kind = ControlKind::Hidden;
  mode.param = "tone-mode";
  mode.minimum = 0;
  mode.maximum = 1;
  mode.defaultValue = static_cast<int>(PencilToneMode::Contrast);
  mode.help = "0 contrast, 1 lighting: the slider moved last";

  e.controls = {contrast, lighting, mode};
  e.routine = [](const EffectInput& in) {
    return peccilsketch(in.source, static_cast<PencilToneMode>(in.params.GetInt("tone-mode")),
                        in.params.GetInt("contrast"), in.params.GetInt("lighting"));
  };
}

std::vector<EffectSpec> BuildEffects() {
  std::vector<EffectSpec> all;
  all.push_back(Window(1, kMono, "Pencil sketch", "Pencilsketch1Click", "TBack_and_White_Sketch",
                       "Pencil_Sketch", "Pencil Sketch", "pencil-sketch", "PencilSketch", 108, 184,
                       true));
  AddPencilSketch(all.back());
  all.push_back(Window(2, kMono, "Pen sketch", "Pensketch1Click", "TPen_Sketch", "Pen_Sketch",
                       "Pen Sketch", "pen-sketch", "PenSketch", 108, 184, true));
  all.push_back(Window(3, kMono, "Vuzorar", "Vuzorar1Click", "TVuzorar", "Vuzorar", "Vuzorar",
                       "vuzorar", "Vuzorar", 127, 205, true));
  all.push_back(Window(4, kMono, "Pen && Ink", "PenInk1Click", "TPen_and_Ink", "Pen_and_Ink",
                       "Pen and Ink", "pen-and-ink", "Pen_and_Ink", 109, 186, true));
  all.push_back(Window(5, kColor, "Color Pencil", "Colorsketch1Click", "TColor_Sketch",
                       "Color_Pencil", "Color Sketch", "color-pencil", "ZidovUzivid", 107, 184,
                       false));
  all.push_back(Window(6, kColor, "Realism", "Realism1Click", "TFormOfFringe1", "Setup for Realism",
                       "Realism", "realism", "Realism", 157, 240, false));
  all.push_back(Window(7, kColor, "Abstract", "Abstract1Click", "TFormOfFringe2",
                       "Setup for Abstract", "Abstract art", "abstract", "Abstract", 157, 240,
                       false));
  all.push_back(Window(8, kColor, "Pop art", "Popart1Click", "TFormOfFringe3", "Setup for Pop art",
                       "Pop art", "pop-art", "Pop-art", 157, 240, false));
  all.push_back(Window(9, kColor, "Water color", "Watercolor1Click", "TWater_Color", "Water_Color",
                       "Water color", "water-color", "WaterColor", 103, 184, false));
  all.push_back(Window(10, kColor, "Brume", "Brume1Click", "TBrume", "Brume", "Brume", "brume",
                       "Brume", 103, 184, false));
  all.push_back(Window(11, kAdjust, "HSL adjust", "HSLadjust1Click", "THSL_Adjust", "HSL_Adjust",
                       "HSL Adjusted", "hsl-adjust", "", 0, 0, false));
  all.push_back(Window(12, kAdjust, "Color variety", "Colorvariety1Click", "TColor_variety",
                       "Color_variety", "Color Varied", "color-variety", "", 0, 0, false));
  all.push_back(Window(13, kAdjust, "Color panel", "Colorpanel1Click", "TColor_Panel",
                       "Color_Panel", "Color Panels", "color-panel", "", 0, 0, false));
  all.push_back(Window(14, kVeins, "Texture", "exture1Click", "TTexture", "Texture", "Made texture",
                       "texture", "Texture", 288, 368, false));
  all.push_back(Window(15, kVeins, "Emboss", "Emboss1Click", "TEmboss", "Emboss", "Emboss",
                       "emboss", "Emboss", 103, 184, false));
  all.push_back(Window(16, kAdjust, "Color Filter", "ColorFilter2Click", "TColor_Filter",
                       "Color_Filter", "Color Filter", "color-filter", "", 0, 0, false));
  all.push_back(Window(17, kVeins, "Stria", "Verticalstria1Click", "TStria", "Stria", "Added stria",
                       "stria", "Stria", 159, 240, false));
  return all;
}

}  // namespace

const ControlSpec* EffectSpec::FindControl(const std::string& param) const {
  for (const ControlSpec& c : controls)
    if (c.param == param) return &c;
  return nullptr;
}

EffectParams EffectSpec::Defaults() const {
  EffectParams p;
  for (const ControlSpec& c : controls) p.Set(c.param, c.defaultValue);
  return p;
}

const std::vector<EffectSpec>& Effects() {
  static const std::vector<EffectSpec> all = BuildEffects();
  return all;
}

const EffectSpec* FindEffect(int toolNumber) {
  const auto& all = Effects();
  if (toolNumber < 1 || toolNumber > static_cast<int>(all.size())) return nullptr;
  return &all[static_cast<std::size_t>(toolNumber - 1)];
}

const EffectSpec* FindEffectByCliName(const std::string& cliName) {
  for (const EffectSpec& e : Effects())
    if (e.cliName == cliName) return &e;
  return nullptr;
}

const std::vector<MenuSpec>& EffectMenus() {
  static const std::vector<MenuSpec> menus = {
      {kMono, {1, 2, 3, 4}},
      {kColor, {5, 6, 8, 7, 9, 10}},
      {kAdjust, {13, 11, 16, 12}},
      {kVeins, {15, 14, 17}},
  };
  return menus;
}

}  // namespace quillane
