#pragma once

#include "shaders/ParameterBinding.h"
#include "shaders/ShaderProgram.h"

namespace Qelt {

// Draws both passes of an outline; its bindings are named after the uniforms. Render thread.
class Pencil2OutlineShader {
 public:
  // Throws InvalidArgumentException when a uniform has another type than its binding.
  Pencil2OutlineShader() { link(); }

  // Makes the program and binds its uniforms, in place of those there were. Throws as the constructor does.
  void link();
  // False when the host could not make the program or bind a uniform, for instance for want of a GL context:
  // then nothing can be drawn, until `link` is called again.
  bool isLinked() const { return mLinked; }
  void activate() { mProgram.get()->activate(); }

  ParameterBinding<kBindingMatrix4> uProjectionMatrix;  // stroke units to clip space
  ParameterBinding<kBindingInt> pointTexture;
  ParameterBinding<kBindingVector4> uInputColor;  // 0 to 1; its alpha is not used
  ParameterBinding<kBindingFloat> outlineCase;    // 0 the pass in colour, 1 the erasing one

  // GLSL ES 3.00, zero-terminated. Exported.
  __attribute__((visibility("default"))) static const char szVertexShader[];
  __attribute__((visibility("default"))) static const char szFragmentShader[];

 private:
  ShaderProgram mProgram;
  bool mLinked = false;
};

}  // namespace Qelt
