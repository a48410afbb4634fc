#pragma once

#include <new>
#include <type_traits>

#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "graphics/ISPPenCanvas.h"
#include "model/ObjectStroke.h"
#include "render/Posting.h"
#include "stroke/CacheLookup.h"
#include "stroke/Pencil2StrokeDrawableGL.h"
#include "stroke/StampPen.h"
#include "stroke/input/SampleSources.h"
#include "stroke/placing/ViewScale.h"

namespace Qelt {

// The stroke drawable of one version: has its stamp pen turn live events, recorded events and stored strokes
// into stamps, and hands these to the render thread, one batch per call. `Version` is a row of
// StrokeVersions.h. Main thread.
//
// Each call opens a return guard, under which the stamps are collected and whose end hands them over; a
// redraw of a stored stroke presents what the cache holds instead, where that still fits.
template <typename Version>
class StrokePipeline : public Pencil2StrokeDrawableGL {
  static constexpr bool kFollowsViewScale = Version::profile.followsViewScale;

 public:
  using Row = Version;
  using RenderDrawable = typename Version::RenderDrawable;

  StrokePipeline(Pencil2Data* penData, PenGLDataManager* manager)
      : Pencil2StrokeDrawableGL(penData, manager),
        mRenderDrawable(new (std::nothrow) RenderDrawable(manager)),
        mPen(penData, manager, mRenderDrawable) {
    setDrawableRT(mRenderDrawable);
  }

  ~StrokePipeline() override { destroy(); }

  // False when memory ran out for the render drawable.
  bool hasRenderDrawable() const { return mRenderDrawable != nullptr; }

  bool Draw(const MotionEvent* event, RectF* rect) override {
    if (!areGiven(event, rect) || !canDraw()) return false;
    mPen.beginCall();

    ReturnGuard guard(mRenderDrawable, mCanvas, mRenderDrawable->unclaimedBatch());
    passInverseScale();
    const bool result = mPen.draw(*event, rect);
    report(guard, *rect);
    return result;
  }

  using Pencil2StrokeDrawableGL::RedrawPen;

  bool RedrawPen(const MotionEvent* event, RectF* rect) override {
    mPen.takeSize();
    if (!areGiven(event, rect) || !canDraw()) return false;
    mPen.beginCall();
    postRedrawBegin();

    ReturnGuard guard(mRenderDrawable, mCanvas, mRenderDrawable->unclaimedBatch());
    passInverseScale();
    return redrawInto(guard, event, rect);
  }

  bool RedrawPen(const ObjectStroke* stroke, RectF* rect) override {
    if (!areGiven(stroke, rect) || !canDraw()) return false;
    mPen.beginCall();
    postRedrawBegin();

    CacheLookup cache(*stroke);
    if (fits(cache)) return presentCached(cache, *stroke, rect);
    cache.dropPoints();
    return redrawAndStore(cache, stroke, rect);
  }

 protected:
  bool redraw(const MotionEvent* event, RectF* rect) override {
    return replay(event, rect, Smoothing::Curve);
  }
  bool redraw(const ObjectStroke* stroke, RectF* rect) override {
    return replay(stroke, rect, Smoothing::Curve);
  }
  bool redrawPen_NoCurve(const MotionEvent* event, RectF* rect) override {
    return replay(event, rect, Smoothing::Straight);
  }
  bool redrawPen_NoCurve(const ObjectStroke* stroke, RectF* rect) override {
    return replay(stroke, rect, Smoothing::Straight);
  }

 private:
  using ReturnGuard = typename Version::ReturnGuard;

  template <typename Input>
  bool replay(const Input* input, RectF* rect, Smoothing smoothing) {
    return areGiven(input, rect) && mPen.replay(sourceOf(*input), rect, smoothing);
  }

  // Runs the replay that the curve option asks for and reports its rectangle.
  template <typename Input>
  bool redrawInto(ReturnGuard& guard, const Input* input, RectF* rect) {
    bool result;
    if (settings().smoothing() == Smoothing::Curve) {
      redraw(input, rect);
      mPen.extendRectByStrokeWidthGL(rect);
      result = true;  // Kept: whatever the replay returned; the straight one's result counts
    } else {
      result = redrawPen_NoCurve(input, rect);
    }
    report(guard, *rect);
    return result;
  }

  bool fits(const CacheLookup& cache) {
    if constexpr (kFollowsViewScale) {
      const Vector2<float> inverseScale = mViewScale.inverse(mCanvas->GetMatrix());
      return cache.fits(&inverseScale);
    } else {
      return cache.fits(nullptr);
    }
  }

  bool presentCached(CacheLookup& cache, const ObjectStroke& stroke, RectF* rect) {
    const StrokeSource source(stroke);
    const int first = firstUsablePoint(source);
    postStartPoint(queue(), mRenderDrawable, first < 0 ? PointF{} : source.point(first));
    *rect = cache.rect();
    UnclaimedBatch* unclaimed = mRenderDrawable->unclaimedBatch();
    const bool handedOver =
        typename Version::CacheGuard(mRenderDrawable, mCanvas, unclaimed).present(cache.buffer(), *rect);
    // The render thread drops the reference when it is done with the buffer.
    RefCount* points = cache.takePoints();
    if (!post(queue(), points, &RefCount::Unref)) {
      if (handedOver) {
        unclaimed->keep(points);
      } else {
        points->Unref();
      }
    }
    cache.postRelease(queue());
    return true;
  }

  // Kept: on the curve path the use of the entry always ends, after the batch; on the straight path it ends
  // before the batch, and only where there is an entry.
  bool redrawAndStore(CacheLookup& cache, const ObjectStroke* stroke, RectF* rect) {
    const bool curve = settings().smoothing() == Smoothing::Curve;
    bool result;
    {
      mPen.takeSize();
      ReturnGuard guard(mRenderDrawable, mCanvas, mRenderDrawable->unclaimedBatch());
      passInverseScale();
      result = redrawInto(guard, stroke, rect);
      cache.store(*rect, guard.buffer());
      if (!curve && cache.hasEntry()) cache.postRelease(queue());
    }
    if (curve) cache.postRelease(queue());
    return result;
  }

  // Passes the call's rectangle, stroke units, to the guard, which has the batch drawn into the tiles that it
  // meets, and to the render drawable.
  void report(ReturnGuard& guard, const RectF& rect) {
    guard.setRect(rect);
    postRect(queue(), mRenderDrawable, rect);
  }

  void postRedrawBegin() {
    postRedrawState(queue(), mRenderDrawable);
    postPenData(queue(), mRenderDrawable, getSize(), settings().color());
  }

  // Tells how many stroke units a device pixel takes under the canvas's transform.
  void passInverseScale() {
    if constexpr (kFollowsViewScale)
      mRenderDrawable->SetInverseScale(mViewScale.inverse(mCanvas->GetMatrix()));
  }

  bool canDraw() const { return mRenderDrawable != nullptr && mCanvas != nullptr && settings().exist(); }
  IGLMsgQueue* queue() const { return queueOf(mDataManager); }

  struct NoViewScale {};

  RenderDrawable* mRenderDrawable;  // owned by the host's base; null when its allocation failed
  StampPen<Version> mPen;
  [[no_unique_address]] std::conditional_t<kFollowsViewScale, ViewScale, NoViewScale> mViewScale;
};

}  // namespace Qelt
