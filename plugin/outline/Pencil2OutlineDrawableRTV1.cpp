#include "outline/Pencil2OutlineDrawableRTV1.h"

#include <GLES3/gl3.h>

#include <utility>

#include "gl/GraphicsObject.h"
#include "gl/ManagedObject.h"
#include "gl/OpenGLRenderer.h"
#include "graphics/ISPBitmap.h"
#include "graphics/ISPCanvas.h"
#include "graphics/SPGraphicsFactory.h"
#include "log/Log.h"
#include "math/Matrix4.h"
#include "pencommon/PenGLDataManager.h"
#include "render/Posting.h"
#include "render/ScopeExit.h"
#include "shaders/PencilShaders.h"
#include "shaders/ShaderRegistry.h"

namespace Qelt {
namespace {

constexpr int kPointSide = 200;  // pixels
constexpr unsigned int kOpaqueBlack = 0xFF000000u;
constexpr int kDepthAndStencil = 6;

void log(const char* signature) {
  __android_log_print(kLogDebug, kLogTag, "%s", signature);
}

Vector4<float> colorOf(unsigned int argb) {
  const auto channel = [argb](int shift) { return static_cast<float>((argb >> shift) & 0xFFu) / 255.0f; };
  return {channel(16), channel(8), channel(0), channel(24)};
}

bool hasFloats(const std::vector<float>* batch) {
  return batch != nullptr && !batch->empty();
}

}  // namespace

void Pencil2OutlineDrawableRTV1::AddPoint(Vector2<float>, float) {}

void Pencil2OutlineDrawableRTV1::AddPoint(const Vector2<float>* point, float size, float tiltBlend) {
  const SmPoint centre{point[0].x, point[0].y};
  Appender(*this, 1).AddPoints({1, &centre, &size, nullptr, 0}, {tiltBlend, point[1]});
}

void Pencil2OutlineDrawableRTV1::SetInverseScale(const Vector2<float>& inverseScale) {
  mInverseScale = inverseScale;
}

void Pencil2OutlineDrawableRTV1::Init() {
  if (mReleased) return;
  prepare();
  ManagedObject::Register(this);
}

void Pencil2OutlineDrawableRTV1::prepare() {
  if (mInnerObject == nullptr) mInnerObject = createStampObject(kOutlineVertex);
  if (mOuterObject == nullptr) mOuterObject = createStampObject(kOutlineVertex);
  if (mShader == nullptr) {
    mShader = ShaderManager::GetInstance()->GetShader<Pencil2OutlineShader>();
  } else if (!mShader->isLinked()) {
    mShader->link();
  }
}

void Pencil2OutlineDrawableRTV1::Release() {
  log("virtual void Qelt::Pencil2OutlineDrawableRTV1::Release()");
  ManagedObject::Unregister(this);
  ShaderManager::GetInstance()->ReleaseShader(std::exchange(mShader, nullptr));
  if (mInnerObject != nullptr) std::exchange(mInnerObject, nullptr)->release();
  if (mOuterObject != nullptr) std::exchange(mOuterObject, nullptr)->release();
  SPGraphicsFactory::ReleaseBitmap(std::exchange(mPointTextureBitmap, nullptr));
  mHasPendingData = false;
  mReleased = true;
}

// Kept: a point texture that was drawn is not drawn again; the host has to see to what a bitmap that was
// drawn into holds after a context loss. Only what could not be made without a context is made now.
void Pencil2OutlineDrawableRTV1::RestoreGLObject() {
  log("virtual void Qelt::Pencil2OutlineDrawableRTV1::RestoreGLObject()");
  if (mReleased) return;
  prepare();
  buildPointTexture();
}

void Pencil2OutlineDrawableRTV1::CreatePenCanvas(int, int, IGLMsgQueue*) {
  Init();
  if (!mReleased) buildPointTexture();
}

// Fills the texture with alpha: the shader only looks whether there is any.
void Pencil2OutlineDrawableRTV1::buildPointTexture() {
  if (mPointTextureBitmap != nullptr) return;
  IGLMsgQueue* queue = queueOf(mDataManager);
  ISPBitmap* bitmap = SPGraphicsFactory::CreateBitmap(queue, kPointSide, kPointSide, nullptr, false, 0);
  if (bitmap == nullptr) return;
  // A bitmap that could not be drawn whole is not kept, so that the next call tries again.
  const ScopeExit dropBitmap([this, bitmap] {
    if (mPointTextureBitmap == nullptr) SPGraphicsFactory::ReleaseBitmap(bitmap);
  });
  // Kept: another drawable's name.
  bitmap->SetDebugName("Marker4OutlineDrawableRTV1::CreatePenCanvas mPointTextureBitmap");
  ISPCanvas* canvas = SPGraphicsFactory::CreateCanvas(queue, bitmap, 0);
  if (canvas == nullptr) return;
  const ScopeExit releaseCanvas([canvas] { SPGraphicsFactory::ReleaseCanvas(canvas); });
  canvas->Clear(0);
  SPPaint paint;
  paint.SetColor(kOpaqueBlack);
  paint.SetStyle(SPPaint::kFill);
  paint.SetAntiAlias(true);
  canvas->DrawShape(0.0f, 0.0f, static_cast<float>(kPointSide), paint);
  mPointTextureBitmap = bitmap;
}

void Pencil2OutlineDrawableRTV1::Clear() {
  mHasPendingData = false;
  // The vectors themselves are freed by their own tasks.
  if (mInnerRenderBuffer != nullptr) std::exchange(mInnerRenderBuffer, nullptr)->clear();
  if (mOuterRenderBuffer != nullptr) std::exchange(mOuterRenderBuffer, nullptr)->clear();
}

void Pencil2OutlineDrawableRTV1::Update(bool) {
  constexpr const char* kSignature = "virtual void Qelt::Pencil2OutlineDrawableRTV1::Update(bool)";
  log(kSignature);
  const auto upload = [](const std::vector<float>* batch, GraphicsObject* object) {
    if (!hasFloats(batch)) return;
    // Kept: both streams say 1.
    __android_log_print(kLogDebug, kLogTag, "%s 1 size %lu", kSignature,
                        static_cast<unsigned long>(batch->size()));
    if (object != nullptr) {
      object->updateBuffer(0, batch->data(), static_cast<int>(batch->size() / kFloatsPerVertex));
    }
  };
  upload(mInnerRenderBuffer, mInnerObject);
  upload(mOuterRenderBuffer, mOuterObject);
}

void Pencil2OutlineDrawableRTV1::Draw(ISPSubBitmap* target, Matrix4<float>& matrix) {
  if (target == nullptr || !hasFloats(mInnerRenderBuffer) || !hasFloats(mOuterRenderBuffer)) return;
  if (mInnerObject == nullptr || mOuterObject == nullptr || mPointTextureBitmap == nullptr) return;
  if (mShader == nullptr || !mShader->isLinked()) return;

  OpenGLRenderer::disableState(GL_DEPTH_TEST);
  OpenGLRenderer::enableState(GL_BLEND);
  OpenGLRenderer::setBlendFuncFactors(GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA, GL_ONE, GL_ONE_MINUS_SRC_ALPHA);
  target->BeginRender(0);
  const ScopeExit endRender([target] { target->EndRender(0); });
  const Matrix4<float> projection = target->GetProjection() * matrix;
  drawPass(projection, colorOf(GetOutlineColor()), 0.0f, mOuterObject);

  // What was drawn before keeps the share that the stamps leave uncovered.
  OpenGLRenderer::setBlendFuncFactors(GL_ZERO, GL_ONE_MINUS_SRC_ALPHA, GL_ZERO, GL_ONE_MINUS_SRC_ALPHA);
  drawPass(projection, {}, 1.0f, mInnerObject);

  OpenGLRenderer::discardFramebuffer(kDepthAndStencil);
}

void Pencil2OutlineDrawableRTV1::drawPass(const Matrix4<float>& projection, const Vector4<float>& color,
                                          float outlineCase, GraphicsObject* object) {
  mShader->activate();
  mShader->uProjectionMatrix = projection;
  mPointTextureBitmap->GetTexture()->Bind(0);
  mShader->pointTexture = 0;
  mShader->uInputColor = color;
  mShader->outlineCase = outlineCase;
  object->draw(0, -1, true, 0);
}

}  // namespace Qelt
