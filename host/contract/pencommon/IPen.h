#pragma once

namespace Qelt {

// The names pens and hosts share.
class IPen {
 public:
  // What a host may ask of a pen. The names belong to the host; only the numbers are used here.
  enum PenAttribute : int {
    kAttribute0 = 0,
    kAttribute1 = 1,
    kAttribute2 = 2,
    kAttribute3 = 3,
    kAttribute4 = 4,
  };
};

}  // namespace Qelt
