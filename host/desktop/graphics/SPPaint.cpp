#include "graphics/ISPCanvas.h"

namespace Qelt {

SPPaint::SPPaint() = default;
SPPaint::~SPPaint() = default;

void SPPaint::SetColor(unsigned int argb) {
  mColor = argb;
}

void SPPaint::SetStyle(int style) {
  mStyle = style;
}

void SPPaint::SetAntiAlias(bool on) {
  mAntiAlias = on;
}

unsigned int SPPaint::GetColor() const {
  return mColor;
}

bool SPPaint::IsAntiAlias() const {
  return mAntiAlias;
}

}  // namespace Qelt
