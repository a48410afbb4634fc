#include "math/Matrix3.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>

#include "base/RectF.h"

namespace Qelt {

namespace {

constexpr float kRadiansPerDegree = 0.017453292f;

struct SineCosine {
  float sine = 0.0f, cosine = 0.0f;
};

SineCosine ofDegrees(float degrees) {
  SineCosine result;
  sincosf(degrees * kRadiansPerDegree, &result.sine, &result.cosine);
  return result;
}

template <typename T>
Matrix3<T> product(const Matrix3<T>& left, const Matrix3<T>& right) {
  Matrix3<T> result;
  for (int column = 0; column < 3; ++column) {
    for (int row = 0; row < 3; ++row) {
      result(row, column) =
          left(row, 0) * right(0, column) + left(row, 1) * right(1, column) + left(row, 2) * right(2, column);
    }
  }
  return result;
}

// Cofactors in T, where the inverse needs them; calculaeMatrix widens them.
template <typename T>
void cofactorsOf(const T* m, T* out) {
  out[0] = m[4] * m[8] - m[7] * m[5];
  out[1] = m[7] * m[2] - m[8] * m[1];
  out[2] = m[5] * m[1] - m[4] * m[2];
  out[3] = m[5] * m[6] - m[8] * m[3];
  out[4] = m[8] * m[0] - m[2] * m[6];
  out[5] = m[2] * m[3] - m[5] * m[0];
  out[6] = m[7] * m[3] - m[4] * m[6];
  out[7] = m[1] * m[6] - m[7] * m[0];
  out[8] = m[4] * m[0] - m[1] * m[3];
}

// A conversion that leaves int's range would be undefined, and a mapped rectangle may have any edges: those
// beyond the range take its limit, and NaN becomes 0.
int saturated(float value) {
  if (value != value) return 0;
  if (value >= 2147483648.0f) return std::numeric_limits<int>::max();
  if (value < -2147483648.0f) return std::numeric_limits<int>::min();
  return static_cast<int>(value);
}

}  // namespace

template <typename T>
Matrix3<T>::Matrix3() {
  identitySelf();
}

template <typename T>
Matrix3<T>::Matrix3(const T& value) {
  std::fill_n(mElements, 9, value);
}

template <typename T>
Matrix3<T>::Matrix3(const T* elements) {
  if (elements == nullptr) {
    identitySelf();
  } else {
    std::memcpy(mElements, elements, sizeof(mElements));
  }
}

// Written out, though they only copy, because a host links against them.
template <typename T>
Matrix3<T>::Matrix3(const Matrix3& other) {
  std::memcpy(mElements, other.mElements, sizeof(mElements));
}

template <typename T>
Matrix3<T>& Matrix3<T>::operator=(const Matrix3& other) {
  if (this != &other) std::memcpy(mElements, other.mElements, sizeof(mElements));
  return *this;
}

template <typename T>
Matrix3<T>& Matrix3<T>::identitySelf() {
  zeroSelf();
  mElements[0] = mElements[4] = mElements[8] = T(1);
  return *this;
}

template <typename T>
Matrix3<T>& Matrix3<T>::zeroSelf() {
  std::fill_n(mElements, 9, T(0));
  return *this;
}

template <typename T>
bool Matrix3<T>::isIdentity() const {
  for (int index = 0; index < 9; ++index) {
    if (mElements[index] != (index % 4 == 0 ? T(1) : T(0))) return false;
  }
  return true;
}

template <typename T>
bool Matrix3<T>::operator==(const Matrix3& other) const {
  // NOLINTNEXTLINE(bugprone-suspicious-memory-comparison): bytes are what is promised
  return std::memcmp(mElements, other.mElements, sizeof(mElements)) == 0;
}

template <typename T>
bool Matrix3<T>::operator!=(const Matrix3& other) const {
  return !(*this == other);
}

template <typename T>
Matrix3<T>& Matrix3<T>::transposeSelf() {
  return *this = transpose();
}

template <typename T>
Matrix3<T> Matrix3<T>::transpose() const {
  Matrix3 result;
  for (int column = 0; column < 3; ++column) {
    for (int row = 0; row < 3; ++row) result(row, column) = (*this)(column, row);
  }
  return result;
}

template <typename T>
Matrix3<T>& Matrix3<T>::inverseSelf() {
  return *this = inverse();
}

template <typename T>
Matrix3<T> Matrix3<T>::inverse() const {
  T cofactors[9];
  cofactorsOf(mElements, cofactors);
  const T determinant =
      mElements[0] * cofactors[0] + mElements[3] * cofactors[1] + mElements[6] * cofactors[2];
  if (determinant == T(0)) return *this;
  const T scale = T(1) / determinant;
  Matrix3 result;
  for (int index = 0; index < 9; ++index) result.mElements[index] = cofactors[index] * scale;
  return result;
}

template <typename T>
void Matrix3<T>::calculaeMatrix(double* cofactors) const {
  if (cofactors == nullptr) return;
  T narrow[9];
  cofactorsOf(mElements, narrow);
  for (int index = 0; index < 9; ++index) cofactors[index] = narrow[index];
}

template <typename T>
Matrix3<T> Matrix3<T>::translateMatrix(T tx, T ty) {
  return Matrix3().setTranslate(tx, ty);
}

template <typename T>
Matrix3<T> Matrix3<T>::scaleMatrix(T sx, T sy) {
  return Matrix3().setScale(sx, sy);
}

template <typename T>
Matrix3<T> Matrix3<T>::rotateMatrix(T degrees) {
  return Matrix3().setRotate(degrees);
}

template <typename T>
Matrix3<T>& Matrix3<T>::setTranslate(T tx, T ty) {
  identitySelf();
  mElements[6] = tx;
  mElements[7] = ty;
  return *this;
}

template <typename T>
Matrix3<T>& Matrix3<T>::setScale(T sx, T sy) {
  identitySelf();
  mElements[0] = sx;
  mElements[4] = sy;
  return *this;
}

template <typename T>
Matrix3<T>& Matrix3<T>::setScale(T sx, T sy, T px, T py) {
  setScale(sx, sy);
  mElements[6] = px - sx * px;
  mElements[7] = py - sy * py;
  return *this;
}

template <typename T>
Matrix3<T>& Matrix3<T>::setRotate(T degrees) {
  const auto [sine, cosine] = ofDegrees(degrees);
  identitySelf();
  mElements[0] = cosine;
  mElements[1] = sine;
  mElements[3] = -sine;
  mElements[4] = cosine;
  return *this;
}

template <typename T>
Matrix3<T>& Matrix3<T>::setRotate(T degrees, T px, T py) {
  setRotate(degrees);
  const T cosine = mElements[0];
  const T sine = mElements[1];
  mElements[6] = sine * py - cosine * px + px;
  mElements[7] = -sine * px - cosine * py + py;
  return *this;
}

template <typename T>
Matrix3<T>& Matrix3<T>::preTranslate(T tx, T ty) {
  mElements[6] += mElements[0] * tx + mElements[3] * ty;
  mElements[7] += mElements[1] * tx + mElements[4] * ty;
  mElements[8] += mElements[2] * tx + mElements[5] * ty;
  return *this;
}

template <typename T>
Matrix3<T>& Matrix3<T>::preScale(T sx, T sy) {
  return preConcat(scaleMatrix(sx, sy));
}

template <typename T>
Matrix3<T>& Matrix3<T>::preScale(T sx, T sy, T px, T py) {
  return preConcat(Matrix3().setScale(sx, sy, px, py));
}

template <typename T>
Matrix3<T>& Matrix3<T>::preRotate(T degrees) {
  return preConcat(rotateMatrix(degrees));
}

template <typename T>
Matrix3<T>& Matrix3<T>::preRotate(T degrees, T px, T py) {
  return preConcat(Matrix3().setRotate(degrees, px, py));
}

template <typename T>
Matrix3<T>& Matrix3<T>::preConcat(const Matrix3& other) {
  return *this = product(*this, other);
}

template <typename T>
Matrix3<T>& Matrix3<T>::postTranslate(T tx, T ty) {
  mElements[0] += mElements[2] * tx;
  // Kept: a true product would add element 2 times ty.
  mElements[1] += mElements[1] * ty;
  mElements[3] += mElements[5] * tx;
  mElements[4] += mElements[5] * ty;
  mElements[6] += mElements[8] * tx;
  mElements[7] += mElements[8] * ty;
  return *this;
}

template <typename T>
Matrix3<T>& Matrix3<T>::postScale(T sx, T sy) {
  return postConcat(scaleMatrix(sx, sy));
}

template <typename T>
Matrix3<T>& Matrix3<T>::postScale(T sx, T sy, T px, T py) {
  return postConcat(Matrix3().setScale(sx, sy, px, py));
}

template <typename T>
Matrix3<T>& Matrix3<T>::postRotate(T degrees) {
  return postConcat(rotateMatrix(degrees));
}

template <typename T>
Matrix3<T>& Matrix3<T>::postRotate(T degrees, T px, T py) {
  return postConcat(Matrix3().setRotate(degrees, px, py));
}

template <typename T>
Matrix3<T>& Matrix3<T>::postConcat(const Matrix3& other) {
  return *this = product(other, *this);
}

template <typename T>
void Matrix3<T>::mapRect(RectF* dst, const RectF& src) const {
  if (dst == nullptr) return;
  const T corners[4][2] = {
      {src.left, src.top}, {src.right, src.top}, {src.right, src.bottom}, {src.left, src.bottom}};
  const T* m = mElements;
  bool first = true;
  for (const auto& [x, y] : corners) {
    // A vanishing w is not guarded: the corner is then infinite or NaN.
    const T w = m[8] + x * m[2] + y * m[5];
    const T mappedX = (m[6] + x * m[0] + y * m[3]) / w;
    const T mappedY = (m[7] + x * m[1] + y * m[4]) / w;
    if (first) {
      dst->Set(mappedX, mappedY, mappedX, mappedY);
      first = false;
    } else {
      dst->MakeRect(mappedX, mappedY);
    }
  }
}

template <typename T>
void Matrix3<T>::mapRect(Rect* dst, const Rect& src) const {
  if (dst == nullptr) return;
  RectF box;
  box.Set(static_cast<float>(src.left), static_cast<float>(src.top), static_cast<float>(src.right),
          static_cast<float>(src.bottom));
  mapRect(&box, box);
  box.ExtendRect();
  dst->left = saturated(box.left);
  dst->top = saturated(box.top);
  dst->right = saturated(box.right);
  dst->bottom = saturated(box.bottom);
}

template class Matrix3<float>;

}  // namespace Qelt
