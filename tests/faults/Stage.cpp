#include "Stage.h"

#include <cmath>
#include <new>
#include <stdexcept>
#include <utility>

#include "PlugInCall.h"
#include "base/RectF.h"
#include "desktop/pencommon/BatchObserver.h"
#include "math/Matrix3.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDataManager.h"
#include "support/BatchCheck.h"
#include "support/Board.h"

namespace QeltTests {

using Qelt::MotionEvent;
using Qelt::PenStrokeDataManager;
using Qelt::RectF;
using QeltDesktop::StoredStroke;

namespace {

constexpr float kSize = 4.0f;
constexpr int kInk = static_cast<int>(0xFF305090u);

std::vector<Sample> samples() {
  std::vector<Sample> made;
  for (int i = 0; i <= 9; ++i) {
    const float t = static_cast<float>(i);
    made.push_back(
        {30.3f + 7.0f * t, 40.2f + 12.0f * std::sin(0.6f * t), 0.3f + 0.06f * t, 0.08f * t, 0.2f * t});
  }
  return made;
}

MotionEvent eventOf(int action, const std::vector<Sample>& from, std::size_t begin, std::size_t end) {
  return motionEvent(action, {from.data() + begin, from.data() + end});
}

// A whole stroke in one event's history.
MotionEvent recordedStroke() {
  std::vector<Sample> all = samples();
  all.push_back(all.back());
  return eventOf(Qelt::kActionUp, all, 0, all.size());
}

// Where batches go that are compared, and what was wrong with any.
Drawn* recording = nullptr;
std::string wrong;

void look(const QeltDesktop::Batch& batch) {
  if (const char* const fault = faultOf(batch); fault != nullptr && wrong.empty()) wrong = fault;
  if (recording == nullptr) return;
  recording->batches.insert(recording->batches.end(), batch.buffers.begin(), batch.buffers.end());
  recording->cached.push_back(batch.cached);
}

}  // namespace

std::string Stage::watchBatches() {
  QeltDesktop::setBatchObserver(look);
  return std::exchange(wrong, std::string());
}

void Stage::watchNoBatches() {
  QeltDesktop::setBatchObserver(nullptr);
}

std::string difference(const Drawn& drawn, const Drawn& expected) {
  const auto ofLists = [](const char* name, const auto& some, const auto& others) {
    if (some.size() != others.size()) {
      return std::to_string(some.size()) + " " + name + "s instead of " + std::to_string(others.size());
    }
    for (std::size_t i = 0; i < some.size(); ++i) {
      if (some[i] != others[i]) return std::string(name) + " " + std::to_string(i);
    }
    return std::string();
  };
  std::string found = ofLists("step", drawn.steps, expected.steps);
  if (found.empty()) found = ofLists("batch", drawn.batches, expected.batches);
  if (found.empty() && drawn.cached != expected.cached) found = "hits of the cache";
  return found.empty() && drawn.pixels != expected.pixels ? "pixels" : found;
}

Stage::Stage(QeltDesktop::RenderQueue& queue, QeltDesktop::CanvasLayer* layer, int version)
    : mVersion(version),
      mQueue(queue),
      mLayer(layer),
      mCanvases{{&queue, layer},
                {&queue, nullptr, Target::NoLayer},
                {&queue, layer, Target::NoBitmap},
                {&queue, layer, Target::NoTiles}},
      mData(&queue) {}

Stage::~Stage() {
  deletePen();
  mQueue.finish();
  turnPage();
}

const QeltDesktop::PluginLibrary& Stage::library() {
  static const QeltDesktop::PluginLibrary loaded(QELT_PLUGIN_PATH);
  return loaded;
}

void Stage::makePen() {
  if (mPen != nullptr) return;
  const PlugInCall call;
  mPen.reset(library().createPen());
  if (mPen == nullptr) return;
  mPen->setPenDataManager(&mData);
  setUsualPen();
}

void Stage::deletePen() {
  const PlugInCall call;
  mPen.reset();
}

void Stage::setUsualPen() {
  mPen->setVersion(mVersion);
  mPen->SetScreenResolution(400, 600);
  mPen->SetSize(kSize);
  mPen->SetColor(kInk);
}

void Stage::setUsual(Qelt::PenDrawableGL& drawable) {
  zoom(1.0f);
  const PlugInCall call;
  setUsualPen();
  mPen->GetMorphable()->SetFixedWidthEnabled(false);
  mPen->GetMorphable()->SetCurveEnabled(true);
  drawable.SetCanvas(canvas(Target::Whole));
}

template <typename Call>
void Stage::hostCall(Call&& call) {
  const PlugInCall inside;
  try {
    call();
  } catch (const std::bad_alloc&) {
  }
}

void Stage::finish() {
  const PlugInCall call;
  mQueue.finish();
}

template <typename Call>
void Stage::drawing(Qelt::PenDrawableGL& drawable, Call&& call) {
  if (beforeCall) beforeCall(*this, drawable);
  RectF rect;
  bool answer = false;
  try {
    const PlugInCall inside;
    answer = call(&rect);
  } catch (const std::bad_alloc&) {
    ++mRefusedBatches;
  }
  if (mRecord == nullptr) return;
  mRecord->steps.push_back({answer ? 1.0f : 0.0f});
  // Two edges that are no numbers are alike.
  for (const float edge : {rect.left, rect.top, rect.right, rect.bottom})
    mRecord->steps.back().push_back(std::isnan(edge) ? 0.0625f : edge);
}

template <typename Drawable>
Drawable* Stage::onCanvas(Drawable* (Qelt::Pen::*getter)()) {
  const PlugInCall call;
  Drawable* const drawable = mPen == nullptr ? nullptr : (mPen.get()->*getter)();
  if (drawable != nullptr) drawable->SetCanvas(canvas(Target::Whole));
  return drawable;
}

Qelt::PenStrokeDrawableGL* Stage::strokeDrawable() {
  return onCanvas(&Qelt::Pen::GetStrokeDrawableGL);
}

StoredStroke& Stage::newStroke() {
  mPage.push_back(std::make_unique<StoredStroke>(Qelt::kToolStylus));
  std::int64_t time = 0;
  for (const Sample& sample : samples()) {
    mPage.back()->addPoint({sample.x, sample.y}, time += 4, sample.pressure, sample.tilt, sample.orientation);
  }
  hostCall(
      [this] { PenStrokeDataManager::GetInstance()->CreateStrokeData(mPage.back()->GetRuntimeHandle()); });
  return *mPage.back();
}

template <typename Drawable>
void Stage::send(Drawable* drawable, int action, const std::vector<Sample>& from, std::size_t begin,
                 std::size_t end, bool finishes) {
  const MotionEvent event = eventOf(action, from, begin, end);
  drawing(*drawable, [&](RectF* rect) { return drawable->Draw(&event, rect); });
  if (finishes) finish();
}

void Stage::drawStroke(Qelt::PenStrokeDrawableGL* drawable, bool finishes, bool ends) {
  if (drawable == nullptr) return;
  const std::vector<Sample> all = samples();
  send(drawable, Qelt::kActionDown, all, 0, 1, finishes);
  send(drawable, Qelt::kActionMove, all, 1, 4, finishes);
  send(drawable, Qelt::kActionMove, all, 4, 6, finishes);
  send(drawable, Qelt::kActionMove, all, 6, 9, finishes);
  if (ends) send(drawable, Qelt::kActionUp, all, 9, 10, finishes);
}

void Stage::live(bool finishes) {
  makePen();
  drawStroke(strokeDrawable(), finishes, true);
}

void Stage::beginLive() {
  makePen();
  drawStroke(strokeDrawable(), false, false);
}

void Stage::straight() {
  makePen();
  if (mPen == nullptr) return;
  mPen->GetMorphable()->SetCurveEnabled(false);
  live();
  outline();
  preview();
  mPen->GetMorphable()->SetCurveEnabled(true);
}

template <typename Drawable, typename Input>
void Stage::redrawTwice(Drawable& drawable, const Input& input) {
  for (int i = 0; i < 2; ++i) {
    drawing(drawable, [&](RectF* rect) { return drawable.RedrawPen(&input, rect); });
  }
}

void Stage::redraw(bool finishes) {
  makePen();
  Qelt::PenStrokeDrawableGL* drawable = strokeDrawable();
  if (drawable == nullptr) return;
  const auto keepUp = [&] {
    if (finishes) finish();
  };
  StoredStroke& stroke = newStroke();
  redrawTwice(*drawable, stroke);  // a miss, then a hit
  keepUp();
  stroke.SetRedrawingCacheDirtyFlag();
  redrawTwice(*drawable, stroke);
  keepUp();
  MotionEvent recorded = recordedStroke();
  redrawTwice(*drawable, recorded);
  keepUp();
  mPen->GetMorphable()->SetCurveEnabled(false);
  StoredStroke& straight = newStroke();
  redrawTwice(*drawable, straight);
  redrawTwice(*drawable, recorded);
  mPen->GetMorphable()->SetCurveEnabled(true);
  keepUp();
}

void Stage::outline(bool finishes) {
  makePen();
  Qelt::PenOutlineDrawableGL* drawable = onCanvas(&Qelt::Pen::GetOutlineDrawableGL);
  if (drawable == nullptr) return;
  drawable->SetOutlineSize(2.0f);
  drawable->SetOutlineColor(kInk);
  const StoredStroke& stroke = newStroke();
  MotionEvent recorded = recordedStroke();
  for (int i = 0; i < 2; ++i) {
    drawing(*drawable, [&](RectF* rect) { return drawable->DrawOutline(&stroke, rect); });
    drawing(*drawable, [&](RectF* rect) { return drawable->DrawOutline(&recorded, rect); });
    if (finishes) finish();
  }
}

void Stage::preview(bool finishes) {
  makePen();
  Qelt::PenPreviewDrawableGL* drawable = onCanvas(&Qelt::Pen::GetPreviewDrawableGL);
  if (drawable == nullptr) return;
  const std::vector<Sample> all = samples();
  send(drawable, Qelt::kActionDown, all, 0, 1, finishes);
  send(drawable, Qelt::kActionMove, all, 1, 6, finishes);
  send(drawable, Qelt::kActionUp, all, 9, 10, finishes);
  MotionEvent recorded = recordedStroke();
  drawing(*drawable, [&](RectF* rect) { return drawable->RedrawPen(&recorded, rect); });
  if (finishes) finish();
}

void Stage::predict(bool finishes) {
  makePen();
  if (mPen == nullptr || mVersion != 8) return;
  drawStroke(strokeDrawable(), finishes, false);
  auto* const drawable = onCanvas(&Qelt::Pen::GetPredictionStrokeDrawableGL);
  if (drawable == nullptr) return;
  drawable->SetOpacity(0.5f);
  std::vector<Sample> ahead = samples();
  for (Sample& sample : ahead) sample.x += 60.0f;
  for (int i = 0; i < 2; ++i) send(drawable, Qelt::kActionMove, ahead, 0, 4, finishes);
  Qelt::PenStrokeDrawableGL* stroke = strokeDrawable();
  if (stroke != nullptr) send(stroke, Qelt::kActionUp, samples(), 9, 10, false);
}

void Stage::prepareAll() {
  makePen();
  strokeDrawable();
  onCanvas(&Qelt::Pen::GetOutlineDrawableGL);
  onCanvas(&Qelt::Pen::GetPreviewDrawableGL);
  if (mVersion == 8) onCanvas(&Qelt::Pen::GetPredictionStrokeDrawableGL);
}

void Stage::everyKind() {
  live();
  redraw();
  outline();
  preview();
  predict();
}

void Stage::oneOfEach() {
  makePen();
  const MotionEvent recorded = recordedStroke();
  if (auto* const drawable = strokeDrawable()) redrawTwice(*drawable, newStroke());
  if (auto* const drawable = onCanvas(&Qelt::Pen::GetOutlineDrawableGL)) {
    drawable->SetOutlineSize(2.0f);
    drawing(*drawable, [&](RectF* rect) { return drawable->DrawOutline(&recorded, rect); });
  }
  if (auto* const drawable = onCanvas(&Qelt::Pen::GetPreviewDrawableGL))
    drawing(*drawable, [&](RectF* rect) { return drawable->RedrawPen(&recorded, rect); });
  if (auto* const drawable = onCanvas(&Qelt::Pen::GetPredictionStrokeDrawableGL))
    send(drawable, Qelt::kActionMove, samples(), 2, 5, false);
  finish();
}

bool Stage::redrawsLastOf(Stage& other) {
  if (other.mPage.empty()) return true;
  makePen();
  mPen->GetMorphable()->SetCurveEnabled(other.pen()->GetMorphable()->IsCurveEnabled());
  Qelt::PenStrokeDrawableGL* const drawable = strokeDrawable();
  StoredStroke& stroke = *other.mPage.back();
  finish();
  Drawn* const outer = std::exchange(recording, nullptr);
  Drawn drawn[2];
  for (Drawn& into : drawn) {
    recording = &into;
    drawing(*drawable, [&](RectF* rect) { return drawable->RedrawPen(&stroke, rect); });
    finish();
    stroke.SetRedrawingCacheDirtyFlag();
  }
  recording = outer;
  return drawn[0].batches == drawn[1].batches;
}

void Stage::turnPage() {
  for (const auto& stroke : mPage) {
    PenStrokeDataManager::GetInstance()->DropStrokeData(stroke->GetRuntimeHandle());
  }
  mPage.clear();
}

void Stage::zoom(float factor) {
  Qelt::Matrix3<float> matrix;
  matrix[0] = matrix[4] = factor;
  for (StageCanvas& canvas : mCanvases) canvas.setMatrix(matrix);
}

void Stage::loseAndRestoreContext() {
  hostCall([this] { mQueue.loseContext(); });
  hostCall([this] { mQueue.restoreContext(); });
}

Drawn Stage::drawEverything(float zoomFactor) {
  mQueue.restoreContext();
  mQueue.finish();
  Drawn* const outer = std::exchange(recording, nullptr);
  makePen();
  setUsual(*mPen->GetStrokeDrawableGL());
  zoom(zoomFactor);
  // An outline's first segment grows from the width that the outline before it ended with, and a prediction
  // from the last stroke's end: one of each sets both, and what follows starts alike. Nobody looks at them.
  mCanvases[0].setTarget(Target::NoTiles);
  outline(false);
  live(false);
  mQueue.finish();
  mCanvases[0].setTarget(Target::Whole);
  if (mLayer != nullptr) mLayer->clear();
  Drawn drawn;
  recording = &drawn;
  mRecord = &drawn;
  QeltDesktop::setBatchObserver(look);
  mLayer != nullptr ? oneOfEach() : everyKind();
  mQueue.finish();
  recording = outer;
  mRecord = nullptr;
  if (outer == nullptr) watchNoBatches();
  if (mLayer != nullptr) drawn.pixels = mLayer->readPixels();
  return drawn;
}

}  // namespace QeltTests
