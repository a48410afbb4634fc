#include "support/Command.h"

#include <gtest/gtest.h>
#include <stdio.h>

namespace QeltTests {

std::vector<std::string> linesOf(const std::string& command) {
  std::vector<std::string> lines(1);
  FILE* const output = popen(("LC_ALL=C " + command).c_str(), "r");
  for (int byte; (byte = fgetc(output)) != EOF;) {
    if (byte != '\n')
      lines.back() += static_cast<char>(byte);
    else
      lines.emplace_back();
  }
  EXPECT_EQ(pclose(output), 0) << command;
  lines.pop_back();
  return lines;
}

}  // namespace QeltTests
