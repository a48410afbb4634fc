#pragma once

#include "pencommon/PenPreviewDrawableGL.h"
#include "preview/PreviewVersions.h"
#include "stroke/parts/LiveInput.h"
#include "stroke/parts/MoveFilter.h"
#include "stroke/parts/PatternShift.h"
#include "stroke/parts/PenAttitude.h"
#include "stroke/parts/PenSample.h"
#include "stroke/parts/PenSettings.h"
#include "stroke/parts/Replay.h"
#include "stroke/parts/SampleCleaner.h"
#include "stroke/parts/SegmentPath.h"
#include "stroke/parts/StampCounter.h"
#include "stroke/parts/StampLimits.h"
#include "stroke/parts/StampRun.h"
#include "stroke/parts/StrokeState.h"

namespace Qelt {

struct Pencil2Data;

// Draws the sample stroke of a settings panel: live, while somebody drags in the panel, or a whole stroke
// that one event carries as its history. Takes the road of the stroke drawables with the numbers of its own
// row. Main thread.
class Pencil2PreviewDrawableGL final : public PenPreviewDrawableGL {
 public:
  Pencil2PreviewDrawableGL(Pencil2Data* penData, PenGLDataManager* manager);
  ~Pencil2PreviewDrawableGL() override;

  // False when memory ran out for the render-thread half.
  bool hasPartner() const { return mRender != nullptr; }

  bool Draw(const MotionEvent* event, RectF* rect) override;
  bool RedrawPen(const MotionEvent* event, RectF* rect) override;
  // Does nothing and answers true.
  bool RedrawPen(const List* list, RectF* rect) override;

 private:
  using Version = PreviewVersion;
  using RenderDrawable = Version::RenderDrawable;
  using Run = StampRun<Version>;

  template <typename Source, typename Pen>
  friend bool replay(Source, Pen&, RectF*, Smoothing, float);
  template <typename Pen>
  friend bool drawLive(const MotionEvent&, Pen&, StrokeState&, RectF*, Smoothing, float);

  // What live input and replay ask for.
  SampleCleaner cleaner() const;
  const SegmentPath& path() const { return mPath; }
  void beginLive(const PenSample& start, bool coarseTool, Smoothing smoothing);
  void beginMove(const MotionEvent& event);
  void restartMoves(bool coarseTool);
  void beginReplay(const PenSample& start, Smoothing smoothing);
  void forgetAlpha();
  bool drawLine(const PenSample& sample, RectF* rect, Smoothing smoothing);
  bool endPen(const MotionEvent& event, RectF* rect, Smoothing smoothing);

  bool canDraw() const;
  // Takes the numbers that follow the pen size.
  void takeSize();
  void begin(const PenSample& start);
  void beginWidth(float size);
  // Logs `message` and answers false without a spacing to walk at.
  bool hasSpacing(const char* message) const;
  bool placeSegment(float length, float pressure, RectF* rect, Smoothing smoothing);
  void placeTap(float pressure, RectF* rect);
  PenSettings settings() const { return PenSettings(mPenData); }

  Pencil2Data* mPenData;    // the pen's; may be null when its allocation failed
  RenderDrawable* mRender;  // owned by the host's base; null when its allocation failed
  SegmentPath mPath;
  MoveFilter mMoves;
  PenAttitude<Version::tiltWindow, Version::orientationWindow> mAttitude;
  StrokeState mState;
  StampCounter mStamps;
  PatternShift mPatternShift;
  StampLimits mLimits;
  bool mFirstSegment = true;     // no segment since the pen went down
  float mRepeatDistance = 1.0f;  // between stamps on curves, stroke units
  float mCarried = 0.0f;         // where the next stamp lies on the next curve
  float mWidth = 0.0f;           // reached at the end of the last segment
  float mAlpha = -1.0f;          // likewise; below 0: none yet
};

}  // namespace Qelt
