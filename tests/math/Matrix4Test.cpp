#include "math/Matrix4.h"

#include <gtest/gtest.h>

#include <cmath>
#include <numeric>

#include "base/Vector.h"
#include "math/Elements.h"

namespace Qelt {
namespace {

using Elements = QeltTests::Elements<4>;
using QeltTests::expectNear;
using QeltTests::naiveProduct;

Matrix4<float> of(const Elements& elements) {
  return Matrix4<float>(elements.data());
}

constexpr Elements kIdentity = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
// No two elements alike, invertible.
constexpr Elements kAny = {2.0f, 0.5f,  0.125f, -0.75f, -1.0f, 3.0f,  0.25f, 1.25f,
                           7.0f, -4.0f, 1.5f,   0.0f,   5.0f,  -2.0f, 6.0f,  1.75f};
constexpr float kQuarter = 1.57079633f;

TEST(Matrix4, StoresColumnAfterColumn) {
  Elements counted;
  std::iota(counted.begin(), counted.end(), 0.0f);
  const Matrix4<float> matrix = of(counted);
  EXPECT_EQ(matrix(1, 2), 9.0f);
  const Vector4<float> row = matrix.row(2);
  EXPECT_EQ(row.x, 2.0f);
  EXPECT_EQ(row.y, 6.0f);
  EXPECT_EQ(row.w, 14.0f);
  const Vector4<float> column = matrix.column(3);
  EXPECT_EQ(column.x, 12.0f);
  EXPECT_EQ(column.z, 14.0f);
  EXPECT_EQ(matrix.transpose()(2, 1), 9.0f);
  EXPECT_EQ(matrix.transpose().row(3).y, 13.0f);
  EXPECT_FALSE(matrix.isRowMajor());
  EXPECT_EQ(matrix.storageSize(), 64u);
  EXPECT_EQ(Matrix4<float>(static_cast<const float*>(nullptr)), Matrix4<float>());
}

TEST(Matrix4, EqualityIsThatOfTheBytes) {
  Matrix4<float> plus, minus;
  minus[1] = -0.0f;
  EXPECT_TRUE(plus != minus);
  EXPECT_TRUE(minus == Matrix4<float>(minus));
}

TEST(Matrix4, MultipliesTheOtherFromTheRight) {
  const Elements other = {-3, 0.75f, 0.5f, 1, 2, 1, -0.25f, 0, 4, 9, 2, -1, 0.5f, 6, -7, 3};
  expectNear(of(kAny) * of(other), naiveProduct<4>(kAny, other), 1e-5f);
}

TEST(Matrix4, InverseTimesMatrixIsTheIdentity) {
  const Matrix4<float> inverse = of(kAny).inverse();
  expectNear(naiveProduct<4>(inverse, kAny), kIdentity, 2e-6f);
  Matrix4<float> itself = of(kAny);
  EXPECT_EQ(itself.inverseSelf(), inverse);
}

TEST(Matrix4, CofactorsAreTheInverseTimesTheDeterminant) {
  // Diagonal (2, 3, 5, 7) with element (0, 1) = 4: determinant 210, the inverse's (0, 1) = -4 / 6.
  Matrix4<float> matrix = of({2, 0, 0, 0, 4, 3, 0, 0, 0, 0, 5, 0, 0, 0, 0, 7});
  double cofactors[16];
  matrix.calculaeMatrix(cofactors);
  const double expected[16] = {105, 0, 0, 0, -140, 70, 0, 0, 0, 0, 42, 0, 0, 0, 0, 30};
  for (int index = 0; index < 16; ++index) EXPECT_EQ(cofactors[index], expected[index]) << index;
}

TEST(Matrix4, OnlyADeterminantOfExactlyZeroIsSingular) {
  const Elements singular = {1, 2, 3, 4, 2, 4, 6, 8, 0, -0.0f, 1, 0, 9, 0, 0, 1};
  EXPECT_EQ(of(singular).inverse(), of(singular));
  EXPECT_EQ(of(singular).inverseSelf(), of(singular));
  const Matrix4<float> tiny = Matrix4<float>::scaleMatrix(1e-10f, 1e-10f, 1e-10f).inverse();
  EXPECT_NEAR(tiny[5], 1e10f, 1e4f);
}

TEST(Matrix4, PerspectiveSpansTheFieldOfView) {
  // 90 degrees: f = near, so element 5 is 1; aspect 2 halves element 0. near 1, far 3:
  // -(1 + 3) / 2 = -2 and -(2 * 3 * 1) / 2 = -3.
  expectNear(Matrix4<float>::perspectiveMatrix(90, 2, 1, 3),
             Elements{0.5f, 0, 0, 0, 0, 1, 0, 0, 0, 0, -2, -1, 0, 0, -3, 0}, 1e-6f);
}

TEST(Matrix4, OrthoTakesTheBoxToTheUnitCube) {
  // 2 / 4, 2 / (2 - 10), -2 / 8, -(1 + 5) / 4, -(10 + 2) / -8, -(1 + 9) / 8
  expectNear(Matrix4<float>::orthoMatrix(1, 5, 10, 2, 1, 9),
             Elements{0.5f, 0, 0, 0, 0, -0.25f, 0, 0, 0, 0, -0.25f, 0, -1.5f, 1.5f, -1.25f, 1}, 0.0f);
}

TEST(Matrix4, TranslationAndScaleInBothForms) {
  const Elements moved = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 2, 3, 4, 1};
  expectNear(Matrix4<float>::translateMatrix(2, 3, 4), moved, 0.0f);
  expectNear(Matrix4<float>::translateMatrix(Vector3<float>{2, 3, 4}), moved, 0.0f);
  const Elements scaled = {2, 0, 0, 0, 0, 3, 0, 0, 0, 0, 4, 0, 0, 0, 0, 1};
  expectNear(Matrix4<float>::scaleMatrix(2, 3, 4), scaled, 0.0f);
  expectNear(Matrix4<float>::scaleMatrix(Vector3<float>{2, 3, 4}), scaled, 0.0f);

