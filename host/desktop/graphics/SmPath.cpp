#include "graphics/SmPath.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
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

struct Curve {
  double px, py;  // P(t) = p + t (b + t a)
  double bx, by;
  double ax, ay;
};

// Cubics of the distance since `begin`.
struct Piece {
  double begin, end;
  double at[2], first[2], second[2], third[2];
};

struct Segment {
  Curve curve;
  double begin, end;  // arc length from the contour's start
};

struct Contour {
  std::size_t firstSegment;
  double x, y;
};

// Where a piece may end.
struct Joint {
  double t;
  double dx, dy;  // P'(t)
  double along;   // its component along A
  double speed;
};

// What does not change along a curve.
class Parabola {
 public:
  explicit Parabola(const Curve& curve) : mCurve(curve) {
    const double speed = std::sqrt(curve.bx * curve.bx + curve.by * curve.by);
    mA = std::sqrt(curve.ax * curve.ax + curve.ay * curve.ay);
    if (mA > 0.0) {
      mUx = curve.ax / mA;
      mUy = curve.ay / mA;
      mAcross = std::abs(mUx * curve.by - mUy * curve.bx);
      // Narrower than any float could say: a line, perhaps there and back.
      mIsStraight = mAcross <= 1e-10 * (speed + 2.0 * mA);
      mVertex = -(curve.bx * mUx + curve.by * mUy) / (2.0 * mA);
    } else {
      mAcross = speed;
    }
    if (mIsStraight) mAcross = 0.0;
  }

  double vertex() const { return mVertex; }

  Joint joint(double t) const {
    Joint j{t, mCurve.bx + 2.0 * t * mCurve.ax, mCurve.by + 2.0 * t * mCurve.ay, 0.0, 0.0};
    j.along = j.dx * mUx + j.dy * mUy;
    j.speed = mIsStraight ? std::abs(j.along) : std::sqrt(j.dx * j.dx + j.dy * j.dy);
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
    // Mirrored, if need be, so that most of the way leads away from the vertex.
    const bool mirrored = from.along + to.along < 0.0;
    const double q0 = mirrored ? -to.along : from.along;
    const double q1 = mirrored ? -from.along : to.along;
    const double v0 = mirrored ? to.speed : from.speed;
    const double v1 = mirrored ? from.speed : to.speed;
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
    const double x0 = mCurve.px + from.t * (mCurve.bx + from.t * mCurve.ax);
    const double y0 = mCurve.py + from.t * (mCurve.by + from.t * mCurve.ay);
    Piece made{begin, begin + h, {x0, y0}, {}, {}, {}};
    if (!(h > 0.0)) return made;
    const double x1 = mCurve.px + to.t * (mCurve.bx + to.t * mCurve.ax);
    const double y1 = mCurve.py + to.t * (mCurve.by + to.t * mCurve.ay);
    const double inverse = 1.0 / h;
    const double chordX = (x1 - x0) * inverse;
    const double chordY = (y1 - y0) * inverse;
    if (mIsStraight || mA == 0.0) {
      made.first[0] = chordX;
      made.first[1] = chordY;
      return made;
    }
    const double fromScale = 1.0 / from.speed;
    const double toScale = 1.0 / to.speed;
    const double tx0 = from.dx * fromScale, ty0 = from.dy * fromScale;
    const double tx1 = to.dx * toScale, ty1 = to.dy * toScale;
    made.first[0] = tx0;
    made.first[1] = ty0;
    made.second[0] = (3.0 * chordX - 2.0 * tx0 - tx1) * inverse;
    made.second[1] = (3.0 * chordY - 2.0 * ty0 - ty1) * inverse;
    made.third[0] = (tx0 + tx1 - 2.0 * chordX) * inverse * inverse;
    made.third[1] = (ty0 + ty1 - 2.0 * chordY) * inverse * inverse;
    return made;
  }

 private:
  const Curve& mCurve;
  double mA = 0.0;              // |A|
  double mUx = 0.0, mUy = 0.0;  // A / |A|
  double mAcross = 0.0;         // n: the speed at the vertex, or the constant one
  double mVertex = -1.0;        // its t
  bool mIsStraight = false;
};

}  // namespace

struct SmPath::Measure {
  std::vector<Segment> segments;
  std::vector<Contour> contours;
  double x = 0.0, y = 0.0;  // the current point
  double length = 0.0;      // of the measured contour
  double limit = -1.0;      // the largest distance that has a position
  double tolerance = kTolerance;
  std::size_t first = 0;  // the measured segments
  std::size_t last = 0;
  std::size_t cut = 0;  // the segment that `pieces` belong to
  int pieceCount = 0;
  int piece = 0;  // where the last query was
  std::array<Piece, kMostPieces> pieces;

  void forget() {
    segments.clear();
    contours.clear();
    x = y = 0.0;
    first = last = 0;
    setEmpty();
  }

