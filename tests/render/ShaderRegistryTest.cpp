#include "shaders/ShaderRegistry.h"

#include <android/log.h>
#include <gtest/gtest.h>

#include "gl/ShaderManager.h"
#include "support/Allocations.h"

namespace QeltTests {
namespace {

using Qelt::ShaderManager;

struct ShaderOfThisTest {
  float uniform = 1.0f;
};

TEST(ShaderRegistry, TriesAgainWhereMemoryRanOutForAShader) {
  if (!countsAllocations()) GTEST_SKIP() << "the sanitizers bring allocation functions of their own";
  // What captures lines allocates, which here would fail inside the log library.
  __android_log_set_logger([](const __android_logger_data*, const char*) {});
  ShaderManager* const registry = ShaderManager::GetInstance();
  const long before = liveAllocations();
  int failures = 0;
  for (bool failed = true; failed; ++failures) {
    ShaderOfThisTest* shader;
    {
      const FailingAllocation failing(failures);
      shader = registry->GetShader<ShaderOfThisTest>();
      failed = failing.hasFailed();
    }
    EXPECT_EQ(shader == nullptr, failed) << "allocation " << failures;
    ShaderOfThisTest* const again = registry->GetShader<ShaderOfThisTest>();
    EXPECT_NE(again, nullptr) << "after failed allocation " << failures;
    registry->ReleaseShader(again);
    registry->ReleaseShader(shader);
  }
  __android_log_set_logger(__android_log_stderr_logger);
  EXPECT_GE(failures, 3) << "a shader, a node of the map and a key have been asked for";
  EXPECT_EQ(liveAllocations(), before) << "whoever got none held none";
}

}  // namespace
}  // namespace QeltTests
