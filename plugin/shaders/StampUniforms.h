#pragma once

#include "shaders/ParameterBinding.h"

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

  // Binds in the order above, up to the first that the host has no interface to; true when it bound all.
  bool bind(OpenGLShaderProgram* program) {
    return projectionMatrix.bind(program, "ProjectionMatrix") && sampler0.bind(program, "sampler0") &&
           sampler1.bind(program, "sampler1") && inputColor.bind(program, "inputColor") &&
           grainOffset.bind(program, "grainOffset") && numTilesOfPoints.bind(program, "numTilesOfPoints") &&
           textureHeight.bind(program, "textureHeight") && textureWidth.bind(program, "textureWidth");
  }
};

}  // namespace Qelt
