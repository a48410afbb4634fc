#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <vector>

#include "base/HostApi.h"

namespace Qelt {
class IParameterBinding;
class OpenGLShaderProgram;
}  // namespace Qelt

namespace QeltDesktop {

class CanvasLayer;
class RenderQueue;

// A layer and where it is shown: its pixel (px, py) at (x + scale * px, y + scale * py) of the surface, which
// counts its pixels from its top left corner.
struct ShownLayer {
  CanvasLayer* layer;
  float scale = 1.0f;
  float x = 0.0f;
  float y = 0.0f;
};

// Shows layers on the surface of the queue's context: a page, what is being drawn on top of it, a prediction,
// on paper. Used by the thread that made the queue, which outlives it.
class QELT_HOST_API Presenter {
 public:
  static constexpr std::size_t kMostLayers = 4;

  // Throws std::runtime_error when the queue has no context, or that has no surface.
  explicit Presenter(RenderQueue& queue);
  ~Presenter();
  Presenter(const Presenter&) = delete;
  Presenter& operator=(const Presenter&) = delete;

  // Lays the layers over each other, the lowest first, on paper (red, green, blue) that fills the surface of
  // width x height pixels. Without paper the surface keeps the layers' transparency and holds premultiplied
  // colour. The colours are those of `composeLayers`, give or take a rounding. At a scale of 1 and
  // whole-number positions pixels are shown as they are, else smoothly. Every other pixel of the surface is
  // drawn as well, after everything posted so far. A layer whose place is not finite, or whose scale is not
  // positive, is left out. Does nothing while the context is lost. Throws std::invalid_argument when there
  // are more than kMostLayers.
  void present(std::span<const ShownLayer> layers, const std::optional<std::array<std::uint8_t, 3>>& paper,
               int width, int height);

 private:
  struct Release {
    void operator()(auto* object) const { object->release(); }
  };
  using Binding = std::unique_ptr<Qelt::IParameterBinding, Release>;

  void make();
  void bindAll();
  void release();
  void draw(std::span<const ShownLayer> layers, const std::optional<std::array<std::uint8_t, 3>>& paper,
            int width, int height);

  RenderQueue& mQueue;
  std::unique_ptr<Qelt::OpenGLShaderProgram, Release> mProgram;
  std::array<Binding, kMostLayers> mLayers, mPlaces;
  Binding mPaper, mHeight;
};

}  // namespace QeltDesktop
