#pragma once

#include <GLES3/gl3.h>

#include <atomic>
#include <cstdint>
#include <memory>
#include <span>
#include <utility>
#include <vector>

#include "base/HostApi.h"
#include "desktop/gl/GlDevice.h"
#include "graphics/ISPBitmap.h"
#include "math/Matrix4.h"

namespace QeltDesktop {

class GlBitmap;

// The bitmap's texture, as the host's interface has it.
class GlTexture final : public Qelt::ISPTexture {
 public:
  explicit GlTexture(GlBitmap& bitmap) : mBitmap(bitmap) {}
  void SetFilter(int filterParameter, int glValue) override;
  void SetParameter(unsigned int glName, int glValue) override;
  void Bind(int textureUnit) override;

 private:
  GlBitmap& mBitmap;
};

// One tile: a window into the bitmap's framebuffer.
class GlTile final : public Qelt::ISPSubBitmap {
 public:
  GlTile(GlBitmap& bitmap, int x, int y, int width, int height);
  int GetX() const override { return mX; }
  int GetY() const override { return mY; }
  int GetWidth() const override { return mWidth; }
  int GetHeight() const override { return mHeight; }
  const Qelt::Matrix4<float>& GetProjection() const override { return mProjection; }
  void BeginRender(int mode) override;
  void EndRender(int mode) override;

 private:
  GlBitmap& mBitmap;
  int mX, mY, mWidth, mHeight;
  Qelt::Matrix4<float> mProjection;
};

// An RGBA8 texture, its first row texture coordinate 0 and window coordinate 0. It is transparent when it is
// made, and again when it comes back after a context loss: whoever uploaded to it or drew into it does so
// again. What a canvas drew comes back by itself, because a canvas draws in the program's own memory. Render
// thread; one made on a thread without a GL device stays empty for good.
class QELT_HOST_API GlBitmap final : public Qelt::ISPBitmap, public GlResource {
 public:
  // `tileSize` 0: no tiles, the bitmap is no render target for pens.
  GlBitmap(int width, int height, int tileSize);
  ~GlBitmap() override;

  int GetWidth() const override { return mWidth; }
  int GetHeight() const override { return mHeight; }
  Qelt::ISPTexture* GetTexture() override { return &mTextureInterface; }
  // Instead of those there are. 0: none.
  void setTiles(int tileSize);
  void SetDebugName(const char* name) override;
  void SetPixels(const void* pixels, int width, int height) override;
  int GetTileCount() const override { return static_cast<int>(mTiles.size()); }
  Qelt::ISPSubBitmap* GetSubBitmap(int index) override;

  // The pixels that a canvas draws: 4 bytes each, premultiplied, the first row first, all transparent at the
  // first call. Throws std::bad_alloc.
  std::vector<std::uint8_t>& canvasPixels();
  // Makes them the bitmap's, now and in every context to come.
  void showCanvasPixels();
  // How often the bitmap has come back empty after a context loss. Any thread.
  int timesEmptied() const { return mTimesEmptied; }
  // True when the texture and a framebuffer around it exist in the current context.
  bool isRenderable();
  // Makes a rectangle the render target: framebuffer, viewport and scissor. False without a context.
  bool beginRender(int x, int y, int width, int height);
  void clear(float red, float green, float blue, float alpha);
  // Makes the rectangle of that size at (x, y) transparent.
  void clear(int x, int y, int width, int height);
  // Copies a rectangle of that size, from (fromX, fromY) of another bitmap of the same context to (x, y).
  // Both hold it whole.
  void copyFrom(GlBitmap& source, int fromX, int fromY, int x, int y, int width, int height);
  // Copies whole rows from row `top` on, which are there, 4 bytes a pixel. False without a context.
  bool readRows(int top, std::span<std::uint8_t> pixels);

 private:
  friend class GlTexture;

  void forget() noexcept override;
  void remake() noexcept override;

  void makeTexture();
  bool bindFramebuffer();
  void bindTexture();
  void setParameter(GLenum name, GLint value);

  const int mWidth;
  const int mHeight;
  GlTexture mTextureInterface;
  std::vector<std::unique_ptr<GlTile>> mTiles;
  std::vector<std::pair<GLenum, GLint>> mParameters;  // set again in the next context
  std::vector<std::uint8_t> mCanvasPixels;            // none where no canvas ever drew
  std::atomic<int> mTimesEmptied{0};
  GLuint mTexture = 0;
  GLuint mFramebuffer = 0;
};

}  // namespace QeltDesktop
