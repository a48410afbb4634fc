#include "commands/ProgramFiles.h"

#include <filesystem>
#include <system_error>

#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

namespace fs = std::filesystem;

// A file that comes with the program. It is looked for beside the program, then where installing and building
// put it, seen from the program, so that all of it may be moved together. An installed program takes no file
// of a build tree that it may have been installed into.
std::string besideProgram(const char* fromInstalled, const char* fromBuilt) {
  std::error_code error;
  const fs::path folder = fs::read_symlink("/proc/self/exe", error).parent_path();
  const fs::path installed = (folder / fromInstalled).lexically_normal();
  for (const fs::path& path :
       {folder / installed.filename(), installed, (folder / fromBuilt).lexically_normal()}) {
    if (fs::exists(path, error)) return path.string();
  }
  throw Refusal(installed.string() + ": not there; it comes with the program");
}

}  // namespace

std::string pluginPath(const Options& options) {
  if (!options.plugin) return besideProgram(QELT_PLUGIN_FROM_INSTALLED, QELT_PLUGIN_FROM_PROGRAM);
  // The loader looks for a name without a folder among the system's libraries only; here it may also stand
  // in the current folder.
  std::error_code error;
  const fs::path asked = *options.plugin;
  return !asked.has_parent_path() && fs::exists(asked, error) ? (fs::path(".") / asked).string()
                                                              : asked.string();
}

std::string inputPath(const Options& options) {
  return options.input ? *options.input : besideProgram(QELT_SAMPLE_FROM_INSTALLED, QELT_SAMPLE_FROM_PROGRAM);
}

}  // namespace QeltDesktop
