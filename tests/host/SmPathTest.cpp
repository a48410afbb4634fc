#include "graphics/SmPath.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <limits>
#include <random>
#include <vector>

namespace {

using Qelt::SmPath;
using Qelt::SmPoint;

struct Quad {
  float x0, y0, cx, cy, x1, y1;
};

void build(SmPath& path, const Quad& q) {
  path.rewind();
  path.moveTo(q.x0, q.y0);
  path.quadTo(q.cx, q.cy, q.x1, q.y1);
  path.resetPath(0);
}

// Positions and arc length by brute force, in doubles, at equal steps of the quadratic's parameter.
class Reference {
 public:
  static constexpr int kSteps = 4096;

  explicit Reference(const Quad& q)
      : mPx(q.x0), mPy(q.y0), mBx(2.0 * (double{q.cx} - q.x0)), mBy(2.0 * (double{q.cy} - q.y0)) {
    mAx = double{q.x0} - 2.0 * q.cx + q.x1;
    mAy = double{q.y0} - 2.0 * q.cy + q.y1;
    for (int i = 0; i < kSteps; ++i) {
      const double t = (i + 0.5) / kSteps;
      mLengths.push_back(mLengths.back() + std::hypot(mBx + 2.0 * t * mAx, mBy + 2.0 * t * mAy) / kSteps);
    }
  }
  double lengthTo(int step) const { return mLengths[static_cast<std::size_t>(step)]; }
  double x(double t) const { return mPx + t * (mBx + t * mAx); }
  double y(double t) const { return mPy + t * (mBy + t * mAy); }

 private:
  double mPx, mPy, mBx, mBy, mAx, mAy;
  std::vector<double> mLengths{0.0};
};

// Quadratics of `size` units or less, anywhere within `size` of the origin.
class QuadSource {
 public:
  explicit QuadSource(double size) : mSize(size) {}

  // The flatter, the more sharply it turns back on itself.
  Quad flattened() {
    const double width = std::pow(10.0, -3.0 + 3.0 * u());
    return place(u(), width * u(), u(), width * u());
  }
  // Every other time some of its three points are one.
  Quad onALine() {
    const bool meets = mCount++ % 2 == 0;
    const double slopeX = u(), slopeY = u(), first = meets ? std::round(u()) : u(),
                 second = meets ? std::round(u()) : u();
    return place(first * slopeX, first * slopeY, second * slopeX, second * slopeY);
  }

 private:
  double u() { return mUniform(mBits); }
  Quad place(double cx, double cy, double x, double y) {
    const float ox = inUnits(2 * u()), oy = inUnits(2 * u());
    return {ox, oy, ox + inUnits(cx), oy + inUnits(cy), ox + inUnits(x), oy + inUnits(y)};
  }
  float inUnits(double part) const { return static_cast<float>(0.5 * mSize * part); }

