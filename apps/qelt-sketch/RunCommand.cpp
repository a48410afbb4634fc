#include "Commands.h"

namespace QeltDesktop {

void runCommand(const Options& options) {
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
