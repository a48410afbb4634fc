// Stands before the host's makers of GL objects: what the test program exports under their names is found
// before the host's own. Everything still works, until HostFaults says that a call fails: then makers answer
// null, and what was made throws.

#include <dlfcn.h>

#include "gl/GraphicsFactory.h"
#include "gl/GraphicsObject.h"
#include "gl/OpenGLShaderProgram.h"
#include "graphics/SPGraphicsFactory.h"
#include "support/FaultyCanvas.h"

namespace {

using QeltTests::HostFaults;

// The host's own function behind the one of this file.
template <typename Function>
Function* hosts(Function*, const char* mangledName) {
  return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, mangledName));
}

// Stands before a host's object, and goes with it.
template <typename Interface>
class Faulty : public Interface {
 public:
  explicit Faulty(Interface* real) : mReal(real) {}
  void release() override {
    mReal->release();
    delete this;
  }

 protected:
  Interface* const mReal;
};

class FaultyObject final : public Faulty<Qelt::GraphicsObject> {
 public:
  using Faulty::Faulty;
  void updateBuffer(int index, const void* data, int vertexCount) override {
    HostFaults::mayThrow();
    mReal->updateBuffer(index, data, vertexCount);
  }
  void draw(int first, int count, bool useVertexState, int instances) override {
    HostFaults::mayThrow();
    mReal->draw(first, count, useVertexState, instances);
  }
};

class FaultyBinding final : public Faulty<Qelt::IParameterBinding> {
 public:
  using Faulty::Faulty;
  Qelt::BindingType getType() const override {
    return mLies ? static_cast<Qelt::BindingType>(100) : mReal->getType();
  }
  void set(const Qelt::Matrix4<float>& value) override { forward(value); }
  void set(const Qelt::Vector2<float>& value) override { forward(value); }
  void set(const Qelt::Vector4<float>& value) override { forward(value); }
  void set(float value) override { forward(value); }
  void set(int value) override { forward(value); }

 private:
  template <typename Value>
  void forward(const Value& value) {
    HostFaults::mayThrow();
    mReal->set(value);
  }

  const bool mLies = HostFaults::strikes();  // about its type
};

class FaultyProgram final : public Faulty<Qelt::OpenGLShaderProgram> {
 public:
  using Faulty::Faulty;
  void activate() override { mReal->activate(); }
  Qelt::IParameterBinding* getBindingIntf(const char* name, int type) override {
    if (HostFaults::strikes()) return nullptr;
    Qelt::IParameterBinding* const real = mReal->getBindingIntf(name, type);
    return real != nullptr ? new FaultyBinding(real) : nullptr;
  }
};

}  // namespace

namespace Qelt {

GraphicsObject* GraphicsFactory::createGraphicsObject(int bufferCount, int primitiveType,
                                                      const VertexDescriptor& descriptor, int usage,
                                                      int indexType) {
  static const auto real = hosts(
      &createGraphicsObject, "_ZN4Qelt15GraphicsFactory20createGraphicsObjectEiiRKNS_16VertexDescriptorEii");
  if (HostFaults::strikes()) return nullptr;
  GraphicsObject* const made = real(bufferCount, primitiveType, descriptor, usage, indexType);
  return made != nullptr ? new FaultyObject(made) : nullptr;
}

OpenGLShaderProgram* GraphicsFactory::createOpenGLShaderProgram(const char* vertexSource,
                                                                const char* fragmentSource,
                                                                const char* geometrySource) {
  static const auto real =
      hosts(&createOpenGLShaderProgram, "_ZN4Qelt15GraphicsFactory25createOpenGLShaderProgramEPKcS2_S2_");
  if (HostFaults::strikes()) return nullptr;
  OpenGLShaderProgram* const made = real(vertexSource, fragmentSource, geometrySource);
  return made != nullptr ? new FaultyProgram(made) : nullptr;
}

ISPBitmap* SPGraphicsFactory::CreateBitmap(IGLMsgQueue* queue, int width, int height, const void* pixels,
                                           bool shared, int flags) {
  static const auto real =
      hosts(&CreateBitmap, "_ZN4Qelt17SPGraphicsFactory12CreateBitmapEPNS_11IGLMsgQueueEiiPKvbi");
  return HostFaults::strikes() ? nullptr : real(queue, width, height, pixels, shared, flags);
}

ISPCanvas* SPGraphicsFactory::CreateCanvas(IGLMsgQueue* queue, ISPBitmap* bitmap, int flags) {
  static const auto real =
      hosts(&CreateCanvas, "_ZN4Qelt17SPGraphicsFactory12CreateCanvasEPNS_11IGLMsgQueueEPNS_9ISPBitmapEi");
  return HostFaults::strikes() ? nullptr : real(queue, bitmap, flags);
}

}  // namespace Qelt
