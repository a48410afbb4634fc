#include "gl/VertexDescriptor.h"

#include <algorithm>
#include <cstddef>
#include <numeric>

namespace Qelt {

namespace {

// What every OpenGL ES 3.0 offers.
constexpr int kMostAttributes = 16;

}  // namespace

VertexDescriptor::VertexDescriptor() = default;
VertexDescriptor::VertexDescriptor(const VertexDescriptor&) = default;
VertexDescriptor::~VertexDescriptor() = default;

// Attributes lie in the order added, so the only location that fits is the next one.
void VertexDescriptor::addAttribute(AttributeType, int components, int location) {
  const int next = getAttributeCount();
  if (components < 1 || components > 4 || next >= kMostAttributes) return;
  if (location != -1 && location != next) return;
  mComponents.push_back(components);
}

int VertexDescriptor::getAttributeCount() const {
  return static_cast<int>(mComponents.size());
}

int VertexDescriptor::getComponents(int attribute) const {
  if (attribute < 0 || attribute >= getAttributeCount()) return 0;
  return mComponents[static_cast<std::size_t>(attribute)];
}

int VertexDescriptor::getStride() const {
  return std::accumulate(mComponents.begin(), mComponents.end(), 0);
}

}  // namespace Qelt
