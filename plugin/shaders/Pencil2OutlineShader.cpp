#include "shaders/Pencil2OutlineShader.h"

namespace Qelt {

void Pencil2OutlineShader::link() {
  mLinked = false;
  OpenGLShaderProgram* program = mProgram.make(szVertexShader, szFragmentShader);
  mLinked = program != nullptr && uProjectionMatrix.bind(program, "uProjectionMatrix") &&
            pointTexture.bind(program, "pointTexture") && uInputColor.bind(program, "uInputColor") &&
            outlineCase.bind(program, "outlineCase");
}

}  // namespace Qelt
