#pragma once

#include <cstddef>
#include <cstdint>

#include "pencommon/PenSettingData.h"

namespace Qelt {

// The record that a pen shares with all its drawables. The pen owns it; drawables read the settings live and
// never free it. Main thread. A plain record of fixed layout, zeroed before it is filled.
struct Pencil2Data {
  // The host's settings: pen size and colour lead it. Borrowed from the pen's base.
  PenSettingData* mSettingData;
  bool mCurveEnabled;       // smooth segments; read at each event
  bool mFixedWidthEnabled;  // stored and reported only
  float mFixedWidth;        // stored and reported only

  // What the last curved stroke of versions 4, 7 and 8 left, for the prediction to continue from. Positions
  // and widths in stroke units.
  float mStartX, mStartY;          // first point of the stroke
  float mLastWidth;                // width reached at the end of the last segment
  float mLastStampX, mLastStampY;  // last stamp placed
  float mLastX, mLastY;            // last input point taken in
  // Alpha that the ramp had at the last stamp, before the row's stampAlpha; -1: no stamp yet.
  float mLastAlpha;
  float mLastOrientation;    // mean pen orientation, radians
  std::int32_t mStampCount;  // stamps placed in the stroke
  float mTiltBlend;          // 0 to about 1
  bool mHasLastStroke;       // something new since the last prediction
};

// The layouts are promised: of the record all of it, of the host's settings the two fields that lead them.
static_assert(offsetof(PenSettingData, size) == 0 && offsetof(PenSettingData, color) == 4);
static_assert(offsetof(Pencil2Data, mSettingData) == 0 &&
              offsetof(Pencil2Data, mCurveEnabled) == sizeof(void*));
static_assert(offsetof(Pencil2Data, mFixedWidthEnabled) == sizeof(void*) + 1 &&
              offsetof(Pencil2Data, mFixedWidth) == sizeof(void*) + 4);
static_assert(offsetof(Pencil2Data, mStartX) == sizeof(void*) + 8 &&
              offsetof(Pencil2Data, mStartY) == sizeof(void*) + 12 &&
              offsetof(Pencil2Data, mLastWidth) == sizeof(void*) + 16 &&
              offsetof(Pencil2Data, mLastStampX) == sizeof(void*) + 20 &&
              offsetof(Pencil2Data, mLastStampY) == sizeof(void*) + 24 &&
              offsetof(Pencil2Data, mLastX) == sizeof(void*) + 28 &&
              offsetof(Pencil2Data, mLastY) == sizeof(void*) + 32 &&
              offsetof(Pencil2Data, mLastAlpha) == sizeof(void*) + 36 &&
              offsetof(Pencil2Data, mLastOrientation) == sizeof(void*) + 40 &&
              offsetof(Pencil2Data, mStampCount) == sizeof(void*) + 44 &&
              offsetof(Pencil2Data, mTiltBlend) == sizeof(void*) + 48 &&
              offsetof(Pencil2Data, mHasLastStroke) == sizeof(void*) + 52);

}  // namespace Qelt
