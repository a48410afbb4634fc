#include <android/log.h>
#include <gmock/gmock.h>

#include <cstring>
#include <stdexcept>
#include <string>
#include <typeinfo>

#include "base/Vector.h"
#include "desktop/gl/RenderQueue.h"
#include "gl/OpenGLShaderProgram.h"
#include "gl/ShaderManager.h"
#include "math/Matrix4.h"
#include "shaders/Exceptions.h"
#include "shaders/ParameterBinding.h"
#include "shaders/Pencil2StrokeShaderV1.h"
#include "shaders/Pencil2StrokeShaderV2.h"
#include "shaders/ShaderProgram.h"
#include "shaders/ShaderRegistry.h"
#include "shaders/StampUniforms.h"
#include "support/Allocations.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using namespace Qelt;
using QeltDesktop::RenderQueue;
using testing::IsEmpty;
using testing::SizeIs;

// --- The registry ---

struct Alive {
  Alive() { ++count; }
  ~Alive() { --count; }
  static inline int count = 0;
};
struct OneShader : Alive {};
struct OtherShader : Alive {};
struct BadShader : Alive {
  BadShader() {
    if (isBad) throw std::runtime_error("bad");
  }
  static inline bool isBad = true;
};

ShaderManager& registry() {
  return *ShaderManager::GetInstance();
}

TEST(ShaderRegistryTest, SharesOneShaderAClassAndDestroysItWithItsLastUser) {
  LogCapture log;
  OneShader* const first = registry().GetShader<OneShader>();
  const std::vector<LogLine> lines = log.take();
  ASSERT_THAT(lines, SizeIs(1));
  EXPECT_EQ(lines[0].priority, 3);
  EXPECT_EQ(lines[0].tag, "qel_log");
  EXPECT_EQ(lines[0].text,
            std::string("ShaderManager::GetShader, New ") + typeid(OneShader).name() + " is added");

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
  registry().ReleaseShader(&stranger);
  std::vector<LogLine> lines = log.take();
  ASSERT_THAT(lines, SizeIs(1));
  EXPECT_EQ(lines[0].priority, 6);
  EXPECT_EQ(lines[0].text, std::string("ReleaseShader. Shader (") + typeid(OneShader).name() +
                               ") not in shader manager (not found).");

  OneShader* const registered = registry().GetShader<OneShader>();
  log.take();
  registry().ReleaseShader(&stranger);
  lines = log.take();
  ASSERT_THAT(lines, SizeIs(1));
  EXPECT_EQ(lines[0].priority, 6);
  EXPECT_EQ(lines[0].text, std::string("ReleaseShader. Shader (") + typeid(OneShader).name() +
                               ") not in shader manager (pointer mismatch).");
  EXPECT_EQ(Alive::count, 2);
  registry().ReleaseShader(registered);
  EXPECT_EQ(Alive::count, 1);
}

TEST(ShaderRegistryTest, KeepsNothingOfAShaderThatCouldNotBeMade) {
  const LogCapture log;
  EXPECT_THROW(registry().GetShader<BadShader>(), std::runtime_error);
  EXPECT_EQ(Alive::count, 0);
  BadShader::isBad = false;
  BadShader* const made = registry().GetShader<BadShader>();  // not a leftover
  ASSERT_NE(made, nullptr);
  EXPECT_EQ(Alive::count, 1);
  registry().ReleaseShader(made);
  EXPECT_EQ(Alive::count, 0);
}

// --- Bindings ---

// A program with one uniform of a given type.
class FakeProgram : public OpenGLShaderProgram, public IParameterBinding {
 public:
  explicit FakeProgram(BindingType type) : mType(type) {}
  void activate() override {}
  IParameterBinding* getBindingIntf(const char* name, int type) override {
    EXPECT_EQ(type, 0);
    return std::strcmp(name, "known") == 0 ? this : nullptr;
  }
  BindingType getType() const override { return mType; }
  void set(const Matrix4<float>&) override { last = "matrix"; }
  void set(const Vector2<float>&) override { last = "vector2"; }
  void set(const Vector4<float>&) override { last = "vector4"; }
  void set(float) override { last = "float"; }
  void set(int) override { last = "int"; }
  void release() override { ++releases; }

  std::string last;
  int releases = 0;

 private:
  BindingType mType;
};

template <BindingType N, typename Value>
void expectAccepted(BindingType uniform, const Value& value, const std::string& heard) {
  FakeProgram program(uniform);
  {
    ParameterBinding<N> binding;
    binding.bind(&program, "known");
    binding = value;
    EXPECT_EQ(program.last, heard);
    EXPECT_EQ(program.releases, 0);
  }
  EXPECT_EQ(program.releases, 1);
}

