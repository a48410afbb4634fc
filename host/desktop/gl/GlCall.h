#pragma once

#include <GLES3/gl3.h>

#include "base/HostApi.h"

namespace QeltDesktop {

// Logs every error GL has noted since the last call. Render thread.
QELT_HOST_API void reportGlErrors(const char* file, int line);

// Clears every error GL has noted since the last call; returns true when there was none. Render thread.
QELT_HOST_API bool takeGlErrors();

#ifdef NDEBUG

// A GL function, ready to be called: gl(glBindBuffer)(GL_ARRAY_BUFFER, name).
template <typename Result, typename... Parameters>
constexpr auto gl(Result(GL_APIENTRY* function)(Parameters...)) {
  return function;
}

#else

// The same in debug builds: after each call GL is asked for errors, which are logged with the place.
template <typename Result, typename... Parameters>
class CheckedGlCall {
 public:
  CheckedGlCall(Result(GL_APIENTRY* function)(Parameters...), const char* file, int line)
      : mFunction(function), mFile(file), mLine(line) {}
  ~CheckedGlCall() { reportGlErrors(mFile, mLine); }
  CheckedGlCall(const CheckedGlCall&) = delete;
  CheckedGlCall& operator=(const CheckedGlCall&) = delete;

  Result operator()(Parameters... arguments) const { return mFunction(arguments...); }

 private:
  Result(GL_APIENTRY* mFunction)(Parameters...);
  const char* mFile;
  int mLine;
};

template <typename Result, typename... Parameters>
CheckedGlCall<Result, Parameters...> gl(Result(GL_APIENTRY* function)(Parameters...),
                                        const char* file = __builtin_FILE(), int line = __builtin_LINE()) {
  return {function, file, line};
}

#endif

}  // namespace QeltDesktop
