#pragma once

namespace Qelt {
class Pen;
}

// The entry point of the library: makes one pencil, or answers null when memory ran out. The caller owns it
// and deletes it through its virtual destructor, on the main thread. Exported.
extern "C" __attribute__((visibility("default"))) Qelt::Pen* createPenInst();
