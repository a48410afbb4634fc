#include "Stage.h"

#include <cmath>
#include <initializer_list>
#include <new>
#include <stdexcept>

#include "desktop/pencommon/BatchObserver.h"
#include "math/Matrix3.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDataManager.h"
#include "support/BlindLayer.h"

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
  const Qelt::PointerProperties pointer{0, Qelt::kToolStylus};
  const auto coords = [&](std::size_t i) {
    return Qelt::PointerCoords{from[i].x, from[i].y, from[i].pressure, from[i].tilt, from[i].orientation};
  };
  const Qelt::PointerCoords first = coords(begin);
  MotionEvent event(0, 4, action, 1, &pointer, &first, 0, Qelt::kSourceStylus, 0);
  for (std::size_t i = begin + 1; i < end; ++i) {
    const Qelt::PointerCoords next = coords(i);
    event.AddBatch(4 * static_cast<std::int64_t>(i), &next);
  }
  return event;
}

// A whole stroke in one event's history.
MotionEvent recordedStroke() {
  std::vector<Sample> all = samples();
  all.push_back(all.back());
  return eventOf(Qelt::kActionUp, all, 0, all.size());
}

bool sameBits(float a, float b) {
  return a == b || (std::isnan(a) && std::isnan(b));
}

}  // namespace

// With a layer a canvas like any other; without, one whose render messages have something to run through.
class Stage::Canvas final : public QeltDesktop::PenCanvas {
 public:
  using PenCanvas::PenCanvas;
  Qelt::ISPLayer* GetLayer() override { return layer() != nullptr ? PenCanvas::GetLayer() : &mBlindLayer; }

 private:
  BlindLayer mBlindLayer;
};

bool Drawn::Step::operator==(const Step& other) const {
  return answer == other.answer && sameBits(rect.left, other.rect.left) &&
         sameBits(rect.top, other.rect.top) && sameBits(rect.right, other.rect.right) &&
         sameBits(rect.bottom, other.rect.bottom);
}

std::string difference(const Drawn& drawn, const Drawn& expected) {
  if (drawn.steps.size() != expected.steps.size()) {
    return std::to_string(drawn.steps.size()) + " steps instead of " + std::to_string(expected.steps.size());
  }
  for (std::size_t i = 0; i < drawn.steps.size(); ++i) {
    if (!(drawn.steps[i] == expected.steps[i])) return "step " + std::to_string(i);
  }
  if (drawn.batches.size() != expected.batches.size()) {
    return std::to_string(drawn.batches.size()) + " batches instead of " +
           std::to_string(expected.batches.size());
  }
  for (std::size_t i = 0; i < drawn.batches.size(); ++i) {
    if (drawn.batches[i] != expected.batches[i]) return "batch " + std::to_string(i);
  }
  return drawn.pixels == expected.pixels ? "" : "pixels";
}

Stage::Stage(QeltDesktop::RenderQueue& queue, QeltDesktop::CanvasLayer* layer, int version)
    : mVersion(version),
      mQueue(queue),
      mLayer(layer),
      mCanvas(std::make_unique<Canvas>(&queue, layer)),
      mData(&queue) {}

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
  if (mRecord != nullptr) mRecord->steps.push_back({answer, rect});
}

Qelt::PenStrokeDrawableGL* Stage::strokeDrawable() {
  if (mPen == nullptr) return nullptr;
  Qelt::PenStrokeDrawableGL* drawable = mPen->GetStrokeDrawableGL();
  if (drawable != nullptr) drawable->SetCanvas(mCanvas.get());
  return drawable;
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

void Stage::drawStroke(Qelt::PenStrokeDrawableGL* drawable, bool finishes, bool ends) {
  if (drawable == nullptr) return;
  const std::vector<Sample> all = samples();
  const auto send = [&](int action, std::size_t begin, std::size_t end) {
    const MotionEvent event = eventOf(action, all, begin, end);
    drawing([&](RectF* rect) { return drawable->Draw(&event, rect); });
    if (finishes) mQueue.finish();
  };
  send(Qelt::kActionDown, 0, 1);
  send(Qelt::kActionMove, 1, 4);
  send(Qelt::kActionMove, 4, 6);
  send(Qelt::kActionMove, 6, 9);
  if (ends) send(Qelt::kActionUp, 9, 10);
}

void Stage::live(bool finishes) {
  makePen();
  drawStroke(strokeDrawable(), finishes, true);
}

void Stage::beginLive() {
  makePen();
  drawStroke(strokeDrawable(), false, false);
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
  if (mPen == nullptr) return;
  Qelt::PenOutlineDrawableGL* drawable = mPen->GetOutlineDrawableGL();
  if (drawable == nullptr) return;
  drawable->SetCanvas(mCanvas.get());
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
  if (mPen == nullptr) return;
  Qelt::PenPreviewDrawableGL* drawable = mPen->GetPreviewDrawableGL();
  if (drawable == nullptr) return;
  drawable->SetCanvas(mCanvas.get());
  const std::vector<Sample> all = samples();
  const auto send = [&](int action, std::size_t begin, std::size_t end) {
    const MotionEvent event = eventOf(action, all, begin, end);
    drawing([&](RectF* rect) { return drawable->Draw(&event, rect); });
    if (finishes) mQueue.finish();
  };
  send(Qelt::kActionDown, 0, 1);
  send(Qelt::kActionMove, 1, 6);
  send(Qelt::kActionUp, 9, 10);
  MotionEvent recorded = recordedStroke();
  drawing([&](RectF* rect) { return drawable->RedrawPen(&recorded, rect); });
  if (finishes) mQueue.finish();
}

void Stage::predict(bool finishes) {
  makePen();
  if (mPen == nullptr || mVersion != 8) return;
  drawStroke(strokeDrawable(), finishes, false);
  Qelt::IPenPredictionDrawableGL* drawable = mPen->GetPredictionStrokeDrawableGL();
  if (drawable == nullptr) return;
  drawable->SetCanvas(mCanvas.get());
  drawable->SetOpacity(0.5f);
  std::vector<Sample> ahead = samples();
  for (Sample& sample : ahead) sample.x += 60.0f;
  const MotionEvent event = eventOf(Qelt::kActionMove, ahead, 0, 4);
  for (int i = 0; i < 2; ++i) {
    drawing([&](RectF* rect) { return drawable->Draw(&event, rect); });
    if (finishes) mQueue.finish();
  }
  Qelt::PenStrokeDrawableGL* stroke = strokeDrawable();
  if (stroke == nullptr) return;
  const MotionEvent up = eventOf(Qelt::kActionUp, samples(), 9, 10);
  drawing([&](RectF* rect) { return stroke->Draw(&up, rect); });
}

void Stage::prepareAll() {
  makePen();
  if (mPen == nullptr) return;
  strokeDrawable();
  for (Qelt::PenDrawableGL* drawable : std::initializer_list<Qelt::PenDrawableGL*>{
           mPen->GetOutlineDrawableGL(), mPen->GetPreviewDrawableGL(),
           mVersion == 8 ? mPen->GetPredictionStrokeDrawableGL() : nullptr}) {
    if (drawable != nullptr) drawable->SetCanvas(mCanvas.get());
  }
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
  mCanvas->setMatrix(matrix);
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
