#pragma once

#include <string>
#include <vector>

// A pencil: width in stroke units, and how hard the lead is (InkML's transparency, 0 to 255: a hard lead
// leaves less).
struct Brush {
  double width = 2.0;
  int transparency = 0;
};

// One report of the tablet.
struct Sample {
  double x, y;                // stroke units
  double pressure;            // 0 to 1
  double elevation, azimuth;  // degrees
};

// The page: what was drawn, in order, on one clock.
class Page {
 public:
  static constexpr double kRate = 240.0;  // samples a second

  void add(const Brush& brush, std::vector<Sample> samples);
  void rest(double seconds) { mClock += seconds; }
  std::string inkml() const;

 private:
  struct Trace {
    Brush brush;
    double start;  // seconds
    std::vector<Sample> samples;
  };
  std::vector<Trace> mTraces;
  double mClock = 0.0;
};