  double mSize;
  int mCount = 0;
  std::mt19937 mBits{20240229};
  std::uniform_real_distribution<double> mUniform{-1.0, 1.0};
};

// Positions and length of one quadratic against the reference.
void expectExact(const Quad& q, double positionTolerance, double lengthTolerance) {
  SCOPED_TRACE(testing::PrintToString(std::array{q.x0, q.y0, q.cx, q.cy, q.x1, q.y1}));
  SmPath path;
  build(path, q);
  const Reference reference(q);
  ASSERT_NEAR(path.getLength(), reference.lengthTo(Reference::kSteps), lengthTolerance);
  for (int step = 0; step <= Reference::kSteps; step += 128) {
    const double t = static_cast<double>(step) / Reference::kSteps;
    const double s = reference.lengthTo(step);
    const float asked = std::min(static_cast<float>(s), path.getLength());
    SmPoint at;
    ASSERT_TRUE(path.getPosTan(asked, &at, nullptr)) << "at " << asked;
    const double off = std::hypot(at.x - reference.x(t), at.y - reference.y(t)) - std::abs(asked - s);
    ASSERT_LE(off, positionTolerance) << "at " << asked << " of " << path.getLength();
  }
}

TEST(SmPath, FollowsAnyQuadraticWithinTheTolerancesThatFloatsAllow) {
  for (const double size : {1e-30, 1e-6, 1.0, 10.0, 100.0, 1000.0, 1e6, 1e12}) {
    QuadSource source(size);
    // The closed form in doubles, then one rounding to float; half a unit in the last place at 2048
    // is 1.2e-4.
    const bool isUsual = size >= 1.0 && size <= 1000.0;
    const double position = isUsual ? 0.002 : std::max(std::min(size, 0.002), 4e-6 * size);
    const double length = isUsual ? 0.0002 : 4e-7 * size;
    for (int i = 0; i < (isUsual ? 400 : 200); ++i) {
      expectExact(source.flattened(), position, length);
      expectExact(source.onALine(), position, length);
    }
  }
}

TEST(SmPath, QueriesInAnyOrderAnswerTheSame) {
  SmPath path;
  path.moveTo(0, 0);
  path.lineTo(30, 40);
  path.quadTo(60, 80, 0, 120);
  path.quadTo(0, 120, 0, 120);
  path.quadTo(-200, 120, 10, 119);
  path.lineTo(10, 0);
  path.resetPath(0);
  constexpr int kCount = 400;
  const float step = path.getLength() / kCount;
  const auto at = [&](std::size_t number) {
    SmPoint point;
    EXPECT_TRUE(path.getPosTan(static_cast<float>(number) * step, &point, nullptr));
    return point;
  };
  std::vector<SmPoint> rising;
  for (std::size_t i = 0; i <= kCount; ++i) {
    rising.push_back(at(i));
    // No step is longer than the way along the path.
    if (i > 0) {
      ASSERT_LE(std::hypot(at(i).x - rising[i - 1].x, at(i).y - rising[i - 1].y), step + 0.002f);
    }
  }
  EXPECT_NEAR(rising.back().x, 10.0f, 1e-3f);
  std::mt19937 bits(7);
  for (int i = 0; i < 2000; ++i) {
    const auto number = bits() % (kCount + 1);
    ASSERT_EQ(at(number).x, rising[number].x) << number;
    ASSERT_EQ(at(number).y, rising[number].y) << number;
  }
}

TEST(SmPath, DistancesOutsideAreRefusedAndRoundingIsForgiven) {
  SmPath path;
  SmPoint at{-1, -1};
  EXPECT_FALSE(path.getPosTan(0.0f, &at, nullptr));  // nothing measured yet
  build(path, {0, 0, 3, 1, 7, 0});
  const float length = path.getLength();
  EXPECT_TRUE(path.getPosTan(std::nextafter(std::nextafter(length, INFINITY), INFINITY), &at, nullptr));
  EXPECT_NEAR(at.x, 7.0f, 1e-5f);
  for (const float outside : {length * 1.0001f, -1e-3f, NAN, INFINITY, -INFINITY})
    EXPECT_FALSE(path.getPosTan(outside, &at, nullptr)) << outside;
  path.rewind();
  EXPECT_FALSE(path.getPosTan(0.0f, &at, nullptr));
  EXPECT_EQ(path.getLength(), 0.0f);
  // A path without length has one position.
  path.moveTo(3, 4);
  path.resetPath(0);
  EXPECT_TRUE(path.getPosTan(0.0f, &at, nullptr));
  EXPECT_EQ(at.y, 4.0f);
  EXPECT_FALSE(path.getPosTan(0.01f, &at, nullptr));
  build(path, {5, 6, 5, 6, 5, 6});
  SmPoint along{9, 9};
  EXPECT_TRUE(path.getPosTan(0.0f, &at, &along));
  EXPECT_EQ(at.x, 5.0f);
  EXPECT_EQ(along.x, 0.0f);
  EXPECT_FALSE(path.getPosTan(1e-6f, &at, nullptr));
}

TEST(SmPath, CoordinatesThatAreNotFiniteAreNoWay) {
  SmPath path;
  SmPoint at;
  for (const float bad : {NAN, INFINITY, -INFINITY}) {
    for (int place = 0; place < 6; ++place) {
      float values[6] = {0, 0, 5, 5, 10, 0};
      values[place] = bad;
      build(path, {values[0], values[1], values[2], values[3], values[4], values[5]});
      EXPECT_FALSE(std::isfinite(path.getLength()));
      EXPECT_FALSE(path.getPosTan(0.0f, &at, nullptr));
      EXPECT_FALSE(path.getPosTan(1.0f, &at, nullptr));
    }
  }
  const float huge = std::numeric_limits<float>::max();
  build(path, {-huge, -huge, huge, huge, -huge, huge});
  path.getPosTan(1e38f, &at, nullptr);
  EXPECT_GT(path.getLength(), 0.0f);
}

}  // namespace
