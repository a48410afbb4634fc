#pragma once

namespace Qelt {

// Plain value types; members in storage order, nothing else stored.

template <typename T>
struct Vector2 {
  T x{}, y{};
};

template <typename T>
struct Vector3 {
  T x{}, y{}, z{};
};

template <typename T>
struct Vector4 {
  T x{}, y{}, z{}, w{};
};

}  // namespace Qelt
