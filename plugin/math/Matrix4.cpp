#include "math/Matrix4.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "base/Vector.h"

namespace Qelt {

namespace {

constexpr float kHalfRadiansPerDegree = 0.008726646f;

template <typename T>
Vector3<T> cross(const Vector3<T>& a, const Vector3<T>& b) {
  return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
}

template <typename T>
Vector3<T> normalised(const Vector3<T>& v) {
  const T scale = T(1) / std::sqrt(v.x * v.x + v.y * v.y + v.z * v.z);
  return {v.x * scale, v.y * scale, v.z * scale};
}

// The determinant of what is left without one row and one column, expanded along its first row.
template <typename T>
T minorOf(const Matrix4<T>& m, int leftOutRow, int leftOutColumn) {
  int r[3];
  int c[3];
  for (int kept = 0, index = 0; index < 4; ++index) {
    if (index != leftOutRow) r[kept++] = index;
  }
  for (int kept = 0, index = 0; index < 4; ++index) {
    if (index != leftOutColumn) c[kept++] = index;
  }
  return m(r[0], c[0]) * (m(r[1], c[1]) * m(r[2], c[2]) - m(r[1], c[2]) * m(r[2], c[1])) -
         m(r[0], c[1]) * (m(r[1], c[0]) * m(r[2], c[2]) - m(r[1], c[2]) * m(r[2], c[0])) +
         m(r[0], c[2]) * (m(r[1], c[0]) * m(r[2], c[1]) - m(r[1], c[1]) * m(r[2], c[0]));
}

// Overwrites the upper 3 x 3 with Rx * Ry * Rz, angles in radians.
template <typename T>
void putEuler(T ax, T ay, T az, T* m) {
  T sa, ca, sb, cb, sc, cc;
  sincosf(ax, &sa, &ca);
  sincosf(ay, &sb, &cb);
  sincosf(az, &sc, &cc);
  m[0] = cb * cc;
  m[1] = sa * sb * cc + ca * sc;
  m[2] = sa * sc - ca * sb * cc;
  m[4] = -cb * sc;
  m[5] = ca * cc - sa * sb * sc;
  m[6] = ca * sb * sc + sa * cc;
  m[8] = sb;
  m[9] = -sa * cb;
  m[10] = ca * cb;
}

}  // namespace

template <typename T>
Matrix4<T>::Matrix4() {
  identitySelf();
}

template <typename T>
Matrix4<T>::Matrix4(const T& value) {
  std::fill_n(mElements, 16, value);
}

template <typename T>
Matrix4<T>::Matrix4(const T* elements) {
  if (elements == nullptr) {
    identitySelf();
  } else {
    std::memcpy(mElements, elements, sizeof(mElements));
  }
}

// Written out, though they only copy, because a host links against them.
template <typename T>
Matrix4<T>::Matrix4(const Matrix4& other) {
  std::memcpy(mElements, other.mElements, sizeof(mElements));
}

template <typename T>
Matrix4<T>& Matrix4<T>::operator=(const Matrix4& other) {
  if (this != &other) std::memcpy(mElements, other.mElements, sizeof(mElements));
  return *this;
}

template <typename T>
Matrix4<T>& Matrix4<T>::identitySelf() {
  zeroSelf();
  mElements[0] = mElements[5] = mElements[10] = mElements[15] = T(1);
  return *this;
}

template <typename T>
Matrix4<T>& Matrix4<T>::zeroSelf() {
  std::fill_n(mElements, 16, T(0));
  return *this;
}

template <typename T>
bool Matrix4<T>::operator==(const Matrix4& other) const {
  // NOLINTNEXTLINE(bugprone-suspicious-memory-comparison): bytes are what is promised
  return std::memcmp(mElements, other.mElements, sizeof(mElements)) == 0;
}

template <typename T>
bool Matrix4<T>::operator!=(const Matrix4& other) const {
  return !(*this == other);
}

template <typename T>
Matrix4<T>& Matrix4<T>::transposeSelf() {
  return *this = transpose();
}

template <typename T>
Matrix4<T> Matrix4<T>::transpose() const {
  Matrix4 result;
  for (int column = 0; column < 4; ++column) {
    for (int row = 0; row < 4; ++row) result(row, column) = (*this)(column, row);
  }
  return result;
}

template <typename T>
Matrix4<T>& Matrix4<T>::inverseSelf() {
  return *this = inverse();
}

template <typename T>
Matrix4<T> Matrix4<T>::inverse() const {
  double cofactors[16];
  calculaeMatrix(cofactors);
  const double determinant = mElements[0] * cofactors[0] + mElements[4] * cofactors[1] +
                             mElements[8] * cofactors[2] + mElements[12] * cofactors[3];
  if (determinant == 0.0) return *this;
  const double scale = 1.0 / determinant;
  Matrix4 result;
  for (int index = 0; index < 16; ++index) {
    result.mElements[index] = static_cast<T>(cofactors[index] * scale);
  }
  return result;
}

template <typename T>
void Matrix4<T>::calculaeMatrix(double* cofactors) const {
  if (cofactors == nullptr) return;
  for (int column = 0; column < 4; ++column) {
    for (int row = 0; row < 4; ++row) {
      // Row and column change places: these are the inverse's elements, not the matrix's.
      const T minor = minorOf(*this, column, row);
      cofactors[4 * column + row] = (row + column) % 2 == 0 ? minor : -minor;
    }
  }
}

template <typename T>
Matrix4<T> Matrix4<T>::operator*(const Matrix4& other) const {
  Matrix4 result;
  for (int column = 0; column < 4; ++column) {
    for (int row = 0; row < 4; ++row) {
      result(row, column) = (*this)(row, 0) * other(0, column) + (*this)(row, 1) * other(1, column) +
                            (*this)(row, 2) * other(2, column) + (*this)(row, 3) * other(3, column);
    }
  }
  return result;
}

template <typename T>
Matrix4<T> Matrix4<T>::perspectiveMatrix(T degrees, T aspect, T nearPlane, T farPlane) {
  const T halfHeight = tanf(degrees * kHalfRadiansPerDegree) * nearPlane;
  Matrix4 result(T(0));
  result[0] = T(2) * nearPlane / (T(2) * halfHeight * aspect);
  result[5] = T(2) * nearPlane / (T(2) * halfHeight);
  result[10] = -(nearPlane + farPlane) / (farPlane - nearPlane);
  result[11] = T(-1);
  result[14] = -(T(2) * farPlane * nearPlane) / (farPlane - nearPlane);
  return result;
}

template <typename T>
Matrix4<T> Matrix4<T>::orthoMatrix(T left, T right, T bottom, T top, T nearPlane, T farPlane) {
  Matrix4 result(T(0));
  result[0] = T(2) / (right - left);
  result[5] = T(2) / (top - bottom);
  result[10] = T(-2) / (farPlane - nearPlane);
  result[12] = -(left + right) / (right - left);
  result[13] = -(bottom + top) / (top - bottom);
  result[14] = -(nearPlane + farPlane) / (farPlane - nearPlane);
  result[15] = T(1);
  return result;
}

template <typename T>
Matrix4<T> Matrix4<T>::translateMatrix(T x, T y, T z) {
  Matrix4 result;
  result[12] = x;
  result[13] = y;
  result[14] = z;
  return result;
}

template <typename T>
Matrix4<T> Matrix4<T>::translateMatrix(const Vector3<T>& offset) {
  return translateMatrix(offset.x, offset.y, offset.z);
}

template <typename T>
Matrix4<T> Matrix4<T>::scaleMatrix(T x, T y, T z) {
  Matrix4 result;
  result[0] = x;
  result[5] = y;
  result[10] = z;
  return result;
}

template <typename T>
Matrix4<T> Matrix4<T>::scaleMatrix(const Vector3<T>& factors) {
  return scaleMatrix(factors.x, factors.y, factors.z);
}

template <typename T>
Matrix4<T> Matrix4<T>::rotateMatrix(T ax, T ay, T az) {
  Matrix4 result;
  putEuler(ax, ay, az, result.mElements);
  return result;
}

template <typename T>
Matrix4<T> Matrix4<T>::rotateMatrix(T radians, Vector3<T>& axis) {
  const auto [x, y, z] = normalised(axis);
  T s, c;
  sincosf(radians, &s, &c);
  const T t = T(1) - c;
  // Kept: with column-major storage these formulas turn by -radians.
  Matrix4 result;
  result[0] = c + x * x * t;
  result[1] = x * y * t - s * z;
  result[2] = s * y + x * z * t;
  result[4] = s * z + x * y * t;
  result[5] = c + y * y * t;
  result[6] = y * z * t - s * x;
  result[8] = x * z * t - s * y;
  result[9] = s * x + y * z * t;
  result[10] = c + z * z * t;
  return result;
}

template <typename T>
Matrix4<T> Matrix4<T>::rotateMatrix(Vector3<T> dir, Vector3<T> up) {
  const Vector3<T> side = cross(dir, up);
  const Vector3<T> columns[3] = {normalised(side), normalised(cross(side, dir)), normalised(dir)};
  Matrix4 result;
  for (int number = 0; number < 3; ++number) {
    result(0, number) = columns[number].x;
    result(1, number) = columns[number].y;
    result(2, number) = columns[number].z;
  }
  return result;
}

template <typename T>
Matrix4<T> Matrix4<T>::rotation() const {
  Matrix4 result(*this);
  result[12] = result[13] = result[14] = T(0);
  return result;
}

template <typename T>
Matrix4<T> Matrix4<T>::translation() const {
  return translateMatrix(mElements[12], mElements[13], mElements[14]);
}

template <typename T>
Matrix4<T> Matrix4<T>::rotate(T ax, T ay, T az) const {
  Matrix4 result = translation();
  putEuler(ax, ay, az, result.mElements);
  return result;
}

template <typename T>
Matrix4<T>& Matrix4<T>::rotateSelf(T ax, T ay, T az) {
  putEuler(ax, ay, az, mElements);
  return *this;
}

template class Matrix4<float>;

}  // namespace Qelt
