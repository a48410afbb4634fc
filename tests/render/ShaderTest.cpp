#include <gmock/gmock.h>

#include <string>
#include <typeinfo>

#include "base/Vector.h"
#include "desktop/gl/RenderQueue.h"
#include "gl/OpenGLShaderProgram.h"
#include "gl/ShaderManager.h"
#include "math/Matrix4.h"
#include "shaders/ParameterBinding.h"
#include "shaders/PencilShaders.h"
#include "shaders/ShaderRegistry.h"
#include "support/Allocations.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using namespace Qelt;
using QeltDesktop::RenderQueue;
using testing::Contains;
using testing::ElementsAre;
using testing::Field;
using testing::IsEmpty;
using testing::MatchesRegex;
using testing::SizeIs;
using testing::ThrowsMessage;

MATCHER_P2(LogOf, priority, text, "") {
  return arg.priority == priority && arg.tag == "qel_log" && arg.text == text;
}

// --- The registry ---

struct Alive {
  Alive() { ++count; }
  ~Alive() { --count; }
  bool isLinked() const { return linked; }
  void link() { linked = true; }
  static inline int count = 0;
  bool linked = true;
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

// A shader that was made without a GL context is mended where it is: others hold it already.
TEST(ShaderRegistryTest, LinksAnUnlinkedShaderForTheNextWhoAsks) {
  const LogCapture log;
  OneShader* const shader = registry().GetShader<OneShader>();
  shader->linked = false;
  EXPECT_EQ(registry().GetShader<OneShader>(), shader);
  EXPECT_TRUE(shader->linked);
  for (int i = 0; i < 2; ++i) registry().ReleaseShader(shader);
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

// --- Uniforms ---

// A program with one uniform whose type the host does not tell.
class FakeProgram : public OpenGLShaderProgram, public IParameterBinding {
 public:
  void activate() override {}
  IParameterBinding* getBindingIntf(const char* name, int) override {
    return name != missing ? this : nullptr;
  }
  BindingType getType() const override { return kBindingAny; }
  void set(const Matrix4<float>&) override { FAIL(); }
  void set(const Vector2<float>&) override { FAIL(); }
  void set(const Vector4<float>&) override { FAIL(); }
  void set(float value) override { last = value; }
  void set(int) override { FAIL(); }
  void release() override { ++releases; }

  float last = 0.0f;
  int releases = 0;
  std::string missing;
};

TEST(ParameterBindingTest, TakesAHostThatTellsNoTypeAtItsWordAndGivesTheInterfaceBack) {
  FakeProgram program;
  {
    ParameterBinding<kBindingFloat> binding;
    binding.bind(&program, "uniform");
    binding = 1.5f;
    EXPECT_EQ(program.last, 1.5f);
    EXPECT_EQ(program.releases, 0);
  }
  EXPECT_EQ(program.releases, 1);
}

// Were it drawn with, the unbound one would throw in the middle of a tile.
TEST(StampUniformsTest, AreOnlyBoundWhenAllOfThemAre) {
  FakeProgram program;
  EXPECT_TRUE(StampUniforms().bind(&program));
  for (const char* name : {"ProjectionMatrix", "sampler1", "textureWidth"}) {
    program.missing = name;
    EXPECT_FALSE(StampUniforms().bind(&program)) << name;
  }
}

// A stamp shader whose colour has no alpha.
struct WrongShader : PencilShader<WrongShader, StampUniforms> {
  static constexpr char szVertexShader[] = R"(#version 300 es
layout(location = 0) in vec4 position;
uniform mat4 ProjectionMatrix;
void main() { gl_Position = ProjectionMatrix * position; })";
  static constexpr char szFragmentShader[] = R"(#version 300 es
precision highp float;
uniform sampler2D sampler0;
uniform sampler2D sampler1;
uniform vec3 inputColor;
out vec4 FragColor;
void main() { FragColor = vec4(inputColor, 1.0) * texture(sampler0, vec2(0.5)) * texture(sampler1, vec2(0.5)); })";
};

TEST(StampShaderTest, WithAUniformOfAnotherTypeIsNotRegisteredAndLeaksNothing) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  queue.run([] {
    LogCapture log;
    long after[2];
    for (long& alive : after) {
      EXPECT_THAT(
          [] { registry().GetShader<WrongShader>(); },
          ThrowsMessage<InvalidArgumentException>("ParameterBinding<>::bind - invalid parameter type!"));
      EXPECT_THAT(log.take(),
                  Contains(Field(&LogLine::text, MatchesRegex("inputColor: Found .* but given 6"))));
      alive = liveAllocations();
    }
    EXPECT_EQ(after[1], after[0]);
  });
}

TEST(StampShaderTest, WithoutGLIsNotLinkedAndRefusesValues) {
  const LogCapture log;
  Pencil2StrokeShaderV1 shader;
  EXPECT_FALSE(shader.isLinked());
  EXPECT_THAT([&] { shader.sampler0 = 0; }, ThrowsMessage<NotSupportedException>(
                                                "ParameterBinding: internal interface is not initialized!"));
}

}  // namespace
}  // namespace QeltTests
