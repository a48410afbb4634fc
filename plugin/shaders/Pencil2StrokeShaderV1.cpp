#include "shaders/Pencil2StrokeShaderV1.h"

namespace Qelt {

Pencil2StrokeShaderV1::Pencil2StrokeShaderV1() : mProgram(szVertexShader, szFragmentShader) {
  bind(mProgram);
}

}  // namespace Qelt
