#include "cli/cli_commands.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <sstream>
#include <vector>

#include "batch/batch_convert.h"
#include "cli/cli_docs.h"
#include "codecs/codec_internal.h"
#include "codecs/picture_file.h"
#include "data/startup_picture.h"
#include "document/reshape.h"
#include "document/run_effect.h"
#include "imaging/memory_budget.h"

namespace quillane::cli {
namespace fs = std::filesystem;

namespace {

// Standard input is read whole into memory, never into a temporary file: nothing of it is
// left on disk however the command ends, and a full disk cannot damage it. It is held to what
// a picture file may be and to the memory this process may still take, checked before the
// buffer grows; a stream that starts like no picture is refused at its first bytes.
std::vector<std::uint8_t> ReadStandardInput() {
  constexpr std::int64_t kMaxInput = std::int64_t{2} << 30;  // as for a picture file
  constexpr std::size_t kSniffBytes = 64;
  const auto tooLarge = [] {
    return PictureFileError("standard input is larger than the " + MemoryAmount(kMaxInput) +
                            " a picture file may be");
  };
  std::vector<std::uint8_t> bytes;
  bytes.reserve(std::size_t{1} << 20);
  std::vector<std::uint8_t> chunk(std::size_t{1} << 16);
  bool sniffed = false;
  for (;;) {
    const std::size_t want = sniffed ? chunk.size() : kSniffBytes - bytes.size();
    const ssize_t got = ::read(STDIN_FILENO, chunk.data(), want);
    if (got < 0) {
      if (errno == EINTR) continue;
      throw PictureFileError(std::string("standard input cannot be read: ") + std::strerror(errno));
    }
    const auto size = static_cast<std::int64_t>(bytes.size()) + got;
    if (size > kMaxInput) throw tooLarge();
    if (static_cast<std::size_t>(size) > bytes.capacity()) {
      // Doubled, up to one byte past the largest file: room enough to tell it is larger.
      const std::int64_t grown =
          std::min(static_cast<std::int64_t>(bytes.capacity()) * 2, kMaxInput + 1);
      if (grown > AvailableMemory())
        throw PictureFileError("standard input is too large for the memory available: it " +
                               MemoryNeedText(grown));
      bytes.reserve(static_cast<std::size_t>(grown));
    }
    bytes.insert(bytes.end(), chunk.begin(), chunk.begin() + got);
    if (!sniffed && (got == 0 || bytes.size() == kSniffBytes)) {
      if (codecs::SniffFamily(codecs::Bytes(bytes)).empty())
        throw PictureFileError("standard input is not a picture the program reads");
      sniffed = true;
    }
    if (got == 0) return bytes;
  }
}

// The picture on standard input, decoded from memory by what its first bytes say it is.
Bitmap32 DecodeStandardInput(const std::vector<std::uint8_t>& bytes) {
  try {
    return codecs::DecodeByContent(codecs::Bytes(bytes));
  } catch (const std::bad_alloc&) {
    throw PictureFileError("standard input: there is not enough memory to open the picture (" +
                           MemoryAmount(AvailableMemory()) + " are available)");
  } catch (const std::exception& e) {
    throw PictureFileError(std::string("standard input: ") + e.what());
  }
}

// The picture named by --input or INPUT ("-": standard input), or the built-in one when none is
// named; nothing (with the reason told on err) when it cannot be read.
std::optional<Bitmap32> InputOrBuiltInPicture(const Options& o, std::ostream& err) {
  if (o.input.empty()) return StartupPicture();
  std::string error;
  std::optional<Bitmap32> loaded;
  if (o.input == "-") {
    try {
      loaded = DecodeStandardInput(ReadStandardInput());
    } catch (const std::bad_alloc&) {
      error = "standard input is too large for the memory available (" +
              MemoryAmount(AvailableMemory()) + " are available)";
    } catch (const std::exception& e) {
      error = e.what();
    }
  } else {
    loaded = LoadInputPicture(o.input, error, err);
  }
  if (!loaded) err << "quillane-cli: " << ShownName(error) << "\n";
  return loaded;
}

// The bytes of picture in the type OutputTypeFor gives name, made in memory.
std::vector<std::uint8_t> EncodeOutput(const Bitmap32& picture, const std::string& name) {
  codecs::MemorySink sink;
  switch (OutputTypeFor(name)) {
    case OutputType::Jpeg:
      return codecs::EncodeJpeg(picture, 90);
    case OutputType::Png:
      return codecs::EncodePng(picture);
    case OutputType::Bitmap:
      codecs::EncodeBitmap24(picture, sink);
      return std::move(sink.bytes());
    case OutputType::Metafile:
      codecs::EncodeEnhancedMetafile(picture, sink);
      return std::move(sink.bytes());
    case OutputType::Unknown:
      break;
  }
  throw PictureFileError("unknown output type: " + name);
}

// Standard output closed by its reader (a pipe into head): the command ends without a word.
struct OutputClosed {};

// Writes picture to o.output, or as o.format to out when the output is "-". That one is made
// in memory: no file of it exists at any moment, so none can be left behind.
void WriteOutput(const Bitmap32& picture, const Options& o, std::ostream& out) {
  if (o.output != "-") {
    SaveOutputPicture(picture, o.output);
    return;
  }
  const std::vector<std::uint8_t> bytes = EncodeOutput(picture, "x." + o.format);
  errno = 0;
  out.write(reinterpret_cast<const char*>(bytes.data()),
            static_cast<std::streamsize>(bytes.size()));
  out.flush();
  if (!out && errno == EPIPE) throw OutputClosed();
  if (!out) throw PictureFileError("standard output could not be written");
}

// WriteOutput, with a failure written to err as the reason the command failed.
bool WriteOutputOrSay(const Bitmap32& picture, const Options& o, std::ostream& out,
                      std::ostream& err) {
  try {
    WriteOutput(picture, o, out);
    return true;
  } catch (const OutputClosed&) {
    return false;
  } catch (const std::exception& e) {
    err << "quillane-cli: cannot write "
        << (o.output == "-" ? std::string("to standard output") : ShownName(o.output)) << ": "
        << ShownName(e.what()) << "\n";
    return false;
  }
}

int ApplyCommand(const Options& o, std::ostream& out, std::ostream& err) {
  std::optional<Bitmap32> picture = InputOrBuiltInPicture(o, err);
  if (!picture) return kExitFailed;
  const std::string name = o.input.empty() ? "the built-in picture" : o.input;
  const int width = picture->Width(), height = picture->Height();
  try {
    // Through a document, as the program does it: alpha 255, source in, working out. A
    // one-shot command cannot undo, so it keeps no history.
    PictureDocument document(std::move(*picture), PictureDocument::History::None);
    document.RandomState() = o.seed;
    try {
      RunEffect(document, *o.effect, o.params, false);
    } catch (const std::bad_alloc&) {
      throw;
    } catch (const std::exception& e) {
      err << "quillane-cli: " << o.effect->cliName << ": " << ShownName(e.what()) << "\n";
      return kExitFailed;
    }
    if (!WriteOutputOrSay(document.Working(), o, out, err)) return kExitFailed;
  } catch (const std::bad_alloc&) {
    err << "quillane-cli: " << o.effect->cliName << ": " << ShownName(name) << " "
        << MemoryNeedText(OperationBytes(width, height)) << "\n";
    return kExitFailed;
  }
  if (o.output != "-") out << ShownName(o.output) << "\n";
  return kExitOk;
}

// rotate, resize and convert: the picture opened as the program opens it (alpha 255), turned or
// resampled as the program does it, and written in the type the output names.
int PictureCommand(const Options& o, std::ostream& out, std::ostream& err) {
  std::optional<Bitmap32> picture = InputOrBuiltInPicture(o, err);
  if (!picture) return kExitFailed;
  const std::string name = o.input == "-" ? std::string("standard input") : o.input;
  const int width = picture->Width(), height = picture->Height();
  const std::string verb = o.command == Command::Rotate   ? "rotate"
                           : o.command == Command::Resize ? "resize"
                                                          : "convert";
  try {
    PictureDocument document(std::move(*picture), PictureDocument::History::None);
    if (o.command == Command::Rotate && !RotateDocument(document, o.turn)) {
      err << "quillane-cli: rotate: " << ShownName(name) << " (" << width << " by " << height
          << " pixels) is too small to turn\n";
      return kExitFailed;
    }
    if (o.command == Command::Resize) {
      const ResizeResult result = ResizeDocument(document, o.width, o.height);
      if (result == ResizeResult::TooSmall) {
        const SizeFactors f = ImageSizeFactors(o.width, o.height, width, height);
        err << "quillane-cli: resize: " << o.width << " by " << o.height << " would make the "
            << width << " by " << height << " picture " << ResampledSide(width, f.width) << " by "
            << ResampledSide(height, f.height) << " pixels\n";
        return kExitUsage;
      }
      if (result == ResizeResult::TooLarge) {
        err << "quillane-cli: resize: " << o.width << " by " << o.height
            << " pixels is larger than the " << Bitmap32::kMaxPixels
            << " pixels a picture may have\n";
        return kExitUsage;
      }
    }
    if (!WriteOutputOrSay(document.Working(), o, out, err)) return kExitFailed;
    if (o.output != "-")
      out << ShownName(o.output) << ": " << document.Working().Width() << " by "
          << document.Working().Height() << " pixels\n";
  } catch (const NotEnoughMemory& e) {
    err << "quillane-cli: " << verb << ": " << ShownName(e.what()) << "\n";
    return kExitFailed;
  } catch (const std::bad_alloc&) {
    err << "quillane-cli: " << verb << ": " << ShownName(name) << " "
        << MemoryNeedText(OperationBytes(width, height)) << "\n";
    return kExitFailed;
  }
  return kExitOk;
}

// Batch progress on a terminal: one line redrawn in place.
class ProgressBar {
 public:
  explicit ProgressBar(std::ostream& err) : err_(err) {}
  ~ProgressBar() { Finish(); }

