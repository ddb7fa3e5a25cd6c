// The manual page and the bash completion script of quillane-cli. Both are written by the
// program itself from its usage text and the effect table, so the installed copies describe
// exactly the effects and options the installed program has.
#pragma once

#include <string>

namespace quillane::cli {

// The manual page in roff (man(7) macros): the usage text, then the text of "list".
std::string ManPageText();

// A bash script that completes the commands, the effect names (only those with a batch
// conversion after "batch"), each effect's own options, the words of its choices, and file or
// folder names where a picture or a folder is expected.
std::string BashCompletionText();

// text as it may stand in a roff no-fill block: backslashes and minus signs escaped, and a line
// that starts with "." or "'" kept from being read as a request.
std::string RoffVerbatim(const std::string& text);

}  // namespace quillane::cli
