#include "PenWorld.h"

#include <cmath>
#include <cstring>
#include <functional>
#include <iterator>
#include <string_view>
#include <typeinfo>
#include <utility>

#include "base/List.h"
#include "base/String.h"
#include "desktop/gl/CallTask.h"
#include "math/Matrix3.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/PenDrawableRT.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDataManager.h"
#include "support/BatchCheck.h"

namespace QeltTests {

using Qelt::MotionEvent;
using Qelt::PenStrokeDataManager;
using Qelt::RectF;

namespace {

// A run must not take long: a segment is allowed a quarter of a million stamps, so few inputs may ask for
// such, and for few. Points far out, and pens so fine that every segment is long for them, are counted.
constexpr int kMostFarPoints = 1;
constexpr int kMostHeavyCalls = 1;
constexpr float kFarOut = 2000.0f;  // stroke units
constexpr float kFinePen = 0.05f;   // stroke units
constexpr std::size_t kMostFloats = 60'000'000;
constexpr std::size_t kMostStrokes = 4;

}  // namespace

// A stored stroke, any of whose arrays may be missing.
class PenWorld::Stroke final : public Qelt::ObjectStroke {
 public:
  int GetPointCount() const override { return count; }
  const Qelt::PointF* GetPoint() const override { return (missing & 1) != 0 ? nullptr : points.data(); }
  const std::int64_t* GetTimeStamp() const override { return (missing & 2) != 0 ? nullptr : times.data(); }
  const float* GetPressure() const override { return (missing & 4) != 0 ? nullptr : pressures.data(); }
  const float* GetTilt() const override { return (missing & 8) != 0 ? nullptr : tilts.data(); }
  const float* GetOrientation() const override { return (missing & 16) != 0 ? nullptr : orientations.data(); }
  int GetToolType() const override { return tool; }

