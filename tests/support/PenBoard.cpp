#include "support/PenBoard.h"

#include <cmath>
#include <new>
#include <set>
#include <stdexcept>
#include <utility>

#include "pencommon/PenStrokeDataManager.h"
#include "support/AllocationGate.h"

namespace QeltTests {

using Qelt::MotionEvent;
using Qelt::PenStrokeDataManager;
using Qelt::RectF;
using QeltDesktop::StoredStroke;

std::ostream& operator<<(std::ostream& out, Kind kind) {
  static constexpr const char* kNames[] = {"Live", "Redraw", "Outline", "Preview", "Prediction"};
  return out << kNames[static_cast<std::size_t>(kind)];
}

std::vector<Drawing> drawings(const std::vector<int>& versions) {
  std::vector<Drawing> all{{Kind::Preview, kUsualVersion}};
  std::set<int> outlines;
  for (const int version : versions) {
    all.push_back({Kind::Live, version});
    all.push_back({Kind::Redraw, version});
    if (outlines.insert(rowOf(version).outlineVersion).second) all.push_back({Kind::Outline, version});
    if (rowOf(version).predicts) all.push_back({Kind::Prediction, version});
  }
  return all;
}

std::string drawingName(const testing::TestParamInfo<Drawing>& test) {
  return testing::PrintToString(test.param.kind) + "Version" + std::to_string(test.param.version);
}

void expectAlike(const Drawn& drawn, const Drawn& expected) {
  EXPECT_EQ(drawn.steps, expected.steps);
  EXPECT_TRUE(drawn.batches == expected.batches) << "batches";
  EXPECT_EQ(drawn.cached, expected.cached);
  EXPECT_TRUE(drawn.pixels == expected.pixels) << "pixels";
}

namespace {

// Runs a call of the host's own, which may run out of memory.
template <typename Call>
void hostCall(Call&& call) {
  const PlugInCall inside;
  try {
    call();
  } catch (const std::bad_alloc&) {
  }
}

void makeCacheEntry(const StoredStroke& stroke) {
  hostCall([&] { PenStrokeDataManager::GetInstance()->CreateStrokeData(stroke.GetRuntimeHandle()); });
}

}  // namespace

const QeltDesktop::PluginLibrary& PenBoard::library() {
  static const QeltDesktop::PluginLibrary loaded(QELT_PLUGIN_PATH);
  return loaded;
}

PenBoard::PenBoard(const BoardOptions& wanted)
    : Board(wanted), mMakePen([] { return library().createPen(); }) {
  makePen();
  if (pen == nullptr) throw std::runtime_error("no pen");
  watch();
}

PenBoard::PenBoard(const BoardOptions& wanted, QeltDesktop::RenderQueue& itsQueue,
                   QeltDesktop::CanvasLayer* itsLayer, MakePen makesPen)
    : Board(wanted, itsQueue, itsLayer), mMakePen(std::move(makesPen)) {}

PenBoard::~PenBoard() {
  queue.onAccepted = nullptr;
  queue.accept = nullptr;
  deletePen();
  finish();
  unwatch();
  turnPage();
  EXPECT_EQ(canvas.openTiles(), 0) << "a tile was begun and not ended";
}

void PenBoard::makePen() {
  if (pen != nullptr) return;
  const PlugInCall call;
  pen.reset(mMakePen());
  if (pen == nullptr) return;
  pen->setPenDataManager(&data);
  setUsualPen();
}

void PenBoard::deletePen() {
  const PlugInCall call;
  pen.reset();
}

void PenBoard::finish() {
  const PlugInCall call;
  queue.finish();
}

void PenBoard::setUsualPen() {
  pen->setVersion(options.version);
  pen->SetScreenResolution(400, 600);
  pen->SetSize(options.size);
  pen->SetColor(static_cast<int>(options.color));
  pen->GetMorphable()->SetCurveEnabled(options.curve);
}

void PenBoard::setUsual(Qelt::PenDrawableGL& drawable) {
  zoom(1.0f);
  const PlugInCall call;
  setUsualPen();
  pen->GetMorphable()->SetFixedWidthEnabled(false);
  drawable.SetCanvas(&canvas);
}

void PenBoard::setCurve(bool curve) {
  makePen();
  if (pen != nullptr) pen->GetMorphable()->SetCurveEnabled(curve);
}

template <typename Drawable>
Drawable* PenBoard::onCanvas(Drawable* (Qelt::Pen::*getter)()) {
  makePen();
  const PlugInCall call;
  Drawable* const drawable = pen == nullptr ? nullptr : (pen.get()->*getter)();
  if (drawable != nullptr) drawable->SetCanvas(&canvas);
  return drawable;
}

bool PenBoard::draw(const MotionEvent& event) {
  return onCanvas(&Qelt::Pen::GetStrokeDrawableGL)->Draw(&event, &rect);
}

template <typename Drawable, typename Made>
void PenBoard::call(Drawable* drawable, const std::function<void(const Call&)>& around, Made&& made) {
  if (drawable == nullptr) return;
  if (beforeCall) beforeCall(*drawable);
  around([&](RectF* area) {
    try {
      const PlugInCall inside;
      return made(*drawable, area);
    } catch (const std::bad_alloc&) {
      ++mRefusedBatches;
      return false;
    }
  });
  if (keepsUp) finish();
}

// Down, two moves with half of the samples each, up; or all but the up.
template <typename Drawable>
void PenBoard::drawLive(Drawable* drawable, const std::vector<Sample>& samples, bool ends,
                        const std::function<void(const Call&)>& around) {
  const auto middle = samples.begin() + static_cast<std::ptrdiff_t>(samples.size() / 2);
  const std::pair<int, std::vector<Sample>> events[] = {{Qelt::kActionDown, {samples.front()}},
                                                        {Qelt::kActionMove, {samples.begin() + 1, middle}},
                                                        {Qelt::kActionMove, {middle, samples.end()}},
                                                        {Qelt::kActionUp, {samples.back()}}};
  for (const auto& [action, some] : events) {
    if (action == Qelt::kActionUp && !ends) return;
    const MotionEvent event = eventOf(action, some);
    call(drawable, around, [&](auto& it, RectF* area) { return it.Draw(&event, area); });
  }
}

StoredStroke& PenBoard::newStroke(const std::vector<Sample>& samples) {
  return *mPage.emplace_back(stored(samples));
}

void PenBoard::draw(Kind kind, const std::vector<Sample>& samples,
                    const std::function<void(const Call&)>& around) {
  const MotionEvent whole = recorded(samples);
  switch (kind) {
    case Kind::Live:
      return drawLive(onCanvas(&Qelt::Pen::GetStrokeDrawableGL), samples, true, around);
    case Kind::Redraw: {
      auto* const drawable = onCanvas(&Qelt::Pen::GetStrokeDrawableGL);
      call(drawable, around, [&](auto& it, RectF* area) { return it.RedrawPen(&whole, area); });
      StoredStroke& stroke = newStroke(samples);
      for (const char* const entry : {"none", "empty", "full", "dirty"}) {
        if (*entry == 'e') makeCacheEntry(stroke);
        if (*entry == 'd') stroke.SetRedrawingCacheDirtyFlag();
        call(drawable, around, [&](auto& it, RectF* area) { return it.RedrawPen(&stroke, area); });
      }
      return;
    }
    case Kind::Outline: {
      auto* const drawable = onCanvas(&Qelt::Pen::GetOutlineDrawableGL);
      if (drawable == nullptr) return;
      drawable->SetOutlineSize(3.0f);
      drawable->SetOutlineColor(static_cast<int>(options.color));
      const StoredStroke& stroke = newStroke(samples);
      call(drawable, around, [&](auto& it, RectF* area) { return it.DrawOutline(&whole, area); });
      return call(drawable, around, [&](auto& it, RectF* area) { return it.DrawOutline(&stroke, area); });
    }
    case Kind::Preview: {
      auto* const drawable = onCanvas(&Qelt::Pen::GetPreviewDrawableGL);
      drawLive(drawable, samples, true, around);
      return call(drawable, around, [&](auto& it, RectF* area) { return it.RedrawPen(&whole, area); });
    }
    case Kind::Prediction: {
      if (!rowOf(options.version).predicts) return;
      drawLive(onCanvas(&Qelt::Pen::GetStrokeDrawableGL), samples, false, around);
      auto* const drawable = onCanvas(&Qelt::Pen::GetPredictionStrokeDrawableGL);
      if (drawable == nullptr) return;
      drawable->SetOpacity(0.75f);
      const MotionEvent ahead = eventOf(Qelt::kActionMove, {samples.rbegin(), samples.rend()});
      return call(drawable, around, [&](auto& it, RectF* area) { return it.Draw(&ahead, area); });
    }
  }
}

void PenBoard::draw(Kind kind, const std::vector<Sample>& samples) {
  draw(kind, samples, [this](const Call& call) {
    const bool answer = call(&(rect = {}));
    if (mSteps == nullptr) return;
    mSteps->push_back({answer ? 1.0f : 0.0f});
    // Two edges that are NaN are alike.
    for (const float edge : {rect.left, rect.top, rect.right, rect.bottom})
      mSteps->back().push_back(std::isnan(edge) ? 0.0625f : edge);
  });
}

std::vector<Sample> PenBoard::usualStroke() {
  std::vector<Sample> made;
  for (int i = 0; i < 9; ++i) {
    const auto t = static_cast<float>(i);
    made.push_back(
        {30.3f + 7.0f * t, 40.2f + 12.0f * std::sin(0.6f * t), 0.3f + 0.06f * t, 0.08f * t, 0.2f * t});
  }
  return made;
}

void PenBoard::drawOneOfEach() {
  const std::vector<Sample> samples = usualStroke();
  const MotionEvent whole = recorded(samples);
  const MotionEvent ahead = eventOf(Qelt::kActionMove, {samples[2], samples[3], samples[4]});
  const StoredStroke& stroke = newStroke(samples);
  const auto around = [](const Call& call) {
    RectF area;
    call(&area);
  };
  makeCacheEntry(stroke);
  for (int i = 0; i < 2; ++i)
    call(onCanvas(&Qelt::Pen::GetStrokeDrawableGL), around,
         [&](auto& it, RectF* area) { return it.RedrawPen(&stroke, area); });
  call(onCanvas(&Qelt::Pen::GetOutlineDrawableGL), around, [&](auto& it, RectF* area) {
    it.SetOutlineSize(2.0f);
    return it.DrawOutline(&whole, area);
  });
  call(onCanvas(&Qelt::Pen::GetPreviewDrawableGL), around,
       [&](auto& it, RectF* area) { return it.RedrawPen(&whole, area); });
  call(onCanvas(&Qelt::Pen::GetPredictionStrokeDrawableGL), around,
       [&](auto& it, RectF* area) { return it.Draw(&ahead, area); });
  finish();
}

void PenBoard::prepareAll() {
  onCanvas(&Qelt::Pen::GetStrokeDrawableGL);
  onCanvas(&Qelt::Pen::GetOutlineDrawableGL);
  onCanvas(&Qelt::Pen::GetPreviewDrawableGL);
  if (rowOf(options.version).predicts) onCanvas(&Qelt::Pen::GetPredictionStrokeDrawableGL);
}

Drawn PenBoard::drawEverything(float zoomFactor) {
  queue.restoreContext();
  queue.finish();
  QeltDesktop::setBatchObserver(nullptr);
  makePen();
  setUsual(*pen->GetStrokeDrawableGL());
  zoom(zoomFactor);
  // An outline's first segment grows from the width that the outline before it ended with, and a prediction
  // from the last stroke's end: one of each sets both, and what follows starts alike. Nobody looks at them.
  canvas.setTarget(Target::NoTiles);
  draw(Kind::Outline);
  draw(Kind::Live);
  queue.finish();
  canvas.setTarget(Target::Whole);
  if (layer != nullptr) layer->clear();
  Drawn drawn;
  mSteps = &drawn.steps;
  takeBatches();
  watch();
  layer != nullptr ? drawOneOfEach() : drawAll();
  for (QeltDesktop::Batch& batch : takeBatches()) {
    drawn.batches.insert(drawn.batches.end(), batch.buffers.begin(), batch.buffers.end());
    drawn.cached.push_back(batch.cached);
  }
  takePosts();
  unwatch();
  mSteps = nullptr;
  if (layer != nullptr) drawn.pixels = layer->readPixels();
  return drawn;
}

void PenBoard::turnPage() {
  for (const auto& stroke : mPage) {
    PenStrokeDataManager::GetInstance()->DropStrokeData(stroke->GetRuntimeHandle());
  }
  mPage.clear();
}

void PenBoard::loseAndRestoreContext() {
  hostCall([this] { queue.loseContext(); });
  hostCall([this] { queue.restoreContext(); });
}

}  // namespace QeltTests
