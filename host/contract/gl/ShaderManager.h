#pragma once

#include <map>
#include <string>

#include "base/CriticalSection.h"
#include "base/HostApi.h"

namespace Qelt {

// The process-wide registry of shared shaders. The host owns map, key and lock; the templates are the
// plug-in's (shaders/ShaderRegistry.h), one instantiation for each of its shader classes.
class QELT_HOST_API ShaderManager {
 public:
  // Made from a shader class's run-time type name. Chosen here: it keeps a copy, so that an entry may
  // outlive the library that brought it.
  class QELT_HOST_API Key {
   public:
    explicit Key(const char* text);
    const char* GetText() const;
    bool operator<(const Key& other) const;

   private:
    std::string mText;
  };

  struct Entry {
    void* shader = nullptr;
    unsigned int references = 0;
  };

  static ShaderManager* GetInstance();

  // The one shader of class T, made on first demand, with one reference more; null when memory ran out.
  template <typename T>
  T* GetShader();
  // Gives one reference back; the last one destroys the shader.
  template <typename T>
  void ReleaseShader(T* shader);

 private:
  ShaderManager();
  ~ShaderManager();

  std::map<Key, Entry> mShaders;
  CriticalSection mLock;  // guards mShaders
};

}  // namespace Qelt
