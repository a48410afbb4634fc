#pragma once

#include <array>

namespace Qelt {

// The mean of the last `Size` samples. The sum runs from slot 0 upwards in single precision. The part of it
// below the slot written next does not change until the ring wraps, so it is kept from sample to sample; and
// nothing changes at all where a sample is what it replaces, as with tablets that know no tilt.
template <int Size>
class MeanRing {
 public:
  void fill(float value) {
    mSlots.fill(value);
    restart();
    updateMean();
  }

  void push(float value) {
    if (mNext == Size) restart();
    const bool changes = mSlots[mNext] != value;
    mSlots[mNext] = value;
    mSumBelow += value;
    ++mNext;
    if (changes) updateMean();
  }

  // The mean of all slots.
  float mean() const { return mMean; }

 private:
  void restart() {
    mNext = 0;
    mSumBelow = 0.0f;
  }

  void updateMean() {
    float sum = mSumBelow;
    for (int i = mNext; i < Size; ++i) sum += mSlots[i];
    mMean = sum / static_cast<float>(Size);
  }

  std::array<float, Size> mSlots{};
  int mNext = 0;           // the slot written next; `Size` stands for slot 0
  float mSumBelow = 0.0f;  // the sum of the slots below it
  float mMean = 0.0f;
};

// How the pen is held: tilt and orientation, each averaged over the last samples.
template <int TiltWindow, int OrientationWindow>
class PenAttitude {
 public:
  // Begins a stroke with this attitude everywhere in both histories. Radians.
  void fill(float tilt, float orientation) {
    mTilts.fill(tilt);
    mOrientations.fill(orientation);
    mMeanTilt = tilt;
    mMeanOrientation = orientation;
  }

  void push(float tilt, float orientation) {
    mTilts.push(tilt);
    mOrientations.push(unwrapped(orientation));
    mMeanTilt = mTilts.mean();
    mMeanOrientation = mOrientations.mean();
  }

  float meanTilt() const { return mMeanTilt; }
  // Radians. May lie outside (-pi, pi], because samples are unwrapped.
  float meanOrientation() const { return mMeanOrientation; }

  // Puts an earlier mean back and leaves the history as it is: an outline that drops a segment goes on
  // unwrapping against the mean from before that segment.
  void setMeanOrientation(float orientation) { mMeanOrientation = orientation; }

 private:
  // Turns a sample that lies across +-pi from the mean by a full turn, so that the mean does not jump.
  float unwrapped(float orientation) const {
    constexpr float kPi = 3.1415927f;
    constexpr float kTwoPi = 6.2831855f;
    if (mMeanOrientation * orientation < 0.0f) {
      if (mMeanOrientation > 0.0f) {
        if (mMeanOrientation - orientation > kPi) return orientation + kTwoPi;
      } else if (orientation - mMeanOrientation > kPi) {
        return orientation - kTwoPi;
      }
    }
    return orientation;
  }

  MeanRing<TiltWindow> mTilts;
  MeanRing<OrientationWindow> mOrientations;
  float mMeanTilt = 0.0f;
  float mMeanOrientation = 0.0f;
};

}  // namespace Qelt
