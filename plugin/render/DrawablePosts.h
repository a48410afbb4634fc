#pragma once

#include <cstdint>

#include "base/PointF.h"
#include "base/RectF.h"
#include "pencommon/PenDrawableRT.h"
#include "pencommon/PenGLDataManager.h"
#include "render/Posting.h"

// What main-thread drawables have their render-thread partners told. Without a queue nothing is. Main thread,
// but for `queueOf`.
namespace Qelt {

// Either thread.
inline IGLMsgQueue* queueOf(PenGLDataManager* manager) {
  return manager != nullptr ? manager->GetMsgQueue() : nullptr;
}

// The point that a stroke's grain is fixed to, stroke units.
template <typename RenderDrawable>
void postStartPoint(IGLMsgQueue* queue, RenderDrawable* drawable, PointF at) {
  post(queue, drawable, &RenderDrawable::SetStartPoint, at.x, at.y);
}

inline void postPenData(IGLMsgQueue* queue, PenDrawableRT* drawable, float size, std::uint32_t argb) {
  post(queue, drawable, &PenDrawableRT::SetPenData, size, static_cast<int>(argb));
}

// A whole stroke is about to be drawn again.
inline void postRedrawState(IGLMsgQueue* queue, PenDrawableRT* drawable) {
  post(queue, drawable, &PenDrawableRT::SetRedrawState, true);
}

// The area that a call changed, to whole units.
inline void postRect(IGLMsgQueue* queue, PenDrawableRT* drawable, RectF rect) {
  rect.ExtendRect();
  post(queue, drawable, &PenDrawableRT::SetRect, rect);
}

}  // namespace Qelt
