#pragma once

#include <new>

#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "math/FloatRange.h"
#include "model/ObjectStroke.h"
#include "outline/Pencil2OutlineDrawableGL.h"
#include "render/Posting.h"
#include "stroke/StampPen.h"
#include "stroke/input/SampleSources.h"

namespace Qelt {

// The outline drawable of one version: has its stamp pen turn a whole stroke, recorded or stored, into stamps
// of two streams, and hands these to the render thread. `Version` is a row of OutlineVersions.h. Main thread.
template <typename Version>
class OutlinePipeline : public Pencil2OutlineDrawableGL {
 public:
  using Row = Version;
  using RenderDrawable = typename Version::RenderDrawable;

  OutlinePipeline(Pencil2Data* penData, PenGLDataManager* manager)
      : Pencil2OutlineDrawableGL(penData, manager),
        mRenderDrawable(new (std::nothrow) RenderDrawable(manager)),
        mPen(penData, manager, mRenderDrawable) {
    setDrawableRT(mRenderDrawable);
  }

  ~OutlinePipeline() override { destroy(); }

  // False when memory ran out for the render drawable.
  bool hasRenderDrawable() const { return mRenderDrawable != nullptr; }

  bool DrawOutline(const MotionEvent* event, RectF* rect) override { return drawOutline(event, rect); }
  bool DrawOutline(const ObjectStroke* stroke, RectF* rect) override { return drawOutline(stroke, rect); }

 private:
  template <typename Input>
  bool drawOutline(const Input* input, RectF* rect) {
    mPen.takeSize();
    if (!areGiven(input, rect)) return false;
    if (mRenderDrawable == nullptr || mCanvas == nullptr || !settings().exist()) return false;
    mPen.beginCall();

    // Kept: set at once, not posted; an outline that still waits is drawn in this colour too.
    mRenderDrawable->SetOutlineColor(static_cast<unsigned int>(GetOutlineColor()));
    const float outlineSize = usableOutlineSize();
    mRenderDrawable->SetOutlineSize(outlineSize);
    typename Version::ReturnGuard guard(mRenderDrawable, mCanvas, mRenderDrawable->unclaimedBatch());
    const Smoothing smoothing = settings().smoothing();
    const bool replayed = mPen.replay(sourceOf(*input), rect, smoothing);
    rect->IncreaseRect(outlineSize);
    guard.setRect(*rect);
    postRect(queueOf(mDataManager), mRenderDrawable, *rect);
    // Kept: true on curves, whatever the replay returned; the straight one's result counts.
    return smoothing == Smoothing::Curve || replayed;
  }

  // A size that does not fit into a vertex counts as 0.
  float usableOutlineSize() {
    const float size = GetOutlineSize();
    return isUsableCoordinate(size) ? size : 0.0f;
  }

  RenderDrawable* mRenderDrawable;  // owned by the host's base; null when its allocation failed
  StampPen<Version> mPen;
};

}  // namespace Qelt
