#include <cmath>
#include <numbers>

#include "Commands.h"
#include "Ink.h"
#include "OutputFile.h"
#include "PageDrawing.h"
#include "PageLayout.h"
#include "Picture.h"
#include "ProgramFiles.h"
#include "Progress.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"

namespace QeltDesktop {
namespace {

// The panel, in stroke units and pixels a unit.
constexpr float kPanelWidth = 480.0f;
constexpr float kPanelHeight = 160.0f;
constexpr float kPanelZoom = 1.0f;
constexpr int kSamples = 160;

// A lying S that swells: pressed harder and leant further towards its middle.
Page samplePanel() {
  constexpr double kInset = 50.0, kSwing = 42.0;        // stroke units
  constexpr double kLightest = 0.15, kHeaviest = 0.75;  // pressure
  constexpr double kMostTilt = 0.55;                    // radians
  Page page;
  for (int i = 0; i < kSamples; ++i) {
    const double along = static_cast<double>(i) / (kSamples - 1);
    const double swell = std::pow(std::sin(along * std::numbers::pi), 2.0);
    Sample sample;
    sample.x = static_cast<float>(kInset + along * (kPanelWidth - 2.0 * kInset));
    sample.y = static_cast<float>(kPanelHeight / 2.0 - kSwing * std::sin(along * 2.0 * std::numbers::pi));
    sample.pressure = static_cast<float>(kLightest + (kHeaviest - kLightest) * swell);
    sample.tilt = static_cast<float>(kMostTilt * swell);
    sample.time = i * 1000.0 / 240.0;
    page.traces.addSample(sample);
  }
  page.traces.finishTrace(kNoNumber, std::nullopt);
  return page;
}

}  // namespace

void previewCommand(const Options& asked) {
  Options options = asked;
  options.mode = Mode::Event;
  OutputFile file(options.output);
  const PluginLibrary plugin(pluginPath(options));
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);
  Progress progress("drawing stroke", 1);
  const PageLayout layout = layOut({0.0f, 0.0f, kPanelWidth, kPanelHeight}, kPanelZoom, 0.0f);
  const Picture picture =
      drawPage(plugin, queue, samplePanel(), options, layout, {.preview = true}, progress);
  file.write(encodePng(picture));
  file.commit();
}

}  // namespace QeltDesktop
