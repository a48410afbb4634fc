#pragma once

#include <memory>

#include "base/HostApi.h"

namespace Qelt {

struct SmPoint {
  float x = 0.0f, y = 0.0f;
};

// A path of straight and quadratic segments that finds positions by arc length. Main thread.
class QELT_HOST_API SmPath {
 public:
  SmPath();
  ~SmPath();
  SmPath(const SmPath&) = delete;
  SmPath& operator=(const SmPath&) = delete;

  // Makes room for `pointCount` points, so that building a path of so many allocates nothing.
  void incReserve(int pointCount);
  // Forgets the points, keeps the room.
  void rewind();
  // Forgets points and room.
  void freeMemory();

  void moveTo(float x, float y);
  void lineTo(float x, float y);
  void quadTo(float controlX, float controlY, float x, float y);
  // Prepares measuring from contour 0; called once after the last point is in.
  void resetPath(int contour);

  // Arc length in stroke units, within 0.001 of exact; 0 for a path of one point, NaN or infinite when a
  // coordinate is.
  float getLength() const;
  // The point at an arc length, within 0.01 of exact on segments up to 1000 units long; false when
  // `distance` lies outside the path or the path is empty. A path without length has a position at
  // distance 0. `tangent` may be null.
  bool getPosTan(float distance, SmPoint* position, SmPoint* tangent) const;

 private:
  struct Measure;
  std::unique_ptr<Measure> mMeasure;
};

}  // namespace Qelt
