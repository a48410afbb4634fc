#pragma once

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>
#include <typeinfo>

#include "base/CriticalSection.h"
#include "gl/ShaderManager.h"
#include "log/Log.h"

// The plug-in's half of the shader registry: one shared shader a class, counted. Any thread; shaders
// themselves are used on the render thread only.
namespace Qelt {

template <typename T>
T* ShaderManager::GetShader() try {
  const AutoCriticalSection lock(&mLock);
  const Key key(typeid(T).name());
  auto found = mShaders.find(key);
  if (found == mShaders.end()) {
    __android_log_print(kLogDebug, kLogTag, "ShaderManager::GetShader, New %s is added", typeid(T).name());
    std::unique_ptr<T> made(new (std::nothrow) T);
    found = mShaders.emplace(key, Entry{made.get(), 0}).first;
    static_cast<void>(made.release());  // the entry has it now
  } else if (found->second.shader == nullptr) {
    // Memory ran out for it once; nobody holds it.
    found->second.shader = new (std::nothrow) T;
  } else if (T* shader = static_cast<T*>(found->second.shader); !shader->isLinked()) {
    // It could not be linked when it was made, most likely for want of a GL context. Others may hold it, so
    // it is linked where it is.
    shader->link();
  }
  if (found->second.shader != nullptr) ++found->second.references;
  return static_cast<T*>(found->second.shader);
} catch (const std::bad_alloc&) {
  // No memory for the registry's own: as if there were none for the shader.
  return nullptr;
}

template <typename T>
void ShaderManager::ReleaseShader(T* shader) {
  if (shader == nullptr) return;
  const AutoCriticalSection lock(&mLock);
  const char* const name = typeid(T).name();
  // Found by its text: a key takes memory, and giving back must not.
  const auto found = std::find_if(mShaders.begin(), mShaders.end(), [name](const auto& entry) {
    return std::strcmp(entry.first.GetText(), name) == 0;
  });
  if (found == mShaders.end()) {
    __android_log_print(kLogError, kLogTag, "%s. Shader (%s) not in shader manager (not found).",
                        "ReleaseShader", name);
    return;
  }
  if (found->second.shader != shader) {
    __android_log_print(kLogError, kLogTag, "%s. Shader (%s) not in shader manager (pointer mismatch).",
                        "ReleaseShader", name);
    return;
  }
  if (found->second.references == 1) {
    delete shader;
    mShaders.erase(found);
  } else {
    --found->second.references;
  }
}

}  // namespace Qelt
