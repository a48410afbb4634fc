#include "shaders/Pencil2StrokeShaderV1.h"

namespace Qelt {

void Pencil2StrokeShaderV1::link() {
  mLinked = false;
  OpenGLShaderProgram* program = mProgram.make(szVertexShader, szFragmentShader);
  mLinked = program != nullptr && bind(program);
}

}  // namespace Qelt
