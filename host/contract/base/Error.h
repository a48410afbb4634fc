#pragma once

#include "base/HostApi.h"

namespace Qelt {

// The host's error code of the last failed call, one a thread.
class QELT_HOST_API Error {
 public:
  // Invalid argument: a null event, rectangle or stroke, or an empty stroke.
  static constexpr unsigned long kInvalidArgument = 7;

  static void SetError(unsigned long code);
  // The last code set on this thread, 0 when none was. Chosen here: reading it leaves it.
  static unsigned long GetError();
};

}  // namespace Qelt
