#pragma once

#include <utility>

#include "gl/GraphicsFactory.h"
#include "gl/OpenGLShaderProgram.h"

namespace Qelt {

// A program of a shader class. Render thread.
class ShaderProgram {
 public:
  ShaderProgram() = default;
  ~ShaderProgram() { release(); }
  ShaderProgram(const ShaderProgram&) = delete;
  ShaderProgram& operator=(const ShaderProgram&) = delete;

  // Has the host make the program, in place of the one there was. Returns null when the host cannot, for
  // instance while there is no GL context. The sources must outlive the program.
  OpenGLShaderProgram* make(const char* vertexSource, const char* fragmentSource) {
    release();
    mProgram = GraphicsFactory::createOpenGLShaderProgram(vertexSource, fragmentSource, nullptr);
    return mProgram;
  }

  OpenGLShaderProgram* get() const { return mProgram; }

 private:
  void release() {
    if (mProgram != nullptr) std::exchange(mProgram, nullptr)->release();
  }

  OpenGLShaderProgram* mProgram = nullptr;
};

}  // namespace Qelt
