#pragma once

#include <utility>

#include "base/Vector.h"
#include "gl/OpenGLShaderProgram.h"
#include "log/Log.h"
#include "math/Matrix4.h"
#include "shaders/Exceptions.h"

namespace Qelt {

// The C++ type of each uniform type.
template <BindingType N>
struct BindingValue;
template <>
struct BindingValue<kBindingMatrix4> {
  using Type = Matrix4<float>;
};
template <>
struct BindingValue<kBindingVector2> {
  using Type = Vector2<float>;
};
template <>
struct BindingValue<kBindingVector4> {
  using Type = Vector4<float>;
};
template <>
struct BindingValue<kBindingFloat> {
  using Type = float;
};
template <>
struct BindingValue<kBindingInt> {
  using Type = int;
};

// One typed uniform of a program. Render thread. Owns the host's interface to it.
template <BindingType N>
class ParameterBinding {
 public:
  ParameterBinding() = default;
  // An exception out of the release ends the process.
  ~ParameterBinding() { release(); }
  ParameterBinding(const ParameterBinding&) = delete;
  ParameterBinding& operator=(const ParameterBinding&) = delete;

  // Looks the uniform up; returns false when the host has no interface to it. Throws InvalidArgumentException
  // when it has another type.
  bool bind(OpenGLShaderProgram* program, const char* name) {
    release();
    mInterface = program->getBindingIntf(name, kBindingAny);
    if (mInterface == nullptr) return false;
    const BindingType found = mInterface->getType();
    if (found == N || found == kBindingAny) return true;
    __android_log_print(kLogInfo, kLogTag, "%s: Found %d but given %d", name, static_cast<int>(found),
                        static_cast<int>(N));
    release();
    throw InvalidArgumentException("ParameterBinding<>::bind - invalid parameter type!");
  }

  // Sets the uniform. Throws NotSupportedException when it is not bound.
  ParameterBinding& operator=(const typename BindingValue<N>::Type& value) {
    if (mInterface == nullptr) {
      throw NotSupportedException("ParameterBinding: internal interface is not initialized!");
    }
    mInterface->set(value);
    return *this;
  }

 private:
  void release() {
    if (mInterface != nullptr) std::exchange(mInterface, nullptr)->release();
  }

  IParameterBinding* mInterface = nullptr;
};

}  // namespace Qelt
