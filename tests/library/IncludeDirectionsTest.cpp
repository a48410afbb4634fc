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

struct Include {
  std::string from;  // relative to the root it was found under
  std::string what;
};

std::vector<Include> includesUnder(const fs::path& root) {
  static const std::regex kInclude("^\\s*#\\s*include\\s*\"([^\"]+)\".*");
  std::vector<Include> found;
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(root)) {
    const std::string extension = entry.path().extension();
    if (extension != ".h" && extension != ".cpp") continue;
    std::ifstream file(entry.path());
    for (std::string line; std::getline(file, line);) {
      std::smatch match;
      if (std::regex_match(line, match, kInclude)) {
        found.push_back({fs::relative(entry.path(), root).string(), match[1]});
      }
    }
  }
  return found;
}

std::string folderOf(const std::string& path) {
  return path.substr(0, path.find('/'));
}

int floorOf(const std::string& path) {
  if (path == kSharedRecord) return 0;
  const auto found = kFloors.find(folderOf(path));
  return found == kFloors.end() ? -1 : found->second;
}

bool mayInclude(const Include& include) {
  if (fs::exists(kSource / "host/contract" / include.what)) return true;
  const int own = floorOf(include.from);
  const int other = floorOf(include.what);
  if (own < 0 || other < 0) return false;
  return other < own || folderOf(include.from) == folderOf(include.what);
}

std::vector<std::string> offenders(const std::vector<Include>& includes, bool (*allowed)(const Include&)) {
  std::vector<std::string> result;
  for (const Include& include : includes) {
    if (!allowed(include)) result.push_back(include.from + " includes " + include.what);
  }
  return result;
}

TEST(IncludeDirections, OfThePluginRunFromThePenDownToTheMatrices) {
  const std::vector<Include> includes = includesUnder(kSource / "plugin");
  EXPECT_FALSE(includes.empty());
  EXPECT_THAT(offenders(includes, mayInclude), testing::IsEmpty());
}

// The contract includes itself. The host takes the matrices from the pen's folder and nothing else: it must
// work with any pen.
TEST(IncludeDirections, OfTheHostTakeOnlyMatricesFromThePlugin) {
  const auto isOfContract = [](const Include& include) {
    return fs::exists(kSource / "host/contract" / include.what);
  };
  const auto isOfHost = [](const Include& include) {
    return folderOf(include.what) == "math" || !fs::exists(kSource / "plugin" / include.what);
  };
  EXPECT_THAT(offenders(includesUnder(kSource / "host/contract"), isOfContract), testing::IsEmpty());
  EXPECT_THAT(offenders(includesUnder(kSource / "host/desktop"), isOfHost), testing::IsEmpty());
}

}  // namespace
