#include "Stage.h"

#include <cmath>
#include <new>
#include <stdexcept>

#include "base/RectF.h"
#include "desktop/pencommon/BatchObserver.h"
#include "math/Matrix3.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDataManager.h"
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

}  // namespace

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
  return found.empty() && drawn.pixels != expected.pixels ? "pixels" : found;
}

Stage::Stage(QeltDesktop::RenderQueue& queue, QeltDesktop::CanvasLayer* layer, int version)
    : mVersion(version), mQueue(queue), mLayer(layer), mCanvas(&queue, layer), mData(&queue) {}

Stage::~Stage() {
  mPen.reset();
  mQueue.finish();
  turnPage();
}

const QeltDesktop::PluginLibrary& Stage::library() {
  static const QeltDesktop::PluginLibrary loaded(QELT_PLUGIN_PATH);
  return loaded;
}

void Stage::makePen() {
  if (mPen != nullptr) return;
  mPen.reset(library().createPen());
  if (mPen == nullptr) return;
  mPen->setPenDataManager(&mData);
  mPen->setVersion(mVersion);
  mPen->SetScreenResolution(400, 600);
  mPen->SetSize(kSize);
  mPen->SetColor(kInk);
}

void Stage::deletePen() {
  mPen.reset();
}

template <typename Call>
void Stage::drawing(Call&& call) {
  RectF rect;
  bool answer = false;
  try {
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
  Drawable* const drawable = mPen == nullptr ? nullptr : (mPen.get()->*getter)();
  if (drawable != nullptr) drawable->SetCanvas(&mCanvas);
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
  PenStrokeDataManager::GetInstance()->CreateStrokeData(mPage.back()->GetRuntimeHandle());
  return *mPage.back();
}

template <typename Drawable>
void Stage::send(Drawable* drawable, int action, const std::vector<Sample>& from, std::size_t begin,
                 std::size_t end, bool finishes) {
  const MotionEvent event = eventOf(action, from, begin, end);
  drawing([&](RectF* rect) { return drawable->Draw(&event, rect); });
  if (finishes) mQueue.finish();
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
void Stage::redrawTwice(Drawable* drawable, const Input& input) {
  for (int i = 0; i < 2; ++i) {
    drawing([&](RectF* rect) { return drawable->RedrawPen(&input, rect); });
  }
}

void Stage::redraw(bool finishes) {
  makePen();
  Qelt::PenStrokeDrawableGL* drawable = strokeDrawable();
  if (drawable == nullptr) return;
  const auto keepUp = [&] {
    if (finishes) mQueue.finish();
  };
  StoredStroke& stroke = newStroke();
  redrawTwice(drawable, stroke);  // a miss, then a hit
  keepUp();
  stroke.SetRedrawingCacheDirtyFlag();
  redrawTwice(drawable, stroke);
  keepUp();
  MotionEvent recorded = recordedStroke();
  redrawTwice(drawable, recorded);
  keepUp();
  mPen->GetMorphable()->SetCurveEnabled(false);
  StoredStroke& straight = newStroke();
  redrawTwice(drawable, straight);
  redrawTwice(drawable, recorded);
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
    drawing([&](RectF* rect) { return drawable->DrawOutline(&stroke, rect); });
    drawing([&](RectF* rect) { return drawable->DrawOutline(&recorded, rect); });
    if (finishes) mQueue.finish();
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
  drawing([&](RectF* rect) { return drawable->RedrawPen(&recorded, rect); });
  if (finishes) mQueue.finish();
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

void Stage::turnPage() {
  for (const auto& stroke : mPage) {
    PenStrokeDataManager::GetInstance()->DropStrokeData(stroke->GetRuntimeHandle());
  }
  mPage.clear();
}

void Stage::zoom(float factor) {
  Qelt::Matrix3<float> matrix;
  matrix[0] = matrix[4] = factor;
  mCanvas.setMatrix(matrix);
}

void Stage::loseAndRestoreContext() {
  mQueue.loseContext();
  mQueue.restoreContext();
}

Drawn Stage::drawEverything() {
  mQueue.finish();
  Drawn drawn;
  zoom(1.0f);
  makePen();
  // An outline's first segment grows from the width that the outline before it ended with, and a prediction
  // from the last stroke's end: one of each sets both, and what follows starts alike.
  outline();
  mQueue.finish();
  if (mLayer != nullptr) mLayer->clear();
  mRecord = &drawn;
  QeltDesktop::setBatchObserver([&drawn](QeltDesktop::Batch batch) {
    for (std::vector<float>& buffer : batch.buffers) drawn.batches.push_back(std::move(buffer));
  });
  live();
  redraw();
  outline();
  preview();
  predict();
  mQueue.finish();
  QeltDesktop::setBatchObserver(nullptr);
  mRecord = nullptr;
  if (mLayer != nullptr) drawn.pixels = mLayer->readPixels();
  return drawn;
}

}  // namespace QeltTests
