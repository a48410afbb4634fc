#pragma once

#include <GLES3/gl3.h>

#include <cmath>
#include <cstddef>
#include <limits>
#include <utility>
#include <vector>

#include "base/Vector.h"
#include "gl/GraphicsObject.h"
#include "gl/ManagedObject.h"
#include "gl/OpenGLRenderer.h"
#include "graphics/ISPBitmap.h"
#include "log/Log.h"
#include "math/FloatRange.h"
#include "math/Matrix4.h"
#include "render/BatchGuard.h"
#include "render/PatternTextures.h"
#include "render/Posting.h"
#include "render/RenderVersions.h"
#include "render/ScopeExit.h"
#include "render/StampVertices.h"
#include "shaders/ShaderRegistry.h"

namespace Qelt {

// Where the grain of a stroke is fixed: its start point in stroke units, until the first tile drawn turns it
// into window pixels. Render thread.
class GrainOrigin {
 public:
  void set(float x, float y) {
    mStartPoint = {x, y};
    mStartPointPending = true;
  }

  // True from each `set` until the next `settle` that had a viewport.
  bool isPending() const { return mStartPointPending; }

  // Converts the start point: maps it to clip space and from there into the viewport (x, y, width, height in
  // window pixels). Without a viewport, as while the GL context is lost, the point stays pending.
  void settle(const Matrix4<float>& projection, Vector4<int> viewport) {
    if (viewport.z == 0 || viewport.w == 0) return;
    mStartPointPending = false;
    const float x = mStartPoint.x;
    const float y = mStartPoint.y;
    const float clipX = projection[0] * x + projection[4] * y + projection[12];
    const float clipY = projection[1] * x + projection[5] * y + projection[13];
    const float clipW = projection[3] * x + projection[7] * y + projection[15];
    mStartPoint.x =
        (clipX / clipW + 1.0f) * 0.5f * static_cast<float>(viewport.z) + static_cast<float>(viewport.x);
    mStartPoint.y =
        (clipY / clipW + 1.0f) * 0.5f * static_cast<float>(viewport.w) + static_cast<float>(viewport.y);
  }

  Vector2<float> value() const { return mStartPoint; }

 private:
  Vector2<float> mStartPoint;
  bool mStartPointPending = false;
};

// A render drawable of stamps: appends them as vertices on the main thread, uploads and draws the batch on
// the render thread. `HostBase` is the host's render drawable of the kind; `Version` is a row of
// RenderVersions.h, which holds all that differs. Adds no slots to the host's.
//
// The host calls CreatePenCanvas before anything is drawn. Per stroke, SetStartPoint comes first. Per batch,
// stamps are appended between SetBuffer(batch) and SetBuffer(nullptr); then come SendDataToGPU, Update, Draw
// for each tile, and Clear. Release comes at the end. The drawable borrows the batch from SendDataToGPU to
// Clear.
//
// What could not be prepared, for want of memory or of a GL context, is tried again at the next
// CreatePenCanvas and when the context is restored; until then nothing is drawn. Kept: once released, a
// drawable never draws again, whatever is called on it; a host makes a new one.
//
// Main thread: AddPoint, Appender, reserve, SetInverseScale, unclaimedBatch. Render thread: the rest.
template <typename HostBase, typename Version>
class StampRenderer : public HostBase {
  static constexpr const RenderProfile& kProfile = Version::profile;

 public:
  static constexpr std::size_t kFloatsPerVertex = kProfile.vertex.floats();
  static constexpr std::size_t kFloatsPerStamp = 6 * kFloatsPerVertex;
  static constexpr bool kAntialiased = kFloatsPerVertex == kAntialiasedVertex.floats();

  using HostBase::HostBase;

  void AddPoint(Vector2<float>, float) final {}

  // Appends stamps to the write buffer. Must not outlive a change of the buffer or of the inverse scale.
  class Appender {
   public:
    // Makes room for so many stamps, so that appending them does not allocate. Throws std::bad_alloc.
    Appender(StampRenderer& renderer, int stamps)
        : mStamps(renderer.mWriteBuffer, stamps), mInverseScale(renderer.mInverseScale) {}

