#pragma once

#include "shaders/ParameterBinding.h"
#include "shaders/ShaderProgram.h"
#include "shaders/StampUniforms.h"

namespace Qelt {

// Draws the prediction's stamps: version 2 of the stroke shaders with an overall opacity. Render thread.
class Pencil2PredictionShader : public StampUniforms {
 public:
  // Throws InvalidArgumentException when a uniform has another type than its binding.
  Pencil2PredictionShader() { link(); }

  // Makes the program and binds its uniforms, in place of those there were. Throws as the constructor does.
  void link();
  // False when the host could not make the program or bind a uniform, for instance for want of a GL context:
  // then nothing can be drawn, until `link` is called again.
  bool isLinked() const { return mLinked; }
  void activate() { mProgram.get()->activate(); }

  ParameterBinding<kBindingFloat> inputOpacity;  // 0 to 1; bound after the others

  // GLSL ES 3.00, zero-terminated. Exported.
  __attribute__((visibility("default"))) static const char szVertexShader[];
  __attribute__((visibility("default"))) static const char szFragmentShader[];

 private:
  ShaderProgram mProgram;
  bool mLinked = false;
};

}  // namespace Qelt
