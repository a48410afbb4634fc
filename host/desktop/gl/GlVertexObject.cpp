#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <new>
#include <vector>

#include "desktop/gl/GlCall.h"
#include "desktop/gl/GlDevice.h"
#include "gl/GraphicsFactory.h"
#include "gl/GraphicsObject.h"
#include "gl/VertexDescriptor.h"

namespace Qelt {

GraphicsObject::~GraphicsObject() = default;

}  // namespace Qelt

namespace QeltDesktop {

namespace {

class GlVertexObject final : public Qelt::GraphicsObject, public GlResource {
 public:
  GlVertexObject(int bufferCount, GLenum primitive, const Qelt::VertexDescriptor& layout)
      : mPrimitive(primitive), mLayout(layout), mBuffers(static_cast<std::size_t>(bufferCount)) {
    if (isLive()) makeNames();
  }

  ~GlVertexObject() override {
    if (!isLive()) return;
    for (const Buffer& buffer : mBuffers) {
      gl(glDeleteVertexArrays)(1, &buffer.array);
      gl(glDeleteBuffers)(1, &buffer.store);
    }
  }

  void updateBuffer(int index, const void* data, int vertexCount) override {
    if (index < 0 || static_cast<std::size_t>(index) >= mBuffers.size()) return;
    Buffer& buffer = mBuffers[static_cast<std::size_t>(index)];
    const int vertices = data != nullptr ? std::max(vertexCount, 0) : 0;
    const auto* const bytes = static_cast<const std::uint8_t*>(data);
    // A copy stays here for the next context.
    buffer.data.assign(bytes, bytes + static_cast<std::size_t>(vertices) * strideBytes());
    buffer.vertices = vertices;
    if (isLive()) upload(buffer);
  }

  void draw(int first, int count, bool, int instances) override {
    if (!isLive()) return;
    for (const Buffer& buffer : mBuffers) {
      const int begin = std::clamp(first, 0, buffer.vertices);
      const int rest = buffer.vertices - begin;
      const int drawn = count < 0 ? rest : std::min(count, rest);
      if (drawn == 0) continue;
      gl(glBindVertexArray)(buffer.array);
      if (instances > 0) {
        gl(glDrawArraysInstanced)(mPrimitive, begin, drawn, instances);
      } else {
        gl(glDrawArrays)(mPrimitive, begin, drawn);
      }
      gl(glBindVertexArray)(0);
    }
  }

  void release() override { delete this; }

 private:
  struct Buffer {
    GLuint array = 0;
    GLuint store = 0;
    int vertices = 0;
    std::vector<std::uint8_t> data;
  };

  void forget() override {
    for (Buffer& buffer : mBuffers) buffer.array = buffer.store = 0;
  }

  void remake() override { makeNames(); }

  std::size_t strideBytes() const { return static_cast<std::size_t>(mLayout.getStride()) * sizeof(float); }

  void makeNames() {
    for (Buffer& buffer : mBuffers) {
      gl(glGenVertexArrays)(1, &buffer.array);
      gl(glGenBuffers)(1, &buffer.store);
      gl(glBindVertexArray)(buffer.array);
      gl(glBindBuffer)(GL_ARRAY_BUFFER, buffer.store);
      std::size_t offset = 0;
      for (int i = 0; i < mLayout.getAttributeCount(); ++i) {
        const auto location = static_cast<GLuint>(i);
        gl(glEnableVertexAttribArray)(location);
        // GL takes an offset into the buffer as a pointer.
        gl(glVertexAttribPointer)(
            location, mLayout.getComponents(i), GL_FLOAT, GL_FALSE, static_cast<GLsizei>(strideBytes()),
            reinterpret_cast<const void*>(offset));  // NOLINT(performance-no-int-to-ptr)
        offset += static_cast<std::size_t>(mLayout.getComponents(i)) * sizeof(float);
      }
      gl(glBindVertexArray)(0);
      gl(glBindBuffer)(GL_ARRAY_BUFFER, 0);
      upload(buffer);
    }
  }

  void upload(Buffer& buffer) {
    if (buffer.data.empty()) return;
    gl(glBindBuffer)(GL_ARRAY_BUFFER, buffer.store);
    const auto size = static_cast<GLsizeiptr>(buffer.data.size());
    // A store of its own for each batch: draws of the last one may still be under way.
    gl(glBufferData)(GL_ARRAY_BUFFER, size, buffer.data.data(), GL_DYNAMIC_DRAW);
    gl(glBindBuffer)(GL_ARRAY_BUFFER, 0);
  }

  GLenum mPrimitive;
  Qelt::VertexDescriptor mLayout;
  std::vector<Buffer> mBuffers;
};

}  // namespace

}  // namespace QeltDesktop

namespace Qelt {

GraphicsObject* GraphicsFactory::createGraphicsObject(int bufferCount, int primitiveType,
                                                      const VertexDescriptor& descriptor, int, int) {
  constexpr int kMostBuffers = 16;
  if (bufferCount < 1 || bufferCount > kMostBuffers) return nullptr;
  if (primitiveType < GL_POINTS || primitiveType > GL_TRIANGLE_FAN) return nullptr;
  if (descriptor.getStride() < 1 || QeltDesktop::GlDevice::current() == nullptr) return nullptr;
  try {
    return new QeltDesktop::GlVertexObject(bufferCount, static_cast<GLenum>(primitiveType), descriptor);
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

}  // namespace Qelt
