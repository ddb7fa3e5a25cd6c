// What quillane-cli does once its command line is understood.
#pragma once

#include <optional>
#include <ostream>
#include <string>

#include "cli/cli_options.h"
#include "imaging/bitmap32.h"

namespace quillane::cli {

// Runs options; normal output goes to out, messages and progress to err. With terminal set,
// batch progress is drawn as a bar redrawn in place; otherwise it is one line per picture.
// Returns the exit code.
int RunCommand(const Options& options, std::ostream& out, std::ostream& err, bool terminal);

// Reads an input picture: whatever LoadPictureFile reads, plus PNG. On failure returns nothing
// and sets error to a sentence naming the file.
std::optional<Bitmap32> LoadInputPicture(const std::string& path, std::string& error,
                                         std::ostream& notices);

// Writes picture in the type its extension names (OutputTypeFor). Throws PictureFileError.
void SaveOutputPicture(const Bitmap32& picture, const std::string& path);

// The text of "list".
std::string EffectListText();

// A menu or menu entry caption as displayed: "&&" shows one "&", a single "&" marks the
// accelerator and is not shown, surrounding blanks dropped (" B&&W" gives "B&W").
std::string DisplayedCaption(const std::string& caption);

// text with &, <, >, " and ' written as HTML entities.
std::string HtmlEscape(const std::string& text);

}  // namespace quillane::cli
