#include "gl/ShaderManager.h"

namespace Qelt {

ShaderManager::Key::Key(const char* text) : mText(text != nullptr ? text : "") {}

const char* ShaderManager::Key::GetText() const {
  return mText.c_str();
}

bool ShaderManager::Key::operator<(const Key& other) const {
  return mText < other.mText;
}

// Never destroyed: a plug-in may give shaders back while the process ends.
ShaderManager* ShaderManager::GetInstance() {
  static ShaderManager* const instance = new ShaderManager;
  return instance;
}

ShaderManager::ShaderManager() = default;
ShaderManager::~ShaderManager() = default;

}  // namespace Qelt
