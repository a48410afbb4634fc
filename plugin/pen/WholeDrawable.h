#pragma once

#include <new>

namespace Qelt {

class PenGLDataManager;
struct Pencil2Data;

// Makes a drawable with everything it draws with, or none: one that memory ran out for half way would draw
// nothing for the rest of its life, while the next demand for none tries again. Main thread.
template <typename Drawable>
Drawable* makeWhole(Pencil2Data* penData, PenGLDataManager* manager) {
  if (penData == nullptr) return nullptr;
  auto* made = new (std::nothrow) Drawable(penData, manager);
  if (made == nullptr || made->hasPartner()) return made;
  delete made;
  return nullptr;
}

}  // namespace Qelt
