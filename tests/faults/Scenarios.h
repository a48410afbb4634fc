#pragma once

#include <vector>

#include "Stage.h"

namespace QeltTests {

// What a host does while something fails.
struct Scenario {
  const char* name;
  void (*run)(Stage&);
  bool everyVersion;  // or version 8 alone
};

// Those that need no GL. Where a pen dies, it dies with work queued.
std::vector<Scenario> scenarios();
// Those with a picture: textures, shaders, buffers; loss of the context.
std::vector<Scenario> pictureScenarios();

}  // namespace QeltTests
