#include "shaders/Pencil2StrokeShaderV2.h"

namespace Qelt {

Pencil2StrokeShaderV2::Pencil2StrokeShaderV2() : mProgram(szVertexShader, szFragmentShader) {
  bind(mProgram);
}

}  // namespace Qelt
