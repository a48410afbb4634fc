#pragma once

#include <memory>

#include "desktop/model/StoredStroke.h"

namespace QeltBench {

// A stored stroke of a waving line with changing pressure, 10 units from point to point.
std::unique_ptr<QeltDesktop::StoredStroke> makeStroke(int points, float x, float y);

}  // namespace QeltBench
