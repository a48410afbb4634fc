#include "math/Matrix3.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <limits>

#include "base/RectF.h"
#include "math/Elements.h"

namespace Qelt {
namespace {

using Elements = QeltTests::Elements<3>;
using QeltTests::expectNear;
constexpr auto product = QeltTests::naiveProduct<3, Elements, Elements>;

Matrix3<float> of(const Elements& elements) {
  return Matrix3<float>(elements.data());
}

void expectEdges(const RectF& box, float left, float top, float right, float bottom) {
  EXPECT_NEAR(box.left, left, 1e-6f);
  EXPECT_NEAR(box.top, top, 1e-6f);
  EXPECT_NEAR(box.right, right, 1e-6f);
  EXPECT_NEAR(box.bottom, bottom, 1e-6f);
}

// No two elements alike, projective, invertible.
constexpr Elements kAny = {2.0f, 0.5f, 0.125f, -1.0f, 3.0f, 0.25f, 7.0f, -4.0f, 1.5f};

TEST(Matrix3, StoresColumnAfterColumn) {
  const Elements counted = {1, 2, 3, 4, 5, 6, 7, 8, 9};
  Matrix3<float> matrix = of(counted);
  EXPECT_EQ(matrix(1, 0), 2.0f);
  EXPECT_EQ(matrix(0, 1), 4.0f);
  EXPECT_EQ(matrix(2, 1), 6.0f);
  const float named[] = {matrix.getScaleX(), matrix.getSkewY(),      matrix.getSkewX(),
                         matrix.getScaleY(), matrix.getTranslateX(), matrix.getTranslateY()};
  const int indices[] = {0, 1, 3, 4, 6, 7};
  for (int i = 0; i < 6; ++i) EXPECT_EQ(named[i], counted[indices[i]]) << i;
  expectNear(matrix.transpose(), Elements{1, 4, 7, 2, 5, 8, 3, 6, 9}, 0.0f);
  expectNear(matrix.transposeSelf(), Elements{1, 4, 7, 2, 5, 8, 3, 6, 9}, 0.0f);
  EXPECT_FALSE(matrix.isRowMajor());
  EXPECT_EQ(matrix.storageSize(), 36u);
}

TEST(Matrix3, BeginsAsTheIdentityThatHasNoTolerance) {
  EXPECT_TRUE(Matrix3<float>().isIdentity());
  EXPECT_TRUE(Matrix3<float>(static_cast<const float*>(nullptr)).isIdentity());
  Matrix3<float> matrix(2.5f);
  expectNear(matrix, Elements{2.5f, 2.5f, 2.5f, 2.5f, 2.5f, 2.5f, 2.5f, 2.5f, 2.5f}, 0.0f);
  expectNear(matrix.zeroSelf(), Elements{}, 0.0f);
  matrix.identitySelf()[8] = std::nextafter(1.0f, 2.0f);
  EXPECT_FALSE(matrix.isIdentity());
  matrix.identitySelf()[1] = 1e-45f;
  EXPECT_FALSE(matrix.isIdentity());
}

// Kept: equality is that of the bytes, unlike isIdentity's.
TEST(Matrix3, EqualityIsThatOfTheBytes) {
  Matrix3<float> plus, minus;
  minus[1] = -0.0f;
  EXPECT_FALSE(plus == minus);
  EXPECT_TRUE(plus != minus);
  EXPECT_TRUE(minus.isIdentity());
  plus[4] = std::numeric_limits<float>::quiet_NaN();
  const Matrix3<float> copy = plus;
  EXPECT_TRUE(plus == copy);
}

TEST(Matrix3, PivotsStayWhereTheyAre) {
  // 10 - 2 * 10 = -10, 20 - 3 * 20 = -40
  expectNear(Matrix3<float>().setScale(2, 3, 10, 20), Elements{2, 0, 0, 0, 3, 0, -10, -40, 1}, 0.0f);
  expectNear(of(kAny).setTranslate(5, 6), Elements{1, 0, 0, 0, 1, 0, 5, 6, 1}, 0.0f);
  // A quarter turn about (10, 20) takes (x, y) to (30 - y, 10 + x).
  expectNear(of(kAny).setRotate(90, 10, 20), Elements{0, 1, 0, -1, 0, 0, 30, 10, 1}, 2e-6f);
}

TEST(Matrix3, ARightAngleLeavesTheCosineOfSinglePrecision) {
  const Matrix3<float> quarter = Matrix3<float>::rotateMatrix(90);
  EXPECT_EQ(quarter[1], 1.0f);
  EXPECT_EQ(quarter[3], -1.0f);
  EXPECT_EQ(quarter[0], quarter[4]);
  EXPECT_NE(quarter[0], 0.0f);
  EXPECT_LT(std::abs(quarter[0]), 1e-7f);
  EXPECT_EQ(quarter[8], 1.0f);
}

TEST(Matrix3, PreMultipliesFromTheRightAndPostFromTheLeft) {
  const Elements other = {-3.0f, 0.75f, 0.5f, 2.0f, 1.0f, -0.25f, 4.0f, 9.0f, 2.0f};
  expectNear(of(kAny).preConcat(of(other)), product(kAny, other), 1e-5f);
  expectNear(of(kAny).postConcat(of(other)), product(other, kAny), 1e-5f);

  const Elements scale = {3, 0, 0, 0, -2, 0, 0, 0, 1};
  expectNear(of(kAny).preScale(3, -2), product(kAny, scale), 1e-6f);
  expectNear(of(kAny).postScale(3, -2), product(scale, kAny), 1e-6f);
  const Elements scaleAboutPivot = {3, 0, 0, 0, -2, 0, -10, 21, 1};  // pivot (5, 7)
  expectNear(of(kAny).preScale(3, -2, 5, 7), product(kAny, scaleAboutPivot), 1e-5f);
  expectNear(of(kAny).postScale(3, -2, 5, 7), product(scaleAboutPivot, kAny), 1e-5f);

  // 30 degrees: cosine sqrt(3) / 2, sine 1 / 2.
  const float c = 0.8660254f;
  const Elements turn = {c, 0.5f, 0, -0.5f, c, 0, 0, 0, 1};
  expectNear(of(kAny).preRotate(30), product(kAny, turn), 2e-6f);
  expectNear(of(kAny).postRotate(30), product(turn, kAny), 2e-6f);
  // About (4, 2): 0.5 * 2 - c * 4 + 4 and -0.5 * 4 - c * 2 + 2.
  const Elements turnAboutPivot = {c, 0.5f, 0, -0.5f, c, 0, 5 - 4 * c, -2 * c, 1};
  expectNear(of(kAny).preRotate(30, 4, 2), product(kAny, turnAboutPivot), 1e-5f);
  expectNear(of(kAny).postRotate(30, 4, 2), product(turnAboutPivot, kAny), 1e-5f);

  const Elements translate = {1, 0, 0, 0, 1, 0, 5, 7, 1};
  expectNear(of(kAny).preTranslate(5, 7), product(kAny, translate), 1e-5f);

  Matrix3<float> itself = of(kAny);
  expectNear(itself.preConcat(itself), product(kAny, kAny), 1e-5f);
}

// Kept: element 1 grows by element 1 * ty; the true product would add element 2 * ty.
TEST(Matrix3, PostTranslateFeedsTheSkewBackIntoItself) {
  Matrix3<float> skewed;
  skewed[1] = 0.5f;
  skewed.postTranslate(5, 7);
  EXPECT_EQ(skewed[1], 4.0f);  // 0.5 + 0.5 * 7, where T * M keeps 0.5
  // 2 + 0.125 * 5, 0.5 + 0.5 * 7; -1 + 0.25 * 5, 3 + 0.25 * 7; 7 + 1.5 * 5, -4 + 1.5 * 7
  expectNear(of(kAny).postTranslate(5, 7),
             Elements{2.625f, 4.0f, 0.125f, 0.25f, 4.75f, 0.25f, 14.5f, 6.5f, 1.5f}, 0.0f);
}

TEST(Matrix3, InverseTimesMatrixIsTheIdentity) {
  const Matrix3<float> inverse = of(kAny).inverse();
  Elements elements;
  std::memcpy(elements.data(), inverse.data(), sizeof(elements));
  expectNear(product(elements, kAny), Elements{1, 0, 0, 0, 1, 0, 0, 0, 1}, 1e-6f);
  Matrix3<float> itself = of(kAny);
  EXPECT_TRUE(itself.inverseSelf() == inverse);
}

TEST(Matrix3, CofactorsAreTheInverseTimesTheDeterminant) {
  double cofactors[9];
  // Rows (2 0 1), (0 3 0), (1 0 1): determinant 2 * 3 - 1 * 3 = 3.
  of({2, 0, 1, 0, 3, 0, 1, 0, 1}).calculaeMatrix(cofactors);
  const double expected[9] = {3, 0, -3, 0, 1, 0, -3, 0, 6};
  for (int index = 0; index < 9; ++index) EXPECT_EQ(cofactors[index], expected[index]) << index;
  // Single precision: 16777216 + 1 is lost before the result is widened.
  of({1, 0, 0, 0, 16777216, 1, 0, -1, 1}).calculaeMatrix(cofactors);
  EXPECT_EQ(cofactors[0], 16777216.0);
}

TEST(Matrix3, OnlyADeterminantOfExactlyZeroIsSingular) {
  const Elements singular = {1, 2, 3, 2, 4, 6, -0.0f, 1, 5};
  EXPECT_TRUE(of(singular).inverse() == of(singular));
  EXPECT_TRUE(of(singular).inverseSelf() == of(singular));
  // Determinant 1e-15 * 1e-15 = 1e-30.
  const Matrix3<float> tiny = Matrix3<float>::scaleMatrix(1e-15f, 1e-15f).inverse();
  EXPECT_NEAR(tiny[0], 1e15f, 1e9f);
  EXPECT_NEAR(tiny[4], 1e15f, 1e9f);
  EXPECT_NEAR(tiny[8], 1.0f, 1e-6f);
}

TEST(Matrix3, MapRectBoxesAllFourCorners) {
  // Half the diagonal of a 2 x 2 square about the origin: sqrt(2).
  RectF square{-1, -1, 1, 1};
  const Matrix3<float> turn = Matrix3<float>::rotateMatrix(45);
  RectF box;
  turn.mapRect(&box, square);
  expectEdges(box, -1.4142135f, -1.4142135f, 1.4142135f, 1.4142135f);
  turn.mapRect(&square, square);
  EXPECT_EQ(std::memcmp(&square, &box, sizeof(box)), 0) << "the source may be the target";
  turn.mapRect(static_cast<RectF*>(nullptr), box);

  // w = 1 + x / 2: the left edge at 0 keeps its size, the right one at 2 is halved.
  const Matrix3<float> perspective = of({1, 0, 0.5f, 0, 1, 0, 0, 0, 1});
  perspective.mapRect(&box, RectF{0, -4, 2, 4});
  expectEdges(box, 0.0f, -4.0f, 1.0f, 4.0f);
  // Nothing guards w = 0: at x = -2 the corner goes to infinity.
  perspective.mapRect(&box, RectF{-2, 1, 0, 2});
  EXPECT_TRUE(std::isinf(box.left) || std::isinf(box.right));
}

TEST(Matrix3, WholeRectanglesAreRoundedOutwards) {
  Rect box;
  Matrix3<float>::scaleMatrix(0.5f, 0.25f).mapRect(&box, Rect{1, 1, 3, 7});
  // 0.5, 0.25, 1.5, 1.75
  EXPECT_EQ(box.left, 0);
  EXPECT_EQ(box.top, 0);
  EXPECT_EQ(box.right, 2);
  EXPECT_EQ(box.bottom, 2);
  // Too far for an int.
  Matrix3<float>::scaleMatrix(1e20f, 1e20f).mapRect(&box, Rect{-1, -1, 1, 1});
  EXPECT_EQ(box.left, std::numeric_limits<int>::min());
  EXPECT_EQ(box.right, std::numeric_limits<int>::max());
}

}  // namespace
}  // namespace Qelt
