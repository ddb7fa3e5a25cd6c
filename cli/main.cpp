// quillane-cli: the effects of Quillane from the command line, without any window.
#include <unistd.h>

#include <QtGlobal>
#include <algorithm>
#include <csignal>
#include <iostream>
#include <string>
#include <vector>

#include "batch/batch_convert.h"
#include "cli/cli_commands.h"
#include "cli/cli_options.h"
#include "codecs/picture_file.h"
#include "imaging/picture_memory.h"

namespace {

QtMessageHandler qtDefaultHandler = nullptr;

// The command line reports a file it cannot read in its own words; the warnings Qt's image
// readers print about the same hostile file are noise. Critical and fatal messages still show.
void QuietQtMessages(QtMsgType type, const QMessageLogContext& context, const QString& message) {
  if ((type == QtCriticalMsg || type == QtFatalMsg) && qtDefaultHandler != nullptr) {
    qtDefaultHandler(type, context, message);
  }
}

}  // namespace

int main(int argc, char** argv) {
  quillane::SetUpPictureMemory();
  qtDefaultHandler = qInstallMessageHandler(QuietQtMessages);
  using namespace quillane::cli;
  const std::vector<std::string> args(argv + 1, argv + argc);
  const ParseResult parsed = ParseCommandLine(args);
  if (!parsed.Ok()) {
    // The error quotes what was typed, which may be any bytes.
    std::cerr << "quillane-cli: " << quillane::ShownName(parsed.error) << "\n";
    return parsed.exitCode;
  }
  if (parsed.options.maxPixels > 0) quillane::SetMaxPicturePixels(parsed.options.maxPixels);
  // A reader that goes away (| head) shows as a failed write, so that the command can end
  // quietly with a failure of its own instead of being killed part way.
  std::signal(SIGPIPE, SIG_IGN);
  const int code = RunCommand(parsed.options, std::cout, std::cerr, isatty(STDERR_FILENO) == 1);
  std::cout.flush();
  return std::cout ? code : std::max<int>(code, kExitFailed);
}
