#include <gmock/gmock.h>

#include <fstream>
#include <regex>
#include <set>
#include <string>
#include <vector>

#include "support/Command.h"

namespace {

// Two lists of demangled names, one a line; a line that begins with # stands between them.
struct Names {
  std::set<std::string> always, sometimes;
};

Names namesIn(const std::string& file) {
  std::ifstream list(QELT_SOURCE_DIR "/tests/library/" + file);
  Names names;
  std::set<std::string>* current = &names.always;
  for (std::string name; std::getline(list, name);) {
    if (name.starts_with('#'))
      current = &names.sometimes;
    else
      current->insert(name);
  }
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
  EXPECT_EQ(std::set(lines.begin(), lines.end()), namesIn("exports.txt").always);
}

// A host that lacks one of these names cannot load the library; docs/host-contract.md tells what then.
TEST(Imports, OfTheHostAreTheListedOnesAndOfTheCLibraryTheUsual) {
  if (QELT_SANITIZED) return;  // sanitizers ask for type infos and functions of their own
  // C++ libraries keep their templates in inline namespaces of different names.
  const std::regex inlineNamespace("std::__[A-Za-z0-9]+::"), version("@.*");
  // What the compiler and the C++ library want of each other changes with their versions.
  const std::regex ofCompiler(
      "_.*|std::.*|operator (new|delete).*|(typeinfo|vtable) for (std|__cxxabiv1)::.*");
  std::set<std::string> ofHost, others;
  for (const std::string& line : linesOf(QELT_NM " -DC --undefined-only")) {
    // "                 U Qelt::RefCount::Unref()"
    const std::string symbol = std::regex_replace(line.substr(line.find_first_not_of(' ') + 2), version, "");
    const std::string name = std::regex_replace(symbol, inlineNamespace, "std::");
    if (name.find("Qelt::") != std::string::npos) {
      ofHost.insert(name);
    } else if (name == "__android_log_print" || !std::regex_match(name, ofCompiler)) {
      others.insert(name);
    }
  }
  Names listed = namesIn("imports.txt");
  EXPECT_THAT(listed.always, testing::IsSubsetOf(ofHost));
  listed.sometimes.merge(listed.always);
  EXPECT_THAT(ofHost, testing::IsSubsetOf(listed.sometimes));
  // Another mathematical function might give other numbers on another system; these were compared.
  EXPECT_THAT(others, testing::IsSubsetOf({"__android_log_print", "bcmp", "memcmp", "memcpy", "memmove",
                                           "memset", "sincosf", "snprintf", "sqrt", "sqrtf", "strcmp",
                                           "strlen", "tanf", "truncf"}));
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
