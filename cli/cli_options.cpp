#include "cli/cli_options.h"

#include <charconv>
#include <filesystem>
#include <map>
#include <optional>

#include "codecs/picture_file.h"

namespace quillane::cli {
namespace {

ParseResult Fail(std::string message, int exitCode = kExitUsage) {
  ParseResult r;
  r.error = std::move(message);
  r.exitCode = exitCode;
  return r;
}

ParseResult Plain(Command command) {
  ParseResult r;
  r.options.command = command;
  return r;
}

// The parameters a user can give for effect.
std::string SettableList(const EffectSpec& effect) {
  std::string list;
  for (const ParamSpec& p : effect.params) {
    if (p.kind == ParamKind::Hidden) continue;
    if (!list.empty()) list += ", ";
    list += "--" + p.name;
  }
  return list.empty() ? "none" : list;
}

// Walks the arguments after the command: options with values, and positional arguments.
class ArgumentWalker {
 public:
  explicit ArgumentWalker(const std::vector<std::string>& args, std::size_t first)
      : args_(args), next_(first) {}

  bool Done() const { return next_ >= args_.size(); }
  // The next argument; an option "--name=value" is split and its value held for TakeValue.
  std::string Take() {
    std::string arg = args_[next_++];
    inlineValue_.reset();
    if (arg.size() > 2 && arg.compare(0, 2, "--") == 0) {
      const std::size_t eq = arg.find('=');
      if (eq != std::string::npos) {
        inlineValue_ = arg.substr(eq + 1);
        arg.resize(eq);
      }
    }
    return arg;
  }
  // The next argument as it stands, after "--" has ended the options.
  std::string TakeRaw() { return args_[next_++]; }
  std::optional<std::string> TakeValue() {
    if (inlineValue_) {
      std::string v = std::move(*inlineValue_);
      inlineValue_.reset();
      return v;
    }
    if (Done()) return std::nullopt;
    return args_[next_++];
  }

