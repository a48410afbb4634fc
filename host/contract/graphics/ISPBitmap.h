#pragma once

#include "base/HostApi.h"
#include "base/Matrix.h"

namespace Qelt {

// The texture behind a bitmap. Render thread. Slots chosen here.
class QELT_HOST_API ISPTexture {
 public:
  // The two filters of a texture, by the host's numbers. Chosen here: which is which.
  enum FilterParameter : int { kMinFilter = 4, kMagFilter = 5 };

  virtual void SetFilter(int filterParameter, int glValue) = 0;
  virtual void SetParameter(unsigned int glName, int glValue) = 0;
  virtual void Bind(int textureUnit) = 0;

 protected:
  virtual ~ISPTexture();
};

// One tile of a bitmap, as a render target. Render thread. Slots chosen here.
class QELT_HOST_API ISPSubBitmap {
 public:
  // Position and size in the bitmap, pixels.
  virtual int GetX() const = 0;
  virtual int GetY() const = 0;
  virtual int GetWidth() const = 0;
  virtual int GetHeight() const = 0;
  // Maps bitmap pixels to the tile's clip space; the bitmap's first row goes to clip y = -1.
  virtual const Matrix4<float>& GetProjection() const = 0;
  // Makes the tile the render target, and no longer so. All tiles of a bitmap are windows into one
  // framebuffer: viewport and scissor become the tile's rectangle there. The pen passes 0.
  virtual void BeginRender(int mode) = 0;
  virtual void EndRender(int mode) = 0;

 protected:
  virtual ~ISPSubBitmap();
};

// An RGBA8 picture on the GPU. Render thread: off it a bitmap cannot be made. Slots chosen here.
class QELT_HOST_API ISPBitmap {
 public:
  virtual int GetWidth() const = 0;
  virtual int GetHeight() const = 0;
  virtual ISPTexture* GetTexture() = 0;  // never null
  virtual void SetDebugName(const char* name) = 0;
  // Replaces the top left width x height pixels: 4 bytes each, red first, rows top down and tightly
  // packed. The first row is texture coordinate 0. The data is copied; an empty area does nothing.
  virtual void SetPixels(const void* pixels, int width, int height) = 0;
  // Tiles are numbered row by row; 0 of them where the bitmap is no render target.
  virtual int GetTileCount() const = 0;
  virtual ISPSubBitmap* GetSubBitmap(int index) = 0;

 protected:
  virtual ~ISPBitmap();
};

}  // namespace Qelt
