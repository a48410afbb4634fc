#pragma once

#include <cstddef>

#include "base/Matrix.h"
#include "base/RectF.h"

namespace Qelt {

// A 3 x 3 matrix: transforms of the plane, affine and projective (a canvas's matrix).
//
// Column-major: element (row r, column c) is stored at 3c + r, and points are column vectors. By index:
//   0 scale x    3 skew x     6 translate x
//   1 skew y     4 scale y    7 translate y
//   2 persp. 0   5 persp. 1   8 persp. 2 (1 when affine)
//
// "pre" makes this = this * X (X acts on points first), "post" makes this = X * this (X acts last).
// Operations that change the matrix return it. Nothing reports an error; where there is no finite result, the
// result is infinite or NaN. Kept: rotations here take degrees, those of Matrix4 take radians.
//
// A plain value: any thread, no shared state. Only Matrix3<float> exists; the pen's library exports all of
// it.
template <typename T>
class __attribute__((visibility("default"))) Matrix3 {
 public:
  Matrix3();                            // identity
  explicit Matrix3(const T& value);     // every element
  explicit Matrix3(const T* elements);  // nine, as stored; null gives the identity
  Matrix3(const Matrix3& other);
  Matrix3& operator=(const Matrix3& other);

  Matrix3& identitySelf();
  Matrix3& zeroSelf();
  // Exact: no tolerance.
  bool isIdentity() const;
  // Kept: compares bytes, so +0 and -0 differ and a NaN equals itself.
  bool operator==(const Matrix3& other) const;
  bool operator!=(const Matrix3& other) const;

  Matrix3& transposeSelf();
  Matrix3 transpose() const;
  // A matrix whose determinant is exactly 0 stays as it is; nothing else counts as singular.
  Matrix3& inverseSelf();
  Matrix3 inverse() const;
  // Writes nine cofactors, the inverse times the determinant, as stored; each is worked out in T.
  // Kept: the name is misspelt; hosts link against it.
  void calculaeMatrix(double* cofactors) const;

  static Matrix3 translateMatrix(T tx, T ty);
  static Matrix3 scaleMatrix(T sx, T sy);
  static Matrix3 rotateMatrix(T degrees);

  // Each replaces the whole matrix; the pivot (px, py) is the point that stays where it is.
  Matrix3& setTranslate(T tx, T ty);
  Matrix3& setScale(T sx, T sy);
  Matrix3& setScale(T sx, T sy, T px, T py);
  Matrix3& setRotate(T degrees);
  Matrix3& setRotate(T degrees, T px, T py);

  Matrix3& preTranslate(T tx, T ty);
  Matrix3& preScale(T sx, T sy);
  Matrix3& preScale(T sx, T sy, T px, T py);
  Matrix3& preRotate(T degrees);
  Matrix3& preRotate(T degrees, T px, T py);
  Matrix3& preConcat(const Matrix3& other);

  // Kept: the product's second element takes element 1 where a true product takes element 2.
  Matrix3& postTranslate(T tx, T ty);
  Matrix3& postScale(T sx, T sy);
  Matrix3& postScale(T sx, T sy, T px, T py);
  Matrix3& postRotate(T degrees);
  Matrix3& postRotate(T degrees, T px, T py);
  Matrix3& postConcat(const Matrix3& other);

  // The bounding box of the mapped corners. `dst` may be `&src`; a null `dst` does nothing.
  void mapRect(RectF* dst, const RectF& src) const;
  // The same, rounded outwards by RectF::ExtendRect; an edge outside int's range takes its limit.
  void mapRect(Rect* dst, const Rect& src) const;

  T getScaleX() const { return mElements[0]; }
  T getScaleY() const { return mElements[4]; }
  T getSkewX() const { return mElements[3]; }
  T getSkewY() const { return mElements[1]; }
  T getTranslateX() const { return mElements[6]; }
  T getTranslateY() const { return mElements[7]; }

  // Row and column in 0..2, index in 0..8; not checked.
  T& operator()(int row, int column) { return mElements[3 * column + row]; }
  const T& operator()(int row, int column) const { return mElements[3 * column + row]; }
  T& operator[](int index) { return mElements[index]; }
  const T& operator[](int index) const { return mElements[index]; }
  T* data() { return mElements; }
  const T* data() const { return mElements; }
  static std::size_t storageSize() { return 9 * sizeof(T); }  // bytes
  static bool isRowMajor() { return false; }

 private:
  T mElements[9];
};

static_assert(sizeof(Matrix3<float>) == 36, "nine floats and nothing else");

// Compiled once, in Matrix3.cpp; without this line the inline ones would be emitted hidden elsewhere, and
// the linker would then hide the exported ones too.
extern template class Matrix3<float>;

}  // namespace Qelt
