#include "desktop/engine/PluginLibrary.h"

#include <stdexcept>

namespace QeltDesktop {

namespace {

LoadedPlugin load(const std::string& path) try {
  return loadPlugin(path);
} catch (const std::runtime_error& error) {
  throw std::runtime_error(std::string("cannot load the pen plug-in: ") + error.what());
}

}  // namespace

PluginLibrary::PluginLibrary(const std::string& path)
    : mPlugin(load(path)), mCreatePen(reinterpret_cast<CreatePen>(symbol("createPenInst"))) {
  if (mCreatePen == nullptr) throw std::runtime_error(path + " is no pen plug-in: it has no createPenInst");
}

Qelt::Pen* PluginLibrary::createPen() const {
  return mCreatePen();
}

void* PluginLibrary::symbol(const char* name) const {
  return name != nullptr ? findInPlugin(mPlugin, name) : nullptr;
}

const std::string& PluginLibrary::path() const {
  return mPlugin.path;
}

}  // namespace QeltDesktop
