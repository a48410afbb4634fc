#include "base/Error.h"

namespace Qelt {

namespace {

thread_local unsigned long tLastError = 0;

}  // namespace

void Error::SetError(unsigned long code) {
  tLastError = code;
}

unsigned long Error::GetError() {
  return tLastError;
}

}  // namespace Qelt
