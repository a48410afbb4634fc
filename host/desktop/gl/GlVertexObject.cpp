#include "desktop/gl/GlVertexObject.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <cstdint>
#include <cstdio>
#include <limits>
#include <new>
#include <utility>

#include "desktop/base/Log.h"
#include "desktop/gl/GlCall.h"
#include "gl/GraphicsFactory.h"

namespace Qelt {

GraphicsObject::~GraphicsObject() = default;

}  // namespace Qelt

namespace QeltDesktop {

namespace {

// The list of those whose batches of several slices the running task has uploaded.
thread_local GlVertexObject* tFirstLarge = nullptr;

thread_local std::size_t tUploaded = 0;  // bytes

std::atomic<std::uint64_t> gUndrawn{0};

constexpr std::size_t kAlwaysFits = std::size_t{1} << 20;  // bytes

// Drivers allocate while they draw, and crash where they cannot. Returns whether memory is left for them.
bool hasRoomForDriver() {
  constexpr std::size_t kRoom = std::size_t{128} << 20;
  void* const room = ::operator new(kRoom, std::nothrow);
  ::operator delete(room);
  return room != nullptr;
}

// Strips, fans and loops cannot be cut; points, lines and triangles look the same drawn slice by slice.
bool isSeparate(GLenum primitive) {
  return primitive == GL_POINTS || primitive == GL_LINES || primitive == GL_TRIANGLES;
}

}  // namespace

GlVertexObject::GlVertexObject(int bufferCount, GLenum primitive, const Qelt::VertexDescriptor& layout,
                               int sliceVertices)
    : mPrimitive(primitive),
      mLayout(layout),
      mSliceVertices(isSeparate(primitive) ? sliceVertices : std::numeric_limits<int>::max()),
      mBuffers(static_cast<std::size_t>(bufferCount)) {
  if (isLive()) remake();
}

GlVertexObject::~GlVertexObject() {
  unlinkLarge();
  if (!isLive()) return;
  for (Buffer& buffer : mBuffers) {
    setSliceCount(buffer, 0);
  }
}

void GlVertexObject::updateBuffer(int index, const void* data, int vertexCount) {
  if (index < 0 || static_cast<std::size_t>(index) >= mBuffers.size() || !isLive()) return;
  Buffer& buffer = mBuffers[static_cast<std::size_t>(index)];
  const int vertices = data != nullptr ? std::max(vertexCount, 0) : 0;
  buffer.vertices = 0;
  if (upload(buffer, data, vertices)) {
    buffer.vertices = vertices;
    if (buffer.slices.size() > 1) linkLarge();
    return;
  }
  empty(buffer);
  ++gUndrawn;
  std::array<char, 128> line{};
  std::snprintf(line.data(), line.size(), "there is no memory to draw a batch of %d vertices of %zu bytes",
                vertices, strideBytes());
  logError(line.data());
}

bool GlVertexObject::upload(Buffer& buffer, const void* data, int vertices) {
  const auto* bytes = static_cast<const std::uint8_t*>(data);
  const auto count = static_cast<std::size_t>(vertices);
  const auto most = static_cast<std::size_t>(mSliceVertices);
  if (!setSliceCount(buffer, std::max<std::size_t>(1, count / most + (count % most > 0 ? 1 : 0))))
    return false;
  // With some drivers, asking for errors waits for the GPU; a live event's batch is small and always fits.
  const bool asks = count * strideBytes() > kAlwaysFits;
  if (asks) takeGlErrors();  // whatever others left
  std::size_t done = 0;
  for (const Slice& slice : buffer.slices) {
    const std::size_t size = std::min(count - done, most) * strideBytes();
    device()->state().bindArrayBuffer(slice.store);
    // A new store for each batch, because the GPU may still be drawing from the last one.
    const void* const from = size > 0 ? bytes + done * strideBytes() : nullptr;
    glBufferData(GL_ARRAY_BUFFER, static_cast<GLsizeiptr>(size), asks ? nullptr : from, GL_STREAM_DRAW);
    if (asks) {
      // Drivers fill a store that they could not make.
      if (!takeGlErrors()) return false;
      glBufferSubData(GL_ARRAY_BUFFER, 0, static_cast<GLsizeiptr>(size), from);
      if (!takeGlErrors()) return false;
    }
    done += most;
    tUploaded += size;
  }
  return buffer.slices.size() == 1 || hasRoomForDriver();
}

void GlVertexObject::draw(int first, int count, bool, int instances) {
  if (!isLive() || device()->state().program() == 0) return;
  for (const Buffer& buffer : mBuffers) {
    const int begin = std::clamp(first, 0, buffer.vertices);
    int left = count < 0 ? buffer.vertices - begin : std::min(count, buffer.vertices - begin);
    int from = begin % mSliceVertices;
    for (auto slice = static_cast<std::size_t>(begin / mSliceVertices); left > 0; ++slice) {
      const int drawn = std::min(left, mSliceVertices - from);
      device()->state().bindVertexArray(buffer.slices[slice].array);
      if (instances > 0) {
        gl(glDrawArraysInstanced)(mPrimitive, from, drawn, instances);
      } else {
        gl(glDrawArrays)(mPrimitive, from, drawn);
      }
      left -= drawn;
      from = 0;
    }
  }
}

void GlVertexObject::release() {
  delete this;
}

std::uint64_t GlVertexObject::undrawnBatches() {
  return gUndrawn;
}

std::size_t GlVertexObject::takeUploadedBytes() {
  return std::exchange(tUploaded, 0);
}

void GlVertexObject::dropLargeBatches() {
  for (GlVertexObject** link = &tFirstLarge; *link != nullptr;) {
    GlVertexObject* const object = *link;
    // It belongs to another queue, whose task this thread goes on with later.
    if (!object->isLive()) {
      link = &object->mNextLarge;
      continue;
    }
    *link = object->mNextLarge;
    for (Buffer& buffer : object->mBuffers) {
      if (buffer.slices.size() > 1) object->empty(buffer);
    }
  }
}

void GlVertexObject::linkLarge() {
  unlinkLarge();
  mNextLarge = tFirstLarge;
  tFirstLarge = this;
}

void GlVertexObject::unlinkLarge() {
  for (GlVertexObject** link = &tFirstLarge; *link != nullptr; link = &(*link)->mNextLarge) {
    if (*link != this) continue;
    *link = mNextLarge;
    return;
  }
}

void GlVertexObject::empty(Buffer& buffer) {
  buffer.vertices = 0;
  setSliceCount(buffer, 1);
  device()->state().bindArrayBuffer(buffer.slices.front().store);
  glBufferData(GL_ARRAY_BUFFER, 0, nullptr, GL_STREAM_DRAW);
}

bool GlVertexObject::setSliceCount(Buffer& buffer, std::size_t count) {
  std::vector<Slice>& slices = buffer.slices;
  while (slices.size() > count) {
    device()->state().forgetVertexArray(slices.back().array);
    gl(glDeleteVertexArrays)(1, &slices.back().array);
    device()->state().forgetArrayBuffer(slices.back().store);
    gl(glDeleteBuffers)(1, &slices.back().store);
    slices.pop_back();
  }
  try {
    slices.reserve(count);
  } catch (const std::bad_alloc&) {
    return false;
  }
  while (slices.size() < count) makeNames(slices.emplace_back());
  return true;
}

void GlVertexObject::forget() noexcept {
  unlinkLarge();
  for (Buffer& buffer : mBuffers) {
    buffer.slices.resize(1);
    buffer.slices.front() = {};
    buffer.vertices = 0;
  }
}

void GlVertexObject::remake() noexcept {
  for (Buffer& buffer : mBuffers) makeNames(buffer.slices.front());
}

std::size_t GlVertexObject::strideBytes() const {
  return static_cast<std::size_t>(mLayout.getStride()) * sizeof(float);
}

void GlVertexObject::makeNames(Slice& slice) {
  gl(glGenVertexArrays)(1, &slice.array);
  gl(glGenBuffers)(1, &slice.store);
  device()->state().bindVertexArray(slice.array);
  device()->state().bindArrayBuffer(slice.store);
  std::size_t offset = 0;
  for (int i = 0; i < mLayout.getAttributeCount(); ++i) {
    const auto location = static_cast<GLuint>(i);
    gl(glEnableVertexAttribArray)(location);
    // GL takes an offset into the buffer as a pointer.
    gl(glVertexAttribPointer)(location, mLayout.getComponents(i), GL_FLOAT, GL_FALSE,
                              static_cast<GLsizei>(strideBytes()),
                              reinterpret_cast<const void*>(offset));  // NOLINT(performance-no-int-to-ptr)
    offset += static_cast<std::size_t>(mLayout.getComponents(i)) * sizeof(float);
  }
}

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
