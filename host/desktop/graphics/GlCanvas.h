#pragma once

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
  GlBitmap& mBitmap;
  Qelt::OpenGLShaderProgram* mProgram = nullptr;
  Qelt::IParameterBinding* mEdges = nullptr;
  Qelt::IParameterBinding* mColor = nullptr;
  Qelt::IParameterBinding* mAntiAlias = nullptr;
  Qelt::GraphicsObject* mQuad = nullptr;
};

}  // namespace QeltDesktop