  void Draw(int index, int count, const std::string& name) {
    constexpr int kWidth = 30;
    const int filled = count > 0 ? (index - 1) * kWidth / count : 0;
    err_ << "\r[" << std::string(static_cast<std::size_t>(filled), '#')
         << std::string(static_cast<std::size_t>(kWidth - filled), '.') << "] " << index << "/"
         << count << " " << ShownName(name) << "\x1b[K" << std::flush;
    drawn_ = true;
  }
  // A line of its own above the bar.
  void Print(const std::string& line) {
    if (drawn_) err_ << "\r\x1b[K";
    err_ << ShownName(line) << "\n" << std::flush;
    drawn_ = false;
  }
  void Finish() {
    if (drawn_) err_ << "\r\x1b[K" << std::flush;
    drawn_ = false;
  }

 private:
  std::ostream& err_;
  bool drawn_ = false;
};

int BatchCommand(const Options& o, std::ostream& out, std::ostream& err, bool terminal) {
  const std::string inputFolder = TrimBlanks(o.input);
  BatchScan scan = ScanBatchFolderTelling(inputFolder);
  if (!scan.error.empty()) {
    err << "quillane-cli: " << ShownName(scan.error) << "\n";
    return kExitFailed;
  }
  BatchJob job{o.input, o.output, std::move(scan.files)};
  PictureDocument document;
  document.RandomState() = o.seed;
  ProgressBar bar(err);

  BatchObserver observer;
  observer.message = [&](const std::string& caption, const std::string& text) {
    bar.Print(caption + ": " + text);
  };
  observer.progress = [&](const BatchProgress& p) {
    const std::string position =
        "picture " + std::to_string(p.index) + " of " + std::to_string(p.count) + ": ";
    switch (p.step) {
      case BatchProgress::Step::Loading:
        if (terminal) bar.Draw(p.index, p.count, p.name);
        break;
      case BatchProgress::Step::Written:
        if (!terminal) bar.Print(position + p.name + " -> " + p.outputPath);
        break;
      case BatchProgress::Step::Skipped:
        bar.Print(position + p.name + " skipped: " + p.reason);
        break;
      default:
        break;
    }
  };
  const BatchResult result = ConvertBatch(document, *o.effect, o.params, job, observer);
  bar.Finish();

  // Entries named like pictures that are no files are skipped pictures too.
  std::vector<BatchSkipped> skipped;
  for (auto& [name, reason] : scan.notFiles) skipped.push_back({name, reason});
  skipped.insert(skipped.end(), result.skipped.begin(), result.skipped.end());
  const auto listSkipped = [&] {
    if (skipped.empty()) return;
    err << "Skipped " << skipped.size() << (skipped.size() == 1 ? " picture:\n" : " pictures:\n");
    for (const BatchSkipped& s : skipped)
      err << "  " << ShownName(s.name) << ": " << ShownName(s.reason) << "\n";
  };
  if (result.end == BatchResult::End::Refused) {
    listSkipped();
    return kExitFailed;
  }
  const std::size_t listed = job.files.size() + scan.notFiles.size();
  if (result.end == BatchResult::End::Stopped)
    err << "quillane-cli: " << ShownName(result.error) << "\n";
  out << "Converted " << result.outputs.size() << " of " << listed
      << (listed == 1 ? " picture" : " pictures") << " into " << ShownName(TrimBlanks(o.output))
      << "\n";
  listSkipped();
  if (result.end == BatchResult::End::Stopped) {
    const std::size_t left = listed - result.outputs.size() - skipped.size();
    err << "Stopped before the end; " << left
        << (left == 1 ? " picture was not converted.\n" : " pictures were not converted.\n");
    return kExitFailed;
  }
  if (!result.AllConverted() || !skipped.empty()) return kExitFailed;
  out << "The batch convert is successful.\n";
  return kExitOk;
}

struct GalleryEntry {
  std::string title;
  std::string file;
};

std::string GalleryHtml(const std::string& sourceName, const GalleryEntry& original,
                        const std::vector<std::pair<std::string, std::vector<GalleryEntry>>>& menus,
                        const std::vector<std::string>& unavailable) {
  auto figure = [](const GalleryEntry& e) {
    const std::string file = HtmlEscape(e.file);
    const std::string title = HtmlEscape(e.title);
    return "<figure><a href=\"" + file + "\"><img src=\"" + file + "\" alt=\"" + title +
           "\"></a><figcaption>" + title + "</figcaption></figure>\n";
  };
  std::ostringstream html;
  html << "<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\">\n"
          "<title>Quillane effects</title>\n<style>\n"
          "body { font-family: sans-serif; margin: 2em; background: #f3f3f0; color: #222; }\n"
          ".sheet { display: flex; flex-wrap: wrap; gap: 1.5em; }\n"
          "figure { margin: 0; padding: 0.6em; background: #fff; "
          "box-shadow: 0 1px 4px rgba(0,0,0,.2); }\n"
          "img { display: block; max-width: 360px; height: auto; }\n"
          "figcaption { margin-top: 0.4em; text-align: center; }\n"
          "</style>\n</head>\n<body>\n<h1>Quillane effects</h1>\n<p>Every effect with its "
          "default settings, applied to "
       << HtmlEscape(sourceName) << ".</p>\n";
  html << "<h2>Original</h2>\n<div class=\"sheet\">\n" << figure(original) << "</div>\n";
  for (const auto& [menu, entries] : menus) {
    if (entries.empty()) continue;
    html << "<h2>" << HtmlEscape(menu) << "</h2>\n<div class=\"sheet\">\n";
    for (const GalleryEntry& e : entries) html << figure(e);
    html << "</div>\n";
  }
  if (!unavailable.empty()) {
    html << "<p>Not yet available: ";
    for (std::size_t i = 0; i < unavailable.size(); ++i)
      html << (i ? ", " : "") << HtmlEscape(unavailable[i]);
    html << ".</p>\n";
  }
  html << "</body>\n</html>\n";
  return html.str();
}

int GalleryCommand(const Options& o, std::ostream& out, std::ostream& err) {
  std::optional<Bitmap32> picture = InputOrBuiltInPicture(o, err);
  if (!picture) return kExitFailed;
  const std::string sourceName =
      o.input.empty() ? "the built-in picture" : fs::path(o.input).filename().string();
  std::error_code ec;
  fs::create_directories(o.output, ec);
  if (!fs::is_directory(o.output)) {
    err << "quillane-cli: cannot create the folder " << ShownName(o.output)
        << (ec ? ": " + ec.message() : std::string()) << "\n";
    return kExitFailed;
  }

  const fs::path folder(o.output);
  PictureDocument document(std::move(*picture), PictureDocument::History::None);
  int status = kExitOk;
  auto write = [&](const Bitmap32& p, const std::string& file) {
    try {
      SavePng(p, (folder / file).string(), LinkAtTarget::Refuse);
      return true;
    } catch (const std::exception& e) {
      err << "quillane-cli: cannot write " << ShownName((folder / file).string()) << ": "
          << ShownName(e.what()) << "\n";
      status = kExitFailed;
      return false;
    }
  };
  if (!write(document.Working(), "original.png")) return kExitFailed;

  std::vector<std::pair<std::string, std::vector<GalleryEntry>>> menus;
  std::vector<std::string> unavailable;
  int written = 0;
  for (EffectMenu menu : kEffectMenus) {
    menus.push_back({DisplayedCaption(MenuCaption(menu)), {}});
    for (const EffectSpec* effect : MenuEffects(menu)) {
      const std::string title = DisplayedCaption(effect->menuEntry);
      if (!effect->routine) {
        unavailable.push_back(title);
        continue;
      }
      const std::string file = effect->cliName + ".png";
      try {
        // Every effect starts from the picture as opened, as it does in the program.
        PictureDocument trial = document;
        RunEffect(trial, *effect, {}, false);
        if (!write(trial.Working(), file)) continue;
      } catch (const std::bad_alloc&) {
        err << "quillane-cli: " << effect->cliName << ": " << ShownName(sourceName) << " "
            << MemoryNeedText(OperationBytes(document.Source().Width(), document.Source().Height()))
            << "\n";
        status = kExitFailed;
        continue;
      } catch (const std::exception& e) {
        err << "quillane-cli: " << effect->cliName << ": " << ShownName(e.what()) << "\n";
        status = kExitFailed;
        continue;
      }
      menus.back().second.push_back({title, file});
      ++written;
    }
  }

  const std::string index = (folder / "index.html").string();
  try {
    SaveTextFile(GalleryHtml(sourceName, {"Original", "original.png"}, menus, unavailable), index,
                 LinkAtTarget::Refuse);
  } catch (const std::exception& e) {
    err << "quillane-cli: cannot write " << ShownName(index) << ": " << ShownName(e.what()) << "\n";
    return kExitFailed;
  }
  out << "Wrote " << written << (written == 1 ? " effect" : " effects") << " and the original into "
      << ShownName(o.output) << "; open " << ShownName(index) << " to see them.\n";
  return status;
}

}  // namespace

std::optional<Bitmap32> LoadInputPicture(const std::string& path, std::string& error,
                                         std::ostream& notices) {
  try {
    std::optional<Bitmap32> picture =
        AsciiLower(fs::path(path).extension().string()) == ".png"
            ? LoadPng(path)
            : LoadPictureFile(path, [&](const std::string& caption, const std::string& text) {
                notices << caption << ": " << text << "\n";
              });
    if (!picture) {
      // Not there, or not reachable: a link loop or a folder that may not be entered is no
      // missing file.
      struct stat info {};
      const int why = ::stat(path.c_str(), &info) == 0 ? 0 : errno;
      error = path + ": " +
              (why == ELOOP ? "a symbolic link loop (" + std::string(std::strerror(why)) + ")"
               : why != 0 && why != ENOENT ? std::string(std::strerror(why))
                                           : std::string("no such file"));
      return std::nullopt;
    }
    if (picture->Width() < 1) {
      error = path + " is not a valid format";
      return std::nullopt;
    }
    return picture;
  } catch (const std::exception& e) {
    error = NamingTheFile(path, e.what());
    return std::nullopt;
  }
}

void SaveOutputPicture(const Bitmap32& picture, const std::string& path) {
  switch (OutputTypeFor(path)) {
    case OutputType::Jpeg:
      SaveJpeg(picture, path, 90);
      return;
    case OutputType::Bitmap:
      SaveBitmap24(picture, path);
      return;
    case OutputType::Metafile:
      SaveMetafile(picture, path);
      return;
    case OutputType::Png:
      SavePng(picture, path);
      return;
    case OutputType::Unknown:
      break;
  }
  throw PictureFileError("unknown output type: " + path);
}

std::string DisplayedCaption(const std::string& caption) {
  std::string shown;
  for (std::size_t i = 0; i < caption.size(); ++i) {
    if (caption[i] != '&') {
      shown += caption[i];
    } else if (i + 1 < caption.size() && caption[i + 1] == '&') {
      shown += '&';
      ++i;
    }
  }
  return TrimBlanks(shown);
}

std::string HtmlEscape(const std::string& text) {
  std::string escaped;
  escaped.reserve(text.size());
  for (char c : text) {
    switch (c) {
      case '&':
        escaped += "&amp;";
        break;
      case '<':
        escaped += "&lt;";
        break;
      case '>':
        escaped += "&gt;";
        break;
      case '"':
        escaped += "&quot;";
        break;
      case '\'':
        escaped += "&#39;";
        break;
      default:
        escaped += c;
    }
  }
  return escaped;
}

std::string EffectListText() {
  std::ostringstream text;
  text << "Effects (quillane-cli apply EFFECT [--PARAM VALUE ...]); parameters not given keep "
          "their defaults.\n";
  for (EffectMenu menu : kEffectMenus) {
    text << "\n" << DisplayedCaption(MenuCaption(menu)) << "\n";
    for (const EffectSpec* e : MenuEffects(menu)) {
      text << "  " << e->cliName << "  (" << DisplayedCaption(e->menuEntry) << ")";
      if (!e->routine) {
        text << "  not yet available\n";
        continue;
      }
      text << (e->HasBatchPanel() ? "  batch output NAME-" + e->batchTag + ".jpg"
                                  : std::string("  no batch conversion"))
           << "\n";
      for (const ParamSpec& p : e->params) {
        if (p.kind == ParamKind::Hidden) {
          std::string selectors;
          for (const ParamSpec& s : e->params)
            if (s.selects == p.name) selectors += (selectors.empty() ? "--" : " or --") + s.name;
          text << "      " << p.name << " is not an option of its own: ";
          if (!selectors.empty()) text << "giving " << selectors << " chooses it; ";
          text << DescribeParam(p);
          if (!p.help.empty()) text << " (" << p.help << ")";
          text << "\n";
          continue;
        }
        const std::string description = DescribeParam(p);
        const std::size_t gap = description.find("  ");
        std::string option = "--" + p.name + " " + description.substr(0, gap);
        option.resize(std::max<std::size_t>(option.size() + 1, 23), ' ');
        text << "      " << option << " "
             << (gap == std::string::npos ? "" : description.substr(gap + 2));
        if (!p.help.empty()) text << "; " << p.help;
        text << "\n";
      }
      if (e->params.empty()) text << "      no parameters\n";
    }
  }
  return text.str();
}

int RunCommand(const Options& options, std::ostream& out, std::ostream& err, bool terminal) {
  switch (options.command) {
    case Command::Help:
      out << UsageText();
      return kExitOk;
    case Command::Version:
      out << VersionText() << "\n";
      return kExitOk;
    case Command::List:
      out << EffectListText();
      return kExitOk;
    case Command::Apply:
      return ApplyCommand(options, out, err);
    case Command::Batch:
      return BatchCommand(options, out, err, terminal);
    case Command::Gallery:
      return GalleryCommand(options, out, err);
    case Command::Rotate:
    case Command::Resize:
    case Command::Convert:
      return PictureCommand(options, out, err);
    case Command::Manpage:
      out << ManPageText();
      return kExitOk;
    case Command::Completion:
      out << BashCompletionText();
      return kExitOk;
  }
  return kExitUsage;
}

}  // namespace quillane::cli
