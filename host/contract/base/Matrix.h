#pragma once

namespace Qelt {

// Column-major float matrices. The pen carries and exports their operations (math/Matrix3.h,
// math/Matrix4.h); the contract only passes them by reference.
template <typename T>
class Matrix3;
template <typename T>
class Matrix4;

}  // namespace Qelt
