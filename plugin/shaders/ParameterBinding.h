#pragma once

#include <exception>
#include <memory>
#include <string>

#include "base/Vector.h"
#include "gl/OpenGLShaderProgram.h"
#include "log/Log.h"
#include "math/Matrix4.h"

namespace Qelt {

// Thrown by an operation that the object is in no state for.
class NotSupportedException : public std::exception {
 public:
  explicit NotSupportedException(const std::string& message) : mMessage(message) {}
  const char* what() const noexcept override { return mMessage.c_str(); }

 private:
  std::string mMessage;
};

// Thrown where a value is of the wrong kind.
class InvalidArgumentException : public std::exception {
 public:
  explicit InvalidArgumentException(const std::string& message) : mMessage(message) {}
  const char* what() const noexcept override { return mMessage.c_str(); }

 private:
  std::string mMessage;
};

// Owns a host object that is given back with `release`. An exception out of that ends the process.
struct ReleaseToHost {
  template <typename T>
  void operator()(T* object) const noexcept {
    object->release();
  }
};
template <typename T>
using HostOwned = std::unique_ptr<T, ReleaseToHost>;

// Gives the object back now, and lets the host's exceptions out.
template <typename T>
void giveBack(HostOwned<T>& owned) {
  if (T* const object = owned.release(); object != nullptr) object->release();
}

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
  // Looks the uniform up, in place of the one that was bound; returns false if the host has no interface to
  // it. Throws InvalidArgumentException if it has another type.
  bool bind(OpenGLShaderProgram* program, const char* name) {
    giveBack(mInterface);
    mInterface.reset(program->getBindingIntf(name, kBindingAny));
    if (mInterface == nullptr) return false;
    const BindingType found = mInterface->getType();
    if (found == N || found == kBindingAny) return true;
    __android_log_print(kLogInfo, kLogTag, "%s: Found %d but given %d", name, static_cast<int>(found),
                        static_cast<int>(N));
    giveBack(mInterface);
    throw InvalidArgumentException("ParameterBinding<>::bind - invalid parameter type!");
  }

  // Sets the uniform. Throws NotSupportedException if it is not bound.
  ParameterBinding& operator=(const typename BindingValue<N>::Type& value) {
    if (mInterface == nullptr) {
      throw NotSupportedException("ParameterBinding: internal interface is not initialized!");
    }
    mInterface->set(value);
    return *this;
  }

 private:
  HostOwned<IParameterBinding> mInterface;
};

}  // namespace Qelt
