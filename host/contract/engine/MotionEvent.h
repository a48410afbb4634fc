#pragma once

#include <cstdint>
#include <vector>

#include "base/HostApi.h"

namespace Qelt {

// One sample of the pointer.
struct PointerCoords {
  float x = 0.0f, y = 0.0f;  // stroke units, y down
  float pressure = 0.0f;     // 0 to 1
  float tilt = 0.0f;         // radians from upright, 0 to pi / 2
  float orientation = 0.0f;  // radians, clockwise from up, -pi to pi
};

struct PointerProperties {
  int id = 0;
  int toolType = 0;  // ToolType
};

// The numbers are Android's.
enum MotionAction : int { kActionDown = 0, kActionUp = 1, kActionMove = 2, kActionCancel = 3 };
enum ToolType : int { kToolUnknown = 0, kToolFinger = 1, kToolStylus = 2, kToolMouse = 3, kToolEraser = 4 };
enum InputSource : int { kSourceTouchScreen = 4098, kSourceMouse = 8194, kSourceStylus = 16386 };

// One input event of one pointer: a current sample and the older samples batched with it. The pen writes its
// corrections of pressure and tilt back, so that later consumers of the event see them. Main thread. Chosen
// here: one pointer; a pointer index above 0 is taken as 0.
class QELT_HOST_API MotionEvent {
 public:
  // Times are milliseconds. `properties` and `coords` hold `pointerCount` entries; they are copied.
  MotionEvent(std::int64_t downTime, std::int64_t eventTime, int action, int pointerCount,
              const PointerProperties* properties, const PointerCoords* coords, int buttonState, int source,
              int flags);
  MotionEvent(const MotionEvent&);
  MotionEvent& operator=(const MotionEvent&);
  ~MotionEvent();

  // Makes the current sample the newest history sample, and `coords` the current one.
  void AddBatch(std::int64_t eventTime, const PointerCoords* coords);

  int GetAction() const;
  int GetToolType(int pointer) const;
  int GetSource() const;
  int GetButtonState() const;
  int GetFlags() const;
  std::int64_t GetDownTime() const;
  std::int64_t GetEventTime() const;

  float GetX(int pointer) const;
  float GetY(int pointer) const;
  float GetPressure(int pointer) const;
  float GetTilt(int pointer) const;
  float GetOrientation(int pointer) const;

  // History, oldest first: `position` runs from 0 to GetHistorySize() - 1; outside it they return 0.
  int GetHistorySize() const;
  float GetHistoricalX(int position) const;
  float GetHistoricalY(int position) const;
  float GetHistoricalPressure(int position) const;
  float GetHistoricalTilt(int position) const;
  float GetHistoricalOrientation(int position) const;

  void SetPressure(float pressure);
  void SetTilt(float tilt);
  void SetHistoricalPressure(int position, float pressure);
  void SetHistoricalTilt(int position, float tilt);

 private:
  std::int64_t mDownTime;
  std::int64_t mEventTime;
  int mAction;
  int mToolType;
  int mButtonState;
  int mSource;
  int mFlags;
  PointerCoords mCurrent;
  std::vector<PointerCoords> mHistory;
};

}  // namespace Qelt