  int count = 0;  // may be below 0, never more than there are points
  int missing = 0;
  int tool = 0;
  std::vector<Qelt::PointF> points;
  std::vector<std::int64_t> times;
  std::vector<float> pressures, tilts, orientations;
};

PenWorld::PenWorld(const QeltDesktop::PluginLibrary& library, QeltDesktop::RenderQueue& queue,
                   QeltDesktop::CanvasLayer* layer)
    : mLibrary(library),
      mQueue(queue),
      mCanvas(&queue, layer),
      mOther(&queue, layer),
      mBlank(&queue, nullptr),
      mData(&queue),
      mQueueless(nullptr) {
  mQueue.accept = [this](const Qelt::ITask&) {
    const bool refused = (mRefusals & 1) != 0;
    mRefusals >>= 1;
    return !refused;
  };
  QeltDesktop::setBatchObserver([this](const QeltDesktop::Batch& batch) { note(batch); });
}

PenWorld::~PenWorld() {
  HostFaults::open();
  mQueue.restoreContext();
  for (auto& pen : mPens) pen.reset();
  mQueue.accept = nullptr;
  // What dying pens could not post, the next one that dies posts for them.
  std::unique_ptr<Qelt::Pen> last(mLibrary.createPen());
  if (last != nullptr) last->setPenDataManager(&mData);
  last.reset();
  mQueue.finish();
}

std::uint64_t PenWorld::play(FuzzInput input) {
  const int kind = input.pick(128);
  mFarPoints = kind == 101 ? kMostFarPoints : 0;
  mHeavyCalls = kind == 102 ? kMostHeavyCalls : 0;
  const bool isHeavy = mFarPoints > 0 || mHeavyCalls > 0;
  for (int steps = 1; !input.isEmpty() && mFloats < kMostFloats; ++steps) {
    step(input);
    // What waits is not counted yet, and may be much.
    if (isHeavy && steps % 4 == 0) mQueue.finish();
  }
  for (auto& pen : mPens) pen.reset();
  mQueue.finish();
  QeltDesktop::setBatchObserver(nullptr);
  for (const auto& stroke : mStrokes) {
    PenStrokeDataManager::GetInstance()->DropStrokeData(stroke->GetRuntimeHandle());
  }
  return mHash;
}

void PenWorld::step(FuzzInput& input) {
  const int which = input.pick(2);
  std::unique_ptr<Qelt::Pen>& pen = mPens[which];
  if (pen == nullptr) {
    pen.reset(mLibrary.createPen());
    if (pen == nullptr) breakOff("a pen", "no pen");
    pen->setPenDataManager(&mData);
    pen->setVersion(Qelt::kRenderingVersions.back().number);
    mSizes[which] = pen->GetSize();
  }
  const int move = input.pick(16);
  if (move == 0) {
    pen.reset();
  } else if (move <= 2) {
    change(input, *pen);
    mSizes[which] = pen->GetSize();
  } else if (move == 3) {
    ask(input, *pen);
  } else if (move <= 12) {
    if (mayDraw(*pen)) draw(input, *pen, move - 4);
  } else if (move == 13) {
    changeView(input);
  } else if (move == 14) {
    changeQueue(input);
  } else {
    mQueue.finish();
  }
}

bool PenWorld::mayDraw(const Qelt::Pen& pen) {
  const float size = &pen == mPens[0].get() ? mSizes[0] : mSizes[1];
  return !(size > 0.0f && size < kFinePen) || --mHeavyCalls >= 0;
}

void PenWorld::change(FuzzInput& input, Qelt::Pen& pen) {
  Qelt::IPenMorphable& morphing = *pen.GetMorphable();
  const std::function<void()> changes[] = {
      [&] { pen.SetSize(input.any()); },
      [&] { pen.SetSize(0.5f + std::abs(input.usual())); },
      [&] { pen.SetColor(input.word()); },
      [&] {
        pen.setVersion(input.flag() ? 1 + input.pick(static_cast<int>(Qelt::kRenderingVersions.size()))
                                    : input.word());
      },
      [&] { morphing.SetCurveEnabled(input.flag()); },
      [&] {
        morphing.SetFixedWidthEnabled(input.flag());
        morphing.SetFixedWidth(input.any());
      },
      [&] { pen.SetScreenResolution(input.word(), input.word()); },
      [&] {
        const char text[] = {static_cast<char>(input.byte()), ';', '\0'};
        const Qelt::String setting(text);
        pen.SetAdvancedSetting(input.flag() ? &setting : nullptr);
      },
      [&] {
        pen.SetParticleDensity(input.word());
        pen.SetParticleSize(input.any());
        pen.SetRenderingLevel(input.word());
        pen.SetEnhancedAntiAlias(input.flag());
      },
      [&] {
        Qelt::PenGLDataManager* const choices[] = {&mData, &mQueueless, nullptr};
        pen.setPenDataManager(choices[input.pick(3)]);
      },
      [&] {
        morphing.SetCurveEnabled(true);
        pen.setPenDataManager(&mData);
      },
  };
  changes[input.pick(static_cast<int>(std::size(changes)))]();
}

void PenWorld::ask(FuzzInput& input, Qelt::Pen& pen) {
  const float numbers[] = {pen.GetSize(), pen.GetMinSize(), pen.GetMaxSize(),
                           pen.GetMorphable()->GetFixedWidth()};
  mix(numbers, sizeof numbers);
  const bool flags[] = {pen.GetPenAttribute(static_cast<Qelt::IPen::PenAttribute>(input.pick(8))),
                        pen.GetMorphable()->IsCurveEnabled(),
                        pen.GetMorphable()->IsFixedWidthEnabled(),
                        pen.GetMsgQueue() != nullptr,
                        pen.GetTestDrawableGL() != nullptr,
                        pen.GetWetDryable() != nullptr};
  mix(flags, sizeof flags);
  const std::string_view setting = pen.GetAdvancedSetting()->GetText();
  mix(setting.data(), setting.size());
  const int which = input.pick(5);
  if (which == 4) {
    Qelt::PointF points[3];
    float pressures[3];
    for (auto& point : points) point = {input.any(), input.any()};
    for (auto& pressure : pressures) pressure = input.any();
    note(true,
         pen.GetStrokeRect(points, pressures, nullptr, input.pick(4), input.any(), input.flag(), nullptr));
    return;
  }
  Qelt::PenDrawableGL* drawable = nullptr;
  if (which == 0) drawable = pen.GetStrokeDrawableGL();
  if (which == 1) drawable = pen.GetOutlineDrawableGL();
  if (which == 2) drawable = pen.GetPreviewDrawableGL();
  if (which == 3) drawable = pen.GetPredictionStrokeDrawableGL();
  if (drawable != nullptr) drawable->SetCanvas(pickCanvas(input));
}

Qelt::ISPPenCanvas* PenWorld::pickCanvas(FuzzInput& input) {
  Qelt::ISPPenCanvas* const choices[] = {&mCanvas, &mCanvas, &mBlank, nullptr, &mOther};
  return choices[input.pick(5)];
}

float PenWorld::coordinate(FuzzInput& input) {
  const float value = input.any();
  if (std::isfinite(value) && std::abs(value) > kFarOut && --mFarPoints < 0) return 10.0f;
  return value;
}

MotionEvent PenWorld::event(FuzzInput& input, int mostHistory) {
  const int shape = input.byte();
  const int actions[] = {Qelt::kActionDown, Qelt::kActionMove, Qelt::kActionMove, Qelt::kActionUp};
  const int action = shape < 240 ? actions[shape % 4] : input.word();
  const int tool = shape % 7 == 6 ? input.word() : shape % 5;
  const int sources[] = {Qelt::kSourceStylus, Qelt::kSourceTouchScreen, Qelt::kSourceMouse, 0};
  const Qelt::PointerProperties pointer{0, tool};
  const int history = input.pick(mostHistory + 1);
  const auto coords = [&] {
    return Qelt::PointerCoords{coordinate(input), coordinate(input), input.any(), input.any(), input.any()};
  };
  const Qelt::PointerCoords first = coords();
  MotionEvent made(0, 1, action, 1, &pointer, &first, 0, sources[shape / 4 % 4], 0);
  for (int i = 0; i < history; ++i) {
    const Qelt::PointerCoords next = coords();
    made.AddBatch(i, &next);
  }
  return made;
}

PenWorld::Stroke& PenWorld::stroke(FuzzInput& input) {
  const int choice = input.byte();
  if (!mStrokes.empty() && (choice % 2 == 1 || mStrokes.size() == kMostStrokes)) {
    Stroke& known = *mStrokes[static_cast<std::size_t>(choice / 2) % mStrokes.size()];
    if (choice % 8 == 7) known.SetRedrawingCacheDirtyFlag();
    return known;
  }
  auto made = std::make_unique<Stroke>();
  const int points = input.pick(6);
  for (int i = 0; i < points; ++i) {
    made->points.push_back({coordinate(input), coordinate(input)});
    made->pressures.push_back(input.any());
    made->tilts.push_back(input.any());
    made->orientations.push_back(input.any());
    made->times.push_back(i);
  }
  made->missing = input.flag() ? 0 : input.byte();
  made->count = choice == 128 ? -1 : points;
  made->tool = choice / 8 % 5;
  if (choice % 4 == 2) PenStrokeDataManager::GetInstance()->CreateStrokeData(made->GetRuntimeHandle());
  if (choice % 64 == 4) made->SetOriginalRuntimeHandle(input.word());
  if (choice % 64 == 6 && !mStrokes.empty()) {
    made->SetOriginalRuntimeHandle(mStrokes.front()->GetRuntimeHandle());
  }
  mStrokes.push_back(std::move(made));
  return *mStrokes.back();
}

template <typename Drawable>
Drawable* PenWorld::onCanvas(FuzzInput& input, Drawable* drawable) {
  if (drawable == nullptr) breakOff("a pen", "no drawable");
  if (drawable->GetCanvas() == nullptr && input.flag()) drawable->SetCanvas(&mCanvas);
  return drawable;
}

// A page whose stroke gets another version does not offer the drawing of the version before.
void PenWorld::keepCacheFitting(const Stroke& stroke, const Qelt::PenStrokeDrawableGL& drawable) {
  const int original = stroke.GetOriginalRuntimeHandle();
  const int handle = original == -1 ? stroke.GetRuntimeHandle() : original;
  const auto [known, isNew] = mDrawnBy.try_emplace(handle, &typeid(drawable));
  if (isNew || *known->second == typeid(drawable)) return;
  known->second = &typeid(drawable);
  PenStrokeDataManager* const manager = PenStrokeDataManager::GetInstance();
  manager->DropStrokeData(handle);
  for (const auto& other : mStrokes) {
    if (other->GetRuntimeHandle() == handle) manager->CreateStrokeData(handle);
  }
}

// One call of a drawable, with an event, a stored stroke or a list, any of which may be null.
void PenWorld::draw(FuzzInput& input, Qelt::Pen& pen, int which) {
  RectF rect;
  bool answer = false;
  int nulls = 0;
  const auto area = [&] { return nulls >= 252 ? nullptr : &rect; };
  const auto orNull = [&](const auto& object) { return nulls % 84 == 81 ? nullptr : &object; };
  if (which < 4) {
    Qelt::PenStrokeDrawableGL* const drawable = onCanvas(input, pen.GetStrokeDrawableGL());
    const MotionEvent made = event(input, 4);
    nulls = input.byte();
    answer = drawable->Draw(orNull(made), area());
  } else if (which < 6) {
    Qelt::PenStrokeDrawableGL* const drawable = onCanvas(input, pen.GetStrokeDrawableGL());
    nulls = input.byte();
    if (nulls % 3 == 0) {
      const MotionEvent made = event(input, 5);
      answer = drawable->RedrawPen(orNull(made), area());
    } else if (nulls % 16 == 1) {
      const Qelt::List list;
      answer = drawable->RedrawPen(orNull(list), area());
    } else {
      const Stroke& made = stroke(input);
      keepCacheFitting(made, *drawable);
      answer = drawable->RedrawPen(static_cast<const Qelt::ObjectStroke*>(orNull(made)), area());
    }
  } else if (which == 6) {
    Qelt::PenOutlineDrawableGL* const drawable = onCanvas(input, pen.GetOutlineDrawableGL());
    nulls = input.byte();
    if (nulls % 4 == 0) drawable->SetOutlineSize(input.any());
    if (nulls % 4 == 1) drawable->SetOutlineColor(input.word());
    if (nulls % 3 == 0) {
      const MotionEvent made = event(input, 5);
      answer = drawable->DrawOutline(orNull(made), area());
    } else {
      const Stroke& made = stroke(input);
      answer = drawable->DrawOutline(static_cast<const Qelt::ObjectStroke*>(orNull(made)), area());
    }
  } else if (which == 7) {
    Qelt::PenPreviewDrawableGL* const drawable = onCanvas(input, pen.GetPreviewDrawableGL());
    nulls = input.byte();
    const MotionEvent made = event(input, 4);
    answer =
        nulls % 2 == 0 ? drawable->Draw(orNull(made), area()) : drawable->RedrawPen(orNull(made), area());
  } else {
    Qelt::IPenPredictionDrawableGL* const drawable = pen.GetPredictionStrokeDrawableGL();
    if (drawable == nullptr) return;
    onCanvas(input, drawable);
    nulls = input.byte();
    if (nulls % 4 == 0) drawable->SetOpacity(input.any());
    const MotionEvent made = event(input, 3);
    answer = drawable->Draw(orNull(made), area());
  }
  note(answer, rect);
}

void PenWorld::changeView(FuzzInput& input) {
  Qelt::Matrix3<float> matrix;
  switch (input.pick(3)) {
    case 0:
      for (std::size_t i = 0; i < 9; ++i) matrix[i] = input.any();
      break;
    case 1:
      matrix[0] = matrix[4] = 0.25f + std::abs(input.usual()) / 16.0f;
      break;
    default:
      break;
  }
  QeltDesktop::PenCanvas* const choices[] = {&mCanvas, &mBlank, &mOther};
  choices[input.pick(3)]->setMatrix(matrix);
  const int target = input.pick(16);
  if (target < 4) mCanvas.setTarget(static_cast<Target>(target));
}

void PenWorld::changeQueue(FuzzInput& input) {
  switch (input.pick(6)) {
    case 0:
      mRefusals = static_cast<std::uint32_t>(input.word());
      break;
    case 1:
      mRefusals = 0;
      break;
    case 2:
      mQueue.loseContext();
      if (input.flag()) mQueue.finish();
      mQueue.restoreContext();
      break;
    case 3:
      // Lost between the tasks that wait and those to come, for as long as it takes.
      QeltDesktop::postCall(mQueue, [this] { mQueue.loseContext(); });
      break;
    case 4:
      QeltDesktop::postCall(mQueue, [this] { mQueue.restoreContext(); });
      break;
    default:
      // Some call of the host's fails, or none does any more.
      if (const int number = input.byte(); number < 192) {
        HostFaults::fail(1 + number, input.flag());
      } else {
        HostFaults::open();
      }
      break;
  }
}

void PenWorld::note(bool answer, const RectF& rect) {
  mix(&answer, sizeof answer);
  const float edges[] = {rect.left, rect.top, rect.right, rect.bottom};
  // Which of two equal NaNs comes out of an operation is not part of the promise.
  for (const float edge : edges) {
    const float comparable = std::isnan(edge) ? 0.5f : edge;
    mix(&comparable, sizeof comparable);
  }
}

void PenWorld::note(const QeltDesktop::Batch& batch) {
  if (const char* const fault = faultOf(batch); fault != nullptr) breakOff("a pen", fault);
  for (const std::vector<float>& buffer : batch.buffers) {
    mFloats += buffer.size();
    const std::size_t count = buffer.size();
    mix(&count, sizeof count);
    mix(buffer.data(), buffer.size() * sizeof(float));
  }
}

void PenWorld::mix(const void* bytes, std::size_t count) {
  // Eight bytes at a time: batches may be long.
  const auto* at = static_cast<const unsigned char*>(bytes);
  for (; count >= 8; at += 8, count -= 8) {
    std::uint64_t chunk;
    std::memcpy(&chunk, at, 8);
    mHash = (mHash ^ chunk) * 1099511628211u;
    mHash ^= mHash >> 29;
  }
  for (; count > 0; ++at, --count) mHash = (mHash ^ *at) * 1099511628211u;
}

}  // namespace QeltTests
