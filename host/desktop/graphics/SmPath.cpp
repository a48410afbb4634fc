#include "graphics/SmPath.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <exception>
#include <limits>
#include <new>
#include <vector>

namespace Qelt {

namespace {

// How positions are found fast: each quadratic is cut into pieces, few where it bends gently, and each piece
// carries x and y as cubics of the arc length, fitted to its end points and unit tangents. A query is then
// two polynomials. The cut bounds the fit's error beforehand: over a length h it is at most
// h^4 / 384 times the largest fourth derivative of the curve by its arc length. For a parabola that
// derivative falls steadily with the distance from the vertex, so its value at the slowest point of a piece
// bounds it; with a = |A|, n the speed at the vertex and v the speed at that point it is at most
// 8 a^3 n (15 v^2 - 11 n^2) / v^9.
//
// Everything here is + - * / sqrt and log of doubles, so that different machines agree to the last bit.

constexpr double kTolerance = 0.0005;  // stroke units
// Coordinates far out are no finer than this share of themselves, and need no finer fit.
constexpr double kRelativeTolerance = 0x1p-23;
// Paths within a few float roundings of their length are still on the path.
constexpr double kLengthRounding = 4.0 * 0x1p-23;
// The bound on pieces of one quadratic. The worst found is well below (see the test); past it pieces get
// coarser.
constexpr int kMostPieces = 192;
constexpr int kMostCuts = 40;

// x and y.
using Two [[gnu::vector_size(16)]] = double;

Two both(double number) {
  return Two{number, number};
}
double dot(Two a, Two b) {
  const Two product = a * b;
  return product[0] + product[1];
}
double size(Two a) {
  return std::sqrt(dot(a, a));
}

struct Curve {
  Two p, b, a;  // P(t) = p + t (b + t a)
};

// Cubics of the distance since `begin`.
struct Piece {
  double begin, end;
  Two at, first, second, third;

  bool holds(double distance) const { return distance >= begin && distance <= end; }

  void tell(double distance, SmPoint* position, SmPoint* tangent) const {
    const Two s = both(distance - begin);
    if (position != nullptr) {
      const Two place = at + s * (first + s * (second + s * third));
      *position = {static_cast<float>(place[0]), static_cast<float>(place[1])};
    }
    if (tangent != nullptr) [[unlikely]]
      tellTangent(s, tangent);
  }

 private:
  // Out of line, as is whatever else the usual query can do without.
  [[gnu::noinline]] void tellTangent(Two s, SmPoint* tangent) const {
    const Two way = first + s * (2.0 * second + s * (3.0 * third));
    const double speed = size(way);
    const Two unit = way * both(speed > 0.0 ? 1.0 / speed : 0.0);
    *tangent = {static_cast<float>(unit[0]), static_cast<float>(unit[1])};
  }
};

constexpr double kInfinity = std::numeric_limits<double>::infinity();
// What holds no distance.
constexpr Piece kNowhere{kInfinity, -kInfinity, Two{}, Two{}, Two{}, Two{}};

struct Segment {
  Curve curve;
  double begin, end;  // arc length from the contour's start
};

struct Contour {
  std::size_t firstSegment;
  Two at;
};

// Where a piece may end.
struct Joint {
  double t;
  double along;  // the component of P'(t) along A
  double speed;
  Two d;  // P'(t)
};

// What does not change along a curve.
class Parabola {
 public:
  explicit Parabola(const Curve& curve) : mCurve(curve) {
    const double speed = size(curve.b);
    mA = size(curve.a);
    if (mA > 0.0) {
      mU = curve.a / both(mA);
      mAcross = std::abs(mU[0] * curve.b[1] - mU[1] * curve.b[0]);
      // Narrower than any float could say: a line, perhaps there and back.
      mIsStraight = mAcross <= 1e-10 * (speed + 2.0 * mA);
      mVertex = -dot(curve.b, mU) / (2.0 * mA);
    } else {
      mAcross = speed;
    }
    if (mIsStraight) mAcross = 0.0;
  }

  double vertex() const { return mVertex; }

