#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <utility>

#include "desktop/engine/PluginLibrary.h"
#include "desktop/pencommon/PenDataManager.h"
#include "ink/Ink.h"
#include "pencommon/Pen.h"
#include "play/Options.h"

namespace QeltDesktop {

class RenderQueue;

// Size and colour of one stroke.
struct PenStyle {
  float size;  // stroke units
  std::uint32_t argb;
};

// What the command line gives wins over the brush, and the brush over the pen's own style. A brush may name a
// colour, a transparency, or both.
PenStyle styleFor(const Brush& brush, const PenStyle& own, const Options& options);

// In the same way: what the command line gives, else the brush, else what is usual. An outline takes a size;
// its colour is opaque black where the brush has none. No outline unless one of them asks for it.
int renderingVersionFor(const Brush& brush, const Options& options);
bool curveFor(const Brush& brush, const Options& options);
std::optional<OutlineOptions> outlineFor(const Brush& brush, const Options& options);

// What a pen is made for. Strokes of different kinds are drawn by different pens, since what a pen remembers
// of one stroke reaches into the next: its grain, and the width that an outline begins with.
struct PenKind {
  int renderingVersion;  // any number: the pen knows what to do
  bool curve;            // smooth segments

  bool operator<(const PenKind& other) const {
    return std::pair(renderingVersion, curve) < std::pair(other.renderingVersion, other.curve);
  }
};
PenKind penKindFor(const Brush& brush, const Options& options);

// One pen of the plug-in, set up as a host does it, and its way to the render thread. Main thread. The queue,
// and every canvas that one of the pen's drawables was given, outlive it.
class PenSession {
 public:
  // Throws Refusal when the plug-in makes no pen.
  PenSession(const PluginLibrary& plugin, RenderQueue& queue, const PenKind& kind);
  // Deletes the pen and waits for its last tasks.
  ~PenSession();
  PenSession(const PenSession&) = delete;
  PenSession& operator=(const PenSession&) = delete;

  Qelt::Pen& pen() { return *mPen; }
  // The style of a new pen.
  const PenStyle& ownStyle() const { return mOwnStyle; }
  // Applies to the strokes from now on.
  void setStyle(const PenStyle& style);

 private:
  RenderQueue& mQueue;
  PenDataManager mDataManager;
  std::unique_ptr<Qelt::Pen> mPen;
  PenStyle mOwnStyle;
};

// A pen for each kind of which a page has strokes. Like a session, and as long-lived.
class PenSet {
 public:
  // Throws Refusal when the plug-in makes no pen.
  PenSet(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options);

  const std::map<PenKind, std::unique_ptr<PenSession>>& sessions() const { return mSessions; }
  // Of a stroke of the page.
  PenSession& of(const PenKind& kind) const { return *mSessions.at(kind); }

 private:
  std::map<PenKind, std::unique_ptr<PenSession>> mSessions;
};

}  // namespace QeltDesktop
