#pragma once

#include "base/HostApi.h"

namespace Qelt {

// Names of the host's pen types.
class QELT_HOST_API PenManager {
 public:
  static const char* const QELT_PENCIL2_NAME;
};

}  // namespace Qelt
