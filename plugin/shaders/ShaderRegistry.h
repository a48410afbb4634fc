#pragma once

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>
#include <typeinfo>

#include "base/CriticalSection.h"
#include "gl/ShaderManager.h"
#include "log/Log.h"

// The registry of shared shaders, as far as it is the plug-in's: the host has the map and its lock, and these
// templates are what fills it. There is one shader per class in the process. Each GetShader adds a reference
// to it, to be given back with one ReleaseShader; the last one deletes it.
//
// A shader that memory ran out for, or that could not be linked, is tried again whenever somebody asks for
// it. Misuse is logged and changes nothing. Any thread may call; shaders themselves are for the render thread
// alone.
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
    static_cast<void>(made.release());  // the entry owns it from here on
  } else if (found->second.shader == nullptr) {
    // Memory ran out when it was first asked for, so that nobody holds one.
    found->second.shader = new (std::nothrow) T;
  } else if (T* shader = static_cast<T*>(found->second.shader); !shader->isLinked()) {
    // It could not be linked when it was made, most likely for want of a GL context. Others may hold it, so
    // it is not replaced.
    shader->link();
  }
  if (found->second.shader != nullptr) ++found->second.references;
  return static_cast<T*>(found->second.shader);
} catch (const std::bad_alloc&) {
  // Memory ran out for the registry's entry. The caller sees the same as if it had for the shader.
  return nullptr;
}

template <typename T>
void ShaderManager::ReleaseShader(T* shader) {
  if (shader == nullptr) return;
  const AutoCriticalSection lock(&mLock);
  const char* const name = typeid(T).name();
  // The keys' texts are compared, since making a key takes memory, and giving back must not need any.
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
