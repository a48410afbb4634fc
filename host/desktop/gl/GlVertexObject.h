#pragma once

#include <GLES3/gl3.h>

#include <cstddef>
#include <cstdint>
#include <vector>

#include "base/HostApi.h"
#include "desktop/gl/GlDevice.h"
#include "gl/GraphicsObject.h"
#include "gl/VertexDescriptor.h"

namespace QeltDesktop {

// Vertex buffers in GL's memory; the host keeps no copy of what is in them. After a context loss they are
// there again, empty: whoever draws uploads first. A batch of more than 1 MiB that there is no memory for is
// logged in one line and not drawn. Render thread.
//
// A large batch of points, lines or triangles lies in slices, each a store and a draw of its own: drivers
// that count bytes in 32 bits crash on a store of some gigabytes. Such a batch goes with the render task that
// uploaded it, so that a page drawn once does not hold that memory from then on; a batch of one slice stays
// until the next.
class QELT_HOST_API GlVertexObject final : public Qelt::GraphicsObject, public GlResource {
 public:
  // Vertices per slice. A multiple of 6, so that a border cuts through no line and no triangle, and the two
  // triangles of a stamp stay together; over 32 MiB for any pen, so that the C library gives freed slices
  // back to the system.
  static constexpr int kSliceVertices = 6 << 18;

  // `sliceVertices`: a multiple of 6.
  GlVertexObject(int bufferCount, GLenum primitive, const Qelt::VertexDescriptor& layout,
                 int sliceVertices = kSliceVertices);
  ~GlVertexObject() override;

  void updateBuffer(int index, const void* data, int vertexCount) override;
  // In a batch of several slices `first` is a multiple of 6.
  void draw(int first, int count, bool useVertexState, int instances) override;
  void release() override;

  // How many batches there was no memory for since the process began. Any thread.
  static std::uint64_t undrawnBatches();

  // How many bytes of vertices have been uploaded on this thread since the last time.
  static std::size_t takeUploadedBytes();

  // A render task has ended: drops the batches of several slices that it uploaded on this thread.
  static void dropLargeBatches();

 private:
  struct Slice {
    GLuint array = 0;
    GLuint store = 0;
  };
  struct Buffer {
    std::vector<Slice> slices = std::vector<Slice>(1);  // the first is always there
    int vertices = 0;
  };

  void forget() noexcept override;
  void remake() noexcept override;

  std::size_t strideBytes() const;
  void makeNames(Slice& slice);
  // False when there is no memory for them; then `empty` must follow.
  bool setSliceCount(Buffer& buffer, std::size_t count);
  bool upload(Buffer& buffer, const void* data, int vertices);
  void empty(Buffer& buffer);
  void linkLarge();
  void unlinkLarge();

  GLenum mPrimitive;
  Qelt::VertexDescriptor mLayout;
  int mSliceVertices;
  std::vector<Buffer> mBuffers;
  GlVertexObject* mNextLarge = nullptr;  // of those with a batch of several slices
};

}  // namespace QeltDesktop