  Joint joint(double t) const {
    Joint j{t, 0.0, 0.0, mCurve.b + both(2.0 * t) * mCurve.a};
    j.along = dot(j.d, mU);
    j.speed = mIsStraight ? std::abs(j.along) : size(j.d);
    return j;
  }

  bool hasVertexBetween(const Joint& from, const Joint& to) const {
    return mVertex > from.t && mVertex < to.t;
  }

  // True when one cubic is good enough from one joint to the other.
  bool fits(const Joint& from, const Joint& to, double tolerance) const {
    if (mA == 0.0) return true;
    // Speed is a convex function of t, so this is not below the length.
    const double length = 0.5 * (to.t - from.t) * (from.speed + to.speed);
    if (!(length > tolerance)) return true;
    const bool turns = hasVertexBetween(from, to);
    if (mIsStraight) return !turns;
    const double slowest = turns ? mAcross : std::min(from.speed, to.speed);
    const double ratio = length / slowest;
    const double square = slowest * slowest;
    return ratio * ratio * ratio * ratio * mA * mA * mA * mAcross *
               (15.0 * square - 11.0 * mAcross * mAcross) <=
           48.0 * tolerance * square * square * slowest;
  }

  // The arc length between two joints, in closed form.
  double length(const Joint& from, const Joint& to) const {
    const double time = to.t - from.t;
    if (mA == 0.0) return time * mAcross;
    // Mirrored, if need be, so that most of the way leads away from the vertex. Chosen without a branch:
    // where a stroke bends evenly the vertex is in the middle, and which half is longer is a matter of
    // chance.
    const auto mirrored = both(from.along + to.along) < Two{};
    const Two q = mirrored ? Two{-to.along, -from.along} : Two{from.along, to.along};
    const Two v = mirrored ? Two{to.speed, from.speed} : Two{from.speed, to.speed};
    const double q0 = q[0], q1 = q[1], v0 = v[0], v1 = v[1];
    if (mIsStraight) {
      return q0 < 0.0 ? (q0 * q0 + q1 * q1) / (4.0 * mA) : 0.5 * time * (v0 + v1);
    }
    // With q the component along A: the integral of v is (q v + n^2 log(q + v)) / (4 a). Written by way of
    // differences, so that a vanishing a costs no digits.
    const double square = mAcross * mAcross;
    const double lower = q0 < 0.0 ? square / (v0 - q0) : q0 + v0;
    const double sum = v0 + v1;
    const double slope = (q0 + q1) / sum;
    const double scale = (sum + q0 + q1) / (sum * lower);
    const double x = (q1 - q0) * scale;
    double logarithm = 0.0;
    if (x < 0.35) {
      // log(1 + x) / x by the series of atanh(y) with y = x / (2 + x).
      const double y = x / (2.0 + x);
      const double z = y * y;
      const double series = 1.0 + z * (1.0 / 3.0 + z * (1.0 / 5.0 + z * (1.0 / 7.0 + z * (1.0 / 9.0))));
      logarithm = scale * (1.0 - y) * series;
    } else {
      logarithm = std::log((q1 + v1) / lower) / (q1 - q0);
    }
    return 0.5 * time * (v0 + q1 * slope + square * logarithm);
  }

  Piece piece(const Joint& from, const Joint& to, double begin) const {
    const double h = length(from, to);
    const Two at = mCurve.p + both(from.t) * (mCurve.b + both(from.t) * mCurve.a);
    Piece made{begin, begin + h, at, Two{}, Two{}, Two{}};
    if (!(h > 0.0)) return made;
    const Two end = mCurve.p + both(to.t) * (mCurve.b + both(to.t) * mCurve.a);
    const Two inverse = both(1.0 / h);
    const Two chord = (end - at) * inverse;
    if (mIsStraight || mA == 0.0) {
      made.first = chord;
      return made;
    }
    const Two from1 = from.d * both(1.0 / from.speed);
    const Two to1 = to.d * both(1.0 / to.speed);
    made.first = from1;
    made.second = (3.0 * chord - 2.0 * from1 - to1) * inverse;
    made.third = (from1 + to1 - 2.0 * chord) * inverse * inverse;
    return made;
  }

