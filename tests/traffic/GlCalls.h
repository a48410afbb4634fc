#pragma once

#include <set>
#include <string>
#include <vector>

namespace QeltTests {

// Every GL call that the host's libraries make in this program is noted on its way to GL.

// The names of the calls since the last time, in order. Any thread.
std::vector<std::string> takeGlCalls();
// The names of all that are noted.
const std::set<std::string>& countedGlCalls();

}  // namespace QeltTests
