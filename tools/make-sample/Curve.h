#pragma once

#include <vector>

// Plain geometry of the page: x to the right, y down, in stroke units. Only + - * / and square roots are
// used, which round alike on every machine; so the page comes out the same everywhere.

struct Point {
  double x = 0.0;
  double y = 0.0;
};

inline Point operator+(Point a, Point b) {
  return {a.x + b.x, a.y + b.y};
}
inline Point operator-(Point a, Point b) {
  return {a.x - b.x, a.y - b.y};
}
inline Point operator*(Point a, double factor) {
  return {a.x * factor, a.y * factor};
}
inline double dot(Point a, Point b) {
  return a.x * b.x + a.y * b.y;
}
double length(Point a);
Point mix(Point a, Point b, double t);

// The direction of a compass angle in degrees: 0 is up, 90 to the right. (Like an azimuth.)
Point heading(double degrees);

// 0 below `from`, 1 above `to`, smooth between; `from` may be the larger.
double ramp(double from, double to, double value);

// A point a curve runs through. At a corner the pen turns sharply without leaving the paper.
struct Waypoint {
  Point at;
  bool corner = false;
};

using Polyline = std::vector<Point>;

// A smooth curve through the waypoints, as points about a quarter of a unit apart.
Polyline smooth(const std::vector<Waypoint>& waypoints);
Polyline smooth(const std::vector<Point>& points);
