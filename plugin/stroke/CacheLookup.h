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

// One redraw's look into the host's stroke cache, where the floats of a stored stroke wait for its next
// redraw. The plug-in never creates an entry; it fills those that the host has. Lives on the stack of the
// redraw; main thread.
//
// First `fits` says whether the cached floats can be presented: then `takePoints` and `postRelease`.
// Otherwise `dropPoints`, and after the stroke has been computed, `store` and `postRelease`.
class CacheLookup {
 public:
  explicit CacheLookup(const ObjectStroke& stroke)
      // Kept: hosts hand strokes over as const, but their handles and dirty flags are set all the same.
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

  // Gives back the reference and the use of the entry where an exception kept them from being given back.
  ~CacheLookup() {
    dropPoints();
    if (mData != nullptr && !mReleased) mManager->ReleaseStrokeData(mHandle);
  }

  CacheLookup(const CacheLookup&) = delete;
  CacheLookup& operator=(const CacheLookup&) = delete;

  bool hasEntry() const { return mData != nullptr; }

  // True when the cached floats still show the stroke as it is. `inverseScale`: the scale that they must have
  // been computed at; null for a version that does not follow the scale.
  bool fits(const Vector2<float>* inverseScale) const {
    return mPoints != nullptr && !mStroke.IsRedrawingCacheDirty() &&
           (inverseScale == nullptr || mPoints->hasSameInverseScale(*inverseScale));
  }

  // Only when `fits`.
  RectF rect() const { return mData->GetPenRect(); }
  std::vector<float>* buffer() const { return mPoints->mBuffer; }

  // Hands over the reference that keeps the buffer alive. The render thread drops it after using the buffer.
  RefCount* takePoints() { return std::exchange(mPoints, nullptr); }

  // Drops the reference to what is cached, before the stroke is computed again.
  void dropPoints() {
    if (mPoints != nullptr) takePoints()->Unref();
  }

  // Stores a copy of the computed floats. If memory runs out, the stroke stays uncached.
  void store(const RectF& rect, const std::vector<float>* floats) {
    if (mData == nullptr) return;
    if (PenStrokePointData* points = copy(floats); points != nullptr) {
      mData->SetPenRect(rect);
      if (mData->SetPointData(points)) clearDirtyFlag();
      points->Unref();
    }
    mStroke.SetOriginalRuntimeHandle(-1);
  }

  // Ends this use of the entry: on the render thread, or at once when the queue refuses.
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
      // Without memory for the floats there is no vector either.
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