 private:
  const Curve& mCurve;
  double mA = 0.0;        // |A|
  Two mU{};               // A / |A|
  double mAcross = 0.0;   // n: the speed at the vertex, or the constant one
  double mVertex = -1.0;  // its t
  bool mIsStraight = false;
};

}  // namespace

struct SmPath::Measure {
  std::vector<Segment> segments;
  std::vector<Contour> contours;
  Two current{};        // the current point
  double length = 0.0;  // of the measured contour
  double limit = -1.0;  // the largest distance that has a position
  double tolerance = kTolerance;
  std::size_t first = 0;  // the measured segments
  std::size_t last = 0;
  std::size_t cut = 0;  // the segment that `pieces` belong to
  int pieceCount = 0;
  const Piece* now = &kNowhere;  // where the last query was
  std::array<Piece, kMostPieces> pieces;

  void forget() {
    segments.clear();
    contours.clear();
    current = Two{};
    first = last = 0;
    setEmpty();
  }

  void setEmpty() {
    length = 0.0;
    limit = -1.0;
    now = &kNowhere;
  }

  void addQuad(Two control, Two to) {
    addCurve({current, 2.0 * (control - current), current - 2.0 * control + to}, to);
  }

  void addLine(Two to) { addCurve({current, to - current, Two{}}, to); }

  void addContour(Two at) {
    if (hasRoom(contours)) {
      contours.push_back({segments.size(), at});
      current = at;
    }
  }

  void addCurve(const Curve& curve, Two to) {
    if (contours.empty()) addContour(current);
    if (hasRoom(segments)) {
      segments.push_back({curve, 0.0, 0.0});
      current = to;
    }
  }

  // Room for one more. What memory has no room for is left out.
  template <typename Kind>
  static bool hasRoom(std::vector<Kind>& all) {
    return all.size() < all.capacity() || grows(all);
  }
  template <typename Kind>
  [[gnu::noinline]] static bool grows(std::vector<Kind>& all) {
    try {
      all.reserve(std::max<std::size_t>(2 * all.size(), 4));
      return true;
    } catch (const std::exception&) {
      return false;
    }
  }

  // Cuts a segment into pieces and returns its length.
  double cutSegment(std::size_t index) {
    const Segment& segment = segments[index];
    const Parabola parabola(segment.curve);
    cut = index;
    pieceCount = 0;
    now = pieces.data();
    double distance = segment.begin;
    std::array<Joint, kMostCuts + 1> ahead;
    int waiting = 1;
    ahead[0] = parabola.joint(1.0);
    Joint from = parabola.joint(0.0);
    while (waiting > 0) {
      const Joint& to = ahead[static_cast<std::size_t>(waiting - 1)];
      const bool full = waiting > kMostCuts || pieceCount + waiting >= kMostPieces;
      if (!full && !parabola.fits(from, to, tolerance)) {
        const double at = parabola.hasVertexBetween(from, to) ? parabola.vertex() : 0.5 * (from.t + to.t);
        ahead[static_cast<std::size_t>(waiting++)] = parabola.joint(at);
        continue;
      }
      Piece& made = pieces[static_cast<std::size_t>(pieceCount++)];
      made = parabola.piece(from, to, distance);
      distance = made.end;
      from = to;
      --waiting;
    }
    return distance - segment.begin;
  }

  void measure(std::size_t contour) {
    setEmpty();
    if (contour >= contours.size()) return;
    first = contours[contour].firstSegment;
    last = contour + 1 < contours.size() ? contours[contour + 1].firstSegment : segments.size();
    const Two at = contours[contour].at;
    double farthest = std::abs(at[0]) + std::abs(at[1]);
    for (std::size_t i = first; i < last; ++i) {
      const auto& [p, b, a] = segments[i].curve;
      farthest += std::abs(a[0]) + std::abs(a[1]) + std::abs(b[0]) + std::abs(b[1]);
    }
    if (!std::isfinite(farthest)) {
      length = farthest;
      return;
    }
    tolerance = std::max(kTolerance, kRelativeTolerance * farthest);
    if (first == last) {
      pieces[0] = {0.0, 0.0, contours[contour].at, Two{}, Two{}, Two{}};
      pieceCount = 1;
      now = pieces.data();
    } else {
      for (std::size_t i = first; i < last; ++i) {
        Segment& segment = segments[i];
        segment.begin = length;
        if (i == first) {
          length += cutSegment(i);
        } else {
          const Parabola parabola(segment.curve);
          length += parabola.length(parabola.joint(0.0), parabola.joint(1.0));
        }
        segment.end = length;
      }
    }
    limit = length * (1.0 + kLengthRounding);
  }

