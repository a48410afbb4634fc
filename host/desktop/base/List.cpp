#include "base/List.h"

#include <cstddef>

namespace Qelt {

List::List() = default;
List::~List() = default;

void List::Add(ObjectBase* object) {
  mObjects.push_back(object);
}

int List::GetCount() const {
  return static_cast<int>(mObjects.size());
}

ObjectBase* List::Get(int index) const {
  if (index < 0 || index >= GetCount()) return nullptr;
  return mObjects[static_cast<std::size_t>(index)];
}

}  // namespace Qelt