 private:
  const std::vector<std::string>& args_;
  std::size_t next_;
  std::optional<std::string> inlineValue_;
};

bool IsOption(const std::string& arg) {
  return arg.size() > 1 && arg.front() == '-';
}

// "--a or --b": the options that select the hidden parameter name.
std::string Selectors(const EffectSpec& effect, const std::string& name) {
  std::string selectors;
  for (const ParamSpec& p : effect.params)
    if (p.selects == name) selectors += (selectors.empty() ? "--" : " or --") + p.name;
  return selectors;
}

// The output of a command that writes one picture: "-" is standard output (PNG unless --format
// says otherwise), a file's type is its extension. An empty result when it will do.
std::string CheckOutputFile(const std::string& verb, Options& o) {
  if (o.output == "-") {
    if (o.format.empty()) o.format = "png";
    return {};
  }
  if (!o.format.empty()) return "--format is for -o -; a file's type is its extension";
  std::error_code ec;
  if (std::filesystem::is_directory(o.output, ec))
    return verb + ": " + o.output + " is a folder; name the file to write in it";
  if (OutputTypeFor(o.output) == OutputType::Unknown)
    return verb + ": cannot tell the output type of '" + o.output +
           "'; end it in .jpg, .jpeg, .bmp, .wmf, .emf or .png";
  return {};
}

// A side for resize: digits only, from 1 to the largest 32-bit integer.
std::optional<int> SideValue(const std::string& text) {
  int value = 0;
  const char* end = text.data() + text.size();
  if (text.empty() || text.find_first_not_of("0123456789") != std::string::npos) return {};
  const auto read = std::from_chars(text.data(), end, value);
  if (read.ec != std::errc() || read.ptr != end || value < 1) return {};
  return value;
}

// "rotate cw|ccw INPUT", "resize WIDTH HEIGHT INPUT", "convert INPUT"; each with -o OUTPUT.
ParseResult ParsePictureCommand(Command command, const std::vector<std::string>& args) {
  const std::string& verb = args[0];
  const std::string usage = command == Command::Rotate   ? "rotate cw|ccw INPUT -o OUTPUT"
                            : command == Command::Resize ? "resize WIDTH HEIGHT INPUT -o OUTPUT"
                                                         : "convert INPUT -o OUTPUT";
  ParseResult result;
  Options& o = result.options;
  o.command = command;
  std::vector<std::string> positional;
  bool haveOutput = false;
  bool optionsEnded = false;
  ArgumentWalker walker(args, 1);
  while (!walker.Done()) {
    const std::string arg = optionsEnded ? walker.TakeRaw() : walker.Take();
    if (!optionsEnded && arg == "--") {
      optionsEnded = true;
      continue;
    }
    if (optionsEnded || !IsOption(arg) || arg == "-") {
      positional.push_back(arg);
      continue;
    }
    const bool isOutput = arg == "-o" || arg == "--output";
    if (!isOutput && arg != "--format")
      return Fail("unknown option " + arg + " for " + verb + " (usage: quillane-cli " + usage +
                  ")");
    const std::optional<std::string> value = walker.TakeValue();
    if (!value || value->empty())
      return Fail(arg + " needs a " + (isOutput ? "file name" : "type: jpg, bmp, wmf or png"));
    if (isOutput) {
      if (haveOutput) return Fail(arg + " given twice");
      o.output = *value;
      haveOutput = true;
    } else {
      if (!o.format.empty()) return Fail("--format given twice");
      o.format = AsciiLower(*value);
      if (OutputTypeFor("x." + o.format) == OutputType::Unknown)
        return Fail("--format must be jpg, jpeg, bmp, wmf, emf or png, not '" + *value + "'");
    }
  }

  const std::size_t wanted = command == Command::Rotate ? 2 : command == Command::Resize ? 3 : 1;
  if (positional.size() != wanted)
    return Fail(verb + ": expected quillane-cli " + usage + ", got " +
                std::to_string(positional.size()) +
                (positional.size() == 1 ? " argument" : " arguments") + " besides the options");
  if (command == Command::Rotate) {
    if (positional[0] != "cw" && positional[0] != "ccw")
      return Fail("rotate: the turn is cw (clockwise) or ccw (anticlockwise), not '" +
                  positional[0] + "'");
    o.turn = positional[0] == "cw" ? QuarterTurn::Clockwise : QuarterTurn::Anticlockwise;
  }
  if (command == Command::Resize) {
    const std::optional<int> w = SideValue(positional[0]);
    const std::optional<int> h = SideValue(positional[1]);
    if (!w || !h)
      return Fail(
          "resize: WIDTH and HEIGHT are whole numbers of pixels from 1 to 2147483647, "
          "not '" +
          positional[w ? 1 : 0] + "'");
    o.width = *w;
    o.height = *h;
  }
  o.input = positional.back();
  if (o.input.empty()) return Fail(verb + ": the input picture's name is empty");
  if (!haveOutput) return Fail(verb + ": say where to write the result with -o OUTPUT");
  if (std::string error = CheckOutputFile(verb, o); !error.empty()) return Fail(error);
  return result;
}

// "apply", "batch": EFFECT first, then options and positional arguments.
ParseResult ParseEffectCommand(Command command, const std::vector<std::string>& args) {
  const std::string& verb = args[0];
  if (args.size() < 2 || IsOption(args[1]))
    return Fail(verb + ": name an effect first (quillane-cli list shows them)");
  const EffectSpec* effect = FindEffectByCliName(args[1]);
  if (effect == nullptr)
    return Fail("unknown effect '" + args[1] + "' (quillane-cli list shows them)");
  if (!effect->routine) return Fail(effect->cliName + " is not yet available");
  if (command == Command::Batch && !effect->HasBatchPanel())
    return Fail(effect->cliName + " has no batch conversion; use apply on each picture");

  ParseResult result;
  Options& o = result.options;
  o.command = command;
  o.effect = effect;
  o.params = effect->Defaults();
  bool haveInput = false;
  bool haveOutput = false;
  bool optionsEnded = false;
  bool haveSeed = false;
  std::map<std::string, std::string> given;     // parameter -> the option that gave it
  std::map<std::string, std::string> selected;  // hidden parameter -> the option that chose it

  ArgumentWalker walker(args, 2);
  while (!walker.Done()) {
    const std::string arg = optionsEnded ? walker.TakeRaw() : walker.Take();
    if (!optionsEnded && arg == "--") {
      optionsEnded = true;
      continue;
    }
    if (optionsEnded || !IsOption(arg) || arg == "-") {
      if (command == Command::Batch)
        return Fail("batch: unexpected argument '" + arg + "' (use --input DIR --output DIR)");
      if (haveInput) return Fail("apply: only one input picture, but also got '" + arg + "'");
      if (arg.empty()) return Fail("apply: the input picture's name is empty");
      o.input = arg;
      haveInput = true;
      continue;
    }
    const bool isOutput = arg == "-o" || arg == "--output";
    const bool isInput = command == Command::Batch && arg == "--input";
    const bool isFormat = command == Command::Apply && arg == "--format";
    if (isOutput || isInput || isFormat) {
      const std::optional<std::string> value = walker.TakeValue();
      if (!value || value->empty())
        return Fail(arg + " needs a " +
                    (isFormat                                ? "type: jpg, bmp, wmf or png"
                     : isOutput && command == Command::Apply ? "file name"
                                                             : "folder"));
      if (isFormat) {
        if (!o.format.empty()) return Fail("--format given twice");
        o.format = AsciiLower(*value);
        if (OutputTypeFor("x." + o.format) == OutputType::Unknown)
          return Fail("--format must be jpg, jpeg, bmp, wmf, emf or png, not '" + *value + "'");
        continue;
      }
      bool& have = isOutput ? haveOutput : haveInput;
      if (have) return Fail(arg + " given twice");
      (isOutput ? o.output : o.input) = *value;
      have = true;
      continue;
    }
    if (arg == "--seed") {
      const std::optional<std::string> value = walker.TakeValue();
      std::uint32_t seed = 0;
      const char* end = value ? value->data() + value->size() : nullptr;
      const auto read =
          value ? std::from_chars(value->data(), end, seed) : std::from_chars_result{};
      if (!value || value->empty() || read.ec != std::errc() || read.ptr != end)
        return Fail("--seed must be an integer from 0 to 4294967295" +
                    (value ? ", not '" + *value + "'" : std::string()));
      if (haveSeed) return Fail("--seed given twice");
      o.seed = seed;
      haveSeed = true;
      continue;
    }
    if (arg.compare(0, 2, "--") != 0)
      return Fail("unknown option " + arg + " (quillane-cli --help shows the usage)");
    const std::string name = arg.substr(2);
    const ParamSpec* param = effect->FindParam(name);
    if (param == nullptr)
      return Fail("unknown option --" + name + " for " + effect->cliName +
                  " (its parameters: " + SettableList(*effect) + ")");
    if (param->kind == ParamKind::Hidden) {
      const std::string selectors = Selectors(*effect, name);
      return Fail(
          "--" + name + " is not an option: it is chosen by " +
          (selectors.empty() ? std::string("the other parameters") : "giving " + selectors));
    }
    const std::optional<std::string> value = walker.TakeValue();
    if (!value) return Fail(arg + " needs a value");
    if (given.count(name)) return Fail(arg + " given twice");
    given[name] = arg;
    if (!param->selects.empty()) {
      // Two sliders that each choose the tone cannot both be meant.
      const auto other = selected.find(param->selects);
      if (other != selected.end())
        return Fail(other->second + " and " + arg + " cannot be given together: each chooses the " +
                    param->selects + " (give one of them)");
      selected[param->selects] = arg;
      o.params.Set(param->selects, param->selectValue);
    }
    try {
      o.params.SetList(name, ParseParamText(*param, *value));
    } catch (const ParamError& e) {
      const std::string message = e.what();
      if (message.find("--" + name) != std::string::npos) return Fail(message);
      return Fail("--" + name + ": " + message);
    }
  }

  if (command == Command::Apply) {
    if (!haveOutput) return Fail("apply: say where to write the result with -o OUTPUT");
    if (std::string error = CheckOutputFile(verb, o); !error.empty()) return Fail(error);
  } else {
    if (!haveInput) return Fail("batch: name the input folder with --input DIR");
    if (!haveOutput) return Fail("batch: name the output folder with --output DIR");
  }
  return result;
}

ParseResult ParseGallery(const std::vector<std::string>& args) {
  ParseResult result;
  Options& o = result.options;
  o.command = Command::Gallery;
  bool haveFolder = false;
  bool haveInput = false;
  bool optionsEnded = false;
  ArgumentWalker walker(args, 1);
  while (!walker.Done()) {
    const std::string arg = optionsEnded ? walker.TakeRaw() : walker.Take();
    if (!optionsEnded && arg == "--") {
      optionsEnded = true;
      continue;
    }
    if (!optionsEnded && arg == "--input") {
      const std::optional<std::string> value = walker.TakeValue();
      if (!value || value->empty()) return Fail("--input needs a file name");
      if (haveInput) return Fail("--input given twice");
      o.input = *value;
      haveInput = true;
      continue;
    }
    if (!optionsEnded && IsOption(arg) && arg != "-")
      return Fail("unknown option " + arg + " for gallery (quillane-cli --help shows the usage)");
    if (haveFolder) return Fail("gallery: only one folder, but also got '" + arg + "'");
    o.output = arg;
    haveFolder = true;
  }
  if (!haveFolder) return Fail("gallery: name the folder to write into");
  if (o.output.empty()) return Fail("gallery: the folder's name is empty");
  return result;
}

// "--max-pixels N" or "--max-pixels=N" anywhere before "--" in the arguments of a command that
// reads pictures: taken out into maxPixels, the other arguments left in rest. An error text
// for a bad or repeated value.
std::string TakeMaxPixels(const std::vector<std::string>& args, std::vector<std::string>& rest,
                          std::int64_t& maxPixels) {
  const std::string name = "--max-pixels";
  bool optionsEnded = false;
  for (std::size_t i = 0; i < args.size(); ++i) {
    const std::string& arg = args[i];
    if (arg == "--") optionsEnded = true;
    std::optional<std::string> value;
    if (optionsEnded || i == 0 || arg.compare(0, name.size(), name) != 0) {
      rest.push_back(arg);
      continue;
    }
    if (arg == name) {
      if (i + 1 < args.size()) value = args[++i];
    } else if (arg[name.size()] == '=') {
      value = arg.substr(name.size() + 1);
    } else {
      rest.push_back(arg);  // another option that starts alike
      continue;
    }
    const std::string range = "from 1 to " + std::to_string(Bitmap32::kMaxPixels);
    std::int64_t pixels = 0;
    const char* end = value ? value->data() + value->size() : nullptr;
    const auto read =
        value ? std::from_chars(value->data(), end, pixels) : std::from_chars_result{};
    if (!value || value->empty() || read.ec != std::errc() || read.ptr != end || pixels < 1 ||
        pixels > Bitmap32::kMaxPixels)
      return name + " must be a whole number of pixels " + range +
             (value ? ", not '" + *value + "'" : std::string());
    if (maxPixels != 0) return name + " given twice";
    maxPixels = pixels;
  }
  return {};
}

}  // namespace

OutputType OutputTypeFor(const std::string& path) {
  const std::size_t dot = path.find_last_of("./");
  if (dot == std::string::npos || path[dot] != '.') return OutputType::Unknown;
  const std::string ext = AsciiLower(path.substr(dot));
  if (ext == ".jpg" || ext == ".jpeg") return OutputType::Jpeg;
  if (ext == ".bmp") return OutputType::Bitmap;
  if (ext == ".wmf" || ext == ".emf") return OutputType::Metafile;
  if (ext == ".png") return OutputType::Png;
  return OutputType::Unknown;
}

// Whether -h or --help stands where an option may: not after "--", and not as the value of an
// option (every "--name" but --version takes one, as does -o), so "-o -h" and "-- --help" are
// names of files.
bool AsksForHelp(const std::vector<std::string>& args) {
  for (std::size_t i = 0; i < args.size(); ++i) {
    const std::string& arg = args[i];
    if (arg == "--") return false;
    if (arg == "-h" || arg == "--help" || arg.rfind("--help=", 0) == 0) return true;
    if (arg == "-o" ||
        (arg.rfind("--", 0) == 0 && arg.find('=') == std::string::npos && arg != "--version"))
      ++i;
  }
  return false;
}

ParseResult ParseCommandLine(const std::vector<std::string>& args) {
  if (AsksForHelp(args)) return Plain(Command::Help);
  if (args.empty()) return Fail("no command given (quillane-cli --help shows the usage)");

  const std::string& verb = args[0];
  if (verb == "apply" || verb == "batch" || verb == "gallery" || verb == "rotate" ||
      verb == "resize" || verb == "convert") {
    std::vector<std::string> rest;
    std::int64_t maxPixels = 0;
    if (std::string error = TakeMaxPixels(args, rest, maxPixels); !error.empty())
      return Fail(error);
    if (maxPixels != 0) {
      ParseResult result = ParseCommandLine(rest);
      result.options.maxPixels = maxPixels;
      return result;
    }
  }
  if (verb == "--version" || verb == "-V") {
    if (args.size() > 1) return Fail("--version takes no arguments");
    return Plain(Command::Version);
  }
  if (verb == "help") return Plain(Command::Help);
  if (verb == "list") {
    if (args.size() > 1) return Fail("list takes no arguments");
    return Plain(Command::List);
  }
  if (verb == "manpage" || verb == "completion") {
    if (args.size() > 1) return Fail(verb + " takes no arguments");
    return Plain(verb == "manpage" ? Command::Manpage : Command::Completion);
  }
  if (verb == "apply") return ParseEffectCommand(Command::Apply, args);
  if (verb == "batch") return ParseEffectCommand(Command::Batch, args);
  if (verb == "gallery") return ParseGallery(args);
  if (verb == "rotate") return ParsePictureCommand(Command::Rotate, args);
  if (verb == "resize") return ParsePictureCommand(Command::Resize, args);
  if (verb == "convert") return ParsePictureCommand(Command::Convert, args);
  return Fail("unknown command '" + verb + "' (quillane-cli --help shows the usage)");
}

std::string VersionText() {
  return std::string("quillane-cli ") + QUILLANE_VERSION;
}

std::string UsageText() {
  return R"(Usage:
  quillane-cli list
  quillane-cli apply EFFECT [--PARAM VALUE ...] [--seed N] [INPUT] -o OUTPUT [--format TYPE]
  quillane-cli batch EFFECT [--PARAM VALUE ...] [--seed N] --input DIR --output DIR
  quillane-cli gallery DIR [--input FILE]
  quillane-cli rotate cw|ccw INPUT -o OUTPUT
  quillane-cli resize WIDTH HEIGHT INPUT -o OUTPUT
  quillane-cli convert INPUT -o OUTPUT
  quillane-cli manpage | completion
  quillane-cli --help | --version

Turns photographs into artwork with the effects of Quillane, without a window.

  list     every effect with its parameters, their ranges and defaults
  apply    one effect on one picture (the built-in picture when INPUT is left out);
           OUTPUT ends in .jpg or .jpeg (JPEG, quality 90), .bmp (24-bit bitmap),
           .wmf or .emf (metafile) or .png (lossless, keeps alpha); INPUT "-" reads
           standard input and OUTPUT "-" writes standard output, as PNG unless
           --format jpg, bmp or wmf says otherwise
  batch    one effect over every *.jpg, *.jpeg, *.bmp and *.wmf file of DIR (any case,
           sorted by name, subfolders not entered); each result is written as
           NAME-Tag.jpg into the output folder, which is created when missing
  gallery  the built-in picture (or FILE) through every effect with its defaults: one
           PNG per effect, the original, and index.html to look at them side by side
  rotate   a quarter turn clockwise (cw) or anticlockwise (ccw), as the program's
           toolbar buttons turn a picture
  resize   to WIDTH by HEIGHT pixels with the program's image size arithmetic and
           nearest-pixel resampling (a side can come out one pixel short: 400 of 521
           gives 399)
  convert  the picture saved in the type OUTPUT's extension names
  manpage  this text and the list of effects as a manual page (roff)
  completion
           a bash completion script for the commands, effects and options

INPUT may be a .jpg, .jpeg, .bmp, .ico, .gif, .wmf, .emf or .png file. Parameters take
the values "list" shows (whole numbers within their ranges, words, lists, colours);
unset ones keep their defaults; each may be given once. Values may also be written
--PARAM=VALUE, and "--" ends the options. --seed N (0 to 4294967295, default 0) starts
the random generator that brume draws from where N says, as the program starts it at 0;
the same seed, picture and settings give the same result, and a batch continues the
sequence from one picture to the next.

Pictures of more than 200000000 pixels are refused (the largest cameras write about 150
million); --max-pixels N, given to any command that reads pictures, sets another limit,
from 1 to 268435456 pixels, the most a picture can have.

Examples:
  quillane-cli apply pencil-sketch --contrast 60 photo.jpg -o sketch.png
  quillane-cli apply pencil-sketch --lighting 140 -o builtin-sketch.jpg
  quillane-cli batch pencil-sketch --input ~/Pictures --output ~/Pictures/sketches
  quillane-cli apply realism --kernel 1,2,1,0,1,0,-1,-2,-1 photo.jpg -o realism.png
  quillane-cli apply brume --scope 6 --seed 42 photo.jpg -o misty.jpg
  quillane-cli gallery gallery/
  quillane-cli rotate cw photo.jpg -o upright.jpg
  quillane-cli resize 400 266 photo.jpg -o small.png

Exit status: 0 done; 1 an input could not be read, an output could not be written,
or a batch skipped or failed pictures; 2 the command line was wrong (unknown command,
effect or option, or a value that is not a whole number within its range).
)";
}

}  // namespace quillane::cli
