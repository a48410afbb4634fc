#include "core/InkmlStrokes.h"

#include <cstddef>

#include "engine/MotionEvent.h"
#include "ink/InkmlReader.h"
#include "ink/SourceText.h"
#include "play/Options.h"
#include "play/PenSession.h"
#include "text/Refusal.h"

namespace QeltDesktop {

PageStyle styleOf(const Stroke& stroke, const PenLimits& own) {
  const Options none;
  const PenStyle asDrawn = styleFor(stroke.brush, {own.size, own.argb}, none);
  const PenKind kind = penKindFor(stroke.brush, none);
  PageStyle style;
  style.size = asDrawn.size;
  style.argb = asDrawn.argb;
  style.look = kind.renderingVersion;
  style.smooth = kind.curve;
  if (const auto outline = outlineFor(stroke.brush, none)) style.outline = {outline->size, outline->argb};
  const int tool = stroke.tool.value_or(Qelt::kToolStylus);
  // A pen draws every other tool as it draws a stylus.
  style.tool = tool == Qelt::kToolFinger || tool == Qelt::kToolMouse ? tool : Qelt::kToolStylus;
  checkStyle(style);
  return style;
}

std::vector<std::unique_ptr<PageStroke>> readStrokes(std::span<const std::uint8_t> bytes,
                                                     const std::string& name, StrokeId first,
                                                     const PenLimits& own) {
  const Page page =
      readInkml(SourceText(printable(name), std::string(bytes.begin(), bytes.end())), kFarthest);
  std::vector<std::unique_ptr<PageStroke>> strokes;
  strokes.reserve(page.strokes.size());
  for (const Stroke& stroke : page.strokes) {
    const std::string where = page.name + ": trace " + std::to_string(strokes.size() + 1) + ": ";
    std::vector<Sample> samples;
    samples.reserve(stroke.samples.size());
    for (const Sample& sample : stroke.samples) {
      if (!isUsable(sample)) throw Refusal(where + "a sample's time is out of range");
      samples.push_back(sample);
    }
    try {
      strokes.push_back(std::make_unique<PageStroke>(first + static_cast<StrokeId>(strokes.size()),
                                                     styleOf(stroke, own), samples));
    } catch (const Refusal& reason) {
      throw Refusal(where + reason.what());
    }
  }
  return strokes;
}

}  // namespace QeltDesktop
