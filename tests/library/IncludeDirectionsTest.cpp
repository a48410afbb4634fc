#include <gmock/gmock.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

const fs::path kSource = QELT_SOURCE_DIR;

// A folder of the plug-in includes itself and what stands above it.
const std::map<std::string, int> kFloors = {
    {"log", 0},     {"math", 0},    {"shaders", 1},    {"render", 2}, {"stroke", 3},
    {"outline", 4}, {"preview", 4}, {"prediction", 4}, {"pen", 5},
};

// The record every drawable is made with: the pen owns it, the folders below the pen read it.
const std::string kSharedRecord = "pen/Pencil2Data.h";

std::string folderOf(const std::string& path) {
  return path.substr(0, path.find('/'));
}

int floorOf(const std::string& path) {
  if (path == kSharedRecord) return 0;
  const auto found = kFloors.find(folderOf(path));
  return found == kFloors.end() ? -1 : found->second;
}

bool isSystems(const std::string& header) {
  return header.front() == '<';
}

// The standard library's headers and OpenGL ES 3.0's are there on every system.
bool isEverySystems(const std::string& header) {
  return isSystems(header) && (header.find('.') == std::string::npos || header == "<GLES3/gl3.h>");
}

// A source of the host that knows the system that it runs on.
bool isForOneSystem(const std::string& path) {
  return path.starts_with("platform/") && path != "platform/Platform.h";
}

bool isOfContract(const std::string& path) {
  return fs::exists(kSource / "host/contract" / path);
}

// "from includes what" of each include under a folder that is not allowed. System headers keep their
// brackets.
template <typename Allowed>
std::vector<std::string> offenders(const fs::path& root, Allowed allowed) {
  static const std::regex kInclude("^\\s*#\\s*include\\s*(?:\"([^\"]+)\"|(<[^>]+>)).*");
  std::vector<std::string> found;
  int includes = 0;
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(root)) {
    const std::string extension = entry.path().extension();
    if (extension != ".h" && extension != ".cpp") continue;
    const std::string from = fs::relative(entry.path(), root).string();
    std::ifstream file(entry.path());
    for (std::string line; std::getline(file, line);) {
      std::smatch match;
      if (!std::regex_match(line, match, kInclude)) continue;
      ++includes;
      const std::string what = match[1].str() + match[2].str();
      if (!allowed(from, what)) found.push_back(from + " includes " + what);
    }
  }
  EXPECT_GT(includes, 10) << root;
  return found;
}

TEST(IncludeDirections, OfThePluginRunFromThePenDownToTheMatrices) {
  const auto runsDown = [](const std::string& from, const std::string& what) {
    if (isEverySystems(what) || isOfContract(what) || what == "<android/log.h>") return true;
    const int own = floorOf(from), other = floorOf(what);
    return own >= 0 && other >= 0 && (other < own || folderOf(from) == folderOf(what));
  };
  EXPECT_THAT(offenders(kSource / "plugin", runsDown), testing::IsEmpty());
}

// The contract includes itself. The host takes the matrices from the pen's folder and nothing else: it must
// work with any pen. What it needs of the system stands behind one header.
TEST(IncludeDirections, OfTheHostTakeOnlyMatricesFromThePluginAndTheSystemFromThePlatform) {
  EXPECT_THAT(offenders(kSource / "host/contract",
                        [](const std::string&, const std::string& what) {
                          return isEverySystems(what) || isOfContract(what);
                        }),
              testing::IsEmpty());
  EXPECT_THAT(offenders(kSource / "host/desktop",
                        [](const std::string& from, const std::string& what) {
                          if (isSystems(what)) return isEverySystems(what) || isForOneSystem(from);
                          if (isForOneSystem(from)) return what == "desktop/platform/Platform.h";
                          if (folderOf(what) == "desktop") return !isForOneSystem(what.substr(8));
                          return folderOf(what) == "math" || !fs::exists(kSource / "plugin" / what);
                        }),
              testing::IsEmpty());
}

// Of the program's folders each includes itself and those before it. From the plug-in, which is loaded and
// may be another one, it takes the matrices and the list of versions.
TEST(IncludeDirections, OfTheProgramRunFromTheCommandsDownToText) {
  const std::map<std::string, int> floors = {
      {"text", 0}, {"ink", 1}, {"output", 1}, {"play", 2}, {"commands", 3}};
  const auto runsDown = [&](const std::string& from, const std::string& what) {
    const auto own = floors.find(folderOf(from)), other = floors.find(folderOf(what));
    if (other == floors.end())
      return folderOf(what) == "math" || what == "pen/RenderingVersions.h" ||
             !fs::exists(kSource / "plugin" / what);
    return own == floors.end() || own == other || own->second > other->second;
  };
  EXPECT_THAT(offenders(kSource / "apps/qelt-sketch", runsDown), testing::IsEmpty());
}

}  // namespace
