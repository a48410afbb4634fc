#pragma once

#include "base/HostApi.h"

namespace Qelt {

// How to fill a shape.
class QELT_HOST_API SPPaint {
 public:
  enum Style : int { kFill = 0 };

  SPPaint();
  ~SPPaint();
  void SetColor(unsigned int argb);
  void SetStyle(int style);
  void SetAntiAlias(bool on);
  unsigned int GetColor() const;
  bool IsAntiAlias() const;

 private:
  unsigned int mColor = 0xFF000000u;
  int mStyle = kFill;
  bool mAntiAlias = false;
};

// Draws shapes into a bitmap. Render thread. Slots chosen here.
class QELT_HOST_API ISPCanvas {
 public:
  virtual void Clear(unsigned int argb) = 0;
  // The host shape with corner (x, y) and size `size`. Chosen here: a filled square.
  virtual void DrawShape(float x, float y, float size, const SPPaint& paint) = 0;

 protected:
  friend class SPGraphicsFactory;
  virtual ~ISPCanvas();
};

}  // namespace Qelt
