#pragma once

#include <cstdint>
#include <functional>

#include "Curve.h"
#include "Page.h"

// Small and the same everywhere: SplitMix64.
class Random {
 public:
  explicit Random(std::uint64_t seed) : mState(seed) {}
  double unit();  // 0 to 1
  double around(double middle, double spread) { return middle + spread * (2.0 * unit() - 1.0); }

 private:
  std::uint64_t mState;
};

// Noise along a line that changes smoothly: about 0, at most `reach` away from it.
class Tremor {
 public:
  Tremor(Random& random, double reach, double wavelength);
  double at(double distance) const;

 private:
  double mReach;
  double mWavelength;
  std::uint64_t mSeed;
};

// How the hand leads the pencil along one stroke.
struct Touch {
  Brush brush;
  // Pressure from 0 to 1 at a place of the stroke: how far along it is (0 to 1), and the way the pen moves
  // there.
  std::function<double(double along, Point direction)> pressure;
  double elevation = 56.0;  // degrees above the paper
  double azimuth = 128.0;   // degrees clockwise from up: where the pencil's end points
  // When set, the elevation along the stroke instead.
  std::function<double(double along)> leaning = nullptr;
  double speed = 400.0;  // units a second on the straight
  double shake = 0.25;   // how far the hand trembles, in units
};

// A right hand at a tablet that reports 240 samples a second. It slows down in curves, trembles a little, and
// neither pressure nor attitude is ever quite steady.
class Hand {
 public:
  Hand(Page& page, std::uint64_t seed) : mPage(page), mRandom(seed) {}

  void draw(const Polyline& path, const Touch& touch);
  Random& random() { return mRandom; }

 private:
  Page& mPage;
  Random mRandom;
};
