#include <gmock/gmock.h>

#include <initializer_list>
#include <string>
#include <typeinfo>
#include <vector>

#include "gl/ShaderManager.h"
#include "outline/Pencil2OutlineDrawableRTV1.h"
#include "render/RenderDrawables.h"
#include "shaders/ShaderRegistry.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using Qelt::ShaderManager;
using testing::Contains;
using testing::ElementsAre;
using testing::Field;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::SizeIs;

MATCHER_P2(LogOf, priority, text, "") {
  return arg.priority == priority && arg.tag == "qel_log" && arg.text == text;
}

struct Shader {
  Shader() { ++alive; }
  ~Shader() { --alive; }
  bool isLinked() const { return true; }
  void link() {}
  static inline int alive = 0;
};
struct OtherShader : Shader {};

TEST(ShaderRegistryTest, SharesOneShaderAClassAndDestroysItWithItsLastUser) {
  LogCapture log;
  ShaderManager& registry = *ShaderManager::GetInstance();
  const std::string name = typeid(Shader).name();
  const std::string complaint = "ReleaseShader. Shader (" + name + ") not in shader manager ";
  Shader stranger;
  registry.ReleaseShader<Shader>(nullptr);
  EXPECT_THAT(log.take(), IsEmpty());
  registry.ReleaseShader(&stranger);
  EXPECT_THAT(log.take(), ElementsAre(LogOf(6, complaint + "(not found).")));

  Shader* const first = registry.GetShader<Shader>();
  EXPECT_THAT(log.take(), ElementsAre(LogOf(3, "ShaderManager::GetShader, New " + name + " is added")));
  EXPECT_EQ(registry.GetShader<Shader>(), first);
  OtherShader* const other = registry.GetShader<OtherShader>();
  EXPECT_THAT(log.take(), SizeIs(1));  // of the other one
  registry.ReleaseShader(&stranger);
  EXPECT_THAT(log.take(), ElementsAre(LogOf(6, complaint + "(pointer mismatch).")));

  registry.ReleaseShader(first);
  EXPECT_EQ(Shader::alive, 3);
  registry.ReleaseShader(first);
  EXPECT_EQ(Shader::alive, 2);
  registry.ReleaseShader(other);
  EXPECT_EQ(Shader::alive, 1);
  EXPECT_THAT(log.take(), IsEmpty());
}

// Whatever is called on them: a host makes new ones.
TEST(RenderDrawables, OnceReleasedMakeNothingAgain) {
  LogCapture log;
  Qelt::Pencil2StrokeDrawableRTV3 stroke(nullptr);
  Qelt::Pencil2OutlineDrawableRTV1 outline(nullptr);
  for (Qelt::PenDrawableRT* const drawable : std::initializer_list<Qelt::PenDrawableRT*>{&stroke, &outline}) {
    drawable->CreatePenCanvas(1, 1, nullptr);
    EXPECT_THAT(log.take(), Contains(Field(&LogLine::text, HasSubstr("is added"))));
    drawable->Release();
    drawable->Init();
    drawable->CreatePenCanvas(1, 1, nullptr);
    drawable->RestoreGLObject();
    EXPECT_THAT(log.take(), Not(Contains(Field(&LogLine::text, HasSubstr("is added")))));
  }
}

// Outside a segment as well: six vertices each, an outline's in both streams.
TEST(RenderDrawables, TakeStampsOneByOne) {
  const Qelt::Vector2<float> stamp[2] = {{10.0f, 20.0f}, {0.0f, 1.0f}};
  std::vector<float> batch, inner, outer;
  Qelt::Pencil2StrokeDrawableRTV1 stroke(nullptr);
  stroke.SetBuffer(&batch);
  stroke.AddPoint(stamp, 4.0f, 0.5f, 0.25f, 1);
  EXPECT_THAT(batch, SizeIs(6 * 9));
  Qelt::Pencil2OutlineDrawableRTV1 outline(nullptr);
  outline.SetBuffer(&inner, &outer);
  outline.AddPoint(stamp, 4.0f, 0.25f);
  EXPECT_THAT(inner, SizeIs(6 * 7));
  EXPECT_THAT(outer, SizeIs(6 * 7));
}

}  // namespace
}  // namespace QeltTests
