#pragma once

#include <map>
#include <vector>

#include "base/CriticalSection.h"
#include "base/HostApi.h"
#include "base/RectF.h"
#include "base/RefCount.h"
#include "base/Vector.h"

namespace Qelt {

// The vertex floats of one stored stroke, shared between the cache and the render thread. After the
// reference-count header come two pointer-sized members; the second is the buffer, which the plug-in
// allocates and fills and this object deletes.
class QELT_HOST_API PenStrokePointData : public RefCount {
 public:
  PenStrokePointData();

  // True when the floats were computed at this inverse scale.
  bool hasSameInverseScale(Vector2<float> inverseScale) const;
  // Chosen here: the stroke data records the scale current when it takes the points.
  void setInverseScale(Vector2<float> inverseScale);

 protected:
  ~PenStrokePointData() override;

 private:
  Vector2<float> mInverseScale;

 public:
  std::vector<float>* mBuffer = nullptr;
};

// The cached drawing of one stored stroke. Any thread.
class QELT_HOST_API PenStrokeData {
 public:
  PenStrokeData();
  ~PenStrokeData();

  RectF GetPenRect() const;
  void SetPenRect(const RectF& rect);
  // A counted reference, null when nothing is cached; the caller gives it back with `Unref`.
  PenStrokePointData* GetPointData();
  // Takes a reference of its own, drops the one it had. False when it will not keep the points.
  bool SetPointData(PenStrokePointData* points);

 private:
  mutable CriticalSection mLock;
  RectF mPenRect;
  PenStrokePointData* mPoints = nullptr;
};

// The process-wide cache of stored strokes' drawings, keyed by runtime handle. Any thread.
class QELT_HOST_API PenStrokeDataManager {
 public:
  static PenStrokeDataManager* GetInstance();

  // The stroke's entry, kept alive until the matching `ReleaseStrokeData`; null when the page has none.
  PenStrokeData* GetStrokeData(int runtimeHandle);
  // Ends one use of an entry. A handle without an entry in use is ignored.
  void ReleaseStrokeData(int runtimeHandle);

  // Chosen here, for the page: entries are made and dropped by it, never by a pen. A dropped entry that is
  // in use goes with its last use.
  void CreateStrokeData(int runtimeHandle);
  void DropStrokeData(int runtimeHandle);
  // Chosen here: the inverse scale of the view that the calling thread draws for, recorded into points as it
  // stores them. Each thread has its own, (1, 1) at first: pens on two threads draw for two views.
  void SetInverseScale(Vector2<float> inverseScale);
  Vector2<float> GetInverseScale();

 private:
  PenStrokeDataManager();
  ~PenStrokeDataManager();

  struct Entry;
  CriticalSection mLock;
  std::map<int, Entry*> mEntries;
};

}  // namespace Qelt
