#include "Commands.h"
#include "desktop/platform/Platform.h"

namespace QeltDesktop {

void runCommand(const Options& options) {
  // Standard error is for the one line that says what could not be done.
  if (!options.log) silenceLog();
  switch (options.command) {
    case Command::Draw:
      return drawCommand(options);
    case Command::Trace:
      return traceCommand(options);
    case Command::Preview:
      return previewCommand(options);
    case Command::Sheet:
      return sheetCommand(options);
    case Command::Info:
      return infoCommand(options);
  }
}

}  // namespace QeltDesktop
