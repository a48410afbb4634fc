#include <gmock/gmock.h>

#include <fstream>
#include <regex>
#include <set>
#include <string>
#include <vector>

#include "support/Command.h"

namespace {

// Everything a host may link against, and nothing else: one demangled name a line.
std::vector<std::string> promised() {
  std::ifstream file(QELT_SOURCE_DIR "/tests/library/exports.txt");
  std::vector<std::string> names;
  for (std::string name; std::getline(file, name);) names.push_back(name);
  return names;
}

#if defined(__aarch64__)
constexpr bool kIsArm = true;
#else
constexpr bool kIsArm = false;
#endif

// What a tool for ELF files prints of the library.
std::vector<std::string> linesOf(const std::string& tool) {
  return QeltTests::linesOf(tool + " " QELT_PLUGIN_PATH);
}

TEST(Exports, AreThePromisedNamesAndNothingElse) {
  const std::vector<std::string> lines = linesOf(QELT_NM " -DCj --defined-only");
  // Of a constructor there are two.
  EXPECT_THAT(std::set(lines.begin(), lines.end()), testing::UnorderedElementsAreArray(promised()));
}

TEST(Exports, TheLibraryCarriesItsPlainNameNeedsOnlyTheHostAndTheRuntimeAndRunsNothingAsItIsLoaded) {
  const std::regex entry(".*\\((NEEDED|SONAME)\\).*\\[(.*)\\]"), load("  LOAD .* 0x([0-9a-f]+)"),
      initialisers(".*\\(INIT_ARRAYSZ\\) *([0-9]+) .*");
  std::vector<std::string> needed, sonames;
  for (const std::string& line : linesOf(QELT_READELF " -dlW")) {
    std::smatch match;
    if (std::regex_match(line, match, load)) {
      EXPECT_GE(std::stoul(match[1], nullptr, 16), 0x4000u) << "pages of 16 KB";
    } else if (std::regex_match(line, match, initialisers) && !QELT_SANITIZED) {
      // The compiler's own start-up function is one; on 64-bit ARM its probe for atomic instructions is
      // another.
      EXPECT_LE(std::stoul(match[1]), kIsArm ? 16u : 8u);
    } else if (std::regex_match(line, match, entry)) {
      (match[1] == "NEEDED" ? needed : sonames).push_back(match[2]);
    }
  }
  EXPECT_THAT(sonames, testing::ElementsAre("libQeltPencil2.so"));
  if (QELT_SANITIZED) return;  // their runtimes bring libraries of their own
  EXPECT_THAT(needed, testing::IsSubsetOf({"libQeltBase.so", "libQeltModel.so", "libQeltEngine.so",
                                           "libQeltGL.so", "libQeltGraphics.so", "libQeltPenCommon.so",
                                           "liblog.so.0", "libstdc++.so.6", "libm.so.6", "libgcc_s.so.1",
                                           "libc.so.6", "ld-linux-aarch64.so.1"}));
}

}  // namespace
