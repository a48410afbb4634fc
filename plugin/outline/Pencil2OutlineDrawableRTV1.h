#pragma once

#include <algorithm>
#include <cstddef>
#include <vector>

#include "base/Vector.h"
#include "pencommon/PenOutlineDrawableRT.h"
#include "render/BatchGuard.h"
#include "render/StampVertices.h"

namespace Qelt {

class GraphicsObject;
class ISPBitmap;
class Pencil2OutlineShader;

// The base of the outline render drawables; adds nothing to the host's.
class Pencil2OutlineDrawableRT : public PenOutlineDrawableRT {
 public:
  using PenOutlineDrawableRT::PenOutlineDrawableRT;
};

// The render drawable of every outline version. Each stamp becomes two quads in two streams: one as large as
// the stamp, one larger by the outline size. The large ones are drawn in the outline's colour, then the small
// ones erase, so that a rim is left.
//
// The host calls CreatePenCanvas before anything is drawn. Per batch, stamps are appended between
// SetBuffer(inner, outer) and SetBuffer(nullptr, nullptr); then come SendDataToGPU, Update, Draw for each
// tile, and Clear. Release comes at the end. The drawable borrows the batch from SendDataToGPU to Clear.
//
// What could not be made, for want of memory or of a GL context, is tried again at the next CreatePenCanvas
// and when the context is restored; until then nothing is drawn. Once released, a drawable never draws again;
// a host makes a new one.
//
// Main thread: AddPoint, Appender, SetInverseScale, unclaimedBatch. Render thread: the rest.
class Pencil2OutlineDrawableRTV1 final : public Pencil2OutlineDrawableRT {
 public:
  static constexpr std::size_t kFloatsPerVertex = kOutlineVertex.floats();
  static constexpr std::size_t kFloatsPerStamp = 6 * kFloatsPerVertex;

  using Pencil2OutlineDrawableRT::Pencil2OutlineDrawableRT;

  void AddPoint(Vector2<float> point, float size) override;

  // Appends stamps to the write buffers, or to the one that is there. Must not outlive a change of the
  // buffers or of the outline size.
  class Appender {
   public:
    // Makes room for so many stamps, so that appending them does not allocate. Throws std::bad_alloc.
    Appender(Pencil2OutlineDrawableRTV1& drawable, int stamps)
        : mInner(drawable.mInnerWriteBuffer, stamps),
          mOuter(drawable.mOuterWriteBuffer, stamps),
          mOutlineSize(drawable.GetOutlineSize()) {}

    // Appends stamps. There should be room for them: what is short of it is allocated, and may throw
    // std::bad_alloc.
    void AddPoints(const PlacedStamps& stamps, const StampPose& pose) {
      mInner.makeRoom(stamps.count);
      mOuter.makeRoom(stamps.count);
      write(mInner.take(stamps.count), stamps, pose, [](const StampExtent& extent) { return extent; });
      write(mOuter.take(stamps.count), stamps, pose, [size = mOutlineSize](StampExtent extent) {
        extent.x = std::max(extent.x + size, 0.0f);
        extent.y = std::max(extent.y + size, 0.0f);
        return extent;
      });
    }

   private:
    template <typename Grow>
    static void write(float* out, const PlacedStamps& stamps, const StampPose& pose, Grow&& grow) {
      if (out == nullptr) return;
      StampWriter<kFloatsPerVertex> writer(pose);
      for (int i = 0; i < stamps.count; ++i, out += kFloatsPerStamp) {
        writer.setExtent(grow(squareExtent(stamps.sizes[i])));
        writer.write(out, stamps.centres[i], 0.0f, *writer.look(0));
      }
    }

    StampAppender<kFloatsPerVertex> mInner;
    StampAppender<kFloatsPerVertex> mOuter;
    float mOutlineSize;
  };

  // Appends one stamp: its centre and direction (-sin a, cos a), as two vectors in a row; its width, stroke
  // units; its tilt blend. Throws std::bad_alloc where a buffer cannot grow.
  void AddPoint(const Vector2<float>* point, float size, float tiltBlend);

  UnclaimedBatch* unclaimedBatch() { return &mUnclaimed; }

  void Init() override;
  void Release() override;
  void RestoreGLObject() override;
  void CreatePenCanvas(int width, int height, IGLMsgQueue* queue) override;
  void Clear() override;
  void Update(bool useCacheBuffer) override;
  void Draw(ISPSubBitmap* target, Matrix4<float>& matrix) override;

  // Kept: stored, and used by nothing.
  void SetInverseScale(const Vector2<float>& inverseScale);

 private:
  void prepare();
  void buildPointTexture();
  void drawPass(const Matrix4<float>& projection, const Vector4<float>& color, float outlineCase,
                GraphicsObject* object);

  GraphicsObject* mInnerObject = nullptr;  // stamp-sized quads
  GraphicsObject* mOuterObject = nullptr;  // enlarged by the outline size
  ISPBitmap* mPointTextureBitmap = nullptr;
  Pencil2OutlineShader* mShader = nullptr;
  bool mReleased = false;
  Vector2<float> mInverseScale;
  UnclaimedBatch mUnclaimed;
};

}  // namespace Qelt
