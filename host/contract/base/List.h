#pragma once

#include <vector>

#include "base/HostApi.h"

namespace Qelt {

class ObjectBase;

// A list of page objects, not owned. The pen takes one and reads nothing of it.
class QELT_HOST_API List {
 public:
  List();
  ~List();
  void Add(ObjectBase* object);
  int GetCount() const;
  ObjectBase* Get(int index) const;

 private:
  std::vector<ObjectBase*> mObjects;
};

}  // namespace Qelt
