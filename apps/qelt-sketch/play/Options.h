#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "pen/RenderingVersions.h"

namespace QeltDesktop {

enum class Command { Draw, Trace, Preview, Sheet, Info, Compare };
// How strokes reach the plug-in: event by event, as one recorded event, or as a stored stroke.
enum class Mode { Live, Event, Stroke };
enum class DrawableKind { Stroke, Outline, Preview, Prediction };

// Their words on the command line, in the files that the program writes, and in its messages.
constexpr std::array<std::pair<const char*, Mode>, 3> kModeNames{
    {{"live", Mode::Live}, {"event", Mode::Event}, {"stroke", Mode::Stroke}}};
constexpr std::array<std::pair<const char*, DrawableKind>, 4> kDrawableNames{
    {{"stroke", DrawableKind::Stroke},
     {"outline", DrawableKind::Outline},
     {"preview", DrawableKind::Preview},
     {"prediction", DrawableKind::Prediction}}};

template <typename Names, typename Value>
constexpr const char* nameIn(const Names& names, Value value) {
  for (const auto& [name, named] : names) {
    if (named == value) return name;
  }
  return "";
}
constexpr const char* nameOf(Mode mode) {
  return nameIn(kModeNames, mode);
}
constexpr const char* nameOf(DrawableKind drawable) {
  return nameIn(kDrawableNames, drawable);
}

struct PageSize {
  float width, height;  // stroke units, above 0
};

struct PixelSize {
  int width, height;  // above 0
};

struct Background {
  std::uint32_t rgb = 0xFFFFFF;  // 0xRRGGBB
  bool transparent = false;
};

struct OutlineOptions {
  float size;  // stroke units; any float
  std::uint32_t argb;

  bool operator==(const OutlineOptions&) const = default;
};

// What holds where neither the command line nor the stroke says anything.
constexpr int kUsualRenderingVersion = Qelt::kRenderingVersions.back().number;
constexpr bool kUsualCurve = true;

// What `compare` is asked for: two pictures or two folders.
struct CompareOptions {
  std::string before, after;
  int tolerance = 0;                  // levels of 255 by which pixels may differ
  std::optional<std::string> output;  // a picture of what differs, or a folder for such
};

// What the command line asks for. The defaults stand here alone; the help takes them from here.
struct Options {
  // As it was written, to be read once more over what a picture says.
  std::vector<std::string> commandLine;

  Command command = Command::Draw;
  std::optional<std::string> input;   // none: the sample page
  std::string output;                 // "-": standard output
  bool ink = true;                    // the picture carries the page that it shows
  std::optional<std::string> plugin;  // none: the one built with the program
  bool log = false;                   // show the platform log

  std::optional<int> renderingVersion;  // none: the stroke's. Any number: the pen knows what to do
  std::optional<float> size;            // none: the brush's, else the pen's own. Any float: the pen checks it
  std::optional<std::uint32_t> argb;
  std::optional<bool> curve;  // none: the stroke's

  Mode mode = Mode::Live;
  int samplesPerMove = 4;     // in live mode, at least 1
  std::optional<int> tool;    // Qelt::ToolType; none: the stroke's, else a stylus
  std::optional<int> source;  // none: the tool's
  int repeat = 1;
  std::optional<int> points;
  int predict = 0;  // samples; 0 is off
  float opacity = 0.5f;
  std::optional<OutlineOptions> outline;  // none: the stroke's

  float zoom = 1.0f;             // canvas pixels per stroke unit; finite, above 0
  std::optional<PixelSize> fit;  // as large as the page comes out within it, instead of the zoom
  float rotate = 0.0f;           // degrees clockwise, finite
  std::optional<PageSize> page;
  Background background;

  DrawableKind drawable = DrawableKind::Stroke;

  CompareOptions compare;
};

}  // namespace QeltDesktop
