#pragma once

#include <exception>
#include <new>
#include <utility>
#include <vector>

#include "base/RectF.h"
#include "base/Vector.h"
#include "model/ObjectStroke.h"
#include "pencommon/PenStrokeDataManager.h"
#include "render/Posting.h"

namespace Qelt {

// One redraw's look into the host's stroke-data cache. The plug-in never creates an entry; it fills those
// that the host has. Main thread.
class StrokeCache {
 public:
  explicit StrokeCache(const ObjectStroke& stroke)
      // Kept: hosts hand strokes over as const; their handles and dirty flags are theirs to be set all the
      // same.
      : mStroke(const_cast<ObjectStroke&>(stroke)),
        mManager(PenStrokeDataManager::GetInstance()),
        mHandle(stroke.GetOriginalRuntimeHandle()) {
    if (mHandle == -1) {
      mHandle = stroke.GetRuntimeHandle();
      mOwnHandle = true;
    }
    mData = mManager->GetStrokeData(mHandle);
    if (mData != nullptr) mPoints = mData->GetPointData();
  }

  // Gives back what an exception left: the reference, and the use of the entry.
  ~StrokeCache() {
    dropPoints();
    if (mData != nullptr && !mReleased) mManager->ReleaseStrokeData(mHandle);
  }

  StrokeCache(const StrokeCache&) = delete;
  StrokeCache& operator=(const StrokeCache&) = delete;

  bool hasEntry() const { return mData != nullptr; }

  // True when the cached floats still draw the stroke. `inverseScale`: the one they must have been computed
  // at; null where a version does not care.
  bool fits(const Vector2<float>* inverseScale) const {
    return mPoints != nullptr && !mStroke.IsRedrawingCacheDirty() &&
           (inverseScale == nullptr || mPoints->hasSameInverseScale(*inverseScale));
  }

  // Of an entry that fits.
  RectF rect() const { return mData->GetPenRect(); }
  std::vector<float>* buffer() const { return mPoints->mBuffer; }

  // Hands over the reference that keeps the buffer alive, for the render thread to drop after its use.
  RefCount* takePoints() { return std::exchange(mPoints, nullptr); }

  // Drops what is cached, ahead of the stroke's being computed again.
  void dropPoints() {
    if (mPoints != nullptr) takePoints()->Unref();
  }

  // Keeps a copy of the computed floats. Without memory for it the stroke stays uncached.
  void store(const RectF& rect, const std::vector<float>* floats) {
    if (mData == nullptr) return;
    if (PenStrokePointData* points = copy(floats); points != nullptr) {
      mData->SetPenRect(rect);
      if (mData->SetPointData(points)) clearDirtyFlag();
      points->Unref();
    }
    mStroke.SetOriginalRuntimeHandle(-1);
  }

  // Ends this use of the entry, on the render thread; here and now when the queue refuses.
  void postRelease(IGLMsgQueue* queue) {
    mReleased = true;
    if (!post(queue, mManager, &PenStrokeDataManager::ReleaseStrokeData, mHandle)) {
      mManager->ReleaseStrokeData(mHandle);
    }
  }

 private:
  static PenStrokePointData* copy(const std::vector<float>* floats) {
    if (floats == nullptr) return nullptr;
    auto* points = new (std::nothrow) PenStrokePointData;
    if (points == nullptr) return nullptr;
    try {
      points->mBuffer = new (std::nothrow) std::vector<float>(*floats);
    } catch (const std::exception&) {
      // No memory for the floats; treated as a failed allocation of the vector.
    }
    if (points->mBuffer != nullptr) return points;
    points->Unref();
    return nullptr;
  }

  void clearDirtyFlag() {
    ObjectBase* object = mOwnHandle ? &mStroke : ObjectBase::FindObjectBase(mHandle);
    if (object != nullptr) object->ClearRedrawingCacheDirtyFlag();
  }

  ObjectStroke& mStroke;
  PenStrokeDataManager* mManager;
  int mHandle;
  bool mOwnHandle = false;
  bool mReleased = false;
  PenStrokeData* mData = nullptr;
  PenStrokePointData* mPoints = nullptr;
};

}  // namespace Qelt
