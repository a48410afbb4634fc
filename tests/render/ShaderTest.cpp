#include <gmock/gmock.h>

#include <string>
#include <typeinfo>

#include "gl/ShaderManager.h"
#include "shaders/ShaderRegistry.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using Qelt::ShaderManager;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

MATCHER_P2(LogOf, priority, text, "") {
  return arg.priority == priority && arg.tag == "qel_log" && arg.text == text;
}

struct Alive {
  Alive() { ++count; }
  ~Alive() { --count; }
  bool isLinked() const { return true; }
  void link() {}
  static inline int count = 0;
};
struct OneShader : Alive {};
struct OtherShader : Alive {};
ShaderManager& registry() {
  return *ShaderManager::GetInstance();
}

TEST(ShaderRegistryTest, SharesOneShaderAClassAndDestroysItWithItsLastUser) {
  LogCapture log;
  OneShader* const first = registry().GetShader<OneShader>();
  EXPECT_THAT(log.take(), ElementsAre(LogOf(3, std::string("ShaderManager::GetShader, New ") +
                                                   typeid(OneShader).name() + " is added")));
  EXPECT_EQ(registry().GetShader<OneShader>(), first);
  OtherShader* const other = registry().GetShader<OtherShader>();
  EXPECT_EQ(Alive::count, 2);
  EXPECT_THAT(log.take(), SizeIs(1));  // of the other one

  registry().ReleaseShader(first);
  EXPECT_EQ(Alive::count, 2);
  registry().ReleaseShader(first);
  EXPECT_EQ(Alive::count, 1);
  registry().ReleaseShader(other);
  EXPECT_EQ(Alive::count, 0);
  EXPECT_THAT(log.take(), IsEmpty());
}

TEST(ShaderRegistryTest, ReportsMisuseAndLeavesTheRegisteredOneAlone) {
  LogCapture log;
  OneShader stranger;
  registry().ReleaseShader<OneShader>(nullptr);
  EXPECT_THAT(log.take(), IsEmpty());
  const std::string complaint =
      std::string("ReleaseShader. Shader (") + typeid(OneShader).name() + ") not in shader manager ";
  registry().ReleaseShader(&stranger);
  EXPECT_THAT(log.take(), ElementsAre(LogOf(6, complaint + "(not found).")));

  OneShader* const registered = registry().GetShader<OneShader>();
  log.take();
  registry().ReleaseShader(&stranger);
  EXPECT_THAT(log.take(), ElementsAre(LogOf(6, complaint + "(pointer mismatch).")));
  EXPECT_EQ(Alive::count, 2);
  registry().ReleaseShader(registered);
  EXPECT_EQ(Alive::count, 1);
}

}  // namespace
}  // namespace QeltTests
