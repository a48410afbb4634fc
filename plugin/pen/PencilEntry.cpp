#include "pen/PencilEntry.h"

#include <new>

#include "pen/Pencil2.h"

Qelt::Pen* createPenInst() {
  return new (std::nothrow) Qelt::Pencil2;
}
