#include "batch/batch_convert.h"

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <exception>
#include <filesystem>
#include <future>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <stdexcept>
#include <system_error>
#include <utility>
#include <vector>

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

namespace {

// What an entry that is not a regular file is, for the list of skipped ones.
std::string WhatItIs(const std::string& path) {
  struct stat info {};
  if (::stat(path.c_str(), &info) != 0) {
    const int error = errno;
    if (error == ELOOP) return "a symbolic link loop";
    if (error == ENOENT && ::lstat(path.c_str(), &info) == 0) return "a symbolic link to nothing";
    return std::strerror(error);
  }
  if (S_ISDIR(info.st_mode)) return "a folder";
  if (S_ISFIFO(info.st_mode)) return "a FIFO (named pipe)";
  if (S_ISSOCK(info.st_mode)) return "a socket";
  if (S_ISCHR(info.st_mode) || S_ISBLK(info.st_mode)) return "a device";
  return "not a regular file";
}

}  // namespace

BatchScan ScanBatchFolderTelling(const std::string& folder) {
  BatchScan scan;
  std::vector<std::string> names;
  std::vector<std::string> others;
  std::error_code ec;
  fs::directory_iterator it(folder, ec);
  if (ec) {
    if (ec != std::errc::no_such_file_or_directory && ec != std::errc::not_a_directory)
      scan.error = "Cannot read the folder " + folder + ": " + ec.message();
    return scan;
  }
  for (const fs::directory_iterator end; it != end; it.increment(ec)) {
    if (ec) {
      scan.error = "Cannot read the folder " + folder + ": " + ec.message();
      break;
    }
    std::error_code typeError;
    (it->is_regular_file(typeError) ? names : others).push_back(it->path().filename().string());
  }
  std::sort(names.begin(), names.end());
  std::sort(others.begin(), others.end());
  for (std::string_view mask : kBatchMasks) {
    for (const std::string& name : names)
      if (MatchesMask(name, mask)) scan.files.push_back(name);
    for (const std::string& name : others) {
      if (!MatchesMask(name, mask)) continue;
      const std::string path = JoinPath(folder, name);
      scan.notFiles.emplace_back(name, path + " is not a picture file: it is " + WhatItIs(path));
    }
  }
  return scan;
}

