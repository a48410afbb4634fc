#pragma once

#include "gl/GraphicsFactory.h"
#include "gl/OpenGLShaderProgram.h"

namespace Qelt {

// A program of a shader class. Render thread.
class ShaderProgram {
 public:
  // Null inside when the host cannot make it. The sources must outlive the program.
  ShaderProgram(const char* vertexSource, const char* fragmentSource)
      : mProgram(GraphicsFactory::createOpenGLShaderProgram(vertexSource, fragmentSource, nullptr)) {}
  ~ShaderProgram() {
    if (mProgram != nullptr) mProgram->release();
  }
  ShaderProgram(const ShaderProgram&) = delete;
  ShaderProgram& operator=(const ShaderProgram&) = delete;

  OpenGLShaderProgram* get() const { return mProgram; }

 private:
  OpenGLShaderProgram* mProgram;
};

}  // namespace Qelt
