#pragma once

#include "base/HostApi.h"

namespace Qelt {

class IGLMsgQueue;
class String;

// What the host keeps on the render thread for its pens.
class QELT_HOST_API PenGLDataManager {
 public:
  virtual ~PenGLDataManager();
  // Either thread: the way to the render thread; null when there is none. The same queue for as long as the
  // pens live that were given this manager.
  virtual IGLMsgQueue* GetMsgQueue() = 0;
  // Render thread: drops what is kept for pens of a type name; true when there was something. Posted by a
  // dying pen. Chosen here: the name.
  virtual bool ReleasePenData(String* penName) = 0;
};

}  // namespace Qelt
