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
  return options.plugin ? *options.plugin : besideProgram(QELT_PLUGIN_FROM_PROGRAM);
}

std::string inputPath(const Options& options) {
  return options.input ? *options.input : besideProgram(QELT_SAMPLE_FROM_PROGRAM);
}

}  // namespace QeltDesktop
