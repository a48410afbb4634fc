#include "shaders/Pencil2PreviewShader.h"

namespace Qelt {

Pencil2PreviewShader::Pencil2PreviewShader() : mProgram(szVertexShader, szFragmentShader) {
  bind(mProgram);
}

}  // namespace Qelt
