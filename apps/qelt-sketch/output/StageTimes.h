#pragma once

#include <array>
#include <chrono>
#include <cstddef>
#include <mutex>
#include <string>

namespace QeltDesktop {

// What drawing pages to files goes through.
enum class Stage {
  Read,      // the input
  Geometry,  // the pens on the main thread
  GL,        // the context, the layers, and waiting until all is drawn
  Compose,   // reading the layers back and laying them over each other
  Encode     // and writing
};

// Where the time went, over as many pages as there were. Stages on two threads may overlap. Any thread.
class StageTimes {
 public:
  // The time from its making to its end counts as the stage's.
  class Watch {
   public:
    Watch(StageTimes& times, Stage stage) : mTimes(times), mStage(stage) {}
    ~Watch() { mTimes.add(mStage, Clock::now() - mBegin); }
    Watch(const Watch&) = delete;
    Watch& operator=(const Watch&) = delete;

   private:
    StageTimes& mTimes;
    const Stage mStage;
    const std::chrono::steady_clock::time_point mBegin = Clock::now();
  };

  // A line for each stage, one for the whole time since this was made, in seconds, and one for the most
  // memory that the process has had, code and all.
  std::string report();

 private:
  using Clock = std::chrono::steady_clock;
  static constexpr std::array<const char*, 5> kNames{"read", "geometry", "GL", "compose", "encode"};

  void add(Stage stage, Clock::duration time);

  const Clock::time_point mBegin = Clock::now();
  std::mutex mLock;
  std::array<Clock::duration, kNames.size()> mTimes{};
};

}  // namespace QeltDesktop
