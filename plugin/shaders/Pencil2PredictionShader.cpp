#include "shaders/Pencil2PredictionShader.h"

namespace Qelt {

void Pencil2PredictionShader::link() {
  mLinked = false;
  OpenGLShaderProgram* program = mProgram.make(szVertexShader, szFragmentShader);
  mLinked = program != nullptr && bind(program) && inputOpacity.bind(program, "inputOpacity");
}

}  // namespace Qelt
