#include "shaders/Pencil2StrokeShaderV2.h"

namespace Qelt {

void Pencil2StrokeShaderV2::link() {
  mLinked = false;
  OpenGLShaderProgram* program = mProgram.make(szVertexShader, szFragmentShader);
  mLinked = program != nullptr && bind(program);
}

}  // namespace Qelt
