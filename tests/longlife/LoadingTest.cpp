// The library as a neighbour: it loads and really unloads a thousand times, and draws beside a second copy of
// itself.

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdint>
#include <filesystem>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "pencommon/Pen.h"
#include "support/AllocationGate.h"
#include "support/LogCapture.h"
#include "support/PenBoard.h"

namespace QeltTests {
namespace {

using QeltDesktop::RenderQueue;

// A library that goes when it is closed; the host's own loader keeps it for good.
class Loaded {
 public:
  explicit Loaded(const std::string& path) : mHandle(dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL)) {
    if (mHandle == nullptr) throw std::runtime_error(dlerror());
  }
  ~Loaded() { dlclose(mHandle); }
  Loaded(const Loaded&) = delete;
  Loaded& operator=(const Loaded&) = delete;

  static bool isThere(const std::string& path) {
    void* const again = dlopen(path.c_str(), RTLD_NOW | RTLD_NOLOAD);
    if (again != nullptr) dlclose(again);
    return again != nullptr;
  }
  const void* symbol(const char* name) const { return dlsym(mHandle, name); }
  Qelt::Pen* makePen() const {
    const auto create = reinterpret_cast<Qelt::Pen* (*)()>(dlsym(mHandle, "createPenInst"));
    if (create == nullptr) throw std::runtime_error(dlerror());
    return create();
  }

 private:
  void* mHandle;
};

// A host with one pen of a library.
class Desk : public PenBoard {
 public:
  Desk(const Loaded& library, RenderQueue& itsQueue, QeltDesktop::CanvasLayer* itsLayer)
      : PenBoard({.size = 5.0f}, itsQueue, itsLayer, [&library] { return library.makePen(); }) {
    keepsUp = true;
  }

  void stroke() { draw(Kind::Live); }
};

// A copy of the library under another name, for as long as this lives.
class Copy {
 public:
  Copy() : path(testing::TempDir() + "libAnotherPencil" + std::to_string(getpid()) + ".so") {
    std::filesystem::copy_file(QELT_PLUGIN_PATH, path, std::filesystem::copy_options::overwrite_existing);
  }
  ~Copy() { std::filesystem::remove(path); }
  Copy(const Copy&) = delete;
  Copy& operator=(const Copy&) = delete;

  const std::string path;
};

TEST(Loading, AThousandTimesLeavesNothingBehind) {
  constexpr int kTimes = QELT_SANITIZED ? 100 : 1000;
  LogCapture log;
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
  long early = 0;
  for (int i = 0; i < kTimes; ++i) {
    {
      const Loaded library(QELT_PLUGIN_PATH);
      Desk(library, queue, nullptr).stroke();
    }
    ASSERT_FALSE(Loaded::isThere(QELT_PLUGIN_PATH)) << "still loaded after " << i + 1;
    log.take();
    if (i == 4) early = AllocationGate::counts().allBlocks;
  }
  EXPECT_EQ(AllocationGate::counts().allBlocks, early);
}

TEST(Loading, ACopyDrawsOnWithTheShadersThatAnotherBroughtAndNoneStays) {
  LogCapture log;
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  QeltDesktop::CanvasLayer layer(queue, 128, 64);
  const Copy copy;
  auto one = std::make_unique<Loaded>(QELT_PLUGIN_PATH), other = std::make_unique<Loaded>(copy.path);
  auto left = std::make_unique<Desk>(*one, queue, &layer);
  ASSERT_NE(one->symbol("versionTable"), other->symbol("versionTable")) << "the same library twice";
  // The registry knows shaders by their class: this desk's are the left one's.
  auto right = std::make_unique<Desk>(*other, queue, &layer);
  left->prepareAll();
  right->prepareAll();
  left->stroke();
  const std::vector<std::uint8_t> before = layer.readPixels();
  EXPECT_NE(before, std::vector<std::uint8_t>(before.size())) << "nothing was drawn";
  layer.clear();
  left.reset();
  one.reset();
  ASSERT_FALSE(Loaded::isThere(QELT_PLUGIN_PATH));
  const auto loseAndRestore = [&] {
    queue.loseContext();
    queue.restoreContext();
  };
  loseAndRestore();
  right->stroke();
  EXPECT_TRUE(layer.readPixels() == before);
  // Nothing that is restored may be the library's.
  right.reset();
  other.reset();
  ASSERT_FALSE(Loaded::isThere(copy.path));
  loseAndRestore();
  for (const LogLine& line : log.take()) EXPECT_NE(line.priority, 6) << line.text;
}

}  // namespace
}  // namespace QeltTests
