#include "desktop/graphics/PenCanvas.h"

#include <cmath>

#include "base/Vector.h"
#include "desktop/graphics/CanvasLayer.h"
#include "pencommon/PenStrokeDataManager.h"

namespace Qelt {

ISPPenCanvas::~ISPPenCanvas() = default;

}  // namespace Qelt

namespace QeltDesktop {

namespace {

float inverseLength(const float* column) {
  return 1.0f / std::sqrt(column[0] * column[0] + column[1] * column[1] + column[2] * column[2]);
}

}  // namespace

PenCanvas::PenCanvas(Qelt::IGLMsgQueue* queue, CanvasLayer* layer) : mQueue(queue), mLayer(layer) {}

PenCanvas::~PenCanvas() = default;

void PenCanvas::setMatrix(const Qelt::Matrix3<float>& matrix) {
  mMatrix = matrix;
  const float* const elements = mMatrix.data();
  mInverseScale = {inverseLength(elements), inverseLength(elements + 3)};
}

Qelt::IGLMsgQueue* PenCanvas::GetMsgQueue() {
  return mQueue;
}

// A pen asks when it draws. Whichever canvas was asked last is the one that the drawings stored from here on
// were computed for.
const Qelt::Matrix3<float>& PenCanvas::GetMatrix() {
  Qelt::PenStrokeDataManager::GetInstance()->SetInverseScale(mInverseScale);
  return mMatrix;
}

Qelt::ISPLayer* PenCanvas::GetLayer() {
  return mLayer;
}

void PenCanvas::BeginTile(int) {}

void PenCanvas::EndTile(int) {}

}  // namespace QeltDesktop
