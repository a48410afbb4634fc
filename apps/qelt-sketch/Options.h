#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>

namespace QeltDesktop {

enum class Command { Draw, Trace, Preview, Sheet, Info };
// How strokes reach the plug-in: event by event, as one recorded event, or as a stored stroke.
enum class Mode { Live, Event, Stroke };
enum class DrawableKind { Stroke, Outline, Preview, Prediction };

struct PageSize {
  float width, height;  // stroke units, above 0
};

struct Background {
  std::uint32_t rgb = 0xFFFFFF;  // 0xRRGGBB
  bool transparent = false;
};

struct OutlineOptions {
  float size;  // stroke units; any float
  std::uint32_t argb;
};

// What the command line asks for.
struct Options {
  Command command = Command::Draw;
  std::optional<std::string> input;   // none: the sample page
  std::string output;                 // "-": standard output
  std::optional<std::string> plugin;  // none: the one built with the program
  bool log = false;                   // show the platform log

  int renderingVersion = 8;
  std::optional<float> size;  // any float: the pen has its own opinion of NaN
  std::optional<std::uint32_t> argb;
  bool curve = true;

  Mode mode = Mode::Live;
  int batch = 4;
  std::optional<int> tool;  // Qelt::ToolType
  std::optional<int> source;
  int repeat = 1;
  std::optional<int> points;
  int predict = 0;  // samples; 0 is off
  float opacity = 0.5f;
  std::optional<OutlineOptions> outline;

  float zoom = 1.0f;    // finite, above 0
  float rotate = 0.0f;  // degrees clockwise, finite
  std::optional<PageSize> page;
  Background background;

  DrawableKind drawable = DrawableKind::Stroke;
};

// The program ends at once: what to print, and with which status. Help goes to standard output (status 0),
// wrong usage to standard error (status 2).
struct UsageEnd {
  std::string text;
  int status;
};

std::variant<Options, UsageEnd> parseOptions(int argc, const char* const* argv);

// Their words on the command line.
const char* nameOf(Mode mode);
const char* nameOf(DrawableKind drawable);

}  // namespace QeltDesktop
