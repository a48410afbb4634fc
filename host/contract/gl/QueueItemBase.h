#pragma once

namespace Qelt {

// A node of an intrusive singly linked queue.
template <typename Item>
class QueueItemBase {
 public:
  // The next item, set by the queue; whoever posts sets it to null.
  Item* mNext = nullptr;
};

}  // namespace Qelt
