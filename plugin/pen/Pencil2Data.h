#pragma once

#include <cstdint>

namespace Qelt {

struct PenSettingData;

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
  float mLastAlpha;                // alpha of the last stamp before its version's divisor; -1: no stamp yet
  float mLastOrientation;          // mean pen orientation, radians
  std::int32_t mStampCount;        // stamps placed in the stroke
  float mTiltBlend;                // 0 to about 1
  bool mHasLastStroke;             // something new since the last prediction
};

}  // namespace Qelt
