// The command line of quillane-cli, parsed into what to do. Kept apart from main() so that
// every rule about names, ranges and exit codes can be tested without starting the program.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "effects/registry.h"
#include "imaging/rotate.h"

namespace quillane::cli {

// Exit codes of quillane-cli.
enum ExitCode {
  kExitOk = 0,
  kExitFailed = 1,  // unreadable input, a write error, a batch with skipped or failed pictures
  kExitUsage = 2,   // unknown command, effect or option; a bad or out-of-range value
};

// Manpage and Completion write the manual page and the bash completion script, both made from
// the same effect table as List, so they cannot fall behind it.
enum class Command {
  Help,
  Version,
  List,
  Apply,
  Batch,
  Gallery,
  Rotate,
  Resize,
  Convert,
  Manpage,
  Completion
};

struct Options {
  Command command = Command::Help;
  const EffectSpec* effect = nullptr;  // Apply and Batch
  // Every parameter of effect: its default, or the value given. A parameter that selects a
  // hidden one (the pencil's --lighting selects the lighting tone) sets it when given; two
  // options that select the same one, or one option given twice, are refused.
  EffectParams params;
  std::string input;   // Apply: the picture (empty: the built-in one; "-": standard input);
                       // Batch: the folder; Gallery: --input FILE (empty: the built-in picture)
  std::string output;  // Apply: the file written ("-": standard output); Batch and Gallery: the
                       // folder
  std::string format;  // Apply to "-": the output type's extension without its dot ("png")
  // Apply and Batch: the random generator's state when the run starts (--seed), as the program
  // has it when it starts: 0. Effects that draw (brume) continue it from picture to picture.
  std::uint32_t seed = 0;
  // Rotate: the quarter turn. Resize: the width and height as the image size dialog takes them.
  QuarterTurn turn = QuarterTurn::Clockwise;
  int width = 0;
  int height = 0;
  // --max-pixels: the largest picture the decoders accept; 0 leaves the program's default.
  std::int64_t maxPixels = 0;
};

struct ParseResult {
  Options options;
  std::string error;  // empty when the command line was understood
  int exitCode = kExitOk;
  bool Ok() const { return error.empty(); }
};

// Parses the arguments after the program name. Values are written "--name value" or
// "--name=value"; "--" ends the options, so a picture named "-x.jpg" can be given.
ParseResult ParseCommandLine(const std::vector<std::string>& args);

// The text of --help.
std::string UsageText();

// "quillane-cli 4.36".
std::string VersionText();

// The output types "apply" writes, chosen by the output file's extension (any case).
enum class OutputType { Unknown, Jpeg, Bitmap, Metafile, Png };
OutputType OutputTypeFor(const std::string& path);

}  // namespace quillane::cli
