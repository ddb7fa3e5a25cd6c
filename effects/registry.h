// The one description of every effect: its menu entry, its tool window and that window's
// controls, and its routine. Tool windows, batch conversion and the command line are all
// generated from this table, so a caption, range or default is written exactly once.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "imaging/bitmap32.h"

namespace quillane {

// Parameter values by parameter name (the kebab-case name the command line uses).
class EffectParams {
 public:
  void Set(const std::string& name, std::int64_t value) { values_[name] = value; }
  bool Has(const std::string& name) const { return values_.count(name) != 0; }
  // The value of name; std::out_of_range when it was never set.
  std::int64_t Get(const std::string& name) const { return values_.at(name); }
  int GetInt(const std::string& name) const { return static_cast<int>(Get(name)); }
  const std::map<std::string, std::int64_t>& Values() const { return values_; }

 private:
  std::map<std::string, std::int64_t> values_;
};

enum class ControlKind {
  Slider,    // a track bar with an optional number label beside it
  CheckBox,  // 0 or 1
  Hidden,    // a setting with no control of its own (chosen by other controls)
};

struct ControlSpec {
  ControlKind kind = ControlKind::Slider;
  std::string param;         // parameter name: "contrast"
  std::string objectName;    // the control's name: "TrackBar1"
  std::string captionLabel;  // the label naming it: "Label1" (may be empty)
  std::string caption;       // that label's text: "Contrast:"
  int minimum = 0;
  int maximum = 0;
  int defaultValue = 0;
  int pageStep = 0;           // 0: the toolkit's default
  std::string numberLabel;    // the label showing the number: "Label4" (may be empty)
  std::string initialNumber;  // its caption before the control first moves: "50"
  // The number shown for a position; empty: the position itself.
  std::function<int(int)> numberFor;
  // Moving this control sets another parameter: for example the pencil's sliders choose the
  // tone mode. Empty when it selects nothing.
  std::string selects;
  int selectValue = 0;
  std::string help;  // one line for the command line's list
};

// What a routine reads: the source picture (the picture as opened, after rotation or
// resizing), the working picture (for the windows that can start from it) and the settings.
struct EffectInput {
  const TBitmap32& source;
  const TBitmap32& working;
  const EffectParams& params;
};

using EffectRoutine = std::function<TBitmap32(const EffectInput&)>;

struct EffectSpec {
  int toolNumber = 0;       // 1..17, the active tool number while the window is open
  std::string menu;         // the menu's caption: " B&&W"
  std::string menuEntry;    // the entry's caption as displayed: "Pencil sketch"
  std::string menuHandler;  // "Pencilsketch1Click"; also the menu action's object name
  std::string windowClass;  // "TBack_and_White_Sketch"; the window's object name
  std::string caption;      // window title: "Pencil_Sketch"
  std::string statusText;   // status line after apply: "Pencil Sketch"
  std::string cliName;      // "pencil-sketch"
  std::string batchTag;     // output name tag; empty when the window has no batch panel
  int collapsedHeight = 0;  // 0 for windows without a batch panel
  int expandedHeight = 0;
  bool colorUp = false;             // has the "Color up" button
  bool batchPushesHistory = false;  // its batch routine records a history step per picture
  std::vector<ControlSpec> controls;
  EffectRoutine routine;  // empty until the effect is built

  bool HasBatchPanel() const { return !batchTag.empty(); }
  const ControlSpec* FindControl(const std::string& param) const;
  // Every parameter at its default.
  EffectParams Defaults() const;
};

// The seventeen effects in tool-number order.
const std::vector<EffectSpec>& Effects();

// By tool number (1..17), or by command-line name; nullptr when there is none.
const EffectSpec* FindEffect(int toolNumber);
const EffectSpec* FindEffectByCliName(const std::string& cliName);

// The menus in the order the main window shows them, with their entries in menu order.
struct MenuSpec {
  std::string caption;
  std::vector<int> toolNumbers;
};
const std::vector<MenuSpec>& EffectMenus();

}  // namespace quillane
