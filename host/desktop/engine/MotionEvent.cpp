#include "engine/MotionEvent.h"

#include <cstddef>

namespace Qelt {

MotionEvent::MotionEvent(std::int64_t downTime, std::int64_t eventTime, int action, int pointerCount,
                         const PointerProperties* properties, const PointerCoords* coords, int buttonState,
                         int source, int flags)
    : mDownTime(downTime),
      mEventTime(eventTime),
      mAction(action),
      mToolType(pointerCount > 0 && properties != nullptr ? properties[0].toolType : kToolUnknown),
      mButtonState(buttonState),
      mSource(source),
      mFlags(flags) {
  if (pointerCount > 0 && coords != nullptr) mCurrent = coords[0];
}

MotionEvent::MotionEvent(const MotionEvent&) = default;
MotionEvent& MotionEvent::operator=(const MotionEvent&) = default;
MotionEvent::~MotionEvent() = default;

void MotionEvent::AddBatch(std::int64_t eventTime, const PointerCoords* coords) {
  if (coords == nullptr) return;
  mHistory.push_back(mCurrent);
  mCurrent = *coords;
  mEventTime = eventTime;
}

int MotionEvent::GetAction() const {
  return mAction;
}
int MotionEvent::GetToolType(int) const {
  return mToolType;
}
int MotionEvent::GetSource() const {
  return mSource;
}
int MotionEvent::GetButtonState() const {
  return mButtonState;
}
int MotionEvent::GetFlags() const {
  return mFlags;
}
std::int64_t MotionEvent::GetDownTime() const {
  return mDownTime;
}
std::int64_t MotionEvent::GetEventTime() const {
  return mEventTime;
}

float MotionEvent::GetX(int) const {
  return mCurrent.x;
}
float MotionEvent::GetY(int) const {
  return mCurrent.y;
}
float MotionEvent::GetPressure(int) const {
  return mCurrent.pressure;
}
float MotionEvent::GetTilt(int) const {
  return mCurrent.tilt;
}
float MotionEvent::GetOrientation(int) const {
  return mCurrent.orientation;
}

namespace {

// A sample outside the history reads as zeros.
const PointerCoords& sampleAt(const std::vector<PointerCoords>& history, int position) {
  static constexpr PointerCoords kNone;
  const auto index = static_cast<std::size_t>(position);
  return position >= 0 && index < history.size() ? history[index] : kNone;
}

PointerCoords* findSample(std::vector<PointerCoords>& history, int position) {
  const auto index = static_cast<std::size_t>(position);
  return position >= 0 && index < history.size() ? &history[index] : nullptr;
}

}  // namespace

int MotionEvent::GetHistorySize() const {
  return static_cast<int>(mHistory.size());
}
float MotionEvent::GetHistoricalX(int position) const {
  return sampleAt(mHistory, position).x;
}
float MotionEvent::GetHistoricalY(int position) const {
  return sampleAt(mHistory, position).y;
}
float MotionEvent::GetHistoricalPressure(int position) const {
  return sampleAt(mHistory, position).pressure;
}
float MotionEvent::GetHistoricalTilt(int position) const {
  return sampleAt(mHistory, position).tilt;
}
float MotionEvent::GetHistoricalOrientation(int position) const {
  return sampleAt(mHistory, position).orientation;
}

void MotionEvent::SetPressure(float pressure) {
  mCurrent.pressure = pressure;
}

void MotionEvent::SetTilt(float tilt) {
  mCurrent.tilt = tilt;
}

void MotionEvent::SetHistoricalPressure(int position, float pressure) {
  if (PointerCoords* sample = findSample(mHistory, position)) sample->pressure = pressure;
}

void MotionEvent::SetHistoricalTilt(int position, float tilt) {
  if (PointerCoords* sample = findSample(mHistory, position)) sample->tilt = tilt;
}

}  // namespace Qelt
