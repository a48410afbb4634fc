#include "shaders/Pencil2PreviewShader.h"

namespace Qelt {

void Pencil2PreviewShader::link() {
  mLinked = false;
  OpenGLShaderProgram* program = mProgram.make(szVertexShader, szFragmentShader);
  mLinked = program != nullptr && bind(program);
}

}  // namespace Qelt
