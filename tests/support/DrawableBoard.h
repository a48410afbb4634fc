#pragma once

#include <cstddef>
#include <memory>
#include <tuple>
#include <type_traits>
#include <vector>

#include "outline/Pencil2OutlineDrawableGL.h"
#include "pen/DrawableFactory.h"
#include "pen/Pencil2Data.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenSettingData.h"
#include "stroke/Pencil2StrokeDrawableGL.h"
#include "support/Board.h"
#include "support/Stamps.h"

namespace QeltTests {

// A drawable as the code under test makes it, not through the loaded library, with settings and shared record
// within reach. The version in the options is a stroke's rendering version, or an outline's own.
template <typename Drawable>
class DrawableBoard : public Board {
 public:
  explicit DrawableBoard(const BoardOptions& wanted = {}) : Board(wanted) {
    settings.size = options.size;
    settings.color = options.color;
    shared.mSettingData = &settings;
    shared.mCurveEnabled = options.curve;
    shared.mLastAlpha = -1.0f;
    if constexpr (std::is_same_v<Drawable, Qelt::Pencil2StrokeDrawableGL>) {
      drawable.reset(Qelt::createStrokeDrawable(rowOf(options.version).strokeVersion, &shared, &data));
    } else if constexpr (kOutlines) {
      drawable.reset(Qelt::createOutlineDrawable(options.version, &shared, &data));
    } else {
      drawable = std::make_unique<Drawable>(&shared, &data);
    }
    drawable->SetCanvas(&canvas);
    watch();
  }
  ~DrawableBoard() override {
    unwatch();
    deleteDrawable();
  }

  // As a pen does it when it dies or its version changes.
  void deleteDrawable() {
    drawable.reset();
    queue.finish();
  }

  // A recorded event or a stored stroke: drawn again, outlined.
  template <typename Input>
  bool redraw(const Input& input) {
    rect = {};
    return drawable->RedrawPen(&input, &rect);
  }
  template <typename Input>
  bool outline(const Input& input) {
    rect = {};
    return drawable->DrawOutline(&input, &rect);
  }
  bool outline(const std::vector<Sample>& samples) { return outline(recorded(samples)); }

  // The stamps that reached the render drawable since the last call; of an outline's two streams the inner
  // one comes first.
  std::vector<Stamp> takeStamps(std::size_t stream = 0) {
    std::vector<Stamp> stamps;
    for (const QeltDesktop::Batch& batch : takeBatches()) {
      const std::vector<Stamp> some = stampsOf(batch.buffers.at(stream), stride());
      stamps.insert(stamps.end(), some.begin(), some.end());
    }
    return stamps;
  }

  // Floats in one vertex.
  int stride() const {
    if constexpr (kOutlines) return Qelt::kOutlineFloatsPerVertex;
    if constexpr (std::is_base_of_v<Qelt::PenPreviewDrawableGL, Drawable>)
      return Qelt::kPreviewFloatsPerVertex;
    return strideOf(options.version);
  }

  Qelt::PenSettingData settings;
  Qelt::Pencil2Data shared{};
  std::unique_ptr<Drawable> drawable;

 protected:
  bool draw(const Qelt::MotionEvent& event) override {
    if constexpr (kOutlines)
      return false;  // they take whole strokes only
    else
      return drawable->Draw(&event, &rect);
  }

 private:
  static constexpr bool kOutlines = std::is_same_v<Drawable, Qelt::Pencil2OutlineDrawableGL>;
};

// What a live stroke might leave for the prediction: where it began, its last stamp, its last point.
inline void leaveStroke(Qelt::Pencil2Data& shared, Qelt::PointF start, Qelt::PointF stamp,
                        Qelt::PointF last) {
  std::tie(shared.mStartX, shared.mStartY) = std::tie(start.x, start.y);
  std::tie(shared.mLastStampX, shared.mLastStampY) = std::tie(stamp.x, stamp.y);
  std::tie(shared.mLastX, shared.mLastY) = std::tie(last.x, last.y);
  shared.mLastAlpha = 0.6f;
  shared.mStampCount = 7;
  shared.mHasLastStroke = true;
}

using OutlineBoard = DrawableBoard<Qelt::Pencil2OutlineDrawableGL>;
using DrawingBoard = DrawableBoard<Qelt::Pencil2StrokeDrawableGL>;

}  // namespace QeltTests
