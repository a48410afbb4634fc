#include "traffic/GlCalls.h"

#include <GLES3/gl3.h>
#include <dlfcn.h>

#include <mutex>
#include <utility>

namespace QeltTests {
namespace {

std::mutex gLock;
std::vector<std::string> gCalls;
std::set<std::string>& listed() {
  static std::set<std::string> names;
  return names;
}

void* list(const char* name) {
  listed().insert(name);
  return nullptr;
}

void note(const char* name) {
  const std::lock_guard guard(gLock);
  gCalls.emplace_back(name);
}

}  // namespace

std::vector<std::string> takeGlCalls() {
  const std::lock_guard guard(gLock);
  return std::exchange(gCalls, {});
}

const std::set<std::string>& countedGlCalls() {
  return listed();
}

}  // namespace QeltTests

// The program's functions come before the library's of the same name, for the host's libraries as well.
#define COUNTED(Result, name, parameters, arguments)                                           \
  [[maybe_unused]] static void* const listed_##name = QeltTests::list(#name);                  \
  extern "C" __attribute__((visibility("default"))) Result GL_APIENTRY name parameters {       \
    using Function = Result(GL_APIENTRY*) parameters; /* NOLINT(bugprone-macro-parentheses) */ \
    static const auto next = reinterpret_cast<Function>(dlsym(RTLD_NEXT, #name));              \
    QeltTests::note(#name);                                                                    \
    return next arguments;                                                                     \
  }
#include "CountedGlCalls.h"
