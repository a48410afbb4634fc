#include "Sweep.h"

namespace QeltTests {

namespace {

// The gate knows plug-in and host before the ground makes anything of theirs.
Failing watched(Failing failing) {
  AllocationGate::watch(Stage::library().path());
  return failing;
}

}  // namespace

SweepGround::SweepGround(bool picture, Failing failing)
    : mFailing(watched(failing)),
      mQueue(QeltDesktop::RenderQueue::Mode::Caller,
             picture ? QeltDesktop::RenderQueue::GL::Context : QeltDesktop::RenderQueue::GL::None),
      mFresh(9) {
  if (picture) mLayer = std::make_unique<QeltDesktop::CanvasLayer>(mQueue, 160, 120, 128);
}

SweepGround::~SweepGround() = default;

const Drawn& SweepGround::fresh(int version) {
  Drawn& drawn = mFresh[static_cast<std::size_t>(version)];
  if (drawn.steps.empty()) {
    Stage stage(mQueue, mLayer.get(), version);
    drawn = stage.drawEverything();
  }
  return drawn;
}

SweepGround::Counts SweepGround::settle() {
  mQueue.finish();
  mLog.take();
  return {AllocationGate::plugInBlocks(), AllocationGate::hostBlocks(), AllocationGate::allBlocks(),
          AllocationGate::badDeletions()};
}

}  // namespace QeltTests
