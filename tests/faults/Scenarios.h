#pragma once

#include <string>
#include <vector>

#include "Stage.h"

namespace QeltTests {

// What a host does while something fails.
struct Scenario {
  const char* name;
  void (*run)(Stage&);
  bool everyVersion = false;  // or version 8 alone; of pictures, every version that draws its own way
  bool picture = false;       // or no GL
};

// Where a pen dies, it dies with work queued. Those with a picture: textures, shaders, buffers; loss of the
// context.
std::vector<Scenario> scenarios();

// The one of that name.
Scenario scenario(const std::string& name);

}  // namespace QeltTests
