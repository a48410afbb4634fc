#include "Page.h"

#include <cmath>
#include <cstddef>
#include <cstdio>
#include <utility>

namespace {

std::string brushName(const Brush& brush) {
  char name[64];
  std::snprintf(name, sizeof name, "w%d-t%d", static_cast<int>(std::lround(brush.width * 10.0)),
                brush.transparency);
  return name;
}

}  // namespace

void Page::add(const Brush& brush, std::vector<Sample> samples) {
  const double seconds = static_cast<double>(samples.size()) / kRate;
  mTraces.push_back({brush, mClock, std::move(samples)});
  mClock += seconds;
}

std::string Page::inkml() const {
  std::string text =
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
      "<!-- The sample page of the Qelt pencil. It is the project's own and under the project's licence: "
      "made by\n"
      "     tools/make-sample, not drawn by hand. Pressure, elevation, azimuth and time are what a tablet "
      "with 240\n"
      "     reports a second would say. Do not edit; change the program and run it again. -->\n"
      "<ink xmlns=\"http://www.w3.org/2003/InkML\">\n"
      "  <annotation type=\"title\">Qelt pencil</annotation>\n"
      "  <traceFormat>\n"
      "    <channel name=\"X\" type=\"decimal\"/>\n"
      "    <channel name=\"Y\" type=\"decimal\"/>\n"
      "    <channel name=\"F\" type=\"decimal\" min=\"0\" max=\"1\"/>\n"
      "    <channel name=\"OE\" type=\"decimal\" units=\"deg\"/>\n"
      "    <channel name=\"OA\" type=\"decimal\" units=\"deg\"/>\n"
      "    <channel name=\"T\" type=\"integer\" units=\"ms\"/>\n"
      "  </traceFormat>\n";

  std::vector<std::string> known;
  for (const Trace& trace : mTraces) {
    const std::string name = brushName(trace.brush);
    bool isNew = true;
    for (const std::string& other : known) isNew = isNew && other != name;
    if (!isNew) continue;
    known.push_back(name);
    char lines[400];
    std::snprintf(lines, sizeof lines,
                  "  <brush xml:id=\"%s\">\n"
                  "    <brushProperty name=\"width\" value=\"%.1f\"/>\n"
                  "    <brushProperty name=\"color\" value=\"#202020\"/>\n"
                  "    <brushProperty name=\"transparency\" value=\"%d\"/>\n"
                  "  </brush>\n",
                  name.c_str(), trace.brush.width, trace.brush.transparency);
    text += lines;
  }

  text += "  <traceGroup>\n    <annotation type=\"tool\">stylus</annotation>\n";
  for (const Trace& trace : mTraces) {
    text += "    <trace brushRef=\"#" + brushName(trace.brush) + "\">";
    for (std::size_t i = 0; i < trace.samples.size(); ++i) {
      const Sample& sample = trace.samples[i];
      const double milliseconds = (trace.start + static_cast<double>(i) / kRate) * 1000.0;
      char point[128];
      std::snprintf(point, sizeof point, "%s%.2f %.2f %.3f %.1f %.0f %ld", i == 0 ? "" : ", ", sample.x,
                    sample.y, sample.pressure, sample.elevation, sample.azimuth, std::lround(milliseconds));
      text += point;
    }
    text += "</trace>\n";
  }
  text += "  </traceGroup>\n</ink>\n";
  return text;
}
