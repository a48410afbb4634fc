#pragma once

#include <array>
#include <functional>
#include <memory>
#include <ostream>
#include <utility>
#include <vector>

#include "pen/Pencil2.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/Pen.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDataManager.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "support/Board.h"

namespace QeltTests {

// What a pen draws; a redraw is of a recorded event, of a stored stroke, and of one that is cached.
enum class Kind { Live, Redraw, Outline, Preview, Prediction };

inline constexpr std::array<const char*, 5> kKindNames = {"Live", "Redraw", "Outline", "Preview",
                                                          "Prediction"};
inline std::ostream& operator<<(std::ostream& out, Kind kind) {
  return out << kKindNames[static_cast<std::size_t>(kind)];
}

// A whole pen and everything it draws, call by call as a host makes them. Events of the board itself go to
// the pen's stroke drawable.
class PenBoard : public Board {
 public:
  using Call = std::function<bool(Qelt::RectF*)>;

  explicit PenBoard(const BoardOptions& wanted = {}) : Board(wanted) {
    makePen();
    watch();
  }
  ~PenBoard() override {
    unwatch();
    deletePen();
  }

  void makePen() {
    pen.reset(createPenInst());
    pen->setPenDataManager(&data);
    pen->setVersion(options.version);
    pen->SetSize(options.size);
    pen->SetColor(static_cast<int>(options.color));
    pen->GetMorphable()->SetCurveEnabled(options.curve);
  }
  void deletePen() {
    pen.reset();
    queue.finish();
  }

  // Makes the calls of a kind, some 80 x 40 units wide, leaving it to `around` to make each of them.
  void draw(Kind kind, const std::vector<Sample>& samples, const std::function<void(const Call&)>& around) {
    const Qelt::MotionEvent whole = recorded(samples);
    switch (kind) {
      case Kind::Live:
        return drawLive(onCanvas(pen->GetStrokeDrawableGL()), samples, true, around);
      case Kind::Redraw: {
        auto* const drawable = onCanvas(pen->GetStrokeDrawableGL());
        const auto stroke = stored(samples);
        auto& cache = *Qelt::PenStrokeDataManager::GetInstance();
        around([&](Qelt::RectF* area) { return drawable->RedrawPen(&whole, area); });
        for (const bool hasEntry : {false, true, true}) {
          if (hasEntry) cache.CreateStrokeData(stroke->GetRuntimeHandle());
          around([&](Qelt::RectF* area) { return drawable->RedrawPen(stroke.get(), area); });
        }
        return cache.DropStrokeData(stroke->GetRuntimeHandle());
      }
      case Kind::Outline: {
        auto* const drawable = onCanvas(pen->GetOutlineDrawableGL());
        drawable->SetOutlineSize(3.0f);
        drawable->SetOutlineColor(static_cast<int>(options.color));
        const auto stroke = stored(samples);
        around([&](Qelt::RectF* area) { return drawable->DrawOutline(&whole, area); });
        return around([&](Qelt::RectF* area) { return drawable->DrawOutline(stroke.get(), area); });
      }
      case Kind::Preview: {
        auto* const drawable = onCanvas(pen->GetPreviewDrawableGL());
        drawLive(drawable, samples, true, around);
        return around([&](Qelt::RectF* area) { return drawable->RedrawPen(&whole, area); });
      }
      case Kind::Prediction: {
        drawLive(onCanvas(pen->GetStrokeDrawableGL()), samples, false, around);
        auto* const drawable = onCanvas(pen->GetPredictionStrokeDrawableGL());
        drawable->SetOpacity(0.75f);
        const Qelt::MotionEvent ahead = eventOf(Qelt::kActionMove, {samples[1], samples[0]});
        return around([&](Qelt::RectF* area) { return drawable->Draw(&ahead, area); });
      }
    }
  }
  void draw(Kind kind, const std::vector<Sample>& samples) {
    draw(kind, samples, [this](const Call& call) { call(&(rect = {})); });
  }

  std::unique_ptr<Qelt::Pen> pen;

 protected:
  bool draw(const Qelt::MotionEvent& event) override {
    return onCanvas(pen->GetStrokeDrawableGL())->Draw(&event, &rect);
  }

 private:
  template <typename Drawable>
  Drawable* onCanvas(Drawable* drawable) {
    drawable->SetCanvas(&canvas);
    return drawable;
  }

  Qelt::MotionEvent eventOf(int action, const std::vector<Sample>& samples) const {
    return motionEvent(action, samples, options.tool, options.source, options.clock);
  }

  // Down, two moves with half of the samples each, up; or all but the up.
  template <typename Drawable>
  void drawLive(Drawable* drawable, const std::vector<Sample>& samples, bool ends,
                const std::function<void(const Call&)>& around) {
    const auto middle = samples.begin() + static_cast<std::ptrdiff_t>(samples.size() / 2);
    const std::pair<int, std::vector<Sample>> events[] = {{Qelt::kActionDown, {samples.front()}},
                                                          {Qelt::kActionMove, {samples.begin() + 1, middle}},
                                                          {Qelt::kActionMove, {middle, samples.end()}},
                                                          {Qelt::kActionUp, {samples.back()}}};
    for (const auto& [action, some] : events) {
      if (action == Qelt::kActionUp && !ends) return;
      const Qelt::MotionEvent event = eventOf(action, some);
      around([&](Qelt::RectF* area) { return drawable->Draw(&event, area); });
    }
  }
};

}  // namespace QeltTests