    // Appends stamps. There should be room for them: what is short of it is allocated, and may throw
    // std::bad_alloc.
    void AddPoints(PlacedStamps stamps, const StampPose& pose) {
      float* out = mStamps.take(stamps.count);
      if (out == nullptr) return;
      StampWriter<kFloatsPerVertex> writer(pose);
      writer.setExtent(mExtent);
      float size = mSize;
      const Four* look = writer.look(stamps.shape);
      for (int i = 0; i < stamps.count; ++i) {
        // Most stamps are as large as the one before; the divisions of an extent take a third of the time
        // that a stamp takes.
        if (stamps.sizes[i] != size) {
          size = stamps.sizes[i];
          mExtent = extentOf(size);
          writer.setExtent(mExtent);
        }
        writer.write(out, stamps.centres[i], stamps.alphas[i], *look);
        out += kFloatsPerStamp;
        look = writer.lookAfter(look);
      }
      mSize = size;
    }

   private:
    StampExtent extentOf(float size) const {
      if constexpr (kAntialiased) {
        return antialiasedExtent(size, mInverseScale);
      } else {
        return squareExtent(size);
      }
    }

    StampAppender<kFloatsPerVertex> mStamps;
    Vector2<float> mInverseScale;
    float mSize = std::numeric_limits<float>::quiet_NaN();  // that mExtent belongs to
    StampExtent mExtent{};
  };

  // Appends one stamp: its centre and direction (-sin a, cos a), as two vectors in a row; its width, or half
  // of it where it is anti-aliased, stroke units; its alpha and tilt blend; one of the shapes 0, 1 and 2.
  // Throws std::bad_alloc where the buffer cannot grow; without a buffer nothing happens.
  void AddPoint(const Vector2<float>* point, float size, float alpha, float tiltBlend, int tile) {
    const SmPoint centre{point[0].x, point[0].y};
    Appender(*this, 1).AddPoints({1, &centre, &size, &alpha, tile}, {tiltBlend, point[1]});
  }

  // Makes room for stamps to come. Throws std::bad_alloc.
  void reserve(int stamps) {
    std::vector<float>* const batch = this->mWriteBuffer;
    if (batch == nullptr) return;
    reserveFloats(*batch, batch->size() + static_cast<std::size_t>(stamps) * kFloatsPerStamp + kPastLast);
  }

  UnclaimedBatch* unclaimedBatch() { return &mUnclaimed; }

  // Sets the stroke units per device pixel in x and y, before the stamps of a call are appended. Anything but
  // two positive numbers that leave stamps finite counts as (1, 1).
  void SetInverseScale(const Vector2<float>& inverseScale) requires kAntialiased {
    const bool usable = isUsableScale(inverseScale.x) && isUsableScale(inverseScale.y);
    mInverseScale = usable ? inverseScale : Vector2<float>{1.0f, 1.0f};
  }

  // Fixes the grain to the first point of a stroke, stroke units.
  void SetStartPoint(float x, float y) { mGrainOrigin.set(x, y); }

  void Init() final {
    if (kProfile.logsSetup) log("Init()");
    if (mState == State::Released) return;
    const State reached = prepare();
    ManagedObject::Register(this);
    if (reached == State::Prepared) mState = reached;
  }

  void Release() final {
    log("Release()");
    ManagedObject::Unregister(this);
    ShaderManager::GetInstance()->ReleaseShader(std::exchange(mShader, nullptr));
    if (mGraphicsObject != nullptr) std::exchange(mGraphicsObject, nullptr)->release();
    if (std::exchange(mState, State::Released) != State::Released) mTextures.releaseTextures();
  }

  void RestoreGLObject() final {
    log("RestoreGLObject()");
    if (mState == State::Released) return;
    mState = State::Incomplete;
    mState = prepare();
  }

  void CreatePenCanvas(int, int, IGLMsgQueue*) final {
    if (kProfile.logsSetup) log("CreatePenCanvas(int, int, Qelt::IGLMsgQueue *)");
    if (mState != State::Prepared) this->Init();
  }

  void Clear() final {
    this->mHasPendingData = false;
    // A cached batch belongs to the host, which may drop it from here on.
    if constexpr (kProfile.hasCacheBuffer) this->mCacheBuffer = nullptr;
    // The vector itself is freed by its own task.
    if (this->mRenderBuffer != nullptr) std::exchange(this->mRenderBuffer, nullptr)->clear();
  }

  void Update(bool useCacheBuffer) final {
    mUseCacheBuffer = kProfile.hasCacheBuffer && useCacheBuffer;
    const std::vector<float>* batch = currentBatch();
    if (batch == nullptr || batch->empty() || mGraphicsObject == nullptr) return;
    mGraphicsObject->updateBuffer(0, batch->data(), static_cast<int>(batch->size() / kFloatsPerVertex));
  }

