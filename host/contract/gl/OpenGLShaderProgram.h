#pragma once

#include "base/HostApi.h"
#include "base/Matrix.h"
#include "base/Vector.h"

namespace Qelt {

// The value types of uniforms, by the host's numbers.
enum BindingType : int {
  kBindingAny = 0,
  kBindingMatrix4 = 3,
  kBindingVector2 = 4,
  kBindingVector4 = 6,
  kBindingFloat = 7,
  kBindingInt = 9,
};

// One uniform of a linked program. Render thread. A value of another type than the uniform's is
// undefined; `getType` tells. Chosen here: names and slots.
class QELT_HOST_API IParameterBinding {
 public:
  virtual BindingType getType() const = 0;
  virtual void set(const Matrix4<float>& value) = 0;
  virtual void set(const Vector2<float>& value) = 0;
  virtual void set(const Vector4<float>& value) = 0;
  virtual void set(float value) = 0;
  virtual void set(int value) = 0;
  // Gives the interface back; the program itself stays.
  virtual void release() = 0;

 protected:
  virtual ~IParameterBinding();
};

// A linked program. Render thread. Slots chosen here.
class QELT_HOST_API OpenGLShaderProgram {
 public:
  // Makes the program the current one; uniforms are set on the current program.
  virtual void activate() = 0;
  // The uniform's interface, owned by the caller until its `release`; null when the program has no such
  // uniform. `type` 0 accepts any.
  virtual IParameterBinding* getBindingIntf(const char* name, int type) = 0;
  // Destroys the program.
  virtual void release() = 0;

 protected:
  virtual ~OpenGLShaderProgram();
};

}  // namespace Qelt
