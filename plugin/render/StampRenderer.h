#pragma once

#include <GLES3/gl3.h>

#include <cmath>
#include <cstddef>
#include <limits>
#include <utility>
#include <vector>

#include "base/Vector.h"
#include "gl/GraphicsFactory.h"
#include "gl/GraphicsObject.h"
#include "gl/ManagedObject.h"
#include "gl/OpenGLRenderer.h"
#include "gl/OpenGLShaderProgram.h"
#include "gl/VertexDescriptor.h"
#include "graphics/ISPBitmap.h"
#include "log/Log.h"
#include "math/Matrix4.h"
#include "pencommon/PenGLDataManager.h"
#include "render/GrainOrigin.h"
#include "render/PatternTextures.h"
#include "render/RenderVersions.h"
#include "render/ScopeExit.h"
#include "render/StampVertices.h"
#include "render/UnclaimedBatch.h"
#include "shaders/ShaderRegistry.h"

namespace Qelt {

// A render drawable of stamps: appends them as vertices on the main thread, uploads and draws the batch on
// the render thread. `HostBase` is the host's render drawable of the kind; `Version` a row of
// RenderVersions.h (or the preview's or the prediction's), which holds all that differs. Adds no slots to the
// host's.
//
// What could not be prepared, for want of memory or of a GL context, is tried again at the next
// CreatePenCanvas and when the context is restored. Kept: once released, a drawable never draws again,
// whatever is called on it; a host makes a new one.
//
// Main thread: AddPoint, Appender, reserve, SetInverseScale, unclaimedBatch. Render thread: the rest.
template <typename HostBase, typename Version>
class StampRenderer : public HostBase {
  static constexpr const RenderProfile& kProfile = Version::profile;
  static constexpr bool kAntialiased = kProfile.expansion == StampExpansion::Antialiased;

 public:
  static constexpr std::size_t kFloatsPerVertex = kAntialiased ? 11 : 9;
  static constexpr std::size_t kFloatsPerStamp = 6 * kFloatsPerVertex;

  using HostBase::HostBase;

  void AddPoint(Vector2<float>, float) final {}

  // Appends stamps to the write buffer. Each has a centre and a direction (-sin a, cos a), two vectors in a
  // row; a size, the stamp's width (versions 1 and 2, preview) or half width (version 3, prediction) in
  // stroke units; an opacity factor; a tilt blend; and its shape, tile 0, 1 or 2. Lives while the buffer and
  // the inverse scale stay as they are.
  class Appender {
   public:
    // Makes room for so many stamps, so that appending them does not allocate. Throws std::bad_alloc.
    Appender(StampRenderer& renderer, int stamps)
        : mStamps(renderer.mWriteBuffer, stamps), mInverseScale(renderer.mInverseScale) {}

    void AddPoint(const Vector2<float>* point, float size, float alpha, float tiltBlend, int tile) {
      // Most stamps are as large as the one before; the divisions of an extent cost a third of a stamp.
      if (size != mSize) {
        mExtent = extent(size);
        mSize = size;
      }
      mStamps.add(stampQuad(point[0], mExtent), {alpha, tiltBlend, static_cast<float>(tile), point[1]});
    }

    // The buffer holds all stamps from here on.
    void flush() { mStamps.flush(); }

