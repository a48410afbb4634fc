#include "shaders/Pencil2PredictionShader.h"

namespace Qelt {

Pencil2PredictionShader::Pencil2PredictionShader() : mProgram(szVertexShader, szFragmentShader) {
  bind(mProgram);
  if (mProgram.get() != nullptr) inputOpacity.bind(mProgram.get(), "inputOpacity");
}

}  // namespace Qelt
