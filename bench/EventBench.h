#pragma once

#include <string>

namespace QeltBench {

// Draws a recording live, one sample an event, and prints what an event costs the main thread: median and
// 99th percentile, microseconds. Throws std::runtime_error when the ink cannot be read.
void reportEvents(const std::string& inkPath);

// Draws one stroke of 100,000 points and prints the median cost of its first and its last thousand events.
void reportLongStroke();

}  // namespace QeltBench
