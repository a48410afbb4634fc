#include "shaders/Pencil2OutlineShader.h"

namespace Qelt {

Pencil2OutlineShader::Pencil2OutlineShader() : mProgram(szVertexShader, szFragmentShader) {
  if (mProgram.get() == nullptr) return;
  uProjectionMatrix.bind(mProgram.get(), "uProjectionMatrix");
  pointTexture.bind(mProgram.get(), "pointTexture");
  uInputColor.bind(mProgram.get(), "uInputColor");
  outlineCase.bind(mProgram.get(), "outlineCase");
}

}  // namespace Qelt
