// The parameters of an effect and their kinds. A parameter's kind decides how a tool window
// shows it, how the command line reads it and how "list" describes it; its declaration (name,
// control names, range, default) is written once, in the effect's table entry.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

namespace quillane {

enum class ParamKind {
  Slider,  // a whole number on a track bar, with an optional number label beside it
  Cells,   // whole numbers typed into a grid of text cells (a convolution kernel)
  Choice,  // one of a few named options: radio buttons; a word on the command line
  Switch,  // a check box: 0 or 1
  Colour,  // 0x00BBGGRR from a colour panel and the colour dialog; RRGGBB on the command line
  Clicks,  // a sequence of named options, as swatches clicked one after another
  Hidden,  // a setting with no control of its own, chosen by other controls
};

// One option of a Choice or Clicks parameter. Its value is its 1-based position.
struct ParamOption {
  std::string word;        // on the command line: "rising"
  std::string caption;     // on the control: "///"
  std::string objectName;  // the control: "RadioButton1"
  std::string hint;        // its tooltip; may be empty
};

struct ParamSpec {
  ParamKind kind = ParamKind::Slider;
  std::string name;          // kebab-case, the command line's option: "contrast"
  std::string objectName;    // the control (Slider, Switch, Colour): "TrackBar1"
  std::string captionLabel;  // the label naming it: "Label1" (may be empty)
  std::string caption;       // that label's text, or the check box's: "Contrast:"
  std::int64_t minimum = 0;  // Slider, Hidden; Cells: each cell's range
  std::int64_t maximum = 0;
  std::int64_t defaultValue = 0;  // Slider, Switch, Choice (1-based), Colour, Hidden
  int pageStep = 0;               // Slider; 0: the toolkit's default
  std::string numberLabel;        // Slider: the label showing the number (may be empty)
  std::string initialNumber;      // its caption before the slider first moves
  // Slider: the number shown for a position; null: the position itself.
  int (*numberFor)(int position) = nullptr;
  // Setting this parameter sets another one: the pencil's sliders choose its tone mode.
  std::string selects;
  int selectValue = 0;
  // Cells: the cells' object names in value order, laid out in rows of `columns`, and their
  // texts at start and after "Default".
  std::vector<std::string> cells;
  int columns = 3;
  std::vector<std::int64_t> defaultList;
  std::string hint;                  // the control's tooltip (every cell's, for Cells)
  std::vector<ParamOption> options;  // Choice, Clicks
  std::string help;                  // one line for the command line's list
  bool resetOnShow = false;          // every showing of the window puts it back to its default

  // How many values the parameter holds: its cells for Cells, any number for Clicks, else 1.
  bool IsList() const { return kind == ParamKind::Cells || kind == ParamKind::Clicks; }
};

// A value that cannot be a parameter's: what() is the sentence to show the user.
class ParamError : public std::invalid_argument {
 public:
  using std::invalid_argument::invalid_argument;
};

// Parameter values by parameter name. Every value is a list of whole numbers; a scalar
// parameter holds one.
class EffectParams {
 public:
  using Values = std::vector<std::int64_t>;

  void Set(const std::string& name, std::int64_t value) { values_[name] = Values{value}; }
  void SetList(const std::string& name, Values values) { values_[name] = std::move(values); }
  bool Has(const std::string& name) const { return values_.count(name) != 0; }
  // The (first) value of name; std::out_of_range when it was never set or is an empty list.
  std::int64_t Get(const std::string& name) const { return values_.at(name).at(0); }
  int GetInt(const std::string& name) const { return static_cast<int>(Get(name)); }
  const Values& GetList(const std::string& name) const { return values_.at(name); }
  const std::map<std::string, Values>& All() const { return values_; }
  // Every value of other replaces the one of the same name here.
  void Merge(const EffectParams& other);

  friend bool operator==(const EffectParams&, const EffectParams&) = default;

 private:
  std::map<std::string, Values> values_;
};

// The parameter's value at its default.
EffectParams::Values DefaultValue(const ParamSpec& param);

// A whole number as typed into a cell or given on the command line: optional sign and decimal
// digits, within 32 bits. ParamError "'text' is not a valid integer value" otherwise.
std::int64_t ParseWholeNumber(const std::string& text);

// The command line's text for param, checked against its kind and range. ParamError naming
// the option and what it takes otherwise.
EffectParams::Values ParseParamText(const ParamSpec& param, const std::string& text);

// What the command line's "list" says of param: its value syntax and range, its default.
std::string DescribeParam(const ParamSpec& param);

// The 1-based option of a Choice or Clicks parameter named word (or given by its number);
// nothing when there is none.
std::optional<int> FindOption(const ParamSpec& param, const std::string& word);

}  // namespace quillane
