#pragma once

#include "shaders/ShaderProgram.h"
#include "shaders/StampUniforms.h"

namespace Qelt {

// Draws the preview's stamps: version 1 of the stroke shaders but for the grain's axes.
// Render thread.
class Pencil2PreviewShader : public StampUniforms {
 public:
  // Throws InvalidArgumentException when a uniform has another type than its binding.
  Pencil2PreviewShader();

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
