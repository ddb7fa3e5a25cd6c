#include "batch/batch_convert.h"

#include <sys/stat.h>

#include <algorithm>
#include <exception>
#include <filesystem>
#include <map>
#include <optional>
#include <set>
#include <stdexcept>
#include <system_error>
#include <utility>

#include "codecs/picture_file.h"
#include "document/run_effect.h"
#include "imaging/memory_budget.h"

namespace quillane {
namespace fs = std::filesystem;

namespace {

// "*.jpg" matches every name that ends with ".jpg" in any case; only the extension is compared,
// so "*.jpg" does not also catch "x.jpeg".
bool MatchesMask(const std::string& name, std::string_view mask) {
  const std::string_view tail = mask.substr(1);  // ".jpg"
  return name.size() >= tail.size() && AsciiLower(name.substr(name.size() - tail.size())) == tail;
}

std::string JoinPath(const std::string& folder, const std::string& name) {
  if (!folder.empty() && folder.back() == '/') return folder + name;
  return folder + "/" + name;
}

std::string NotValidFormat(const std::string& path) {
  return path + " is not a valid format";
}

// Files are told apart by device and inode, so another spelling of a folder, or a link to it,
// still names the same file.
using FileId = std::pair<dev_t, ino_t>;
std::optional<FileId> IdOf(const std::string& path) {
  struct stat info {};
  if (::stat(path.c_str(), &info) != 0) return std::nullopt;
  return FileId{info.st_dev, info.st_ino};
}

}  // namespace

std::string ShownName(const std::string& text) {
  std::string shown;
  for (std::size_t i = 0; i < text.size();) {
    const auto c = static_cast<unsigned char>(text[i]);
    // The length of a well-formed UTF-8 sequence starting here, or 0.
    std::size_t length = c < 0x80                ? 1
                         : c >= 0xC2 && c < 0xE0 ? 2
                         : c >= 0xE0 && c < 0xF0 ? 3
                         : c >= 0xF0 && c < 0xF5 ? 4
                                                 : 0;
    for (std::size_t k = 1; k < length; ++k)
      if (i + k >= text.size() || (static_cast<unsigned char>(text[i + k]) & 0xC0) != 0x80)
        length = 0;
    if (length == 0 || c < 0x20 || c == 0x7F) {
      static const char kHex[] = "0123456789abcdef";
      shown += {'\\', 'x', kHex[c >> 4], kHex[c & 15]};
      ++i;
    } else {
      shown.append(text, i, length);
      i += length;
    }
  }
  return shown;
}

std::string NamingTheFile(const std::string& path, const std::string& message) {
  if (message.find(path) != std::string::npos) return message;
  return path + ": " + message;
}

std::vector<std::string> ScanBatchFolder(const std::string& folder) {
  std::vector<std::string> names;
  std::error_code ec;
  fs::directory_iterator it(folder, ec);
  if (ec) return {};
  for (const fs::directory_iterator end; it != end; it.increment(ec)) {
    if (ec) break;
    std::error_code typeError;
    if (!it->is_regular_file(typeError)) continue;
    names.push_back(it->path().filename().string());
  }
  std::sort(names.begin(), names.end());

  std::vector<std::string> list;
  for (std::string_view mask : kBatchMasks)
    for (const std::string& name : names)
      if (MatchesMask(name, mask)) list.push_back(name);
  return list;
}

std::string TrimBlanks(const std::string& text) {
  // Spaces and control characters, the blanks a pasted path picks up.
  auto blank = [](char c) { return static_cast<unsigned char>(c) <= ' '; };
  std::size_t first = 0;
  std::size_t last = text.size();
  while (first < last && blank(text[first])) ++first;
  while (last > first && blank(text[last - 1])) --last;
  return text.substr(first, last - first);
}

std::string BatchOutputName(const std::string& outputFolder, const std::string& inputName,
                            const std::string& tag) {
  const std::string stem = inputName.size() > 4 ? inputName.substr(0, inputName.size() - 4) : "";
  return JoinPath(outputFolder, stem + "-" + tag + ".jpg");
}

BatchResult ConvertBatch(PictureDocument& document, const EffectSpec& effect,
                         const EffectParams& params, const BatchJob& job,
                         const BatchObserver& observer) {
  if (!effect.routine) throw std::invalid_argument(effect.cliName + " is not available yet");
  if (!effect.HasBatchPanel())
    throw std::invalid_argument(effect.cliName + " has no batch conversion");

  BatchResult result;
  auto refuse = [&](const std::string& text) {
    if (observer.message) observer.message("Sorry", text);
    result.end = BatchResult::End::Refused;
    return result;
  };
  auto stop = [&](std::string error) {
    result.end = BatchResult::End::Stopped;
    result.error = std::move(error);
    return result;
  };

  const std::string inputFolder = TrimBlanks(job.inputFolder);
  std::error_code ec;
  if (inputFolder.empty() || !fs::is_directory(inputFolder, ec))
    return refuse("Input Director in not exist.");
  if (job.files.empty()) return refuse("There is no picture to convert.");

  const std::string outputFolder = TrimBlanks(job.outputFolder);
  if (outputFolder.empty()) return stop("No output folder was given.");
  if (!fs::is_directory(outputFolder, ec)) {
    fs::create_directories(outputFolder, ec);
    if (ec || !fs::is_directory(outputFolder))
      return stop("Cannot create the output folder " + outputFolder +
                  (ec ? ": " + ec.message() : std::string(": a file of that name exists")));
  }

  const int count = static_cast<int>(job.files.size());
  const LoaderNotice notice = observer.message;
  // Names of different inputs can lead to one output ("a.jpg", "a.JPG" and "a.bmp"), and with
  // the output folder the input folder an output can be an input ("x-Tag.jpg" beside "x.jpg"):
  // neither is ever overwritten.
  std::set<FileId> inputs;
  for (const std::string& name : job.files)
    if (const auto id = IdOf(JoinPath(inputFolder, name))) inputs.insert(*id);
  std::map<std::string, std::string> writtenFor;  // output path -> the entry that wrote it
  for (int i = 1; i <= count; ++i) {
    BatchProgress progress;
    progress.index = i;
    progress.count = count;
    progress.name = job.files[static_cast<std::size_t>(i - 1)];
    progress.outputPath = BatchOutputName(outputFolder, progress.name, effect.batchTag);
    auto report = [&](BatchProgress::Step step) {
      progress.step = step;
      if (observer.progress) observer.progress(progress);
    };
    report(BatchProgress::Step::Loading);

    auto skip = [&](std::string reason) {
      result.skipped.push_back({progress.name, reason});
      progress.reason = std::move(reason);
      report(BatchProgress::Step::Skipped);
    };
    const std::string path = JoinPath(inputFolder, progress.name);
    if (const auto taken = writtenFor.find(progress.outputPath); taken != writtenFor.end()) {
      skip(path + " was not converted: its output " + progress.outputPath +
           " was already written for " + taken->second);
      continue;
    }
    if (const auto id = IdOf(progress.outputPath); id && inputs.count(*id)) {
      skip(path + " was not converted: its output " + progress.outputPath +
           " is one of the pictures being converted");
      continue;
    }

    // Loaded into a bitmap of its own first: an entry that cannot be read must leave the
    // document, and with it the previous result, untouched and write no file.
    std::optional<TBitmap32> picture;
    std::string reason;
    try {
      picture = LoadPictureFile(path, notice);
      if (!picture || picture->Width() < 1) reason = NotValidFormat(path);
    } catch (const std::exception& e) {
      reason = NamingTheFile(path, e.what());
    }
    if (!reason.empty()) {
      skip(std::move(reason));
      continue;
    }
    const int width = picture->Width(), height = picture->Height();
    try {
      document.Load(std::move(*picture));
    } catch (const std::bad_alloc&) {
      skip(path + " " + MemoryNeedText(OperationBytes(width, height)));
      continue;
    }
    picture.reset();
    report(BatchProgress::Step::Loaded);

    try {
      RunEffect(document, effect, params, effect.batchPushesHistory);
    } catch (const std::bad_alloc&) {
      // Too large for what is left of memory: this picture only; the next may well fit.
      skip(path + " " +
           MemoryNeedText(OperationBytes(document.Source().Width(), document.Source().Height())));
      continue;
    } catch (const std::exception& e) {
      return stop(NamingTheFile(path, e.what()));
    }
    if (observer.afterEffect) observer.afterEffect(progress, document);
    report(BatchProgress::Step::Converted);

    try {
      SaveJpeg(document.Working(), progress.outputPath, 90);
    } catch (const std::exception& e) {
      return stop("Cannot write " + progress.outputPath + ": " + e.what());
    }
    result.outputs.push_back(progress.outputPath);
    writtenFor.emplace(progress.outputPath, progress.name);
    report(BatchProgress::Step::Written);
  }
  return result;
}

}  // namespace quillane
