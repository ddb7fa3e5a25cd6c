// quillane-cli: the effects of Quillane from the command line, without any window.
#include <unistd.h>

#include <iostream>
#include <string>
#include <vector>

#include "cli/cli_commands.h"
#include "cli/cli_options.h"

int main(int argc, char** argv) {
  using namespace quillane::cli;
  const std::vector<std::string> args(argv + 1, argv + argc);
  const ParseResult parsed = ParseCommandLine(args);
  if (!parsed.Ok()) {
    std::cerr << "quillane-cli: " << parsed.error << "\n";
    return parsed.exitCode;
  }
  return RunCommand(parsed.options, std::cout, std::cerr, isatty(STDERR_FILENO) == 1);
}
