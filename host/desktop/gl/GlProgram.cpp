#include <algorithm>
#include <array>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <memory>
#include <new>
#include <string>
#include <vector>

#include "desktop/base/Log.h"
#include "desktop/gl/GlCall.h"
#include "desktop/gl/GlDevice.h"
#include "gl/GraphicsFactory.h"
#include "gl/OpenGLShaderProgram.h"
#include "math/Matrix4.h"

namespace Qelt {

IParameterBinding::~IParameterBinding() = default;
OpenGLShaderProgram::~OpenGLShaderProgram() = default;

}  // namespace Qelt

namespace QeltDesktop {

namespace {

// The host's number for a GL uniform type. Types that no pen uses share one.
Qelt::BindingType bindingTypeOf(GLenum type) {
  switch (type) {
    case GL_FLOAT_MAT4:
      return Qelt::kBindingMatrix4;
    case GL_FLOAT_VEC2:
      return Qelt::kBindingVector2;
    case GL_FLOAT_VEC4:
      return Qelt::kBindingVector4;
    case GL_FLOAT:
      return Qelt::kBindingFloat;
    case GL_INT:
    case GL_SAMPLER_2D:
      return Qelt::kBindingInt;
    default:
      return static_cast<Qelt::BindingType>(100);
  }
}

struct Uniform {
  std::string name;
  GLint location;
  Qelt::BindingType type;
  // What GL has, bit for bit: it is told only what differs. Nothing before the first value.
  std::array<std::uint32_t, 16> value{};
  bool isSet = false;
};

// The program itself, shared with its bindings, which may be given back after it. It keeps the shaders'
// sources and is built again from them after a loss of the context.
class ProgramState final : public GlResource {
 public:
  ProgramState(const char* vertexSource, const char* fragmentSource)
      : mVertexSource(vertexSource), mFragmentSource(fragmentSource) {}
  ~ProgramState() override { destroy(); }

  bool build() {
    mMayBuildAgain = true;  // until it is known that memory is not what it lacks
    const Stage vertex{compile(GL_VERTEX_SHADER, mVertexSource.c_str())};
    const Stage fragment{vertex.name != 0 ? compile(GL_FRAGMENT_SHADER, mFragmentSource.c_str()) : 0};
    if (fragment.name != 0) link(vertex.name, fragment.name);
    if (mProgram != 0) readUniforms();
    mMayBuildAgain = false;
    return mProgram != 0;
  }

  // Makes the program current; false when there is none. Nothing is drawn with another's program then.
  bool use() {
    if (mProgram == 0 && mMayBuildAgain && isLive() && !mReleased) remake();
    if (mProgram == 0 || !isLive()) {
      if (GlDevice* const drawing = GlDevice::live(); drawing != nullptr) drawing->state().useProgram(0);
      noteForeignContext();
      return false;
    }
    device()->state().useProgram(mProgram);
    return true;
  }

  // The index of a uniform, -1 when the program has none of that name.
  int find(const char* name) const {
    const auto found = std::find_if(mUniforms.begin(), mUniforms.end(),
                                    [&](const Uniform& uniform) { return uniform.name == name; });
    return found == mUniforms.end() ? -1 : static_cast<int>(found - mUniforms.begin());
  }

  const Uniform& uniform(int index) const { return mUniforms[static_cast<std::size_t>(index)]; }
  // Notes the value of `bytes` bytes; false when GL has it already.
  bool changes(int index, const void* value, std::size_t bytes) {
    Uniform& uniform = mUniforms[static_cast<std::size_t>(index)];
    if (uniform.isSet && std::memcmp(uniform.value.data(), value, bytes) == 0) return false;
    std::memcpy(uniform.value.data(), value, bytes);
    uniform.isSet = true;
    return true;
  }

  void destroy() {
    mReleased = true;
    if (mProgram != 0 && isLive()) {
      if (device()->state().program() == mProgram) device()->state().useProgram(0);
      gl(glDeleteProgram)(mProgram);
    }
    mProgram = 0;
  }

 private:
  void forget() noexcept override { mProgram = 0; }
  void remake() noexcept override {
    if (mReleased) return;
    try {
      build();
    } catch (const std::bad_alloc&) {
      logError("there is no memory to say why a shader program does not come back");
    }
  }

  // A compiled stage, until the program is linked.
  struct Stage {
    GLuint name;
    explicit Stage(GLuint made) : name(made) {}
    ~Stage() {
      if (name != 0) gl(glDeleteShader)(name);
    }
    Stage(const Stage&) = delete;
    Stage& operator=(const Stage&) = delete;
  };

  // Shaders are shared by the whole process, contexts are not: a second queue's strokes stay invisible.
  void noteForeignContext() {
    if (GlDevice::live() == nullptr || GlDevice::live() == device() || mSaidForeign.exchange(true)) return;
    logError("a shader program belongs to another render queue's context; nothing is drawn with it here");
  }

  // What GL has to say of a failure, as far as it fits.
  using Report = std::array<GLchar, 2048>;

  static GLuint compile(GLenum stage, const char* source) {
    const GLuint shader = gl(glCreateShader)(stage);
    gl(glShaderSource)(shader, 1, &source, nullptr);
    gl(glCompileShader)(shader);
    GLint compiled = GL_FALSE;
    gl(glGetShaderiv)(shader, GL_COMPILE_STATUS, &compiled);
    if (compiled == GL_TRUE) return shader;
    Report report{};
    gl(glGetShaderInfoLog)(shader, static_cast<GLsizei>(report.size()), nullptr, report.data());
    gl(glDeleteShader)(shader);
    logError(std::string(stage == GL_VERTEX_SHADER ? "vertex" : "fragment") +
             " shader does not compile: " + report.data());
    return 0;
  }

