#pragma once

#include "shaders/ParameterBinding.h"
#include "shaders/ShaderProgram.h"

namespace Qelt {

// What every shader that draws stamps takes; named after the uniforms. Render thread.
class StampUniforms {
 public:
  ParameterBinding<kBindingMatrix4> projectionMatrix;  // stroke units to clip space
  ParameterBinding<kBindingInt> sampler0;              // grain
  ParameterBinding<kBindingInt> sampler1;              // stamp shapes
  ParameterBinding<kBindingVector4> inputColor;        // pen colour, 0 to 1; its alpha is not used
  ParameterBinding<kBindingVector2> grainOffset;       // window pixels
  ParameterBinding<kBindingFloat> numTilesOfPoints;
  ParameterBinding<kBindingFloat> textureHeight;  // of the grain, window pixels
  ParameterBinding<kBindingFloat> textureWidth;

 protected:
  StampUniforms() = default;

  // Binds in the order above. A program that the host could not make leaves all unbound.
  void bind(const ShaderProgram& program) {
    if (program.get() == nullptr) return;
    projectionMatrix.bind(program.get(), "ProjectionMatrix");
    sampler0.bind(program.get(), "sampler0");
    sampler1.bind(program.get(), "sampler1");
    inputColor.bind(program.get(), "inputColor");
    grainOffset.bind(program.get(), "grainOffset");
    numTilesOfPoints.bind(program.get(), "numTilesOfPoints");
    textureHeight.bind(program.get(), "textureHeight");
    textureWidth.bind(program.get(), "textureWidth");
  }
};

}  // namespace Qelt
