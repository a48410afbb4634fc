// Makes the sample page: what the pencil can do, drawn by a program that holds it like a hand.
//
//   make-sample FILE      writes the page as InkML
//
// The page is 900 x 640 units: writing at the top, a still life on the right (a ball shaded with the side of
// the lead, a box hatched with its point), and four small studies of pressure and lean on the left.

#include <algorithm>
#include <cmath>
#include <exception>
#include <fstream>
#include <functional>
#include <iostream>
#include <stdexcept>
#include <string>
#include <vector>

#include "Curve.h"
#include "Hand.h"
#include "Letters.h"
#include "Page.h"

namespace {

// The pencils in the box. A lead of transparency 0 is the softest.
constexpr Brush kTitlePencil = {5.2, 0};
constexpr Brush kFinePencil = {2.4, 0};
constexpr Brush kHatchPencil = {2.2, 60};
constexpr Brush kContourPencil = {2.4, 190};
constexpr Brush kHardestLead = {16.0, 228};
constexpr Brush kHardLead = {15.0, 205};
constexpr Brush kMiddleLead = {13.0, 140};
constexpr Brush kSoftLead = {12.0, 40};

// Side of the lead: low enough that the pen broadens fully.
constexpr double kLeaning = 38.0;

std::function<double(double, Point)> steady(double pressure) {
  return [pressure](double, Point) { return pressure; };
}

// A stroke flicked from the wrist: it lands firmly and lifts while it still moves.
std::function<double(double, Point)> flick(double pressure) {
  return [pressure](double along, Point) { return pressure * (1.0 - 0.55 * ramp(0.45, 1.0, along)); };
}

// Writing: the fingers press when they pull down and ease when they push up.
std::function<double(double, Point)> writing(double pressure) {
  return [pressure](double, Point way) { return pressure + (way.y > 0.0 ? 0.20 : 0.13) * way.y; };
}

void writeLine(Hand& hand, const std::string& text, const Lettering& lettering, const Touch& touch) {
  for (const PenPass& pass : write(text, lettering)) hand.draw(smooth(pass), touch);
}

// A straight line as a hand draws it: bowed a little, to the left of its way when `bow` is positive.
Polyline stroke(Point from, Point to, double bow = 0.0) {
  const Point way = to - from;
  const Point left = {way.y, way.x * -1.0};
  const Point middle = mix(from, to, 0.5) + left * bow;
  return smooth(std::vector<Point>{from, mix(mix(from, middle, 0.5), mix(middle, to, 0.5), 0.25), middle,
                                   mix(mix(from, middle, 0.5), mix(middle, to, 0.5), 0.75), to});
}

// ---- hatching ----

struct Hatch {
  double angle;    // compass heading of the strokes, degrees
  double spacing;  // units between two of them
  double bow = 0.0;
  double ragged = 3.0;  // how unevenly the strokes end, in units
};

// Covers what `inside` admits, within `reach` of `centre`, with strokes of one direction.
void hatch(Hand& hand, Point centre, double reach, const std::function<bool(Point)>& inside, const Hatch& how,
           const Touch& touch) {
  const Point way = heading(how.angle);
  const Point across = heading(how.angle + 90.0);
  for (double offset = -reach; offset <= reach; offset += how.spacing * hand.random().around(1.0, 0.22)) {
    double start = 0.0;
    bool open = false;
    for (double place = -reach; place <= reach; place += 1.0) {
      const bool here = place + 1.0 <= reach && inside(centre + across * offset + way * place);
      if (here && !open) start = place;
      if (!here && open && place - start > 7.0) {
        const double from = start + hand.random().around(0.0, how.ragged);
        const double to = place + hand.random().around(0.0, how.ragged);
        const Point drift = across * hand.random().around(0.0, how.spacing * 0.12);
        hand.draw(stroke(centre + across * offset + way * from, centre + across * offset + way * to + drift,
                         how.bow + hand.random().around(0.0, 0.012)),
                  touch);
      }
      open = here;
    }
  }
}

std::function<bool(Point)> insidePolygon(std::vector<Point> corners) {
  return [corners](Point at) {
    for (std::size_t i = 0; i < corners.size(); ++i) {
      const Point edge = corners[(i + 1) % corners.size()] - corners[i];
      const Point to = at - corners[i];
      if (edge.x * to.y - edge.y * to.x < 0.0) return false;
    }
    return true;
  };
}

bool insideEllipse(Point at, Point centre, double width, double height) {
  const double x = (at.x - centre.x) / width;
  const double y = (at.y - centre.y) / height;
  return x * x + y * y < 1.0;
}

// ---- the page ----

void title(Hand& hand) {
  Touch touch{.brush = kTitlePencil, .pressure = writing(0.60)};
  touch.speed = 800.0;
  touch.shake = 0.4;
  writeLine(hand, "Qelt pencil", {.origin = {58.0, 138.0}, .height = 51.0, .climb = 0.012}, touch);

  touch.pressure = [](double along, Point) {
    return 0.42 + 0.46 * ramp(0.0, 0.45, along) * ramp(1.0, 0.6, along);
  };
  touch.speed = 700.0;
  hand.draw(smooth(std::vector<Point>{{72.0, 190.0},
                                      {190.0, 177.0},
                                      {350.0, 168.0},
                                      {520.0, 165.0},
                                      {500.0, 174.0},
                                      {436.0, 180.0},
                                      {566.0, 175.0}}),
            touch);
}

void sentence(Hand& hand) {
  Touch touch{.brush = kFinePencil, .pressure = writing(0.56)};
  touch.speed = 420.0;
  touch.shake = 0.2;
  writeLine(hand, "the point writes, the side shades",
            {.origin = {66.0, 240.0}, .height = 18.5, .climb = 0.006}, touch);
}

// From barely touching to all the weight and back, in four widths.
void pressureStudy(Hand& hand, Point corner) {
  double y = corner.y;
  for (const double width : {2.0, 4.0, 8.0, 15.0}) {
    Touch touch{.brush = {width, 0}, .pressure = [](double along, Point) {
                  return 0.30 + 0.62 * ramp(0.05, 0.5, along) * ramp(1.0, 0.62, along);
                }};
    touch.speed = 600.0;
    y += width * 0.5;
    std::vector<Point> line;
    for (int i = 0; i <= 32; ++i) line.push_back({corner.x + 8.0 * i, y + 2.5 * heading(30.0 * i).y});
    hand.draw(smooth(line), touch);
    y += width * 0.5 + 11.0;
  }
}

// Loops run without lifting: heavy down, light up.
void loopStudy(Hand& hand, Point corner) {
  std::vector<Point> line = {{corner.x, corner.y + 30.0}};
  double x = corner.x + 16.0;
  for (int i = 0; i < 9; ++i) {
    const double tall = 17.0 + 3.0 * i;
    const double foot = corner.y + 38.0;
    line.push_back({x + 10.0, foot - tall * 0.9});
    line.push_back({x + 5.0, foot - tall * 1.25});
    line.push_back({x - 3.0, foot - tall * 0.8});
    line.push_back({x - 2.0, foot - tall * 0.1});
    line.push_back({x + 7.0, foot});
    x += 17.0 + 1.4 * i;
  }
  line.push_back({x + 6.0, corner.y + 22.0});
  Touch touch{.brush = {3.2, 0}, .pressure = writing(0.60)};
  touch.speed = 800.0;
  hand.draw(smooth(line), touch);
}

// The same stroke from upright to leaning: between 47 and 45 degrees the pen goes over from its point to its
// side.
void leanStudy(Hand& hand, Point corner) {
  double x = corner.x;
  for (const double elevation : {75.0, 47.0, 46.3, 45.7, 45.0, 40.0}) {
    Touch touch{.brush = {11.0, 0}, .pressure = steady(0.58)};
    touch.elevation = elevation;
    touch.azimuth = 100.0;
    touch.speed = 350.0;
    hand.draw(stroke({x + 7.0, corner.y}, {x - 7.0, corner.y + 66.0}, 0.02), touch);
    x += 40.0;
  }
}

// One wave with the lead lying on its side and always pointing the same way: broad across, narrow along.
void ribbonStudy(Hand& hand, Point corner) {
  std::vector<Point> line;
  for (int i = 0; i <= 54; ++i)
    line.push_back({corner.x + 4.6 * i, corner.y + 18.0 + 18.0 * heading(24.0 * i).y});
  Touch touch{.brush = {13.0, 0}, .pressure = steady(0.72)};
  touch.elevation = kLeaning;
  touch.azimuth = 132.0;
  touch.speed = 380.0;
  hand.draw(smooth(line), touch);
}

// ---- the still life ----

constexpr Point kBall = {712.0, 322.0};
constexpr double kBallRadius = 124.0;

// How dark the ball is at a point, 0 to 1: light from the upper left, and some of it thrown back by the
// ground.
double ballTone(Point at) {
  const Point n = (at - kBall) * (1.0 / kBallRadius);
  const double flat = dot(n, n);
  if (flat > 1.0) return 0.0;
  const double towards = std::sqrt(1.0 - flat);
  const double light = -0.52 * n.x - 0.60 * n.y + 0.61 * towards;
  const double thrownBack =
      0.34 * ramp(0.62, 1.0, 0.55 * n.x + 0.80 * n.y) * ramp(0.75, 1.0, std::sqrt(flat));
  return std::clamp(1.0 - ramp(-0.25, 1.02, light) - thrownBack, 0.0, 1.0);
}

void ball(Hand& hand) {
  // Found with the point, lightly: round, and not quite round again.
  Touch contour{.brush = kContourPencil, .pressure = steady(0.40)};
  contour.speed = 900.0;
  contour.shake = 0.9;
  for (const double start : {200.0, 350.0}) {
    const double wide = kBallRadius + hand.random().around(0.0, 1.0);
    const double high = kBallRadius + hand.random().around(0.0, 1.0);
    std::vector<Point> round;
    for (int i = 0; i <= 20; ++i) {
      const Point way = heading(start + 19.0 * i);
      round.push_back(kBall + Point{way.x * wide, way.y * high});
    }
    hand.draw(smooth(round), contour);
  }

  // Shaded with the side of the lead in passes, each softer and darker than the one before, each staying
  // further inside the shadow. The strokes run up to the right, square to the pencil, and bulge with the
  // form.
  struct Pass {
    Brush brush;
    double threshold, angle, spacing, pressure;
  };
  for (const Pass& pass :
       {Pass{kHardestLead, 0.09, 42.0, 9.0, 0.50}, Pass{kHardestLead, 0.18, 35.0, 8.0, 0.50},
        Pass{kHardLead, 0.28, 50.0, 8.0, 0.50}, Pass{kHardLead, 0.42, 38.0, 8.0, 0.55},
        Pass{kMiddleLead, 0.55, 46.0, 7.5, 0.55}, Pass{kMiddleLead, 0.70, 33.0, 7.5, 0.65},
        Pass{kSoftLead, 0.82, 44.0, 9.0, 0.52}}) {
    Touch side{.brush = pass.brush, .pressure = flick(pass.pressure)};
    side.elevation = kLeaning;
    side.azimuth = pass.angle + 90.0;
    side.speed = 1500.0;
    // The side of the lead is broad: it keeps clear of the contour.
    const auto dark = [&](Point at) {
      return length(at - kBall) < kBallRadius - 8.0 && ballTone(at) > pass.threshold;
    };
    hatch(hand, kBall, kBallRadius, dark, {pass.angle, pass.spacing, -0.10, 5.0}, side);
  }

  // The edge away from the light, darkest where the ball stands.
  contour.brush = kHatchPencil;
  contour.shake = 0.5;
  contour.pressure = [](double along, Point) {
    return 0.40 + 0.42 * ramp(0.2, 0.7, along) * ramp(1.0, 0.75, along);
  };
  std::vector<Point> edge;
  for (int i = 0; i <= 12; ++i) edge.push_back(kBall + heading(75.0 + 12.0 * i) * (kBallRadius - 0.5));
  hand.draw(smooth(edge), contour);
}

void ballShadow(Hand& hand) {
  const auto onGround = [](Point at) { return length(at - kBall) > kBallRadius - 1.0; };
  struct Pass {
    Brush brush;
    Point centre;
    double width, height, spacing, pressure;
  };
  for (const Pass& pass : {Pass{kHardestLead, {774.0, 440.0}, 100.0, 25.0, 7.0, 0.50},
                           Pass{kHardLead, {768.0, 442.0}, 92.0, 20.0, 7.0, 0.55},
                           Pass{kMiddleLead, {758.0, 444.0}, 74.0, 13.0, 7.0, 0.55},
                           Pass{kSoftLead, {738.0, 447.0}, 48.0, 6.0, 6.0, 0.60}}) {
    Touch side{.brush = pass.brush, .pressure = flick(pass.pressure)};
    side.elevation = kLeaning;
    side.azimuth = 170.0;
    side.speed = 1500.0;
    const auto shadow = [&](Point at) {
      return onGround(at) && insideEllipse(at, pass.centre, pass.width, pass.height);
    };
    hatch(hand, pass.centre, pass.width, shadow, {84.0, pass.spacing, 0.0, 6.0}, side);
  }
}

void box(Hand& hand) {
  // Seen from above its near edge: a lit top, a grey left side, a dark right side.
  const Point top = {452.0, 352.0};
  const Point left = {374.0, 392.0};
  const Point right = {546.0, 386.0};
  const Point near = {466.0, 430.0};
  const Point leftFoot = {380.0, 500.0};
  const Point nearFoot = {468.0, 548.0};
  const Point rightFoot = {540.0, 494.0};

  Touch point{.brush = kHatchPencil, .pressure = flick(0.66)};
  point.speed = 1500.0;
  point.shake = 0.3;

  // The shadow on the ground first, with the side of the lead.
  Touch side{.brush = kHardLead, .pressure = flick(0.6)};
  side.elevation = kLeaning;
  side.azimuth = 160.0;
  side.speed = 1500.0;
  const auto shadow = insidePolygon({nearFoot, rightFoot, {640.0, 500.0}, {596.0, 534.0}});
  hatch(hand, {550.0, 525.0}, 100.0, shadow, {74.0, 8.0, 0.0, 5.0}, side);
  side.brush = kMiddleLead;
  const auto core = insidePolygon({nearFoot, rightFoot, {590.0, 502.0}, {540.0, 536.0}});
  hatch(hand, {550.0, 525.0}, 100.0, core, {78.0, 8.0, 0.0, 4.0}, side);

  const auto topFace = insidePolygon({left, top, right, near});
  const auto leftFace = insidePolygon({left, near, nearFoot, leftFoot});
  const auto rightFace = insidePolygon({near, right, rightFoot, nearFoot});
  const Point topCentre = {460.0, 390.0};
  const Point leftCentre = {422.0, 468.0};
  const Point rightCentre = {505.0, 468.0};

  Touch light = point;
  light.pressure = flick(0.5);
  light.brush = {2.0, 130};
  hatch(hand, topCentre, 100.0, topFace, {62.0, 9.0, 0.0, 4.0}, light);

  // The left side: one set of strokes, then a wider one across it.
  hatch(hand, leftCentre, 100.0, leftFace, {28.0, 5.0, 0.02, 3.0}, point);
  light.brush = kHatchPencil;
  hatch(hand, leftCentre, 100.0, leftFace, {74.0, 8.0, 0.02, 3.0}, light);

  // The right side: three sets, and a fourth where it meets the ground.
  point.pressure = flick(0.74);
  hatch(hand, rightCentre, 100.0, rightFace, {24.0, 3.8, 0.02, 2.0}, point);
  hatch(hand, rightCentre, 100.0, rightFace, {140.0, 4.6, 0.0, 2.0}, point);
  hatch(hand, rightCentre, 100.0, rightFace, {2.0, 5.2, 0.0, 2.0}, point);
  const auto foot = [&](Point at) { return rightFace(at) && at.y > 508.0 - (at.x - 505.0) * 0.5; };
  hatch(hand, rightCentre, 100.0, foot, {62.0, 4.0, 0.0, 3.0}, point);

  // The edges last; a hand overshoots its corners.
  Touch edge{.brush = {3.0, 30}, .pressure = steady(0.60)};
  edge.speed = 900.0;
  edge.shake = 0.4;
  const auto line = [&](Point from, Point to, double pressure) {
    edge.pressure = steady(pressure);
    const Point way = (to - from) * (1.0 / length(to - from));
    const double before = hand.random().around(2.0, 2.5);
    const double past = hand.random().around(2.0, 2.5);
    hand.draw(stroke(from - way * before, to + way * past, hand.random().around(0.0, 0.006)), edge);
  };
  line(left, top, 0.45);
  line(top, right, 0.45);
  line(left, near, 0.55);
  line(near, right, 0.60);
  line(left, leftFoot, 0.60);
  line(near, nearFoot, 0.72);
  line(right, rightFoot, 0.62);
  line(leftFoot, nearFoot, 0.78);
  line(nearFoot, rightFoot, 0.82);
}

// A soft darkness behind the ball's bright side: that is what makes it come forward.
void background(Hand& hand) {
  Touch side{.brush = kHardLead, .pressure = flick(0.5)};
  side.elevation = kLeaning;
  side.azimuth = 128.0;
  side.speed = 1500.0;
  const auto behind = [](Point at) {
    return length(at - kBall) > kBallRadius + 8.0 && insideEllipse(at, {632.0, 262.0}, 105.0, 76.0);
  };
  hatch(hand, {632.0, 262.0}, 106.0, behind, {38.0, 10.0, 0.02, 9.0}, side);
  const auto nearer = [](Point at) {
    return length(at - kBall) > kBallRadius + 8.0 && insideEllipse(at, {632.0, 272.0}, 74.0, 54.0);
  };
  hatch(hand, {632.0, 272.0}, 90.0, nearer, {46.0, 10.0, 0.02, 9.0}, side);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::cerr << "usage: make-sample FILE\n";
    return 2;
  }
  try {
    Page page;
    Hand hand(page, 20);
    title(hand);
    sentence(hand);
    pressureStudy(hand, {66.0, 286.0});
    loopStudy(hand, {66.0, 380.0});
    leanStudy(hand, {82.0, 452.0});
    ribbonStudy(hand, {72.0, 556.0});
    background(hand);
    ball(hand);
    ballShadow(hand);
    box(hand);
    std::ofstream file(argv[1], std::ios::binary);
    file << page.inkml();
    file.close();
    if (!file) throw std::runtime_error(std::string(argv[1]) + ": cannot be written");
  } catch (const std::exception& error) {
    std::cerr << "make-sample: " << error.what() << "\n";
    return 1;
  }
}
