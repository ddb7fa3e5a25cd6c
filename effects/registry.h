// Every effect declares itself beside its routine in one table entry: its menu entry, its tool
// window and that window's buttons, its parameters and its routine. Tool windows, batch
// conversion and the command line are all generated from these entries, so a caption, range
// or default is written exactly once; this file only collects them.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "effects/params.h"
#include "imaging/bitmap32.h"

namespace quillane {

// What a routine reads: the source picture (the picture as opened, after rotation or
// resizing), the working picture (for the windows that can start from it) and the settings,
// every parameter of the effect present. random is the program's one random generator state,
// which a routine that draws continues (null where nothing draws).
struct EffectInput {
  const Bitmap32& source;
  const Bitmap32& working;
  const EffectParams& params;
  std::uint32_t* random = nullptr;
};

using EffectRoutine = std::function<Bitmap32(const EffectInput&)>;

// The four effect menus, in the order the main window shows them.
enum class EffectMenu { Mono, Color, Adjust, Veins };
inline constexpr EffectMenu kEffectMenus[] = {EffectMenu::Mono, EffectMenu::Color,
                                              EffectMenu::Adjust, EffectMenu::Veins};
// The menu's caption as the menu bar takes it: " B&&W".
const char* MenuCaption(EffectMenu menu);
// The menu's object name: "BW1".
const char* MenuObjectName(EffectMenu menu);

// One button of a tool window that the entry names: OK, or "Convert" and "Default".
struct ButtonSpec {
  std::string objectName;
  std::string caption;
  std::string hint;
};

// What an effect gives with its defaults on the built-in picture (521 x 346): the FNV-1a hash
// of its pixel bytes, row by row, and three pixels (at (0, 0), (260, 173) and (520, 345), opaque,
// as 0xBBGGRR in memory order). The table test checks every entry against it, so that no
// effect's bytes change unseen.
struct ReferenceResult {
  std::uint64_t hash = 0;
  std::uint32_t topLeft = 0;
  std::uint32_t centre = 0;
  std::uint32_t bottomRight = 0;
};

struct EffectSpec {
  // The active tool number while the window is open: the entry's place in Effects(), from 1.
  // Set by the registry, never written in an entry.
  int toolNumber = 0;
  EffectMenu menu = EffectMenu::Mono;
  int menuPosition = 0;          // 1-based place in its menu
  std::string menuEntry;         // the entry's caption as the menu takes it: "Pen && Ink"
  std::string menuObjectName;    // the menu action's object name: "Pencilsketch1"
  std::string windowObjectName;  // the tool window's object name: "TBack_and_White_Sketch"
  std::string caption;           // window title: "Pencil_Sketch"
  std::string statusText;        // status line after apply: "Pencil Sketch"
  std::string cliName;           // "pencil-sketch"
  std::string batchTag;          // output name tag; empty when the window has no batch panel
  int collapsedHeight = 0;       // 0 for windows without a batch panel
  int expandedHeight = 0;
  bool colorUp = false;             // has the "Color up" button
  bool batchPushesHistory = false;  // its batch routine records a history step per picture
  // After each apply the line-art flag becomes this; nothing: left as it is.
  std::optional<bool> lineArtAfterApply;
  // The button that applies the settings shown; empty name: none (the window applies by
  // itself).
  ButtonSpec apply{"Button1", "OK", ""};
  // A second button that restores every parameter's default, then applies; empty name: none.
  ButtonSpec restoreDefaults;
  // The batch panel's input and output folder fields.
  std::string inputField = "Edit1";
  std::string outputField = "Edit2";
  std::vector<ParamSpec> params;
  ReferenceResult reference;
  EffectRoutine routine;  // empty until the effect is built

  bool HasBatchPanel() const { return !batchTag.empty(); }
  const ParamSpec* FindParam(const std::string& name) const;
  // Every parameter at its default.
  EffectParams Defaults() const;
};

// Every effect in tool-number order: the order of the registry's list.
const std::vector<const EffectSpec*>& Effects();

// By tool number (1 to the number of effects), or by command-line name; nullptr when there is none.
const EffectSpec* FindEffect(int toolNumber);
const EffectSpec* FindEffectByCliName(const std::string& cliName);

// The entries of one menu, in menu order.
std::vector<const EffectSpec*> MenuEffects(EffectMenu menu);

}  // namespace quillane
