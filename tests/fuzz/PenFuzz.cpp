// Drives pens of the built library through their public interfaces in any order, twice with each input: equal
// runs make equal batches, batches are of whole stamps whose vertices are finite, and nothing crashes, hangs
// or leaks. One input in twenty also draws with GL, loses its context and has GL calls fail.

#include <android/log.h>
#include <dlfcn.h>

#include <cstdlib>
#include <memory>

#include "FuzzInput.h"
#include "PenWorld.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"

namespace {

using QeltDesktop::RenderQueue;

void drop(const __android_logger_data*, const char*) {}

const QeltDesktop::PluginLibrary& library() {
  static const QeltDesktop::PluginLibrary loaded(QELT_PLUGIN_PATH);
  return loaded;
}

// A driver that stays loaded is seen by the leak checker to hold what it holds.
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

std::uint64_t play(RenderQueue& queue, QeltDesktop::CanvasLayer* layer, const std::uint8_t* data,
                   std::size_t size) {
  QeltTests::PenWorld world(library(), queue, layer);
  return world.play(QeltTests::FuzzInput(data, size));
}

bool drawsToo(const std::uint8_t* data, std::size_t size) {
  std::uint32_t sum = 2166136261u;
  for (std::size_t i = 0; i < size; ++i) sum = (sum ^ data[i]) * 16777619u;
  return sum % 20 == 0;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const bool silent = [] {
    __android_log_set_logger(drop);
    return true;
  }();
  (void)silent;
  if (size > 2048) return -1;
  std::uint64_t results[2];
  for (std::uint64_t& result : results) {
    RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
    result = play(queue, nullptr, data, size);
  }
  if (results[0] != results[1]) QeltTests::breakOff("a pen", "equal runs made different batches");
  if (drawsToo(data, size)) {
    static Screen* const screen = new Screen;  // for the process's life
    play(*screen->queue, screen->layer.get(), data, size);
  }
  return 0;
}
