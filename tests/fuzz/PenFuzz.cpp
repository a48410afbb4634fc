// Drives pens of the built library through their public interfaces in any order, twice with each input: equal
// runs make equal batches, batches are of whole stamps whose vertices are finite, and nothing crashes, hangs
// or leaks. One input in twenty also draws with GL, loses its context and has GL calls fail.

#include <android/log.h>
#include <dlfcn.h>

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <functional>
#include <iterator>
#include <map>
#include <memory>
#include <string_view>
#include <typeinfo>
#include <utility>
#include <vector>

#include "FuzzInput.h"
#include "base/List.h"
#include "base/String.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/CallTask.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/pencommon/BatchObserver.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "model/ObjectStroke.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/Pen.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDataManager.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "support/BatchCheck.h"
#include "support/FaultyCanvas.h"
#include "support/PartialStroke.h"

namespace QeltTests {
namespace {

using Qelt::MotionEvent;
using Qelt::PenStrokeDataManager;
using Qelt::RectF;
using QeltDesktop::RenderQueue;

// A run must not take long: a segment is allowed a quarter of a million stamps, so few inputs may ask for
// such, and for few. Points far out, and pens so fine that every segment is long for them, are counted.
constexpr int kMostFarPoints = 1;
constexpr int kMostHeavyCalls = 1;
constexpr float kFarOut = 2000.0f;  // stroke units
constexpr float kFinePen = 0.05f;   // stroke units
constexpr std::size_t kMostFloats = 60'000'000;
constexpr std::size_t kMostStrokes = 4;

const QeltDesktop::PluginLibrary& library() {
  static const QeltDesktop::PluginLibrary loaded(QELT_PLUGIN_PATH);
  return loaded;
}

// A host that does what its input says, in any order: two pens, three canvases whose views differ and whose
// layers come and go, a few stored strokes, one queue that may refuse, calls that fail, a context that is
// lost for a while. It keeps to what a host owes a pen, and to nothing more: what it lends outlives its use.
// Aborts the process where a pen breaks its word. One at a time; the caller's thread is main and render
// thread.
class PenWorld {
 public:
  // A queue with GL has a layer to draw into and may lose its context.
  PenWorld(const FuzzInput& itsInput, RenderQueue& queue, QeltDesktop::CanvasLayer* layer)
      : input(itsInput),
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
    QeltDesktop::setBatchObserver([this](const QeltDesktop::Batch& batch) {
      if (const char* const fault = faultOf(batch); fault != nullptr) breakOff("a pen", fault);
      for (const std::vector<float>& buffer : batch.buffers) {
        mFloats += buffer.size();
        mix(buffer);
      }
    });
  }

  ~PenWorld() {
    HostFaults::open();
    mQueue.restoreContext();
    mQueue.accept = nullptr;
    // What dying pens could not post, the next one that dies posts for them.
    std::unique_ptr<Qelt::Pen> last(library().createPen());
    if (last != nullptr) last->setPenDataManager(&mData);
    last.reset();
    mQueue.finish();
  }

