#pragma once

#include <vector>

#include "base/HostApi.h"

namespace Qelt {

enum class AttributeType : int { Float = 0 };

// The layout of one vertex: attributes tightly packed, locations counted from 0 in the order added.
class QELT_HOST_API VertexDescriptor {
 public:
  VertexDescriptor();
  VertexDescriptor(const VertexDescriptor&);
  ~VertexDescriptor();
  // `location` -1 takes the next one. Chosen here: that this is what the third argument means.
  void addAttribute(AttributeType type, int components, int location);

  int getAttributeCount() const;
  int getComponents(int attribute) const;
  // Floats a vertex.
  int getStride() const;

 private:
  std::vector<int> mComponents;
};

}  // namespace Qelt