   private:
    StampExtent extent(float size) const {
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

  // Appends one stamp. Throws std::bad_alloc where the buffer cannot grow; without a buffer nothing happens.
  void AddPoint(const Vector2<float>* point, float size, float alpha, float tiltBlend, int tile) {
    Appender one(*this, 1);
    one.AddPoint(point, size, alpha, tiltBlend, tile);
    one.flush();
  }

  // Makes room for stamps to come. Throws std::bad_alloc.
  void reserve(int stamps) { reserveStamps(this->mWriteBuffer, stamps, kFloatsPerStamp); }

  UnclaimedBatch* unclaimedBatch() { return &mUnclaimed; }

  void Init() final {
    if (kProfile.logsSetup) log("Init()");
    if (mTextures.isReleased()) return;
    const bool complete = prepare();
    ManagedObject::Register(this);
    mPrepared = complete;
  }

  void Release() final {
    log("Release()");
    mPrepared = false;
    ManagedObject::Unregister(this);
    ShaderManager::GetInstance()->ReleaseShader(std::exchange(mShader, nullptr));
    if (mGraphicsObject != nullptr) std::exchange(mGraphicsObject, nullptr)->release();
    mTextures.release();
  }

  void RestoreGLObject() final {
    log("RestoreGLObject()");
    if (mTextures.isReleased()) return;
    mPrepared = false;
    mPrepared = prepare();
  }

  void CreatePenCanvas(int, int, IGLMsgQueue*) final {
    if (kProfile.logsSetup) log("CreatePenCanvas(int, int, Qelt::IGLMsgQueue *)");
    if (!mPrepared) this->Init();
  }

  void buildTextures(int width, int height) {
    IGLMsgQueue* queue = this->mDataManager != nullptr ? this->mDataManager->GetMsgQueue() : nullptr;
    mTextures.build(queue, width, height, kProfile.className);
  }

  // Returns false when memory ran out or a bitmap is missing.
  bool setTextures(int width, int height) { return mTextures.upload(width, height, kProfile.points); }

  void Clear() final {
    this->mHasPendingData = false;
    // A cached batch is the host's, which may drop it from here on.
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
    if (mGraphicsObject == nullptr || !canShade() || !mTextures.ready()) return;

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
    if constexpr (kProfile.grainFollowsView) {
      const auto map = [&m](float q) {
        const float w = m[3] * q + m[7] * q + m[15];
        return Vector2<float>{(m[0] * q + m[4] * q + m[12]) / w, (m[1] * q + m[5] * q + m[13]) / w};
      };
      const Vector2<float> far = map(static_cast<float>(kGrainSide));
      const Vector2<float> near = map(0.0f);
      return {(far.x - near.x) * kProfile.grainScale, (far.y - near.y) * kProfile.grainScale};
    } else {
      (void)m;
      return {kGrainSide * kProfile.grainScale, kGrainSide * kProfile.grainScale};
    }
  }

 protected:
  // Render thread. The final class declares the public operation, so that posted tasks name it.
  void setStartPoint(float x, float y) { mGrainOrigin.set(x, y); }

  // Stroke units a device pixel in x and y. Anything but two positive numbers that leave stamps finite counts
  // as (1, 1).
  void setInverseScale(const Vector2<float>& inverseScale) {
    const auto usable = [](float scale) { return scale >= 1e-30f && scale <= 1e30f; };
    mInverseScale =
        usable(inverseScale.x) && usable(inverseScale.y) ? inverseScale : Vector2<float>{1.0f, 1.0f};
  }

 private:
  static constexpr int kGrainSide = 150;

  // Makes what is missing and fills the textures; true when all that drawing needs is there.
  bool prepare() {
    if (mGraphicsObject == nullptr) {
      VertexDescriptor descriptor;
      descriptor.addAttribute(AttributeType::Float, 4, -1);
      descriptor.addAttribute(AttributeType::Float, 3, -1);
      descriptor.addAttribute(AttributeType::Float, 2, -1);
      if (kAntialiased) descriptor.addAttribute(AttributeType::Float, 2, -1);
      mGraphicsObject =
          GraphicsFactory::createGraphicsObject(1, GraphicsFactory::kTriangles, descriptor, 0, 0);
    }
    if (mShader == nullptr) {
      mShader = ShaderManager::GetInstance()->GetShader<typename Version::Shader>();
    } else if (!mShader->isLinked()) {
      mShader->link();
    }
    buildTextures(kGrainSide, kGrainSide);
    const bool filled = setTextures(kGrainSide, kGrainSide);
    return filled && mGraphicsObject != nullptr && canShade();
  }

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
  bool mPrepared = false;  // with all that drawing needs, and known to the host as a managed object
  GrainOrigin mGrainOrigin;
  Vector2<float> mInverseScale{1.0f, 1.0f};
  UnclaimedBatch mUnclaimed;
};

}  // namespace Qelt
