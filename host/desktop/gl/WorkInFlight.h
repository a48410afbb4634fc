#pragma once

#include <cstddef>

#include "desktop/gl/GpuFence.h"

namespace QeltDesktop {

// Keeps what a thread's tasks have had drawn from getting further and further ahead of the GPU, which holds
// the vertices, and with a software renderer much more for each, until it has drawn them. Render thread.
class WorkInFlight {
 public:
  // A task has ended: waits for the GPU while it is further behind than it may be.
  void taskEnded();

 private:
  // Vertices between two points to wait for; up to twice as many are in flight, and those of one task more.
  static constexpr std::size_t kMostBytes = std::size_t{1} << 19;

  std::size_t mBytes = 0;  // since the newest point
  GpuFence mPoints[2];
  std::size_t mOldest = 0;
};

}  // namespace QeltDesktop