  Elements untranslated = kAny;
  untranslated[12] = untranslated[13] = untranslated[14] = 0;
  expectNear(of(kAny).rotation(), untranslated, 0.0f);
  expectNear(of(kAny).translation(), Elements{1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 5, -2, 6, 1}, 0.0f);
}

TEST(Matrix4, EulerAnglesTurnAboutZThenYThenX) {
  // Each angle alone, in radians, counter-clockwise about its axis.
  expectNear(Matrix4<float>::rotateMatrix(kQuarter, 0, 0),
             Elements{1, 0, 0, 0, 0, 0, 1, 0, 0, -1, 0, 0, 0, 0, 0, 1}, 1e-6f);
  expectNear(Matrix4<float>::rotateMatrix(0, kQuarter, 0),
             Elements{0, 0, -1, 0, 0, 1, 0, 0, 1, 0, 0, 0, 0, 0, 0, 1}, 1e-6f);
  expectNear(Matrix4<float>::rotateMatrix(0, 0, kQuarter),
             Elements{0, 1, 0, 0, -1, 0, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}, 1e-6f);
  // All three, against the product of the three.
  const float angles[3] = {0.3f, -0.7f, 1.1f};
  const Matrix4<float> product = Matrix4<float>::rotateMatrix(angles[0], 0, 0) *
                                 Matrix4<float>::rotateMatrix(0, angles[1], 0) *
                                 Matrix4<float>::rotateMatrix(0, 0, angles[2]);
  expectNear(Matrix4<float>::rotateMatrix(angles[0], angles[1], angles[2]),
             naiveProduct<4>(product, kIdentity), 1e-6f);
}

TEST(Matrix4, RotatingReplacesTheUpperThreeByThree) {
  const Matrix4<float> euler = Matrix4<float>::rotateMatrix(0.3f, -0.7f, 1.1f);
  const Matrix4<float> made = of(kAny).rotate(0.3f, -0.7f, 1.1f);
  Matrix4<float> changed = of(kAny);
  EXPECT_EQ(&changed.rotateSelf(0.3f, -0.7f, 1.1f), &changed);
  for (int column = 0; column < 3; ++column) {
    for (int row = 0; row < 3; ++row) {
      EXPECT_EQ(made(row, column), euler(row, column));
      EXPECT_EQ(changed(row, column), euler(row, column));
    }
    EXPECT_EQ(made(3, column), 0.0f);
    EXPECT_EQ(changed(3, column), kAny[4 * column + 3]);
    EXPECT_EQ(made(column, 3), kAny[12 + column]);
    EXPECT_EQ(changed(column, 3), kAny[12 + column]);
  }
  EXPECT_EQ(made[15], 1.0f);
  EXPECT_EQ(changed[15], 1.75f);
}

// Kept: about an axis the angle runs the other way than Euler's.
TEST(Matrix4, AxisAndAngleTurnAgainstTheEulerSense) {
  Vector3<float> axis{0, 0, 5};  // any length
  const Matrix4<float> matrix = Matrix4<float>::rotateMatrix(kQuarter, axis);
  expectNear(matrix, Elements{0, -1, 0, 0, 1, 0, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}, 1e-6f);
  EXPECT_EQ(axis.z, 5.0f);
  // A third of a turn about the diagonal takes y to x, z to y and x to z.
  Vector3<float> diagonal{1, 1, 1};
  expectNear(Matrix4<float>::rotateMatrix(2.0943951f, diagonal),
             Elements{0, 0, 1, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 0, 1}, 1e-6f);
  Vector3<float> none{0, 0, 0};
  EXPECT_FALSE(std::isfinite(Matrix4<float>::rotateMatrix(1.0f, none)[0]));
}

TEST(Matrix4, ADirectionAndAnUpwardMakeAFrame) {
  // dir z, up y: z x y = -x, (-x) x z = y.
  expectNear(Matrix4<float>::rotateMatrix(Vector3<float>{0, 0, 2}, Vector3<float>{0, 3, 1}),
             Elements{-1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}, 1e-6f);
  const Matrix4<float> m = Matrix4<float>::rotateMatrix({1, 2, 3}, {0, 1, 0});
  EXPECT_NEAR(m[9] / m[8], 2.0f, 1e-5f);
  EXPECT_NEAR(m[10] / m[8], 3.0f, 1e-5f);
  EXPECT_FALSE(std::isfinite(Matrix4<float>::rotateMatrix({0, 0, 1}, {0, 0, 1})[0]));
}

}  // namespace
}  // namespace Qelt
