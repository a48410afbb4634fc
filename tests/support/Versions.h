#pragma once

#include <gtest/gtest.h>

#include <array>
#include <string>

namespace QeltTests {

// Every rendering version a pen can have.
inline constexpr std::array<int, 8> allVersions() {
  return {1, 2, 3, 4, 5, 6, 7, 8};
}

// Every version of an outline.
inline constexpr std::array<int, 5> outlineVersions() {
  return {1, 2, 3, 4, 5};
}

// Floats in one vertex of a stroke's batch.
inline constexpr int strideOf(int renderingVersion) {
  return renderingVersion == 8 ? 11 : 9;
}

// The name of a test of one version.
inline std::string versionName(const testing::TestParamInfo<int>& test) {
  return "Version" + std::to_string(test.param);
}

}  // namespace QeltTests