std::vector<std::string> ScanBatchFolder(const std::string& folder) {
  return ScanBatchFolderTelling(folder).files;
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

namespace {

// A listed picture read apart from the document, with the notices the loader gave meanwhile.
struct Decoded {
  std::shared_ptr<Bitmap32> picture;  // alpha 255 already; null when reason says why not
  std::string reason;
  bool outOfMemory = false;  // worth another try once nothing else holds memory
  std::vector<std::pair<std::string, std::string>> notices;
};

Decoded DecodeApart(const std::string& path) {
  Decoded decoded;
  try {
    std::optional<Bitmap32> picture =
        LoadPictureFile(path, [&decoded](const std::string& caption, const std::string& text) {
          decoded.notices.emplace_back(caption, text);
        });
    if (!picture || picture->Width() < 1) {
      decoded.reason = NotValidFormat(path);
    } else {
      SetAlphaChannel(*picture, 255);
      decoded.picture = std::make_shared<Bitmap32>(std::move(*picture));
    }
  } catch (const std::bad_alloc&) {
    decoded = Decoded();
    decoded.outOfMemory = true;
  } catch (const std::exception& e) {
    decoded.reason = NamingTheFile(path, e.what());
  }
  return decoded;
}

// JPEG files are read by libjpeg alone. The toolkit's decoders are kept to the thread that
// drives the loop: the toolkit takes the first thread that uses it for its main thread.
bool ReadableOnAnyThread(const std::string& name) {
  const std::string key = AsciiLower(name.size() > 4 ? name.substr(name.size() - 4) : name);
  return key == ".jpg" || key == "jpeg";
}

// What was done ahead for one entry while the entries before it were still being finished.
struct Prepared {
  std::optional<Decoded> decoded;
  std::optional<EffectRun> run;
  std::exception_ptr effectError;  // what the routine threw, if it did
};

// The loop of ConvertBatch. With overlap, the picture after the current one is decoded and the
// one before it encoded while the effect runs; the document, the observer and the result still
// see every entry one at a time, in list order, exactly as without. Work done ahead is only
// taken when it is what the one-at-a-time loop would have computed: the effect ran from the
// random state the document has when the entry's turn comes, and an entry whose input is an
// output of this run is read only after that output is written. Work that failed for want of
// memory is done again at the entry's turn, with nothing else going on.
class BatchLoop {
 public:
  BatchLoop(PictureDocument& document, const EffectSpec& effect, const EffectParams& params,
            const BatchJob& job, const BatchObserver& observer, std::string inputFolder,
            std::string outputFolder)
      : document_(document),
        effect_(effect),
        params_(params),
        job_(job),
        observer_(observer),
        inputFolder_(std::move(inputFolder)),
        outputFolder_(std::move(outputFolder)),
        count_(static_cast<int>(job.files.size())) {
    // Names of different inputs can lead to one output ("a.jpg", "a.JPG" and "a.bmp"), and with
    // the output folder the input folder an output can be an input ("x-Tag.jpg" beside
    // "x.jpg"): neither is ever overwritten.
    for (const std::string& name : job.files)
      if (const auto id = IdOf(JoinPath(inputFolder_, name))) inputs_.insert(*id);
  }

  BatchResult Run() {
    std::vector<bool> readsAnOutput(static_cast<std::size_t>(count_));
    if (job_.overlapStages) {
      std::set<std::string> outputs;
      for (int i = 1; i <= count_; ++i) {
        readsAnOutput[static_cast<std::size_t>(i - 1)] = outputs.count(Canonical(InputPath(i))) > 0;
        outputs.insert(Canonical(OutputPath(i)));
      }
    }
    for (int i = 1; i <= count_; ++i) {
      Prepared prepared;
      if (job_.overlapStages) {
        if (readsAnOutput[static_cast<std::size_t>(i - 1)] && !FinishWrite()) return result_;
        prepared = Prepare(i);
        if (i < count_ && !readsAnOutput[static_cast<std::size_t>(i)] &&
            ReadableOnAnyThread(job_.files[static_cast<std::size_t>(i)]) &&
            !writtenFor_.count(OutputPath(i + 1)) && OutputPath(i + 1) != OutputPath(i))
          ahead_ = {i + 1, std::async(std::launch::async, DecodeApart, InputPath(i + 1))};
        if (prepared.decoded && prepared.decoded->picture) {
          prepared.run.emplace(prepared.decoded->picture, document_.RandomState(), effect_,
                               params_);
          try {
            prepared.run->Compute();
          } catch (...) {
            prepared.effectError = std::current_exception();
          }
        }
      }
      if (!FinishWrite() || !Convert(i, std::move(prepared))) return result_;
    }
    FinishWrite();
    return result_;
  }

 private:
  std::string InputPath(int i) const {
    return JoinPath(inputFolder_, job_.files[static_cast<std::size_t>(i - 1)]);
  }
  std::string OutputPath(int i) const {
    return BatchOutputName(outputFolder_, job_.files[static_cast<std::size_t>(i - 1)],
                           effect_.batchTag);
  }
  static std::string Canonical(const std::string& path) {
    std::error_code ec;
    const fs::path canonical = fs::weakly_canonical(path, ec);
    return ec ? path : canonical.string();
  }

  // The decoded picture of entry i when it can be had ahead of its turn.
  Prepared Prepare(int i) {
    Prepared prepared;
    if (writtenFor_.count(OutputPath(i))) return prepared;  // skipped at its turn
    if (ahead_.index == i && ahead_.decoded.valid()) {
      prepared.decoded = ahead_.decoded.get();
    } else {
      prepared.decoded = DecodeApart(InputPath(i));
    }
    ahead_ = {};
    if (prepared.decoded->outOfMemory) prepared.decoded.reset();
    return prepared;
  }

  void Report(BatchProgress& progress, BatchProgress::Step step) {
    progress.step = step;
    if (observer_.progress) observer_.progress(progress);
  }

  bool Stop(std::string error) {
    result_.end = BatchResult::End::Stopped;
    result_.error = std::move(error);
    return false;
  }

  // The entry that wrote, in this run, the file path names under another name: on a drive that
  // ignores case (FAT, exFAT, network shares) "A-Tag.jpg" and "a-Tag.jpg" are one file. Told
  // by the file's identity; where the file system makes up identities per name (some FUSE
  // mounts), by a name that reaches a file without being listed in its folder and that is, but
  // for case, the name of one written.
  const std::string* WrittenUnderAnotherName(const std::string& path) const {
    const auto id = IdOf(path);
    if (!id) return nullptr;
    if (const auto written = writtenIds_.find(*id); written != writtenIds_.end())
      return &written->second;
    const auto folded = writtenFolded_.find(AsciiLower(path));
    if (folded == writtenFolded_.end()) return nullptr;
    const fs::path name = fs::path(path).filename();
    std::error_code ec;
    for (fs::directory_iterator it(fs::path(path).parent_path(), ec), end; !ec && it != end;
         it.increment(ec))
      if (it->path().filename() == name) return nullptr;
    return ec ? nullptr : &folded->second;
  }

  // Entry i's turn: the document, the observer and the result see it as the one-at-a-time loop
  // has them see it. False when the loop stops.
  bool Convert(int i, Prepared prepared) {
    BatchProgress progress;
    progress.index = i;
    progress.count = count_;
    progress.name = job_.files[static_cast<std::size_t>(i - 1)];
    progress.outputPath = OutputPath(i);
    Report(progress, BatchProgress::Step::Loading);

    auto skip = [&](std::string reason) {
      result_.skipped.push_back({progress.name, reason});
      progress.reason = std::move(reason);
      Report(progress, BatchProgress::Step::Skipped);
      return true;
    };
    const std::string path = InputPath(i);
    if (const auto taken = writtenFor_.find(progress.outputPath); taken != writtenFor_.end())
      return skip(path + " was not converted: its output " + progress.outputPath +
                  " was already written for " + taken->second);
    if (const std::string* by = WrittenUnderAnotherName(progress.outputPath))
      return skip(path + " was not converted: its output " + progress.outputPath +
                  " is the file already written for " + *by);
    if (const auto id = IdOf(progress.outputPath); id && inputs_.count(*id))
      return skip(path + " was not converted: its output " + progress.outputPath +
                  " is one of the pictures being converted");
    // Anyone who can write to the output folder could point a link there at a file of ours.
    if (struct stat info{};
        ::lstat(progress.outputPath.c_str(), &info) == 0 && S_ISLNK(info.st_mode))
      return skip(path + " was not converted: its output " + progress.outputPath +
                  " is a symbolic link, which a batch never writes through");

    // Loaded into a bitmap of its own first: an entry that cannot be read must leave the
    // document, and with it the previous result, untouched and write no file.
    if (prepared.decoded) {
      for (const auto& [caption, text] : prepared.decoded->notices)
        if (observer_.message) observer_.message(caption, text);
      if (!prepared.decoded->picture) return skip(prepared.decoded->reason);
      document_.Load(std::move(prepared.decoded->picture));
    } else {
      ahead_ = {};  // read now as the one-at-a-time loop does, alone
      std::optional<Bitmap32> picture;
      std::string reason;
      try {
        picture = LoadPictureFile(path, observer_.message);
        if (!picture || picture->Width() < 1) reason = NotValidFormat(path);
      } catch (const std::exception& e) {
        reason = NamingTheFile(path, e.what());
      }
      if (!reason.empty()) return skip(std::move(reason));
      const int width = picture->Width(), height = picture->Height();
      try {
        document_.Load(std::move(*picture));
      } catch (const std::bad_alloc&) {
        return skip(path + " " + MemoryNeedText(OperationBytes(width, height)));
      }
    }
    Report(progress, BatchProgress::Step::Loaded);

    const bool aheadValid = prepared.run && prepared.run->StartState() == document_.RandomState();
    bool retry = !aheadValid;
    if (aheadValid && prepared.effectError) {
      try {
        std::rethrow_exception(prepared.effectError);
      } catch (const std::bad_alloc&) {
        retry = true;  // it may well fit now that nothing else is going on
      } catch (const std::exception& e) {
        return Stop(NamingTheFile(path, e.what()));
      }
    }
    try {
      if (retry) {
        prepared.run.reset();
        ahead_ = {};
        RunEffect(document_, effect_, params_, effect_.batchPushesHistory);
      } else {
        prepared.run->Land(document_, effect_.batchPushesHistory);
      }
    } catch (const std::bad_alloc&) {
      // Too large for what is left of memory: this picture only; the next may well fit.
      return skip(
          path + " " +
          MemoryNeedText(OperationBytes(document_.Source().Width(), document_.Source().Height())));
    } catch (const std::exception& e) {
      return Stop(NamingTheFile(path, e.what()));
    }
    if (observer_.afterEffect) observer_.afterEffect(progress, document_);
    Report(progress, BatchProgress::Step::Converted);

    writtenFor_.emplace(progress.outputPath, progress.name);
    pendingWrite_ = progress;
    if (job_.overlapStages) {
      write_ = std::async(std::launch::async,
                          [picture = document_.SharedWorking(), outputPath = progress.outputPath] {
                            SaveJpeg(*picture, outputPath, 90, LinkAtTarget::Refuse);
                          });
      return true;
    }
    return FinishWrite(true);
  }

  // The write of the last converted entry, waited for (or done now, without overlap) and
  // reported; one that failed is reported as skipped. Always true: the loop goes on.
  bool FinishWrite(bool now = false) {
    if (!pendingWrite_) return true;
    BatchProgress progress = std::move(*pendingWrite_);
    pendingWrite_.reset();
    try {
      if (now) {
        SaveJpeg(document_.Working(), progress.outputPath, 90, LinkAtTarget::Refuse);
      } else {
        write_.get();
      }
    } catch (const std::exception& e) {
      // This output only: the next may well go to a name or a place that can be written.
      writtenFor_.erase(progress.outputPath);
      progress.reason = NamingTheFile(progress.outputPath, e.what());
      result_.skipped.push_back({progress.name, progress.reason});
      Report(progress, BatchProgress::Step::Skipped);
      return true;
    }
    if (const auto id = IdOf(progress.outputPath)) writtenIds_.emplace(*id, progress.name);
    writtenFolded_.emplace(AsciiLower(progress.outputPath), progress.name);
    result_.outputs.push_back(progress.outputPath);
    Report(progress, BatchProgress::Step::Written);
    return true;
  }

  PictureDocument& document_;
  const EffectSpec& effect_;
  const EffectParams& params_;
  const BatchJob& job_;
  const BatchObserver& observer_;
  const std::string inputFolder_;
  const std::string outputFolder_;
  const int count_;
  std::set<FileId> inputs_;
  std::map<std::string, std::string> writtenFor_;     // output path -> the entry that wrote it
  std::map<FileId, std::string> writtenIds_;          // the files written -> the entries
  std::map<std::string, std::string> writtenFolded_;  // output paths in lower case -> entries
  BatchResult result_;
  std::optional<BatchProgress> pendingWrite_;
  std::future<void> write_;
  struct Ahead {
    int index = 0;
    std::future<Decoded> decoded;
  } ahead_;
};

}  // namespace

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
  return BatchLoop(document, effect, params, job, observer, inputFolder, outputFolder).Run();
}

}  // namespace quillane
