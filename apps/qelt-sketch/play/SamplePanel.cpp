#include "play/SamplePanel.h"

#include <cmath>
#include <numbers>
#include <optional>

namespace QeltDesktop {

Page samplePanel() {
  constexpr int kSamples = 160;
  constexpr double kInset = 50.0, kSwing = 42.0;        // stroke units
  constexpr double kLightest = 0.15, kHeaviest = 0.75;  // pressure
  constexpr double kMostTilt = 0.55;                    // radians
  Page page{.name = "the sample stroke", .strokes = {}};
  for (int i = 0; i < kSamples; ++i) {
    const double along = static_cast<double>(i) / (kSamples - 1);
    const double swell = std::pow(std::sin(along * std::numbers::pi), 2.0);
    Sample sample;
    sample.x = static_cast<float>(kInset + along * (kPanelWidth - 2.0 * kInset));
    sample.y = static_cast<float>(kPanelHeight / 2.0 - kSwing * std::sin(along * 2.0 * std::numbers::pi));
    sample.pressure = static_cast<float>(kLightest + (kHeaviest - kLightest) * swell);
    sample.tilt = static_cast<float>(kMostTilt * swell);
    sample.time = i * 1000.0 / 240.0;
    page.strokes.addSample(sample);
  }
  page.strokes.finishStroke(kNoNumber, std::nullopt);
  return page;
}

}  // namespace QeltDesktop