  void link(GLuint vertex, GLuint fragment) {
    const GLuint program = gl(glCreateProgram)();
    gl(glAttachShader)(program, vertex);
    gl(glAttachShader)(program, fragment);
    gl(glLinkProgram)(program);
    gl(glDetachShader)(program, vertex);
    gl(glDetachShader)(program, fragment);
    GLint linked = GL_FALSE;
    gl(glGetProgramiv)(program, GL_LINK_STATUS, &linked);
    if (linked == GL_TRUE) {
      mProgram = program;
      return;
    }
    Report report{};
    gl(glGetProgramInfoLog)(program, static_cast<GLsizei>(report.size()), nullptr, report.data());
    gl(glDeleteProgram)(program);
    logError(std::string("shader program does not link: ") + report.data());
  }

  // Indices stay what they were the first time: bindings keep them across contexts.
  void readUniforms() {
    for (Uniform& known : mUniforms) {
      known.location = -1;
      known.isSet = false;
    }
    GLint count = 0;
    gl(glGetProgramiv)(mProgram, GL_ACTIVE_UNIFORMS, &count);
    for (GLint i = 0; i < count; ++i) {
      char name[256] = {};
      GLint size = 0;
      GLenum type = 0;
      gl(glGetActiveUniform)(mProgram, static_cast<GLuint>(i), sizeof name, nullptr, &size, &type, name);
      const GLint location = gl(glGetUniformLocation)(mProgram, name);
      const int known = find(name);
      if (known >= 0) {
        mUniforms[static_cast<std::size_t>(known)].location = location;
      } else {
        mUniforms.push_back({.name = name, .location = location, .type = bindingTypeOf(type)});
      }
    }
  }

  // Copies: the program may outlive the library that brought them.
  std::string mVertexSource;
  std::string mFragmentSource;
  GLuint mProgram = 0;
  bool mReleased = false;
  bool mMayBuildAgain = false;
  std::atomic<bool> mSaidForeign{false};  // whichever render thread comes first
  std::vector<Uniform> mUniforms;
};

class GlUniform final : public Qelt::IParameterBinding {
 public:
  GlUniform(std::shared_ptr<ProgramState> program, int index) : mProgram(std::move(program)), mIndex(index) {}

  Qelt::BindingType getType() const override { return mProgram->uniform(mIndex).type; }

  void set(const Qelt::Matrix4<float>& value) override {
    if (isNew(Qelt::kBindingMatrix4, value.data(), 16)) {
      gl(glUniformMatrix4fv)(location(), 1, GL_FALSE, value.data());
    }
  }
  void set(const Qelt::Vector2<float>& value) override {
    if (isNew(Qelt::kBindingVector2, &value.x, 2)) gl(glUniform2f)(location(), value.x, value.y);
  }
  void set(const Qelt::Vector4<float>& value) override {
    if (isNew(Qelt::kBindingVector4, &value.x, 4)) {
      gl(glUniform4f)(location(), value.x, value.y, value.z, value.w);
    }
  }
  void set(float value) override {
    if (isNew(Qelt::kBindingFloat, &value, 1)) gl(glUniform1f)(location(), value);
  }
  void set(int value) override {
    if (isNew(Qelt::kBindingInt, &value, 1)) gl(glUniform1i)(location(), value);
  }
  void release() override { delete this; }

 private:
  // Makes the program current and notes the value, of so many numbers. A value of another type is dropped
  // rather than handed to GL.
  bool isNew(Qelt::BindingType type, const void* value, std::size_t numbers) {
    return getType() == type && mProgram->use() && mProgram->changes(mIndex, value, 4 * numbers);
  }
  GLint location() const { return mProgram->uniform(mIndex).location; }

  std::shared_ptr<ProgramState> mProgram;
  int mIndex;
};

class GlProgram final : public Qelt::OpenGLShaderProgram {
 public:
  explicit GlProgram(std::shared_ptr<ProgramState> state) : mState(std::move(state)) {}

  void activate() override { mState->use(); }

  Qelt::IParameterBinding* getBindingIntf(const char* name, int type) override {
    const int index = name != nullptr ? mState->find(name) : -1;
    if (index < 0) return nullptr;
    if (type != Qelt::kBindingAny && type != mState->uniform(index).type) return nullptr;
    return new (std::nothrow) GlUniform(mState, index);
  }

  void release() override {
    mState->destroy();
    delete this;
  }

 private:
  std::shared_ptr<ProgramState> mState;
};

}  // namespace

}  // namespace QeltDesktop

namespace Qelt {

OpenGLShaderProgram* GraphicsFactory::createOpenGLShaderProgram(const char* vertexSource,
                                                                const char* fragmentSource, const char*) {
  if (vertexSource == nullptr || fragmentSource == nullptr) return nullptr;
  if (QeltDesktop::GlDevice::live() == nullptr) return nullptr;
  try {
    auto state = std::make_shared<QeltDesktop::ProgramState>(vertexSource, fragmentSource);
    if (!state->build()) return nullptr;
    return new QeltDesktop::GlProgram(std::move(state));
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

}  // namespace Qelt
