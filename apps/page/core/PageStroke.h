#pragma once

#include <cstddef>
#include <cstdint>
#include <list>
#include <memory>
#include <span>
#include <vector>

#include "base/RectF.h"
#include "core/PageTypes.h"
#include "ink/Samples.h"
#include "model/ObjectStroke.h"
#include "play/StrokeFeeder.h"

namespace QeltDesktop {

// A stored stroke of a page, its samples packed: 28 bytes each. Main thread.
class PageStroke final : public Qelt::ObjectStroke {
 public:
  // At least one sample, all of them finite. Throws std::bad_alloc.
  PageStroke(StrokeId id, const PageStyle& style, std::span<const Sample> samples);
  ~PageStroke() override;

  StrokeId id() const { return mId; }
  const PageStyle& style() const { return mStyle; }
  std::size_t size() const { return mSize; }
  Sample sample(std::size_t index) const;
  std::vector<Sample> samples() const;
  // Of the samples alone, stroke units.
  const Qelt::RectF& line() const { return mLine; }
  // Whether an outline of the stroke ends with the same width, whatever the one before it ended with.
  bool settlesOutline() const { return mSettlesOutline; }

  // The bytes of its cached drawing.
  std::size_t cachedBytes() const { return mCachedBytes; }

  bool isShown = true;

  int GetPointCount() const override;
  const Qelt::PointF* GetPoint() const override;
  // Valid until another stroke is asked.
  const std::int64_t* GetTimeStamp() const override;
  const float* GetPressure() const override;
  const float* GetTilt() const override;
  const float* GetOrientation() const override;
  int GetToolType() const override;

 private:
  friend class StrokeCache;

  StrokeId mId;
  PageStyle mStyle;
  std::size_t mSize;
  std::unique_ptr<Qelt::PointF[]> mPoints;
  std::unique_ptr<float[]> mAttitudes;  // all pressures, then all tilts, then all orientations
  std::unique_ptr<double[]> mTimes;     // milliseconds
  Qelt::RectF mLine;
  bool mSettlesOutline = false;

  // Of the cached drawing.
  bool mIsCached = false;
  float mCachedZoom = 0.0f;
  std::size_t mCachedBytes = 0;
  std::list<PageStroke*>::iterator mCachePlace;
};

// How a stroke's events name what draws.
Pointer pointerOf(const PageStyle& style);

// How far the drawing of a stroke reaches from its line, stroke units; it is never more. The smoothed rim
// adds half a pixel.
float reachOf(const PageStyle& style);

// Throws Refusal when the style is none that a page draws.
void checkStyle(const PageStyle& style);

// Whether a sample is finite and near enough.
bool isUsable(const Sample& sample);

// A sample as live input has it: pressure from 0 to 1, tilt from 0 to a quarter turn, its time not before
// `earliest`.
Sample inRange(Sample sample, double earliest);

}  // namespace QeltDesktop