  void setEmpty() {
    length = 0.0;
    limit = -1.0;
  }

  void addQuad(double controlX, double controlY, double toX, double toY) {
    addCurve({x, y, 2.0 * (controlX - x), 2.0 * (controlY - y), x - 2.0 * controlX + toX,
              y - 2.0 * controlY + toY},
             toX, toY);
  }

  void addLine(double toX, double toY) { addCurve({x, y, toX - x, toY - y, 0.0, 0.0}, toX, toY); }

  // What memory has no room for is left out.
  void addContour(double atX, double atY) {
    try {
      contours.push_back({segments.size(), atX, atY});
      x = atX;
      y = atY;
    } catch (const std::bad_alloc&) {
    }
  }

  void addCurve(const Curve& curve, double toX, double toY) {
    if (contours.empty()) addContour(x, y);
    try {
      segments.push_back({curve, 0.0, 0.0});
      x = toX;
      y = toY;
    } catch (const std::bad_alloc&) {
    }
  }

  // Cuts a segment into pieces and returns its length.
  double cutSegment(std::size_t index) {
    const Segment& segment = segments[index];
    const Parabola parabola(segment.curve);
    cut = index;
    pieceCount = 0;
    piece = 0;
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
    double farthest = std::abs(contours[contour].x) + std::abs(contours[contour].y);
    for (std::size_t i = first; i < last; ++i) {
      const Curve& curve = segments[i].curve;
      farthest += std::abs(curve.ax) + std::abs(curve.ay) + std::abs(curve.bx) + std::abs(curve.by);
    }
    if (!std::isfinite(farthest)) {
      length = farthest;
      return;
    }
    tolerance = std::max(kTolerance, kRelativeTolerance * farthest);
    if (first == last) {
      pieces[0] = {0.0, 0.0, {contours[contour].x, contours[contour].y}, {}, {}, {}};
      pieceCount = 1;
      piece = 0;
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

  // Finds the piece that holds a distance other than the last one's. Out of line, to keep the usual query
  // short.
  [[gnu::noinline]] const Piece& seek(double distance) {
    if (first != last) {
      const Segment& now = segments[cut];
      if (distance < now.begin || (distance > now.end && cut + 1 < last)) {
        const auto begin = segments.begin() + static_cast<std::ptrdiff_t>(first);
        const auto end = segments.begin() + static_cast<std::ptrdiff_t>(last - 1);
        const auto found = std::partition_point(
            begin, end, [distance](const Segment& segment) { return segment.end < distance; });
        cutSegment(static_cast<std::size_t>(found - segments.begin()));
      }
    }
    const auto begin = pieces.begin();
    const auto next = begin + std::min(piece + 1, pieceCount - 1);
    if (distance >= next->begin && distance <= next->end) {
      piece = static_cast<int>(next - begin);
    } else {
      piece = static_cast<int>(std::partition_point(begin, begin + (pieceCount - 1),
                                                    [distance](const Piece& p) { return p.end < distance; }) -
                               begin);
    }
    return pieces[static_cast<std::size_t>(piece)];
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
  if (mMeasure != nullptr) mMeasure->addContour(x, y);
}

void SmPath::lineTo(float x, float y) {
  if (mMeasure == nullptr) mMeasure.reset(new (std::nothrow) Measure);
  if (mMeasure != nullptr) mMeasure->addLine(x, y);
}

void SmPath::quadTo(float controlX, float controlY, float x, float y) {
  if (mMeasure == nullptr) mMeasure.reset(new (std::nothrow) Measure);
  if (mMeasure != nullptr) mMeasure->addQuad(controlX, controlY, x, y);
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
  const double at = distance;
  if (!(at >= 0.0 && at <= measure->limit)) return false;
  const Piece* piece = &measure->pieces[static_cast<std::size_t>(measure->piece)];
  if (at < piece->begin || at > piece->end) [[unlikely]]
    piece = &measure->seek(at);
  const double s = at - piece->begin;
  if (position != nullptr) {
    position->x = static_cast<float>(piece->at[0] +
                                     s * (piece->first[0] + s * (piece->second[0] + s * piece->third[0])));
    position->y = static_cast<float>(piece->at[1] +
                                     s * (piece->first[1] + s * (piece->second[1] + s * piece->third[1])));
  }
  if (tangent != nullptr) {
    const double dx = piece->first[0] + s * (2.0 * piece->second[0] + s * (3.0 * piece->third[0]));
    const double dy = piece->first[1] + s * (2.0 * piece->second[1] + s * (3.0 * piece->third[1]));
    const double size = std::sqrt(dx * dx + dy * dy);
    const double scale = size > 0.0 ? 1.0 / size : 0.0;
    tangent->x = static_cast<float>(dx * scale);
    tangent->y = static_cast<float>(dy * scale);
  }
  return true;
}

}  // namespace Qelt
