#pragma once

#include <string>
#include <vector>

namespace QeltTests {

struct LogLine {
  int priority;  // the platform log's: 3 debug, 4 info, 6 error
  std::string tag;
  std::string text;
};

// While one lives, the platform log goes into it instead of to stderr. One at a time. Any thread may log.
class LogCapture {
 public:
  LogCapture();
  ~LogCapture();
  LogCapture(const LogCapture&) = delete;
  LogCapture& operator=(const LogCapture&) = delete;

  // What was logged since the last call, in order.
  std::vector<LogLine> take();

 private:
  int mMinimumPriority;
};

}  // namespace QeltTests
