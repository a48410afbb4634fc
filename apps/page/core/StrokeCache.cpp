#include "core/StrokeCache.h"

#include <iterator>

#include "core/PageStroke.h"
#include "pencommon/PenStrokeDataManager.h"

namespace QeltDesktop {

StrokeCache::~StrokeCache() {
  dropAll();
}

void StrokeCache::prepare(PageStroke& stroke, float zoom, bool followsZoom) {
  if (!stroke.mIsCached) {
    mKept.push_back(&stroke);
    stroke.mCachePlace = std::prev(mKept.end());
    try {
      Qelt::PenStrokeDataManager::GetInstance()->CreateStrokeData(stroke.GetRuntimeHandle());
    } catch (...) {
      mKept.pop_back();
      throw;
    }
    stroke.mIsCached = true;
    stroke.SetRedrawingCacheDirtyFlag();
  } else if (followsZoom && stroke.mCachedZoom != zoom) {
    // Two zooms that the pen takes for the same may differ in the last bits of the drawing.
    stroke.SetRedrawingCacheDirtyFlag();
  }
  ++(stroke.IsRedrawingCacheDirty() ? mMisses : mHits);
  stroke.mCachedZoom = zoom;
}

void StrokeCache::note(PageStroke& stroke) {
  if (!stroke.mIsCached) return;
  auto* const manager = Qelt::PenStrokeDataManager::GetInstance();
  const int handle = stroke.GetRuntimeHandle();
  std::size_t bytes = 0;
  if (Qelt::PenStrokeData* const data = manager->GetStrokeData(handle); data != nullptr) {
    if (Qelt::PenStrokePointData* const points = data->GetPointData(); points != nullptr) {
      bytes = points->mBuffer->size() * sizeof(float);
      points->Unref();
    }
    manager->ReleaseStrokeData(handle);
  }
  mBytes += bytes - stroke.mCachedBytes;
  stroke.mCachedBytes = bytes;
  mKept.splice(mKept.end(), mKept, stroke.mCachePlace);
  while (mBytes > mMostBytes) forget(*mKept.front());
}

void StrokeCache::forget(PageStroke& stroke) {
  if (!stroke.mIsCached) return;
  Qelt::PenStrokeDataManager::GetInstance()->DropStrokeData(stroke.GetRuntimeHandle());
  mKept.erase(stroke.mCachePlace);
  mBytes -= stroke.mCachedBytes;
  stroke.mCachedBytes = 0;
  stroke.mIsCached = false;
}

void StrokeCache::dropAll() {
  while (!mKept.empty()) forget(*mKept.front());
}

}  // namespace QeltDesktop
