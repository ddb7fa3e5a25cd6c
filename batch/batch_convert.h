// Batch conversion: one effect, with one set of settings, over every picture listed from an
// input folder, each result written as a quality-90 JPEG into an output folder. Plain C++; the
// tool windows' batch panels and quillane-cli both drive this loop and learn about its
// progress through a BatchObserver.
#pragma once

#include <array>
#include <functional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "document/document.h"
#include "effects/registry.h"

namespace quillane {

// The masks the input folder is scanned with, in scan order.
inline constexpr std::array<std::string_view, 4> kBatchMasks = {"*.jpg", "*.jpeg", "*.bmp",
                                                                "*.wmf"};

// The bare names of the regular files directly in folder, one scan per mask of kBatchMasks in
// that order. A mask matches a name that ends with its extension, compared without regard to
// case (on this file system "A.JPG" and "a.jpg" are two files and both are listed); subfolders
// are not entered. Within one mask the names are sorted by their bytes, so a folder always
// gives the same list. A name matching two masks would be listed twice; with exact extension
// matching none does. A missing or unreadable folder gives an empty list.
std::vector<std::string> ScanBatchFolder(const std::string& folder);

// ScanBatchFolder, telling also what it leaves out.
struct BatchScan {
  std::vector<std::string> files;  // as ScanBatchFolder lists them
  // Entries whose names match the masks but that are not regular files (folders, FIFOs, links
  // to nothing, link loops), in scan order, each with a sentence naming it and saying what it is.
  std::vector<std::pair<std::string, std::string>> notFiles;
  // Why an existing folder could not be listed ("Cannot read the folder X: Permission
  // denied"), or why the name is no folder when it is not simply missing (a link loop);
  // empty otherwise.
  std::string error;
};
BatchScan ScanBatchFolderTelling(const std::string& folder);

// The folder name as typed into a batch panel, without leading and trailing blanks (spaces and
// control characters).
std::string TrimBlanks(const std::string& text);

// outputFolder + "/" + inputName without its last four characters + "-" + tag + ".jpg":
// "beach.jpg" with tag "Emboss" gives "out/beach-Emboss.jpg", "c.jpeg" gives "out/c.-Emboss.jpg".
// No second "/" is added when outputFolder already ends with one.
std::string BatchOutputName(const std::string& outputFolder, const std::string& inputName,
                            const std::string& tag);

// text as it may be shown to a person: control characters and bytes that are not UTF-8 (a file
// name is any bytes) written as \xHH, so a name can neither move a terminal's cursor nor be
// shown as something it is not.
std::string ShownName(const std::string& text);

// message as it stands when it names path already, otherwise path + ": " + message.
std::string NamingTheFile(const std::string& path, const std::string& message);

// What the loop is doing, reported before and after each picture.
struct BatchProgress {
  enum class Step {
    Loading,    // about to load entry index
    Loaded,     // the entry is the document's picture now (repaint)
    Converted,  // the effect has written the working picture (repaint)
    Written,    // outputPath has been written
    Skipped,    // the entry was not converted, or its output not written; reason says why
  };
  Step step = Step::Loading;
  int index = 0;           // 1-based position in the list
  int count = 0;           // entries in the list
  std::string name;        // the entry's bare file name
  std::string outputPath;  // the output file name of this entry (every step)
  std::string reason;      // Skipped only
};

// Every member may be left empty.
struct BatchObserver {
  // A message box the user must see: caption "Sorry" when the input folder is missing or the
  // list is empty (nothing is converted then).
  std::function<void(const std::string& caption, const std::string& text)> message;
  // Progress of the loop, picture by picture.
  std::function<void(const BatchProgress& progress)> progress;
  // Called once per converted picture, right after the effect (and its history step, for the
  // effects whose batch routine pushes one) and before the Converted progress and the output
  // file: the place for a tool window's own per-picture steps (status line and the like).
  std::function<void(const BatchProgress& progress, const PictureDocument& document)> afterEffect;
};

struct BatchJob {
  std::string inputFolder;         // as typed; blanks around it are ignored
  std::string outputFolder;        // as typed; blanks around it are ignored; created if missing
  std::vector<std::string> files;  // bare names, as ScanBatchFolder gave them
  // The next picture is decoded and the previous one encoded while the effect runs; the
  // document, the observer and the result see exactly what they see without.
  bool overlapStages = true;
};

struct BatchSkipped {
  std::string name;    // the entry's bare file name
  std::string reason;  // a sentence naming the file, fit to show the user
};

struct BatchResult {
  enum class End {
    Completed,  // the loop ran to its end (some entries may have been skipped)
    Refused,    // a "Sorry" message went to the observer; nothing was loaded or written
    Stopped,    // error says what ended the loop; the entries before it stand
  };
  End end = End::Completed;
  std::vector<std::string> outputs;   // the files written, in list order
  std::vector<BatchSkipped> skipped;  // the entries not converted, in list order
  std::string error;                  // Stopped only

  bool AllConverted() const { return end == End::Completed && skipped.empty(); }
};

// Runs effect over job.files as a batch panel's Convert does:
//  1. the trimmed input folder must exist, else "Sorry" / "Input Director in not exist.";
//  2. the list must not be empty, else "Sorry" / "There is no picture to convert.";
//  3. the trimmed output folder is created with its parents when missing (Stopped when that
//     fails or the field is empty);
//  4. per entry: the file (input folder + "/" + name) is loaded with LoadPictureFile and made
//     the document's picture (PictureDocument::Load: working, source and opened picture; the
//     history is left alone); the effect's routine runs with params over the default settings
//     (source in, working out); effects whose batch routine pushes a history step get one
//     (Backup); the working picture is written as a quality-90 JPEG under BatchOutputName,
//     replacing any file of that name.
// An entry that is missing, of an unrecognised type, empty or undecodable is skipped and
// recorded in skipped; the document keeps the previous picture and no output file is written
// for it. So is an entry whose output name was already written in this run (the reason names
// the entry that wrote it), is one of the listed input files or is a symbolic link (never
// written through, even when one is put there meanwhile), and one too large for the
// memory left (the reason says what it needs), and one whose output cannot be written (the
// reason names the output; any file of that name is left as it was). Any other effect error
// stops the loop (End::Stopped, error names the file).
// Throws std::invalid_argument when effect has no routine or no batch output tag.
BatchResult ConvertBatch(PictureDocument& document, const EffectSpec& effect,
                         const EffectParams& params, const BatchJob& job,
                         const BatchObserver& observer = {});

}  // namespace quillane
