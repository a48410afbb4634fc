#pragma once

#include <memory>

#include "graphics/ISPCanvas.h"

namespace Qelt {
class GraphicsObject;
class IParameterBinding;
class OpenGLShaderProgram;
}  // namespace Qelt

namespace QeltDesktop {

class GlBitmap;

// Draws shapes into a bitmap, which holds premultiplied colours afterwards, over a context loss too. Render
// thread.
class GlCanvas final : public Qelt::ISPCanvas {
 public:
  // `bitmap` outlives the canvas.
  explicit GlCanvas(GlBitmap& bitmap);
  ~GlCanvas() override;

  // True when it can draw.
  bool isReady() const;

  void Clear(unsigned int argb) override;
  void DrawShape(float x, float y, float size, const Qelt::SPPaint& paint) override;

 private:
  struct Release {
    void operator()(auto* object) const { object->release(); }
  };

  GlBitmap& mBitmap;
  std::unique_ptr<Qelt::OpenGLShaderProgram, Release> mProgram;
  std::unique_ptr<Qelt::IParameterBinding, Release> mEdges, mColor, mAntiAlias;
  std::unique_ptr<Qelt::GraphicsObject, Release> mQuad;
};

}  // namespace QeltDesktop
