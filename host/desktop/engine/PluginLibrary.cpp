#include "desktop/engine/PluginLibrary.h"

#include <dlfcn.h>

#include <stdexcept>

namespace QeltDesktop {

PluginLibrary::PluginLibrary(const std::string& path)
    : mPath(path), mHandle(dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL | RTLD_NODELETE)) {
  if (mHandle == nullptr) {
    const char* const reason = dlerror();
    throw std::runtime_error("cannot load the pen plug-in: " +
                             std::string(reason != nullptr ? reason : path.c_str()));
  }
  mCreatePen = reinterpret_cast<CreatePen>(symbol("createPenInst"));
  if (mCreatePen == nullptr) throw std::runtime_error(path + " is no pen plug-in: it has no createPenInst");
  Dl_info where{};
  if (dladdr(reinterpret_cast<void*>(mCreatePen), &where) != 0 && where.dli_fname != nullptr) {
    mPath = where.dli_fname;
  }
}

Qelt::Pen* PluginLibrary::createPen() const {
  return mCreatePen();
}

void* PluginLibrary::symbol(const char* name) const {
  return name != nullptr ? dlsym(mHandle, name) : nullptr;
}

const std::string& PluginLibrary::path() const {
  return mPath;
}

}  // namespace QeltDesktop
