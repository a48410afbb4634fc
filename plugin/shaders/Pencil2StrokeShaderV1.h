#pragma once

#include "shaders/ShaderProgram.h"
#include "shaders/StampUniforms.h"

namespace Qelt {

// Draws stamps of stroke render versions 1 and 2: a rim smoothed over one pixel.
// Render thread.
class Pencil2StrokeShaderV1 : public StampUniforms {
 public:
  // Throws InvalidArgumentException when a uniform has another type than its binding.
  Pencil2StrokeShaderV1() { link(); }

  // Makes the program and binds its uniforms, in place of those there were. Throws as the constructor does.
  void link();
  // False when the host could not make the program or bind a uniform, for instance for want of a GL context:
  // then nothing can be drawn, until `link` is called again.
  bool isLinked() const { return mLinked; }
  void activate() { mProgram.get()->activate(); }

  // GLSL ES 3.00, zero-terminated. Exported.
  __attribute__((visibility("default"))) static const char szVertexShader[];
  __attribute__((visibility("default"))) static const char szFragmentShader[];

 private:
  ShaderProgram mProgram;
  bool mLinked = false;
};

}  // namespace Qelt
