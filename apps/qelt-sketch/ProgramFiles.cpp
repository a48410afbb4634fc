#include "ProgramFiles.h"

#include <filesystem>
#include <system_error>

#include "Refusal.h"

namespace QeltDesktop {
namespace {

namespace fs = std::filesystem;

std::string besideProgram(const char* pathFromProgram) {
  std::error_code error;
  const fs::path folder = fs::read_symlink("/proc/self/exe", error).parent_path();
  const fs::path builtIn = (folder / pathFromProgram).lexically_normal();
  for (const fs::path& path : {folder / builtIn.filename(), builtIn}) {
    if (fs::exists(path, error)) return path.string();
  }
  throw Refusal(builtIn.string() + ": not there; it comes with the program");
}

}  // namespace

std::string pluginPath(const Options& options) {
  if (!options.plugin) return besideProgram(QELT_PLUGIN_FROM_PROGRAM);
  // The loader looks for a name without a folder among the system's libraries alone.
  std::error_code error;
  const fs::path asked = *options.plugin;
  return !asked.has_parent_path() && fs::exists(asked, error) ? (fs::path(".") / asked).string()
                                                              : asked.string();
}

std::string inputPath(const Options& options) {
  return options.input ? *options.input : besideProgram(QELT_SAMPLE_FROM_PROGRAM);
}

}  // namespace QeltDesktop
