#pragma once

#include <string>
#include <vector>

namespace QeltTests {

// What a command prints on its standard output. Its failure is a failure of the test.
std::vector<std::string> linesOf(const std::string& command);

}  // namespace QeltTests
