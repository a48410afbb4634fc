#pragma once

#include <cmath>
#include <cstdint>
#include <limits>

// The formulas that turn pen input into stamps. Each is named after the version that brought it; a version
// without a formula of its own uses an earlier one's. All arithmetic is single precision, in the order
// written: it decides what old documents look like.
namespace Qelt::rules {

// A count as a whole number; what does not fit saturates, what is no number counts 0.
inline int saturatedCount(float count) {
  if (!(count > -2147483648.0f)) return 0;
  if (count >= 2147483648.0f) return std::numeric_limits<int>::max();
  return static_cast<int>(count);
}

inline int incremented(int count) {
  return count == std::numeric_limits<int>::max() ? count : count + 1;
}

// --- Tilt (radians from upright, mean of a history) to tilt blend, 0 to about 1 ---

inline float tiltBlendV1(float tilt) {
  if (!(tilt > 0.0f) || tilt < 0.75f) return 0.0f;
  // Kept: 0.08000004, six steps above the float nearest to 0.08.
  return (tilt - 0.75f) / 0x1.47ae2p-4f;
}

inline float tiltBlendV5(float tilt) {
  if (!(tilt > 0.0f) || tilt < 0.05f) return 0.0f;
  return (tilt - 0.05f) / 1.9f;
}

// --- Pen size and tilt blend to stamp width, stroke units ---

inline float pointSizeV1(float size, float blend) {
  return size * 3.5f * blend + size * (1.0f - 2.0f * blend);
}

inline float pointSizeV5(float size, float blend) {
  return size * 5.0f * blend + size;
}

// --- Pressure to alpha ---

// The colour's alpha byte as a factor. Kept: 0 and 1 count as 2, so that a transparent colour still draws
// faint stamps.
inline float colorAlpha(std::uint32_t argb) {
  const std::uint32_t alpha = argb >> 24;
  return alpha < 2 ? 2.0f : static_cast<float>(alpha);
}

inline float clampedSquare(float pressure, float low, float high) {
  const float square = pressure * pressure;
  return square < low ? low : square > high ? high : square;
}

inline float pressureAlphaV1(float pressure, float /*colorAlpha*/, float /*size*/) {
  return clampedSquare(pressure, 0.09f, 0.36f);
}

inline float pressureAlphaV2(float pressure, float colorAlpha, float /*size*/) {
  return clampedSquare(pressure, 0.16f, 0.64f) * (colorAlpha / 80.0f);
}

// Thin pens give denser stamps.
inline float pressureAlphaV8(float pressure, float colorAlpha, float size) {
  return clampedSquare(pressure, 0.25f, 0.7f) * (colorAlpha / 80.0f) * 15.0f / size;
}

// --- Stamps on a segment (`length` and `size` in stroke units) ---

// 0 below a length of 1: such a segment is dropped.
inline int stampCountV1(float length, float size) {
  if (length < 1.0f) return 0;
  const int count = saturatedCount(40.0f / size);
  if (length < 2.0f) return count > 1 ? count : 1;
  const int longer = saturatedCount(length * 0.25f + static_cast<float>(count));
  return longer > 1 ? longer : 1;
}

inline int stampCountV3(float length, float size) {
  const int count = saturatedCount(8.0f / size * length);
  return count > 1 ? count : 1;
}

// --- What a stamp is handed over with ---

// When the pen size changes by powers of ten within a stroke, rounding may carry a ramp below 0.
inline float notNegative(float value) {
  return value > 0.0f ? value : 0.0f;
}

// Stamps up to 1 unit wide are drawn 1.3 wide.
inline float stampWidthV1(float width) {
  return width > 1.0f ? width : 1.3f;
}
inline float stampWidthV4(float width) {
  return notNegative(width) + 1.0f;
}
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

// How far the dirty rectangle reaches from a stamp's centre.
inline float stampReachV1(float width) {
  return stampWidthV1(width) / 2.0f;
}
inline float stampReachV4(float width) {
  return stampWidthV4(width) / 2.0f;
}
inline float stampReachPreview(float width) {
  return stampWidthPreview(width) / 2.0f;
}
// Kept: half as far as the stamp. What the rectangle grows by at the end of a call makes up for it on moves
// and in redraws up to a width of 20 stroke units, on the closing segment up to 12, for a tap up to 10 and
// for a prediction only up to 4. What wider stamps lay into a tile that the rectangle does not meet is
// missing.
inline float stampReachV8(float width) {
  return width / 4.0f;
}

// --- Ramps ---

// The change a step, over `steps` steps; exactly 0 between equal values.
inline float rampStep(float from, float to, int steps) {
  if (to == from) return 0.0f;
  const float step = std::fabs(to - from) / static_cast<float>(steps);
  return to < from ? -step : step;
}

// --- The screen ---

// Shorter side of the screen over 360; 1 without a screen.
inline float pixelScale(int width, int height) {
  const auto shorter = static_cast<float>(width < height ? width : height);
  return shorter == 0.0f ? 1.0f : shorter / 360.0f;
}

// 1440 over the shorter side of the screen; `withoutScreen` when there is none.
inline float speedScale(int width, int height, float withoutScreen) {
  const auto shorter = static_cast<float>(width < height ? width : height);
  return shorter == 0.0f ? withoutScreen : 1440.0f / shorter;
}

}  // namespace Qelt::rules