  void Draw(ISPSubBitmap* tile, Matrix4<float>& matrix) final {
    const std::vector<float>* batch = currentBatch();
    if (tile == nullptr || batch == nullptr || batch->empty()) return;
    if (mGraphicsObject == nullptr || !canShade() || !mHasTextures) return;

    tile->BeginRender(0);
    const ScopeExit endRender([tile] { tile->EndRender(0); });
    const Matrix4<float> projection = tile->GetProjection() * matrix;
    // The first tile after SetStartPoint fixes the grain for the whole stroke.
    if (mGrainOrigin.isPending()) mGrainOrigin.settle(projection, OpenGLRenderer::getViewport());

    OpenGLRenderer::enableState(GL_BLEND);
    OpenGLRenderer::setBlendFuncFactors(GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA, GL_ONE, GL_ONE_MINUS_SRC_ALPHA);
    mShader->activate();
    mShader->projectionMatrix = projection;
    mShader->inputColor = this->mPenColor;
    mShader->grainOffset = mGrainOrigin.value();
    mShader->numTilesOfPoints = 3.0f;
    mTextures.bindGrain(0);
    mShader->sampler0 = 0;
    const Vector2<float> grain = grainSize(matrix);
    mShader->textureWidth = grain.x;
    mShader->textureHeight = grain.y;
    mTextures.bindPoints(1);
    mShader->sampler1 = 1;
    if constexpr (kProfile.hasOpacity) mShader->inputOpacity = this->GetOpacity();

    mGraphicsObject->draw(0, -1, true, 0);
  }

  Vector2<float> grainOrigin() const { return mGrainOrigin.value(); }

  // The on-screen extent of the grain's 150 texels. Kept: under a rotation it is what the formula gives, the
  // extent of the diagonal of a 150-unit square in x and in y.
  static Vector2<float> grainSize(const Matrix4<float>& m) {
    constexpr float kGrainSide = PatternTextures::kGrainSide;
    if constexpr (kProfile.grainFollowsView) {
      const auto map = [&m](float q) {
        const float w = m[3] * q + m[7] * q + m[15];
        return Vector2<float>{(m[0] * q + m[4] * q + m[12]) / w, (m[1] * q + m[5] * q + m[13]) / w};
      };
      const Vector2<float> far = map(kGrainSide);
      const Vector2<float> near = map(0.0f);
      return {(far.x - near.x) * kProfile.grainScale, (far.y - near.y) * kProfile.grainScale};
    } else {
      (void)m;
      return {kGrainSide * kProfile.grainScale, kGrainSide * kProfile.grainScale};
    }
  }

 private:
  // Prepared: all that drawing needs is there, and the host knows the drawable as a managed object.
  enum class State { Incomplete, Prepared, Released };

  // Makes what is missing and fills the textures. Returns what was reached.
  State prepare() {
    if (mGraphicsObject == nullptr) mGraphicsObject = createStampObject(kProfile.vertex);
    if (mShader == nullptr) {
      mShader = ShaderManager::GetInstance()->GetShader<typename Version::Shader>();
    } else if (!mShader->isLinked()) {
      mShader->link();
    }
    mTextures.buildTextures(queueOf(this->mDataManager), kProfile.className);
    const bool filled = mTextures.setTextures(kProfile.points);
    mHasTextures = mHasTextures || filled;
    return filled && mGraphicsObject != nullptr && canShade() ? State::Prepared : State::Incomplete;
  }

  // Another drawable may have linked the shader that all share.
  bool canShade() const { return mShader != nullptr && mShader->isLinked(); }

  const std::vector<float>* currentBatch() const {
    if constexpr (kProfile.hasCacheBuffer) {
      if (mUseCacheBuffer) return this->mCacheBuffer;
    }
    return this->mRenderBuffer;
  }

  static void log(const char* operation) {
    __android_log_print(kLogDebug, kLogTag, "virtual void Qelt::%s::%s", kProfile.className, operation);
  }

  bool mUseCacheBuffer = false;
  GraphicsObject* mGraphicsObject = nullptr;
  typename Version::Shader* mShader = nullptr;
  PatternTextures mTextures;
  bool mHasTextures = false;  // they were filled once
  State mState = State::Incomplete;
  GrainOrigin mGrainOrigin;
  Vector2<float> mInverseScale{1.0f, 1.0f};
  UnclaimedBatch mUnclaimed;
};

}  // namespace Qelt
