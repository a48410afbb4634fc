#include "traffic/GlCalls.h"

#include <GLES3/gl3.h>
#include <dlfcn.h>

#include <mutex>
#include <utility>

namespace QeltTests {
namespace {

std::mutex gLock;
std::vector<std::string> gCalls;
std::set<std::string>& listed() {
  static std::set<std::string> names;
  return names;
}

void* list(const char* name) {
  listed().insert(name);
  return nullptr;
}

void note(const char* name) {
  const std::lock_guard guard(gLock);
  gCalls.emplace_back(name);
}

}  // namespace

std::vector<std::string> takeGlCalls() {
  const std::lock_guard guard(gLock);
  return std::exchange(gCalls, {});
}

const std::set<std::string>& countedGlCalls() {
  return listed();
}

}  // namespace QeltTests

// clang-format off
// NOLINTBEGIN(readability-inconsistent-declaration-parameter-name, bugprone-macro-parentheses)
// The program's functions come before the library's of the same name, for the host's libraries as well.
#define COUNTED(Result, name, parameters, arguments)                                         \
  [[maybe_unused]] static void* const listed_##name = QeltTests::list(#name);                \
  extern "C" __attribute__((visibility("default"))) Result GL_APIENTRY name parameters {     \
    using Function = Result(GL_APIENTRY*) parameters;                                        \
    static const auto next = reinterpret_cast<Function>(dlsym(RTLD_NEXT, #name));            \
    QeltTests::note(#name);                                                                  \
    return next arguments;                                                                   \
  }

COUNTED(void, glActiveTexture, (GLenum a), (a))
COUNTED(void, glAttachShader, (GLuint a, GLuint b), (a, b))
COUNTED(void, glBindBuffer, (GLenum a, GLuint b), (a, b))
COUNTED(void, glBindFramebuffer, (GLenum a, GLuint b), (a, b))
COUNTED(void, glBindTexture, (GLenum a, GLuint b), (a, b))
COUNTED(void, glBindVertexArray, (GLuint a), (a))
COUNTED(void, glBlendFuncSeparate, (GLenum a, GLenum b, GLenum c, GLenum d), (a, b, c, d))
COUNTED(void, glBufferData, (GLenum a, GLsizeiptr b, const void * c, GLenum d), (a, b, c, d))
COUNTED(void, glBufferSubData, (GLenum a, GLintptr b, GLsizeiptr c, const void * d), (a, b, c, d))
COUNTED(GLenum, glCheckFramebufferStatus, (GLenum a), (a))
COUNTED(void, glClear, (GLbitfield a), (a))
COUNTED(void, glClearColor, (GLfloat a, GLfloat b, GLfloat c, GLfloat d), (a, b, c, d))
COUNTED(GLenum, glClientWaitSync, (GLsync a, GLbitfield b, GLuint64 c), (a, b, c))
COUNTED(void, glColorMask, (GLboolean a, GLboolean b, GLboolean c, GLboolean d), (a, b, c, d))
COUNTED(void, glCompileShader, (GLuint a), (a))
COUNTED(void, glCopyTexSubImage2D, (GLenum a, GLint b, GLint c, GLint d, GLint e, GLint f, GLsizei g, GLsizei h), (a, b, c, d, e, f, g, h))
COUNTED(GLuint, glCreateProgram, (), ())
COUNTED(GLuint, glCreateShader, (GLenum a), (a))
COUNTED(void, glDeleteBuffers, (GLsizei a, const GLuint * b), (a, b))
COUNTED(void, glDeleteFramebuffers, (GLsizei a, const GLuint * b), (a, b))
COUNTED(void, glDeleteProgram, (GLuint a), (a))
COUNTED(void, glDeleteShader, (GLuint a), (a))
COUNTED(void, glDeleteSync, (GLsync a), (a))
COUNTED(void, glDeleteTextures, (GLsizei a, const GLuint * b), (a, b))
COUNTED(void, glDeleteVertexArrays, (GLsizei a, const GLuint * b), (a, b))
COUNTED(void, glDetachShader, (GLuint a, GLuint b), (a, b))
COUNTED(void, glDisable, (GLenum a), (a))
COUNTED(void, glDrawArrays, (GLenum a, GLint b, GLsizei c), (a, b, c))
COUNTED(void, glDrawArraysInstanced, (GLenum a, GLint b, GLsizei c, GLsizei d), (a, b, c, d))
COUNTED(void, glEnable, (GLenum a), (a))
COUNTED(void, glEnableVertexAttribArray, (GLuint a), (a))
COUNTED(GLsync, glFenceSync, (GLenum a, GLbitfield b), (a, b))
COUNTED(void, glFlush, (), ())
COUNTED(void, glFramebufferTexture2D, (GLenum a, GLenum b, GLenum c, GLuint d, GLint e), (a, b, c, d, e))
COUNTED(void, glGenBuffers, (GLsizei a, GLuint * b), (a, b))
COUNTED(void, glGenFramebuffers, (GLsizei a, GLuint * b), (a, b))
COUNTED(void, glGenTextures, (GLsizei a, GLuint * b), (a, b))
COUNTED(void, glGenVertexArrays, (GLsizei a, GLuint * b), (a, b))
COUNTED(void, glGetActiveUniform, (GLuint a, GLuint b, GLsizei c, GLsizei * d, GLint * e, GLenum * f, GLchar * g), (a, b, c, d, e, f, g))
COUNTED(GLenum, glGetError, (), ())
COUNTED(void, glGetIntegerv, (GLenum a, GLint * b), (a, b))
COUNTED(void, glGetProgramInfoLog, (GLuint a, GLsizei b, GLsizei * c, GLchar * d), (a, b, c, d))
COUNTED(void, glGetProgramiv, (GLuint a, GLenum b, GLint * c), (a, b, c))
COUNTED(void, glGetShaderInfoLog, (GLuint a, GLsizei b, GLsizei * c, GLchar * d), (a, b, c, d))
COUNTED(void, glGetShaderiv, (GLuint a, GLenum b, GLint * c), (a, b, c))
COUNTED(const GLubyte *, glGetString, (GLenum a), (a))
COUNTED(GLint, glGetUniformLocation, (GLuint a, const GLchar * b), (a, b))
COUNTED(void, glInvalidateFramebuffer, (GLenum a, GLsizei b, const GLenum * c), (a, b, c))
COUNTED(void, glLinkProgram, (GLuint a), (a))
COUNTED(void, glPixelStorei, (GLenum a, GLint b), (a, b))
COUNTED(void, glReadPixels, (GLint a, GLint b, GLsizei c, GLsizei d, GLenum e, GLenum f, void * g), (a, b, c, d, e, f, g))
COUNTED(void, glScissor, (GLint a, GLint b, GLsizei c, GLsizei d), (a, b, c, d))
COUNTED(void, glShaderSource, (GLuint a, GLsizei b, const GLchar *const* c, const GLint * d), (a, b, c, d))
COUNTED(void, glTexImage2D, (GLenum a, GLint b, GLint c, GLsizei d, GLsizei e, GLint f, GLenum g, GLenum h, const void * i), (a, b, c, d, e, f, g, h, i))
COUNTED(void, glTexParameteri, (GLenum a, GLenum b, GLint c), (a, b, c))
COUNTED(void, glTexSubImage2D, (GLenum a, GLint b, GLint c, GLint d, GLsizei e, GLsizei f, GLenum g, GLenum h, const void * i), (a, b, c, d, e, f, g, h, i))
COUNTED(void, glUniform1f, (GLint a, GLfloat b), (a, b))
COUNTED(void, glUniform1i, (GLint a, GLint b), (a, b))
COUNTED(void, glUniform2f, (GLint a, GLfloat b, GLfloat c), (a, b, c))
COUNTED(void, glUniform4f, (GLint a, GLfloat b, GLfloat c, GLfloat d, GLfloat e), (a, b, c, d, e))
COUNTED(void, glUniformMatrix4fv, (GLint a, GLsizei b, GLboolean c, const GLfloat * d), (a, b, c, d))
COUNTED(void, glUseProgram, (GLuint a), (a))
COUNTED(void, glVertexAttribPointer, (GLuint a, GLint b, GLenum c, GLboolean d, GLsizei e, const void * f), (a, b, c, d, e, f))
COUNTED(void, glViewport, (GLint a, GLint b, GLsizei c, GLsizei d), (a, b, c, d))
// NOLINTEND(readability-inconsistent-declaration-parameter-name, bugprone-macro-parentheses)
// clang-format on