  // Moves to the piece that holds a distance; the last one takes what rounding adds. False when the path has
  // no such distance.
  bool seek(double distance) {
    if (!(distance >= 0.0 && distance <= limit)) return false;
    if (first != last) {
      const Segment& segment = segments[cut];
      if (distance < segment.begin || (distance > segment.end && cut + 1 < last)) {
        const auto begin = segments.begin() + static_cast<std::ptrdiff_t>(first);
        const auto end = segments.begin() + static_cast<std::ptrdiff_t>(last - 1);
        const auto found = std::partition_point(
            begin, end, [distance](const Segment& other) { return other.end < distance; });
        cutSegment(static_cast<std::size_t>(found - segments.begin()));
      }
    }
    const Piece* const farthest = pieces.data() + pieceCount - 1;
    now = std::min(now + 1, farthest);
    if (!now->holds(distance)) {
      now = std::partition_point(static_cast<const Piece*>(pieces.data()), farthest,
                                 [distance](const Piece& piece) { return piece.end < distance; });
    }
    return true;
  }

  [[gnu::noinline]] bool tellElsewhere(double distance, SmPoint* position, SmPoint* tangent) {
    if (!seek(distance)) return false;
    now->tell(distance, position, tangent);
    return true;
  }
};

SmPath::SmPath() : mMeasure(new (std::nothrow) Measure) {}

SmPath::~SmPath() = default;

void SmPath::incReserve(int pointCount) {
  if (pointCount <= 0) return;
  if (mMeasure == nullptr) mMeasure.reset(new (std::nothrow) Measure);
  if (mMeasure == nullptr) return;
  // A hint beyond this is taken as far as that; the path still grows as it is built.
  constexpr int kMostReserved = 1 << 16;
  const auto points = static_cast<std::size_t>(std::min(pointCount, kMostReserved));
  try {
    mMeasure->segments.reserve(mMeasure->segments.size() + points);
    mMeasure->contours.reserve(mMeasure->contours.size() + points);
  } catch (const std::bad_alloc&) {
    // Only a hint.
  }
}

void SmPath::rewind() {
  if (mMeasure != nullptr) mMeasure->forget();
}

void SmPath::freeMemory() {
  mMeasure.reset();
}

void SmPath::moveTo(float x, float y) {
  if (mMeasure == nullptr) mMeasure.reset(new (std::nothrow) Measure);
  if (mMeasure != nullptr) mMeasure->addContour(Two{x, y});
}

void SmPath::lineTo(float x, float y) {
  if (mMeasure == nullptr) mMeasure.reset(new (std::nothrow) Measure);
  if (mMeasure != nullptr) mMeasure->addLine(Two{x, y});
}

void SmPath::quadTo(float controlX, float controlY, float x, float y) {
  if (mMeasure == nullptr) mMeasure.reset(new (std::nothrow) Measure);
  if (mMeasure != nullptr) mMeasure->addQuad(Two{controlX, controlY}, Two{x, y});
}

void SmPath::resetPath(int contour) {
  if (mMeasure == nullptr) return;
  mMeasure->setEmpty();
  if (contour >= 0) mMeasure->measure(static_cast<std::size_t>(contour));
}

float SmPath::getLength() const {
  return mMeasure != nullptr ? static_cast<float>(mMeasure->length) : 0.0f;
}

bool SmPath::getPosTan(float distance, SmPoint* position, SmPoint* tangent) const {
  Measure* const measure = mMeasure.get();
  if (measure == nullptr) return false;
  const Piece& piece = *measure->now;
  if (!piece.holds(distance)) [[unlikely]]
    return measure->tellElsewhere(distance, position, tangent);
  piece.tell(distance, position, tangent);
  return true;
}

}  // namespace Qelt
