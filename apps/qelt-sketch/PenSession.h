#pragma once

#include <cstdint>
#include <memory>

#include "Ink.h"
#include "Options.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/pencommon/PenDataManager.h"
#include "pencommon/Pen.h"

namespace QeltDesktop {

class RenderQueue;

// Size and colour of one stroke.
struct PenStyle {
  float size;  // stroke units
  std::uint32_t argb;
};

// The command line wins over the brush, the brush over the pen's own style; a brush may name a colour, a
// transparency, or both.
PenStyle styleFor(const Brush& brush, const PenStyle& own, const Options& options);

// One pen of the plug-in, set up as a host does, and its way to the render thread. Main thread. The queue,
// and every canvas that the pen's drawables were given, outlive it.
class PenSession {
 public:
  // Throws std::runtime_error when the plug-in gives no pen.
  PenSession(const PluginLibrary& plugin, RenderQueue& queue, const Options& options);
  // Deletes the pen and waits for its last tasks.
  ~PenSession();
  PenSession(const PenSession&) = delete;
  PenSession& operator=(const PenSession&) = delete;

  Qelt::Pen& pen() { return *mPen; }
  // What the pen had when it was new.
  const PenStyle& ownStyle() const { return mOwnStyle; }
  // For the strokes from now on.
  void setStyle(const PenStyle& style);

 private:
  RenderQueue& mQueue;
  PenDataManager mDataManager;
  std::unique_ptr<Qelt::Pen> mPen;
  PenStyle mOwnStyle;
};

}  // namespace QeltDesktop
