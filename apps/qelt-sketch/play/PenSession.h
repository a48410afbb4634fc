#pragma once

#include <cstdint>
#include <memory>

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

// One pen of the plug-in, set up as a host does it, and its way to the render thread. Main thread. The queue,
// and every canvas that one of the pen's drawables was given, outlive it.
class PenSession {
 public:
  // Throws Refusal when the plug-in makes no pen.
  PenSession(const PluginLibrary& plugin, RenderQueue& queue, const Options& options);
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

}  // namespace QeltDesktop
