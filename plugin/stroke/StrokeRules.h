#pragma once

#include <cmath>
#include <cstdint>
#include <limits>

#include "log/Log.h"

// The formulas that turn pen input into stamps. Each is named after the stroke version that brought it; a
// version without a formula of its own uses an earlier one's, and so do the outlines and the preview: a
// formula's comment names them where they are not easily guessed. All arithmetic is single precision, in the
// order written: it decides what old documents look like.
namespace Qelt::rules {

// A count as a whole number. What does not fit saturates; NaN counts as 0.
inline int saturatedCount(float count) {
  if (!(count > -2147483648.0f)) return 0;
  if (count >= 2147483648.0f) return std::numeric_limits<int>::max();
  return static_cast<int>(count);
}

inline int incremented(int count) {
  return count == std::numeric_limits<int>::max() ? count : count + 1;
}

// --- Tilt (radians from upright, the mean of a history) to tilt blend, 0 to about 1 ---

inline float adjustTiltV1(float tilt) {
  if (!(tilt > 0.0f) || tilt < 0.75f) return 0.0f;
  // Kept: 0.08000004, six steps above the float nearest to 0.08.
  return (tilt - 0.75f) / 0x1.47ae2p-4f;
}

// Also of outline version 5 and of the preview.
inline float adjustTiltV5(float tilt) {
  if (!(tilt > 0.0f) || tilt < 0.05f) return 0.0f;
  return (tilt - 0.05f) / 1.9f;
}

// --- Pen size and tilt blend to stamp width, stroke units ---

inline float getPointSizeV1(float size, float blend) {
  return size * 3.5f * blend + size * (1.0f - 2.0f * blend);
}

// Also of outline version 5 and of the preview.
inline float getPointSizeV5(float size, float blend) {
  return size * 5.0f * blend + size;
}

// --- Pressure to alpha ---

// The colour's alpha byte as a factor. Kept: 0 and 1 count as 2, so that a transparent colour still draws
// faint stamps.
inline float getAlpha(std::uint32_t argb) {
  const std::uint32_t alpha = argb >> 24;
  return alpha < 2 ? 2.0f : static_cast<float>(alpha);
}

inline float clampedSquare(float pressure, float low, float high) {
  const float square = pressure * pressure;
  return square < low ? low : square > high ? high : square;
}

inline float getPressureAlphaV1(float pressure, float /*colorAlpha*/, float /*size*/) {
  return clampedSquare(pressure, 0.09f, 0.36f);
}

// Of versions 2 to 7, and of the preview.
inline float getPressureAlphaV2(float pressure, float colorAlpha, float /*size*/) {
  return clampedSquare(pressure, 0.16f, 0.64f) * (colorAlpha / 80.0f);
}

// Thin pens give denser stamps.
inline float getPressureAlphaV8(float pressure, float colorAlpha, float size) {
  return clampedSquare(pressure, 0.25f, 0.7f) * (colorAlpha / 80.0f) * 15.0f / size;
}

// --- Stamps on a segment (`length` and `size` in stroke units) ---

// Also of outline versions 1 and 2. 0 below a length of 1: such a segment is dropped.
inline int getRepeatV1(float length, float size) {
  if (length < 1.0f) return 0;
  const int count = saturatedCount(40.0f / size);
  if (length < 2.0f) return count > 1 ? count : 1;
  const int longer = saturatedCount(length * 0.25f + static_cast<float>(count));
  return longer > 1 ? longer : 1;
}

// Also of outline versions 3 to 5 and of the preview.
inline int getRepeatV3(float length, float size) {
  const int count = saturatedCount(8.0f / size * length);
  return count > 1 ? count : 1;
}

// Version 3's, but large counts are logged.
inline int getRepeatV4(float length, float size) {
  const int count = getRepeatV3(length, size);
  if (count > 10000) {
    __android_log_print(kLogError, kLogTag, "repeat %d drawLength %f curWidth %f", count,
                        static_cast<double>(length), static_cast<double>(size));
  }
  return count;
}

// --- From stamp to stamp, stroke units ---

inline float getRepeatDistanceV8(float /*size*/) {
  return 0.4f;
}
inline float getRepeatDistancePreview(float size) {
  return size * 0.08f;
}

// --- What a stamp is handed over with ---

// Rounding may carry a ramp below 0 when the pen size changes by powers of ten within a stroke.
inline float notNegative(float value) {
  return value > 0.0f ? value : 0.0f;
}

// Stamps up to 1 unit wide are drawn 1.3 units wide. Of versions 1 to 3 and 5; of outline versions 1 to 3.
inline float stampWidthV1(float width) {
  return width > 1.0f ? width : 1.3f;
}
// Of versions 4 and 7; of outline versions 4 and 5.
inline float stampWidthV4(float width) {
  return notNegative(width) + 1.0f;
}
// Also of the prediction.
inline float stampHalfWidthV8(float width) {
  return notNegative(width) * 0.5f;
}
// Kept: the preview's ramps may run past their targets, and so below 0. An alpha below 0 shows nothing; a
// stamp of negative width is as large as its amount, mirrored.
inline float stampWidthPreview(float width) {
  return width + 1.0f;
}

inline float stampAlphaV1(float alpha) {
  return notNegative(alpha);
}
inline float stampAlphaV8(float alpha) {
  return notNegative(alpha) / 6.0f;
}
inline float stampAlphaPreview(float alpha) {
  return alpha;
}
// Kept: twice as dense as the live stroke, before the prediction's opacity.
inline float stampAlphaPrediction(float alpha) {
  return alpha / 3.0f;
}

// How far a call's rectangle reaches from a stamp's centre. An outline's stamp reaches as far as a stroke's
// of the same width.
inline float stampReachV1(float width) {
  return stampWidthV1(width) / 2.0f;
}
inline float stampReachV4(float width) {
  return stampWidthV4(width) / 2.0f;
}
inline float stampReachPreview(float width) {
  return stampWidthPreview(width) / 2.0f;
}
// Also of the prediction. Kept: only half as far as the stamp. The growth of the rectangle at the end of a
// call makes up for it on moves and in redraws up to a width of 20 stroke units, on the closing segment up to
// 12, for a tap up to 10, and for a prediction only up to 4. Of wider stamps, what lies in a tile that the
// rectangle does not meet is missing.
inline float stampReachV8(float width) {
  return width / 4.0f;
}

// --- Ramps ---

// The change per step, over `steps` steps. Exactly 0 between equal values.
inline float getDp(float from, float to, int steps) {
  if (to == from) return 0.0f;
  const float step = std::fabs(to - from) / static_cast<float>(steps);
  return to < from ? -step : step;
}

// --- The screen ---

// Shorter side of the screen over 360; 1 without a screen.
inline float getPixelScale(int width, int height) {
  const auto shorter = static_cast<float>(width < height ? width : height);
  return shorter == 0.0f ? 1.0f : shorter / 360.0f;
}

// 1440 over the shorter side of the screen; `withoutScreen` when there is none.
inline float getSpeedScale(int width, int height, float withoutScreen) {
  const auto shorter = static_cast<float>(width < height ? width : height);
  return shorter == 0.0f ? withoutScreen : 1440.0f / shorter;
}

}  // namespace Qelt::rules
