#pragma once

namespace Qelt {

// Whether the pen is down: moves and ups count only after a down. A down restarts at any time; a cancel
// leaves the state as it is, so that the next move goes on with the stroke.
class StrokeState {
 public:
  void down() { mDown = true; }
  bool takesMoves() const { return mDown; }
  // Whether there is a stroke to end.
  bool up() {
    const bool wasDown = mDown;
    mDown = false;
    return wasDown;
  }

 private:
  bool mDown = false;
};

}  // namespace Qelt
