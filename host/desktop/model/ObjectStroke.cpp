#include "model/ObjectStroke.h"

namespace Qelt {

ObjectStroke::ObjectStroke() = default;
ObjectStroke::~ObjectStroke() = default;

}  // namespace Qelt