TEST(ParameterBindingTest, PassesValuesOfItsTypeOnAndGivesTheInterfaceBack) {
  expectAccepted<kBindingMatrix4>(kBindingMatrix4, Matrix4<float>(), "matrix");
  expectAccepted<kBindingVector2>(kBindingVector2, Vector2<float>{}, "vector2");
  expectAccepted<kBindingVector4>(kBindingVector4, Vector4<float>{}, "vector4");
  expectAccepted<kBindingFloat>(kBindingFloat, 1.0f, "float");
  expectAccepted<kBindingInt>(kBindingInt, 1, "int");
  // A host that does not tell types is taken at its word.
  expectAccepted<kBindingFloat>(kBindingAny, 1.0f, "float");
}

TEST(ParameterBindingTest, RefusesAUniformOfAnotherType) {
  LogCapture log;
  FakeProgram program(kBindingVector2);
  ParameterBinding<kBindingVector4> binding;
  try {
    binding.bind(&program, "known");
    FAIL() << "bound";
  } catch (const InvalidArgumentException& error) {
    EXPECT_STREQ(error.what(), "ParameterBinding<>::bind - invalid parameter type!");
  }
  EXPECT_EQ(program.releases, 1);
  const std::vector<LogLine> lines = log.take();
  ASSERT_THAT(lines, SizeIs(1));
  EXPECT_EQ(lines[0].priority, 4);
  EXPECT_EQ(lines[0].text, "known: Found 4 but given 6");
  EXPECT_THROW(binding = Vector4<float>{}, NotSupportedException);
}

TEST(ParameterBindingTest, RefusesValuesWhileUnbound) {
  FakeProgram program(kBindingInt);
  ParameterBinding<kBindingInt> binding;
  binding.bind(&program, "unknown");
  try {
    binding = 1;
    FAIL() << "set";
  } catch (const NotSupportedException& error) {
    EXPECT_STREQ(error.what(), "ParameterBinding: internal interface is not initialized!");
  }
}

// --- Real programs ---

// A stamp shader whose colour has no alpha.
constexpr char kVertex[] = R"(#version 300 es
layout(location = 0) in vec4 position;
uniform mat4 ProjectionMatrix;
void main() { gl_Position = ProjectionMatrix * position; })";
constexpr char kFragment[] = R"(#version 300 es
precision highp float;
uniform sampler2D sampler0;
uniform sampler2D sampler1;
uniform vec3 inputColor;
out vec4 FragColor;
void main() { FragColor = vec4(inputColor, 1.0) * texture(sampler0, vec2(0.5)) * texture(sampler1, vec2(0.5)); })";

class WrongShader : public StampUniforms {
 public:
  WrongShader() : mProgram(kVertex, kFragment) { bind(mProgram); }

 private:
  ShaderProgram mProgram;
};

TEST(StampShaderTest, BindsEveryUniformOfTheRealPrograms) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  queue.run([] {
    const auto setAll = [](auto& shader) {
      ASSERT_TRUE(shader.isLinked());
      shader.activate();
      // Each of these would throw, were its uniform unbound.
      shader.projectionMatrix = Matrix4<float>();
      shader.sampler0 = 0;
      shader.sampler1 = 1;
      shader.inputColor = Vector4<float>{};
      shader.grainOffset = Vector2<float>{};
      shader.numTilesOfPoints = 3.0f;
      shader.textureHeight = 150.0f;
      shader.textureWidth = 150.0f;
    };
    Pencil2StrokeShaderV1 first;
    setAll(first);
    Pencil2StrokeShaderV2 second;
    setAll(second);
  });
}

TEST(StampShaderTest, WithAUniformOfAnotherTypeIsNotRegisteredAndLeaksNothing) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  queue.run([] {
    LogCapture log;
    EXPECT_THROW(registry().GetShader<WrongShader>(), InvalidArgumentException);
    log.take();
    const long before = liveAllocations();
    bool threw = false;
    try {
      registry().GetShader<WrongShader>();
    } catch (const InvalidArgumentException&) {
      threw = true;
    }
    log.take();
    EXPECT_TRUE(threw);
    EXPECT_EQ(liveAllocations(), before);
  });
}

TEST(StampShaderTest, WithoutGLIsNotLinkedAndHarmless) {
  const LogCapture log;
  Pencil2StrokeShaderV1 shader;
  EXPECT_FALSE(shader.isLinked());
  EXPECT_THROW(shader.sampler0 = 0, NotSupportedException);
}

}  // namespace
}  // namespace QeltTests
