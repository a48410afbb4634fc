#include <gmock/gmock.h>

#include <algorithm>
#include <cstddef>
#include <sstream>
#include <string>
#include <vector>

#include "shaders/Pencil2PredictionShader.h"
#include "shaders/Pencil2PreviewShader.h"
#include "shaders/Pencil2StrokeShaderV1.h"
#include "shaders/Pencil2StrokeShaderV2.h"

namespace QeltTests {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

// The lines of a shader that say something.
std::vector<std::string> lines(const char* source) {
  std::vector<std::string> result;
  std::istringstream text(source);
  for (std::string line; std::getline(text, line);) {
    line.resize(std::min(line.size(), line.find("//")));
    line.erase(line.find_last_not_of(' ') + 1);
    line.erase(0, line.find_first_not_of(' '));
    if (!line.empty()) result.push_back(line);
  }
  return result;
}

// What stands in `one` and not, in this order, in `other`.
std::vector<std::string> without(const std::vector<std::string>& one, const std::vector<std::string>& other) {
  // The longest common subsequence, from the back.
  std::vector<std::vector<int>> common(one.size() + 1, std::vector<int>(other.size() + 1, 0));
  for (std::size_t i = one.size(); i-- > 0;) {
    for (std::size_t j = other.size(); j-- > 0;) {
      common[i][j] =
          one[i] == other[j] ? common[i + 1][j + 1] + 1 : std::max(common[i + 1][j], common[i][j + 1]);
    }
  }
  std::vector<std::string> rest;
  std::size_t i = 0;
  std::size_t j = 0;
  while (i < one.size()) {
    if (j < other.size() && one[i] == other[j]) {
      ++i, ++j;
    } else if (j < other.size() && common[i][j + 1] >= common[i + 1][j]) {
      ++j;
    } else {
      rest.push_back(one[i++]);
    }
  }
  return rest;
}

TEST(TwinShaders, ThePreviewDiffersFromTheFirstStrokeShaderInTheGrainLookupOnly) {
  using Preview = Qelt::Pencil2PreviewShader;
  using Stroke = Qelt::Pencil2StrokeShaderV1;
  EXPECT_EQ(lines(Preview::szVertexShader), lines(Stroke::szVertexShader));
  const auto preview = lines(Preview::szFragmentShader);
  const auto stroke = lines(Stroke::szFragmentShader);
  EXPECT_THAT(without(preview, stroke),
              ElementsAre("vec2 grainCoord = vec2((gl_FragCoord.x - grainOffset.x) / textureHeight, "
                          "(gl_FragCoord.y - grainOffset.y) / textureWidth);"));
  EXPECT_THAT(without(stroke, preview),
              ElementsAre("vec2 grainCoord = vec2((gl_FragCoord.x - grainOffset.x) / textureWidth, "
                          "(gl_FragCoord.y - grainOffset.y) / textureHeight);"));
}

TEST(TwinShaders, ThePredictionDiffersFromTheSecondStrokeShaderInTheOpacityOnly) {
  using Prediction = Qelt::Pencil2PredictionShader;
  using Stroke = Qelt::Pencil2StrokeShaderV2;
  EXPECT_EQ(lines(Prediction::szVertexShader), lines(Stroke::szVertexShader));
  const auto prediction = lines(Prediction::szFragmentShader);
  const auto stroke = lines(Stroke::szFragmentShader);
  EXPECT_THAT(without(prediction, stroke),
              ElementsAre("uniform float inputOpacity;",
                          "FragColor = vec4(inputColor.rgb, alpha * smoothAlpha * inputOpacity);"));
  EXPECT_THAT(without(stroke, prediction),
              ElementsAre("FragColor = vec4(inputColor.rgb, alpha * smoothAlpha);"));
}

}  // namespace
}  // namespace QeltTests
