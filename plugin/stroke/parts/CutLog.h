#pragma once

#include "log/Log.h"

namespace Qelt {

// Says once a stroke that a walk gave up before its segment's end.
class CutLog {
 public:
  void restart() { mLogged = false; }

  void note(const char* drawable, float length) {
    if (mLogged) return;
    mLogged = true;
    __android_log_print(kLogError, kLogTag, "%s: a segment of length %f was cut short", drawable,
                        static_cast<double>(length));
  }

 private:
  bool mLogged = false;
};

}  // namespace Qelt
