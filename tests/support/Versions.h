#pragma once

#include <gtest/gtest.h>

#include <set>
#include <string>
#include <vector>

#include "pen/RenderingVersions.h"

namespace QeltTests {

// The row of a rendering version that the list has.
inline const Qelt::RenderingVersion& rowOf(int version) {
  return Qelt::kRenderingVersions.at(static_cast<std::size_t>(version - 1));
}

// Every rendering version a pen can have.
inline std::vector<int> allVersions() {
  std::vector<int> all;
  for (const Qelt::RenderingVersion& row : Qelt::kRenderingVersions) all.push_back(row.number);
  return all;
}
inline int newestVersion() {
  return Qelt::kRenderingVersions.back().number;
}

// Every version of an outline.
inline std::vector<int> outlineVersions() {
  std::set<int> all;
  for (const Qelt::RenderingVersion& row : Qelt::kRenderingVersions) all.insert(row.outlineVersion);
  return {all.begin(), all.end()};
}

// Floats in one vertex of a stroke's batch.
inline int strideOf(int version) {
  return rowOf(version).floatsPerVertex;
}

// The name of a test of one version.
inline std::string versionName(const testing::TestParamInfo<int>& test) {
  return "Version" + std::to_string(test.param);
}

}  // namespace QeltTests
