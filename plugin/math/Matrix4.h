#pragma once

#include <cstddef>

#include "base/Matrix.h"
#include "base/Vector.h"

namespace Qelt {

// A 4 x 4 matrix: transforms of space and the projections GL takes.
//
// Column-major: element (row r, column c) is stored at 4c + r, points are column vectors, and the translation
// is in elements 12, 13 and 14. Operations that change the matrix return it. Nothing reports an error; where
// there is no finite result, the result is infinite or NaN.
// Kept: rotations here take radians, those of Matrix3 take degrees.
//
// A plain value: any thread, no shared state. Only Matrix4<float> exists; the pen's library exports all of
// it.
template <typename T>
class __attribute__((visibility("default"))) Matrix4 {
 public:
  Matrix4();                            // identity
  explicit Matrix4(const T& value);     // every element
  explicit Matrix4(const T* elements);  // sixteen, as stored; null gives the identity
  Matrix4(const Matrix4& other);
  Matrix4& operator=(const Matrix4& other);

  Matrix4& identitySelf();
  Matrix4& zeroSelf();
  // Kept: compares bytes, so +0 and -0 differ and a NaN equals itself.
  bool operator==(const Matrix4& other) const;
  bool operator!=(const Matrix4& other) const;

  Matrix4& transposeSelf();
  Matrix4 transpose() const;
  // A matrix whose determinant is exactly 0 stays as it is; nothing else counts as singular.
  Matrix4& inverseSelf();
  Matrix4 inverse() const;
  // Writes sixteen cofactors, the inverse times the determinant, as stored; each is worked out in T.
  // Kept: the name is misspelt; hosts link against it.
  void calculaeMatrix(double* cofactors) const;

  // this * other
  Matrix4 operator*(const Matrix4& other) const;

  // The view's full height spans `degrees`; `aspect` is width over height; near and far are distances.
  static Matrix4 perspectiveMatrix(T degrees, T aspect, T nearPlane, T farPlane);
  static Matrix4 orthoMatrix(T left, T right, T bottom, T top, T nearPlane, T farPlane);
  static Matrix4 translateMatrix(T x, T y, T z);
  static Matrix4 translateMatrix(const Vector3<T>& offset);
  static Matrix4 scaleMatrix(T x, T y, T z);
  static Matrix4 scaleMatrix(const Vector3<T>& factors);
  // Euler angles in radians: Rx * Ry * Rz, with Rz acting on points first.
  static Matrix4 rotateMatrix(T ax, T ay, T az);
  // `axis` need not have length 1 and is only read; with length 0 the result is not finite.
  // Kept: turns by -radians about the axis, against the sense of the Euler form.
  static Matrix4 rotateMatrix(T radians, Vector3<T>& axis);
  // Columns: dir x up, (dir x up) x dir and dir, each of length 1.
  static Matrix4 rotateMatrix(Vector3<T> dir, Vector3<T> up);

  // This without its translation; its translation alone.
  Matrix4 rotation() const;
  Matrix4 translation() const;
  // A new matrix with the Euler rotation and this one's translation.
  Matrix4 rotate(T ax, T ay, T az) const;
  // Puts the Euler rotation into the upper 3 x 3 and leaves the rest.
  Matrix4& rotateSelf(T ax, T ay, T az);

  // Row, column and their numbers in 0..3, index in 0..15; not checked.
  Vector4<T> row(int number) const {
    return {mElements[number], mElements[number + 4], mElements[number + 8], mElements[number + 12]};
  }
  Vector4<T> column(int number) const {
    const T* first = mElements + 4 * number;
    return {first[0], first[1], first[2], first[3]};
  }
  T& operator()(int row, int column) { return mElements[4 * column + row]; }
  const T& operator()(int row, int column) const { return mElements[4 * column + row]; }
  T& operator[](int index) { return mElements[index]; }
  const T& operator[](int index) const { return mElements[index]; }
  T* data() { return mElements; }
  const T* data() const { return mElements; }
  static std::size_t storageSize() { return 16 * sizeof(T); }  // bytes
  static bool isRowMajor() { return false; }

 private:
  T mElements[16];
};

static_assert(sizeof(Matrix4<float>) == 64, "sixteen floats and nothing else");

// Compiled once, in Matrix4.cpp; see Matrix3.h.
extern template class Matrix4<float>;

}  // namespace Qelt
