#include <android/log.h>

#include "Commands.h"

namespace QeltDesktop {

void runCommand(const Options& options) {
  // Standard error is for the one line that says what could not be done.
  if (!options.log) __android_log_set_minimum_priority(ANDROID_LOG_SILENT);
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
