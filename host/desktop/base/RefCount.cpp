#include "base/RefCount.h"

#include <atomic>

namespace Qelt {

RefCount::RefCount() = default;
RefCount::~RefCount() = default;

void RefCount::Ref() {
  mReferences.fetch_add(1, std::memory_order_relaxed);
}

void RefCount::Unref() {
  if (mReferences.fetch_sub(1, std::memory_order_acq_rel) == 1) delete this;
}

}  // namespace Qelt
