#include "Floor.h"

#include <benchmark/benchmark.h>

#include <cmath>
#include <memory>

namespace QeltBench {

void appendPrepared(std::vector<float>& batch, const Stamp& stamp) {
  // The length is kept from the compiler, which would turn a known one into a slow string move.
  std::size_t length = stamp.size();
  benchmark::DoNotOptimize(length);
  batch.insert(batch.end(), stamp.data(), stamp.data() + length);
}

CheapWalk::CheapWalk(float x0, float y0, float x1, float y1, float x2, float y2)
    : mX0(x0), mY0(y0), mX1(x1), mY1(y1), mX2(x2), mY2(y2) {
  float lastX = x0, lastY = y0, length = 0.0f;
  mDistance[0] = 0.0f;
  for (int i = 1; i <= kChords; ++i) {
    const float t = static_cast<float>(i) / kChords;
    const float u = 1.0f - t;
    const float x = u * u * x0 + 2.0f * u * t * x1 + t * t * x2;
    const float y = u * u * y0 + 2.0f * u * t * y1 + t * t * y2;
    length += std::sqrt((x - lastX) * (x - lastX) + (y - lastY) * (y - lastY));
    mDistance[i] = length;
    lastX = x;
    lastY = y;
  }
}

std::size_t CheapWalk::walk(float spacing, float* out, std::size_t most) const {
  using Four [[gnu::vector_size(16), gnu::aligned(4), gnu::may_alias]] = float;
  float width = 6.0f, alpha = 0.0f;
  std::size_t stamps = 0;
  int chord = 1;
  for (float s = spacing; s <= mDistance[kChords] && stamps < most; s += spacing, ++stamps) {
    while (mDistance[chord] < s) ++chord;
    const float t = (static_cast<float>(chord - 1) +
                     (s - mDistance[chord - 1]) / (mDistance[chord] - mDistance[chord - 1])) /
                    kChords;
    const float u = 1.0f - t;
    const float x = u * u * mX0 + 2.0f * u * t * mX1 + t * t * mX2;
    const float y = u * u * mY0 + 2.0f * u * t * mY1 + t * t * mY2;
    const Four four = {x, y, width, alpha};
    for (int i = 0; i < 64; i += 4) *reinterpret_cast<Four*>(out + i) = four;
    out[64] = width;
    out[65] = alpha;
    out += kStampFloats;
    width += 0.001f;
    alpha += 0.002f;
  }
  return stamps;
}

std::size_t walkCheaply() {
  constexpr int kCurves = 4;
  constexpr std::size_t kMostStamps = 100;
  // Read anew each time, so that nothing is worked out ahead. (DoNotOptimize of GCC 12 would change it.)
  static volatile float far = 10.0f;
  const float end = far;
  const auto out = std::make_unique_for_overwrite<float[]>((kMostStamps + 8) * kStampFloats);
  std::size_t stamps = 0;
  for (int i = 0; i < kCurves; ++i) {
    const CheapWalk walk(0.0f, 0.0f, end / 2.0f, 1.0f, end, 0.0f);
    stamps += walk.walk(0.4f, out.get() + stamps * kStampFloats, kMostStamps - stamps);
  }
  benchmark::DoNotOptimize(out.get());
  benchmark::ClobberMemory();
  return stamps;
}

}  // namespace QeltBench
