#pragma once

#include "shaders/ShaderProgram.h"
#include "shaders/StampUniforms.h"

namespace Qelt {

// Draws stamps of stroke render versions 1 and 2: a rim smoothed over one pixel.
// Render thread.
class Pencil2StrokeShaderV1 : public StampUniforms {
 public:
  // Throws InvalidArgumentException when a uniform has another type than its binding.
  Pencil2StrokeShaderV1();

  // False when the host could not make the program; nothing can be drawn then.
  bool isLinked() const { return mProgram.get() != nullptr; }
  void activate() { mProgram.get()->activate(); }

  // GLSL ES 3.00, zero-terminated. Exported.
  __attribute__((visibility("default"))) static const char szVertexShader[];
  __attribute__((visibility("default"))) static const char szFragmentShader[];

 private:
  ShaderProgram mProgram;
};

}  // namespace Qelt
