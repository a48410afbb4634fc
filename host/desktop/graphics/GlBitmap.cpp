#include "desktop/graphics/GlBitmap.h"

#include <algorithm>
#include <cstddef>

#include "desktop/gl/GlCall.h"

namespace Qelt {

ISPTexture::~ISPTexture() = default;
ISPSubBitmap::~ISPSubBitmap() = default;
ISPBitmap::~ISPBitmap() = default;

}  // namespace Qelt

namespace QeltDesktop {

namespace {

std::size_t byteCount(int width, int height) {
  return static_cast<std::size_t>(width) * static_cast<std::size_t>(height) * 4;
}

// Pixels are read from the first byte on, in rows of that length; 0: as long as what is uploaded is wide.
void setUnpacking(int rowLength) {
  gl(glPixelStorei)(GL_UNPACK_ROW_LENGTH, rowLength);
  gl(glPixelStorei)(GL_UNPACK_SKIP_ROWS, 0);
  gl(glPixelStorei)(GL_UNPACK_SKIP_PIXELS, 0);
}

}  // namespace

void GlTexture::SetFilter(int filterParameter, int glValue) {
  if (filterParameter == kMinFilter) mBitmap.setParameter(GL_TEXTURE_MIN_FILTER, glValue);
  if (filterParameter == kMagFilter) mBitmap.setParameter(GL_TEXTURE_MAG_FILTER, glValue);
}

void GlTexture::SetParameter(unsigned int glName, int glValue) {
  mBitmap.setParameter(glName, glValue);
}

void GlTexture::Bind(int textureUnit) {
  constexpr int kUnits = 16;  // what every OpenGL ES 3.0 offers a fragment shader
  if (textureUnit < 0 || textureUnit >= kUnits || !mBitmap.isLive()) return;
  mBitmap.device()->state().bindTexture(textureUnit, mBitmap.mTexture);
}

GlTile::GlTile(GlBitmap& bitmap, int x, int y, int width, int height)
    : mBitmap(bitmap), mX(x), mY(y), mWidth(width), mHeight(height) {
  // Worked out in double: tiles whose size is a power of two then get a projection without any rounding.
  mProjection[0] = static_cast<float>(2.0 / width);
  mProjection[5] = static_cast<float>(2.0 / height);
  mProjection[12] = static_cast<float>(-1.0 - 2.0 * x / width);
  mProjection[13] = static_cast<float>(-1.0 - 2.0 * y / height);
}

void GlTile::BeginRender(int) {
  mBitmap.beginRender(mX, mY, mWidth, mHeight);
}

// The next to draw makes its own target the render target.
void GlTile::EndRender(int) {}

GlBitmap::GlBitmap(int width, int height, int tileSize)
    : mWidth(width), mHeight(height), mTextureInterface(*this) {
  setTiles(tileSize);
  // Sampling works without mipmaps from the start.
  mParameters = {{GL_TEXTURE_MIN_FILTER, GL_LINEAR},
                 {GL_TEXTURE_MAG_FILTER, GL_LINEAR},
                 {GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE},
                 {GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE}};
  if (isLive()) makeTexture();
}

GlBitmap::~GlBitmap() {
  if (!isLive()) return;
  device()->state().forgetFramebuffer(mFramebuffer);
  gl(glDeleteFramebuffers)(1, &mFramebuffer);
  device()->state().forgetTexture(mTexture);
  gl(glDeleteTextures)(1, &mTexture);
}

void GlBitmap::setTiles(int tileSize) {
  decltype(mTiles) tiles;
  for (int y = 0; tileSize > 0 && y < mHeight; y += std::min(tileSize, mHeight - y)) {
    for (int x = 0; x < mWidth; x += std::min(tileSize, mWidth - x)) {
      tiles.push_back(std::make_unique<GlTile>(*this, x, y, std::min(tileSize, mWidth - x),
                                               std::min(tileSize, mHeight - y)));
    }
  }
  mTiles.swap(tiles);
}

void GlBitmap::SetDebugName(const char*) {}

void GlBitmap::SetPixels(const void* pixels, int width, int height) {
  const int columns = std::min(width, mWidth);
  const int rows = std::min(height, mHeight);
  if (pixels == nullptr || columns <= 0 || rows <= 0 || !isLive()) return;
  bindTexture();
  setUnpacking(width);
  gl(glTexSubImage2D)(GL_TEXTURE_2D, 0, 0, 0, columns, rows, GL_RGBA, GL_UNSIGNED_BYTE, pixels);
  setUnpacking(0);
}

Qelt::ISPSubBitmap* GlBitmap::GetSubBitmap(int index) {
  if (index < 0 || index >= GetTileCount()) return nullptr;
  return mTiles[static_cast<std::size_t>(index)].get();
}

bool GlBitmap::isRenderable() {
  return bindFramebuffer() && gl(glCheckFramebufferStatus)(GL_FRAMEBUFFER) == GL_FRAMEBUFFER_COMPLETE;
}

bool GlBitmap::beginRender(int x, int y, int width, int height) {
  if (!bindFramebuffer()) return false;
  GlState& state = device()->state();
  state.setViewport(x, y, width, height);
  state.setScissor(x, y, width, height);
  state.setEnabled(GL_SCISSOR_TEST, true);
  // Pens set blending and what they draw with; whatever else could keep colour out is seen to here.
  state.setEnabled(GL_CULL_FACE, false);
  state.openColorMask();
  return true;
}

void GlBitmap::clear(float red, float green, float blue, float alpha) {
  if (!beginRender(0, 0, mWidth, mHeight)) return;
  gl(glClearColor)(red, green, blue, alpha);
  gl(glClear)(GL_COLOR_BUFFER_BIT);
}

void GlBitmap::clear(int x, int y, int width, int height) {
  if (!beginRender(x, y, width, height)) return;
  gl(glClearColor)(0.0f, 0.0f, 0.0f, 0.0f);
  gl(glClear)(GL_COLOR_BUFFER_BIT);
}

void GlBitmap::copyFrom(GlBitmap& source, int fromX, int fromY, int x, int y, int width, int height) {
  if (!isLive() || !source.bindFramebuffer()) return;
  bindTexture();
  gl(glCopyTexSubImage2D)(GL_TEXTURE_2D, 0, x, y, fromX, fromY, width, height);
}

bool GlBitmap::readRows(int top, std::span<std::uint8_t> pixels) {
  if (!bindFramebuffer()) return false;
  // What another user of the context left would make the pixels run past their end.
  gl(glBindBuffer)(GL_PIXEL_PACK_BUFFER, 0);
  for (const GLenum packing : {GL_PACK_ROW_LENGTH, GL_PACK_SKIP_ROWS, GL_PACK_SKIP_PIXELS}) {
    gl(glPixelStorei)(packing, 0);
  }
  const int rows = static_cast<int>(pixels.size() / byteCount(mWidth, 1));
  gl(glReadPixels)(0, top, mWidth, rows, GL_RGBA, GL_UNSIGNED_BYTE, pixels.data());
  return true;
}

std::vector<std::uint8_t>& GlBitmap::canvasPixels() {
  if (mCanvasPixels.empty()) mCanvasPixels.resize(byteCount(mWidth, mHeight));
  return mCanvasPixels;
}

void GlBitmap::showCanvasPixels() {
  SetPixels(mCanvasPixels.data(), mWidth, mHeight);
}

void GlBitmap::forget() noexcept {
  mTexture = mFramebuffer = 0;
}

void GlBitmap::remake() noexcept {
  makeTexture();
  if (!mCanvasPixels.empty()) showCanvasPixels();
  ++mTimesEmptied;
}

void GlBitmap::makeTexture() {
  gl(glGenTextures)(1, &mTexture);
  bindTexture();
  setUnpacking(0);
  gl(glTexImage2D)(GL_TEXTURE_2D, 0, GL_RGBA8, mWidth, mHeight, 0, GL_RGBA, GL_UNSIGNED_BYTE, nullptr);
  for (const auto& [name, value] : mParameters) gl(glTexParameteri)(GL_TEXTURE_2D, name, value);
  // Drivers need not zero a new texture.
  clear(0.0f, 0.0f, 0.0f, 0.0f);
}

bool GlBitmap::bindFramebuffer() {
  if (!isLive()) return false;
  const bool isNew = mFramebuffer == 0;
  if (isNew) gl(glGenFramebuffers)(1, &mFramebuffer);
  device()->state().bindFramebuffer(mFramebuffer);
  if (isNew) {
    gl(glFramebufferTexture2D)(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, mTexture, 0);
  }
  return true;
}

void GlBitmap::bindTexture() {
  device()->state().bindTexture(mTexture);
}

void GlBitmap::setParameter(GLenum name, GLint value) {
  const auto known = std::find_if(mParameters.begin(), mParameters.end(),
                                  [&](const auto& parameter) { return parameter.first == name; });
  if (known == mParameters.end()) {
    mParameters.emplace_back(name, value);
  } else {
    if (known->second == value) return;
    known->second = value;
  }
  if (!isLive()) return;
  bindTexture();
  gl(glTexParameteri)(GL_TEXTURE_2D, name, value);
}

}  // namespace QeltDesktop
