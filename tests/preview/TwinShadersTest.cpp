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

// Where two shaders of as many lines differ: the first one's lines, each followed by the second one's.
std::vector<std::string> differences(const char* one, const char* other) {
  const std::vector<std::string> ones = lines(one), others = lines(other);
  EXPECT_EQ(ones.size(), others.size());
  std::vector<std::string> found;
  for (std::size_t i = 0; i < std::min(ones.size(), others.size()); ++i) {
    if (ones[i] != others[i]) found.insert(found.end(), {ones[i], others[i]});
  }
  return found;
}

TEST(TwinShaders, ThePreviewDiffersFromTheFirstStrokeShaderInTheGrainLookupOnly) {
  using Preview = Qelt::Pencil2PreviewShader;
  using Stroke = Qelt::Pencil2StrokeShaderV1;
  EXPECT_THAT(differences(Preview::szVertexShader, Stroke::szVertexShader), IsEmpty());
  EXPECT_THAT(differences(Preview::szFragmentShader, Stroke::szFragmentShader),
              ElementsAre("vec2 grainCoord = vec2((gl_FragCoord.x - grainOffset.x) / textureHeight, "
                          "(gl_FragCoord.y - grainOffset.y) / textureWidth);",
                          "vec2 grainCoord = vec2((gl_FragCoord.x - grainOffset.x) / textureWidth, "
                          "(gl_FragCoord.y - grainOffset.y) / textureHeight);"));
}

TEST(TwinShaders, ThePredictionDiffersFromTheSecondStrokeShaderInTheOpacityOnly) {
  using Prediction = Qelt::Pencil2PredictionShader;
  using Stroke = Qelt::Pencil2StrokeShaderV2;
  EXPECT_THAT(differences(Prediction::szVertexShader, Stroke::szVertexShader), IsEmpty());
  std::string withoutOpacity = Prediction::szFragmentShader;
  for (const std::string extra : {"uniform float inputOpacity;", " * inputOpacity"}) {
    const std::size_t at = withoutOpacity.find(extra);
    ASSERT_NE(at, std::string::npos) << extra;
    withoutOpacity.erase(at, extra.size());
  }
  EXPECT_THAT(differences(withoutOpacity.c_str(), Stroke::szFragmentShader), IsEmpty());
}

}  // namespace
}  // namespace QeltTests