  // Plays the input to its end; returns a number that depends on every batch, rectangle and answer.
  std::size_t play() {
    const int kind = input.pick(128);
    mFarPoints = kind == 101 ? kMostFarPoints : 0;
    mHeavyCalls = kind == 102 ? kMostHeavyCalls : 0;
    const bool isHeavy = mFarPoints > 0 || mHeavyCalls > 0;
    for (int steps = 1; !input.isEmpty() && mFloats < kMostFloats; ++steps) {
      step();
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

 private:
  void step() {
    std::unique_ptr<Qelt::Pen>& pen = mPens[input.pick(2)];
    if (pen == nullptr) {
      pen.reset(library().createPen());
      if (pen == nullptr) breakOff("a pen", "no pen");
      pen->setPenDataManager(&mData);
      pen->setVersion(Qelt::kRenderingVersions.back().number);
    }
    const int move = input.pick(16);
    if (move == 0) {
      pen.reset();
    } else if (move <= 2) {
      change(*pen);
    } else if (move == 3) {
      ask(*pen);
    } else if (move <= 12) {
      const bool isFine = pen->GetSize() > 0.0f && pen->GetSize() < kFinePen;
      if (!isFine || --mHeavyCalls >= 0) draw(*pen, move - 4);
    } else if (move == 13) {
      changeView();
    } else if (move == 14) {
      changeQueue();
    } else {
      mQueue.finish();
    }
  }

  void change(Qelt::Pen& pen) {
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

  void ask(Qelt::Pen& pen) {
    const float numbers[] = {pen.GetSize(), pen.GetMinSize(), pen.GetMaxSize(),
                             pen.GetMorphable()->GetFixedWidth()};
    mix(numbers);
    const bool flags[] = {pen.GetPenAttribute(static_cast<Qelt::IPen::PenAttribute>(input.pick(8))),
                          pen.GetMorphable()->IsCurveEnabled(),
                          pen.GetMorphable()->IsFixedWidthEnabled(),
                          pen.GetMsgQueue() != nullptr,
                          pen.GetTestDrawableGL() != nullptr,
                          pen.GetWetDryable() != nullptr};
    mix(flags);
    mix(std::string_view(pen.GetAdvancedSetting()->GetText()));
    Qelt::PenDrawableGL* drawable = nullptr;
    switch (input.pick(5)) {
      case 0:
        drawable = pen.GetStrokeDrawableGL();
        break;
      case 1:
        drawable = pen.GetOutlineDrawableGL();
        break;
      case 2:
        drawable = pen.GetPreviewDrawableGL();
        break;
      case 3:
        drawable = pen.GetPredictionStrokeDrawableGL();
        break;
      default: {
        Qelt::PointF points[3];
        float pressures[3];
        for (auto& point : points) point = {input.any(), input.any()};
        for (auto& pressure : pressures) pressure = input.any();
        note(true, pen.GetStrokeRect(points, pressures, nullptr, input.pick(4), input.any(), input.flag(),
                                     nullptr));
      }
    }
    Qelt::ISPPenCanvas* const choices[] = {&mCanvas, &mCanvas, &mBlank, nullptr, &mOther};
    if (drawable != nullptr) drawable->SetCanvas(choices[input.pick(5)]);
  }

  // One call of a drawable, with an event, a stored stroke or a list, any of which may be null.
  void draw(Qelt::Pen& pen, int which) {
    RectF rect;
    bool answer = false;
    int nulls = 0;
    const auto area = [&] { return nulls >= 252 ? nullptr : &rect; };
    const auto orNull = [&](const auto& object) { return nulls % 84 == 81 ? nullptr : &object; };
    if (which < 4) {
      Qelt::PenStrokeDrawableGL* const drawable = onCanvas(pen.GetStrokeDrawableGL());
      const MotionEvent made = event(4);
      nulls = input.byte();
      answer = drawable->Draw(orNull(made), area());
    } else if (which < 6) {
      Qelt::PenStrokeDrawableGL* const drawable = onCanvas(pen.GetStrokeDrawableGL());
      nulls = input.byte();
      if (nulls % 3 == 0) {
        const MotionEvent made = event(5);
        answer = drawable->RedrawPen(orNull(made), area());
      } else if (nulls % 16 == 1) {
        const Qelt::List list;
        answer = drawable->RedrawPen(orNull(list), area());
      } else {
        const Qelt::ObjectStroke& made = stroke();
        keepCacheFitting(made, *drawable);
        answer = drawable->RedrawPen(orNull(made), area());
      }
    } else if (which == 6) {
      Qelt::PenOutlineDrawableGL* const drawable = onCanvas(pen.GetOutlineDrawableGL());
      nulls = input.byte();
      if (nulls % 4 == 0) drawable->SetOutlineSize(input.any());
      if (nulls % 4 == 1) drawable->SetOutlineColor(input.word());
      if (nulls % 3 == 0) {
        const MotionEvent made = event(5);
        answer = drawable->DrawOutline(orNull(made), area());
      } else {
        const Qelt::ObjectStroke& made = stroke();
        answer = drawable->DrawOutline(orNull(made), area());
      }
    } else if (which == 7) {
      Qelt::PenPreviewDrawableGL* const drawable = onCanvas(pen.GetPreviewDrawableGL());
      nulls = input.byte();
      const MotionEvent made = event(4);
      answer =
          nulls % 2 == 0 ? drawable->Draw(orNull(made), area()) : drawable->RedrawPen(orNull(made), area());
    } else {
      Qelt::IPenPredictionDrawableGL* const drawable = pen.GetPredictionStrokeDrawableGL();
      if (drawable == nullptr) return;
      onCanvas(drawable);
      nulls = input.byte();
      if (nulls % 4 == 0) drawable->SetOpacity(input.any());
      const MotionEvent made = event(3);
      answer = drawable->Draw(orNull(made), area());
    }
    note(answer, rect);
  }

  void changeView() {
    Qelt::Matrix3<float> matrix;
    const int kind = input.pick(3);
    if (kind == 0) {
      for (std::size_t i = 0; i < 9; ++i) matrix[i] = input.any();
    } else if (kind == 1) {
      matrix[0] = matrix[4] = 0.25f + std::abs(input.usual()) / 16.0f;
    }
    QeltDesktop::PenCanvas* const choices[] = {&mCanvas, &mBlank, &mOther};
    choices[input.pick(3)]->setMatrix(matrix);
    const int target = input.pick(16);
    if (target < 4) mCanvas.setTarget(static_cast<Target>(target));
  }

  void changeQueue() {
    const std::function<void()> changes[] = {
        [&] { mRefusals = static_cast<std::uint32_t>(input.word()); },
        [&] { mRefusals = 0; },
        [&] {
          mQueue.loseContext();
          if (input.flag()) mQueue.finish();
          mQueue.restoreContext();
        },
        // Lost between the tasks that wait and those to come, for as long as it takes.
        [&] { QeltDesktop::postCall(mQueue, [this] { mQueue.loseContext(); }); },
        [&] { QeltDesktop::postCall(mQueue, [this] { mQueue.restoreContext(); }); },
        // Some call of the host's fails, or none does any more.
        [&] {
          if (const int number = input.byte(); number < 192) {
            HostFaults::fail(1 + number, input.flag());
          } else {
            HostFaults::open();
          }
        },
    };
    changes[input.pick(static_cast<int>(std::size(changes)))]();
  }

  // The drawable, which must be there, on a canvas more often than not.
  template <typename Drawable>
  Drawable* onCanvas(Drawable* drawable) {
    if (drawable == nullptr) breakOff("a pen", "no drawable");
    if (drawable->GetCanvas() == nullptr && input.flag()) drawable->SetCanvas(&mCanvas);
    return drawable;
  }

  float coordinate() {
    const float value = input.any();
    if (std::isfinite(value) && std::abs(value) > kFarOut && --mFarPoints < 0) return 10.0f;
    return value;
  }

  MotionEvent event(int mostHistory) {
    const int shape = input.byte();
    const int actions[] = {Qelt::kActionDown, Qelt::kActionMove, Qelt::kActionMove, Qelt::kActionUp};
    const int action = shape < 240 ? actions[shape % 4] : input.word();
    const int tool = shape % 7 == 6 ? input.word() : shape % 5;
    const int sources[] = {Qelt::kSourceStylus, Qelt::kSourceTouchScreen, Qelt::kSourceMouse, 0};
    const Qelt::PointerProperties pointer{0, tool};
    const int history = input.pick(mostHistory + 1);
    const auto coords = [&] {
      return Qelt::PointerCoords{coordinate(), coordinate(), input.any(), input.any(), input.any()};
    };
    const Qelt::PointerCoords first = coords();
    MotionEvent made(0, 1, action, 1, &pointer, &first, 0, sources[shape / 4 % 4], 0);
    for (int i = 0; i < history; ++i) {
      const Qelt::PointerCoords next = coords();
      made.AddBatch(i, &next);
    }
    return made;
  }

  PartialStroke& stroke() {
    const int choice = input.byte();
    if (!mStrokes.empty() && (choice % 2 == 1 || mStrokes.size() == kMostStrokes)) {
      PartialStroke& known = *mStrokes[static_cast<std::size_t>(choice / 2) % mStrokes.size()];
      if (choice % 8 == 7) known.SetRedrawingCacheDirtyFlag();
      return known;
    }
    auto made = std::make_unique<PartialStroke>();
    const int points = input.pick(6);
    for (int i = 0; i < points; ++i) {
      made->points.push_back({coordinate(), coordinate()});
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
    return *mStrokes.emplace_back(std::move(made));
  }

  // A page whose stroke gets another version does not offer the drawing of the version before.
  void keepCacheFitting(const Qelt::ObjectStroke& stroke, const Qelt::PenStrokeDrawableGL& drawable) {
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

  void note(bool answer, const RectF& rect) {
    float numbers[] = {answer ? 1.0f : 0.0f, rect.left, rect.top, rect.right, rect.bottom};
    // Which of two equal NaNs comes out of an operation is not part of the promise.
    for (float& number : numbers) number = std::isnan(number) ? 0.5f : number;
    mix(numbers);
  }

  template <typename Values>
  void mix(const Values& values) {
    const std::string_view bytes(reinterpret_cast<const char*>(std::data(values)),
                                 std::size(values) * sizeof *std::data(values));
    mHash = 31 * mHash + std::hash<std::string_view>()(bytes);
  }

  FuzzInput input;
  RenderQueue& mQueue;
  FaultyCanvas mCanvas, mOther;
  QeltDesktop::PenCanvas mBlank;  // has no layer at all
  QeltDesktop::PenDataManager mData, mQueueless;
  std::unique_ptr<Qelt::Pen> mPens[2];
  std::vector<std::unique_ptr<PartialStroke>> mStrokes;
  std::map<int, const std::type_info*> mDrawnBy;  // of what handles stand for, the drawable
  std::uint32_t mRefusals = 0;                    // one bit a post, the lowest next
  int mFarPoints = 0;                             // still allowed
  int mHeavyCalls = 0;      // still allowed, of pens that place a great many stamps everywhere
  std::size_t mFloats = 0;  // of all batches
  std::size_t mHash = 0;
};

// For the process's life. A driver that stays loaded is seen by the leak checker to hold what it holds.
struct Screen {
  Screen() {
    setenv("EGL_PLATFORM", "surfaceless", 0);
    dlopen("/usr/lib/x86_64-linux-gnu/dri/swrast_dri.so", RTLD_NOW | RTLD_NODELETE);
    queue = std::make_unique<RenderQueue>(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
    layer = std::make_unique<QeltDesktop::CanvasLayer>(*queue, 64, 64, 48);
  }
  std::unique_ptr<RenderQueue> queue;
  std::unique_ptr<QeltDesktop::CanvasLayer> layer;
};

}  // namespace
}  // namespace QeltTests

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  __android_log_set_logger([](const __android_logger_data*, const char*) {});
  if (size > 2048) return -1;
  const QeltTests::FuzzInput input(data, size);
  const auto playBlind = [&input] {
    QeltTests::RenderQueue queue(QeltTests::RenderQueue::Mode::Caller, QeltTests::RenderQueue::GL::None);
    return QeltTests::PenWorld(input, queue, nullptr).play();
  };
  if (playBlind() != playBlind()) QeltTests::breakOff("a pen", "equal runs made different batches");
  std::uint32_t sum = 2166136261u;
  for (std::size_t i = 0; i < size; ++i) sum = (sum ^ data[i]) * 16777619u;
  if (sum % 20 == 0) {
    static auto* const screen = new QeltTests::Screen;
    QeltTests::PenWorld(input, *screen->queue, screen->layer.get()).play();
  }
  return 0;
}
