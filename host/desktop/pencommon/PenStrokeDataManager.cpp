#include "pencommon/PenStrokeDataManager.h"

#include <cmath>
#include <new>

namespace Qelt {

namespace {

// Two ways of computing one scale may differ in the last bits; no view changes by so little. An infinite
// scale is like itself alone: the tolerance must not be reached, or it would take in every other.
bool isSameScale(float a, float b) {
  return a == b || std::abs(a - b) < 1e-6f * std::abs(b);
}

thread_local Vector2<float> tInverseScale{1.0f, 1.0f};

}  // namespace

PenStrokePointData::PenStrokePointData() = default;

PenStrokePointData::~PenStrokePointData() {
  delete mBuffer;
}

bool PenStrokePointData::hasSameInverseScale(Vector2<float> inverseScale) const {
  return isSameScale(mInverseScale.x, inverseScale.x) && isSameScale(mInverseScale.y, inverseScale.y);
}

void PenStrokePointData::setInverseScale(Vector2<float> inverseScale) {
  mInverseScale = inverseScale;
}

PenStrokeData::PenStrokeData() = default;

PenStrokeData::~PenStrokeData() {
  if (mPoints != nullptr) mPoints->Unref();
}

RectF PenStrokeData::GetPenRect() const {
  const AutoCriticalSection guard(&mLock);
  return mPenRect;
}

void PenStrokeData::SetPenRect(const RectF& rect) {
  const AutoCriticalSection guard(&mLock);
  mPenRect = rect;
}

PenStrokePointData* PenStrokeData::GetPointData() {
  const AutoCriticalSection guard(&mLock);
  if (mPoints != nullptr) mPoints->Ref();
  return mPoints;
}

bool PenStrokeData::SetPointData(PenStrokePointData* points) {
  // Points without a buffer hold no drawing.
  PenStrokePointData* const kept = points != nullptr && points->mBuffer != nullptr ? points : nullptr;
  if (kept != nullptr) {
    kept->setInverseScale(PenStrokeDataManager::GetInstance()->GetInverseScale());
    kept->Ref();
  }
  PenStrokePointData* dropped = nullptr;
  {
    const AutoCriticalSection guard(&mLock);
    dropped = mPoints;
    mPoints = kept;
  }
  if (dropped != nullptr) dropped->Unref();
  return kept != nullptr;
}

struct PenStrokeDataManager::Entry {
  PenStrokeData data;
  int uses = 0;
  bool isDropped = false;
};

// Never destroyed: tasks that give entries back may still run while the process ends.
PenStrokeDataManager* PenStrokeDataManager::GetInstance() {
  static PenStrokeDataManager* const instance = new PenStrokeDataManager;
  return instance;
}

PenStrokeDataManager::PenStrokeDataManager() = default;

PenStrokeDataManager::~PenStrokeDataManager() {
  for (const auto& [handle, entry] : mEntries) delete entry;
}

PenStrokeData* PenStrokeDataManager::GetStrokeData(int runtimeHandle) {
  const AutoCriticalSection guard(&mLock);
  const auto found = mEntries.find(runtimeHandle);
  if (found == mEntries.end() || found->second->isDropped) return nullptr;
  ++found->second->uses;
  return &found->second->data;
}

void PenStrokeDataManager::ReleaseStrokeData(int runtimeHandle) {
  const AutoCriticalSection guard(&mLock);
  const auto found = mEntries.find(runtimeHandle);
  if (found == mEntries.end() || found->second->uses == 0) return;
  Entry* const entry = found->second;
  if (--entry->uses > 0 || !entry->isDropped) return;
  mEntries.erase(found);
  delete entry;
}

void PenStrokeDataManager::CreateStrokeData(int runtimeHandle) {
  const AutoCriticalSection guard(&mLock);
  const auto [place, isNew] = mEntries.try_emplace(runtimeHandle, nullptr);
  if (isNew) {
    place->second = new (std::nothrow) Entry;
    if (place->second != nullptr) return;
    mEntries.erase(place);
    throw std::bad_alloc();
  }
  if (place->second->isDropped) {
    // Still in use from before: it starts over empty.
    place->second->isDropped = false;
    place->second->data.SetPointData(nullptr);
    place->second->data.SetPenRect(RectF());
  }
}

void PenStrokeDataManager::DropStrokeData(int runtimeHandle) {
  const AutoCriticalSection guard(&mLock);
  const auto found = mEntries.find(runtimeHandle);
  if (found == mEntries.end()) return;
  if (found->second->uses > 0) {
    found->second->isDropped = true;
    return;
  }
  delete found->second;
  mEntries.erase(found);
}

void PenStrokeDataManager::SetInverseScale(Vector2<float> inverseScale) {
  tInverseScale = inverseScale;
}

Vector2<float> PenStrokeDataManager::GetInverseScale() {
  return tInverseScale;
}

}  // namespace Qelt
