#pragma once

namespace QeltDesktop {

class GlDevice;

// Tells the registered managed objects of a device what becomes of its context. Render thread. What one
// object throws is logged and keeps the others from nothing.
class ManagedObjects {
 public:
  static void release(const GlDevice* device);
  static void restore(const GlDevice* device);
  // The device is going: nobody registered there hears anything any more.
  static void forget(const GlDevice* device);
};

}  // namespace QeltDesktop
