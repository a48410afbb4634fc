#pragma once

#include <array>
#include <cstddef>
#include <vector>

// What stamps would cost if they cost nothing but their bytes, to set the pen's figures beside.
namespace QeltBench {

inline constexpr std::size_t kStampFloats = 66;

using Stamp = std::array<float, kStampFloats>;

// Appends a prepared stamp to a batch with room for it.
void appendPrepared(std::vector<float>& batch, const Stamp& stamp);

// The cheapest honest walk of a version-8 stroke: along a quadratic in steps of equal arc length, read off a
// table of chords; four running floats (width, alpha, x, y); each stamp's 264 bytes stored.
class CheapWalk {
 public:
  // Control points, stroke units.
  CheapWalk(float x0, float y0, float x1, float y1, float x2, float y2);

  // Walks once over the curve; returns how many stamps were stored at `out`, which has room for `most`.
  std::size_t walk(float spacing, float* out, std::size_t most) const;

 private:
  static constexpr int kChords = 16;

  float mX0, mY0, mX1, mY1, mX2, mY2;
  std::array<float, kChords + 1> mDistance;  // from the start to each chord's end
};

// Walks over as many curves as a move event of four samples has, into a batch of its own, as it must be
// handed over. Returns how many stamps that were.
std::size_t walkCheaply();

}  // namespace QeltBench
