#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstddef>
#include <cstdio>
#include <exception>
#include <new>
#include <string>
#include <variant>

#include "commands/CommandLine.h"
#include "commands/Commands.h"
#include "output/Terminal.h"
#include "text/Refusal.h"

namespace {

// Opens the standard descriptors that are closed, so that no file opened later becomes standard output or
// error, where others write. Reading and writing them fails, as it would on a closed descriptor.
void fillStandardDescriptors() {
  constexpr int kModes[] = {O_WRONLY, O_RDONLY, O_WRONLY};
  for (int number = STDIN_FILENO; number <= STDERR_FILENO; ++number) {
    if (fcntl(number, F_GETFD) < 0) open("/dev/null", kModes[number]);
  }
}

int endNotDone(const std::string& line) {
  std::fprintf(stderr, "%s\n", QeltDesktop::printable(line).c_str());
  return 1;
}

int end(const QeltDesktop::UsageEnd& usage) {
  if (usage.status != 0) {
    std::string shown;
    for (std::size_t start = 0; start < usage.text.size();) {
      const std::size_t lineEnd = std::min(usage.text.find('\n', start), usage.text.size());
      shown += QeltDesktop::printable(usage.text.substr(start, lineEnd - start)) + '\n';
      start = lineEnd + 1;
    }
    std::fputs(shown.c_str(), stderr);
    return usage.status;
  }
  std::fputs(usage.text.c_str(), stdout);
  QeltDesktop::finishStandardOutput();
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  fillStandardDescriptors();
  // Writing beyond the allowed file size then fails like writing to a full disk.
  std::signal(SIGXFSZ, SIG_IGN);
  try {
    const std::variant<QeltDesktop::Options, QeltDesktop::UsageEnd> parsed =
        QeltDesktop::parseOptions(argc, argv);
    if (const auto* const usage = std::get_if<QeltDesktop::UsageEnd>(&parsed)) return end(*usage);
    return QeltDesktop::runCommand(std::get<QeltDesktop::Options>(parsed));
  } catch (const std::bad_alloc&) {
    std::fputs("qelt-sketch: out of memory\n", stderr);
    return 1;
  } catch (const QeltDesktop::WrongUsage& wrong) {
    return end(wrong.end());
  } catch (const QeltDesktop::Refusal& refusal) {
    return endNotDone(refusal.what());
  } catch (const std::exception& error) {
    return endNotDone(std::string("qelt-sketch: ") + error.what());
  } catch (...) {
    // A plug-in may throw anything.
    return endNotDone("qelt-sketch: stopped by an exception of unknown type");
  }
}
