#pragma once

#include "gl/GraphicsFactory.h"
#include "shaders/ParameterBinding.h"

// The shaders of the pencil. Everything here is for the render thread.
namespace Qelt {

// What every shader that draws stamps takes. The bindings are named after the uniforms.
struct StampUniforms {
  ParameterBinding<kBindingMatrix4> projectionMatrix;  // stroke units to clip space
  ParameterBinding<kBindingInt> sampler0;              // texture unit of the grain
  ParameterBinding<kBindingInt> sampler1;              // texture unit of the stamp shapes
  ParameterBinding<kBindingVector4> inputColor;        // pen colour, 0 to 1; its alpha is not used
  ParameterBinding<kBindingVector2> grainOffset;       // window pixels
  ParameterBinding<kBindingFloat> numTilesOfPoints;
  ParameterBinding<kBindingFloat> textureHeight;  // of the grain, window pixels
  ParameterBinding<kBindingFloat> textureWidth;

  // Binds in the order above, up to the first that the host has no interface to; true if it bound all.
  bool bind(OpenGLShaderProgram* program) {
    return projectionMatrix.bind(program, "ProjectionMatrix") && sampler0.bind(program, "sampler0") &&
           sampler1.bind(program, "sampler1") && inputColor.bind(program, "inputColor") &&
           grainOffset.bind(program, "grainOffset") && numTilesOfPoints.bind(program, "numTilesOfPoints") &&
           textureHeight.bind(program, "textureHeight") && textureWidth.bind(program, "textureWidth");
  }
};

struct PredictionUniforms : StampUniforms {
  ParameterBinding<kBindingFloat> inputOpacity;  // 0 to 1

  bool bind(OpenGLShaderProgram* program) {
    return StampUniforms::bind(program) && inputOpacity.bind(program, "inputOpacity");
  }
};

struct OutlineUniforms {
  ParameterBinding<kBindingMatrix4> uProjectionMatrix;  // stroke units to clip space
  ParameterBinding<kBindingInt> pointTexture;           // its texture unit
  ParameterBinding<kBindingVector4> uInputColor;        // 0 to 1; its alpha is not used
  ParameterBinding<kBindingFloat> outlineCase;          // 0 the pass in colour, 1 the erasing one

  bool bind(OpenGLShaderProgram* program) {
    return uProjectionMatrix.bind(program, "uProjectionMatrix") &&
           pointTexture.bind(program, "pointTexture") && uInputColor.bind(program, "uInputColor") &&
           outlineCase.bind(program, "outlineCase");
  }
};

// A program with its uniforms, made from the two sources of `Shader`, which derives from it. Render drawables
// share one per class by way of the registry (ShaderRegistry.h).
template <typename Shader, typename Uniforms>
class PencilShader : public Uniforms {
 public:
  // Links. Throws InvalidArgumentException if a uniform has another type than its binding.
  PencilShader() { link(); }

  // Makes the program and binds its uniforms, in place of those there were. Throws as the constructor does.
  void link() {
    mLinked = false;
    giveBack(mProgram);
    mProgram.reset(GraphicsFactory::createOpenGLShaderProgram(Shader::szVertexShader,
                                                              Shader::szFragmentShader, nullptr));
    mLinked = mProgram != nullptr && Uniforms::bind(mProgram.get());
  }
  // False if the host could not make the program or bind a uniform, for instance for want of a GL context.
  // Nothing can be drawn then, until `link` is called again.
  bool isLinked() const { return mLinked; }
  // Only if linked.
  void activate() { mProgram->activate(); }

 private:
  HostOwned<OpenGLShaderProgram> mProgram;  // given back ahead of the uniforms
  bool mLinked = false;
};

// The sources are GLSL ES 3.00, zero-terminated and exported. They come from glsl/, and plugin/CMakeLists.txt
// says which class has which; two vertex shaders serve two classes each.

// For RTV1 and RTV2: a rim smoothed over one pixel.
class Pencil2StrokeShaderV1 : public PencilShader<Pencil2StrokeShaderV1, StampUniforms> {
 public:
  __attribute__((visibility("default"))) static const char szVertexShader[];
  __attribute__((visibility("default"))) static const char szFragmentShader[];
};

// For RTV3: the rim's fade and the dimming of thin stamps come with the vertices.
class Pencil2StrokeShaderV2 : public PencilShader<Pencil2StrokeShaderV2, StampUniforms> {
 public:
  __attribute__((visibility("default"))) static const char szVertexShader[];
  __attribute__((visibility("default"))) static const char szFragmentShader[];
};

// The preview: as Pencil2StrokeShaderV1, with the grain's width and height swapped.
class Pencil2PreviewShader : public PencilShader<Pencil2PreviewShader, StampUniforms> {
 public:
  __attribute__((visibility("default"))) static const char szVertexShader[];
  __attribute__((visibility("default"))) static const char szFragmentShader[];
};

// The prediction: as Pencil2StrokeShaderV2, with an overall opacity.
class Pencil2PredictionShader : public PencilShader<Pencil2PredictionShader, PredictionUniforms> {
 public:
  __attribute__((visibility("default"))) static const char szVertexShader[];
  __attribute__((visibility("default"))) static const char szFragmentShader[];
};

// Both passes of an outline.
class Pencil2OutlineShader : public PencilShader<Pencil2OutlineShader, OutlineUniforms> {
 public:
  __attribute__((visibility("default"))) static const char szVertexShader[];
  __attribute__((visibility("default"))) static const char szFragmentShader[];
};

}  // namespace Qelt
