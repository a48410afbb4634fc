#include <gmock/gmock.h>

#include <array>
#include <cmath>
#include <cstddef>
#include <iterator>
#include <limits>
#include <utility>

#include "base/RectF.h"
#include "base/Vector.h"
#include "math/Matrix3.h"
#include "math/Matrix4.h"

namespace Qelt {
namespace {

// The elements of a matrix, column after column.
using Nine = std::array<float, 9>;
using Sixteen = std::array<float, 16>;

Matrix3<float> of(const Nine& elements) {
  return Matrix3<float>(elements.data());
}
Matrix4<float> of(const Sixteen& elements) {
  return Matrix4<float>(elements.data());
}

// The text-book product, written without the class: rows of the left times columns of the right.
template <typename Left, std::size_t Count>
std::array<float, Count> product(const Left& left, const std::array<float, Count>& right) {
  constexpr std::size_t side = Count == 9 ? 3 : 4;
  std::array<float, Count> result{};
  for (std::size_t row = 0; row < side; ++row) {
    for (std::size_t column = 0; column < side; ++column) {
      double sum = 0.0;
      for (std::size_t k = 0; k < side; ++k) sum += double(left[row + side * k]) * right[k + side * column];
      result[row + side * column] = static_cast<float>(sum);
    }
  }
  return result;
}

template <typename Cases>
void expectNear(const Cases& cases) {
  for (std::size_t number = 0; number < std::size(cases); ++number) {
    const auto& [made, expected] = cases[number];
    for (std::size_t i = 0; i < expected.size(); ++i)
      EXPECT_NEAR(made[i], expected[i], 1e-5f) << "case " << number << ", element " << i;
  }
}

// No two elements alike, invertible; of three rows projective.
constexpr Nine kAny3 = {2.0f, 0.5f, 0.125f, -1.0f, 3.0f, 0.25f, 7.0f, -4.0f, 1.5f};
constexpr Nine kOther3 = {-3.0f, 0.75f, 0.5f, 2.0f, 1.0f, -0.25f, 4.0f, 9.0f, 2.0f};
constexpr Nine kUnit3 = {1, 0, 0, 0, 1, 0, 0, 0, 1};
constexpr Sixteen kAny4 = {2.0f, 0.5f,  0.125f, -0.75f, -1.0f, 3.0f,  0.25f, 1.25f,
                           7.0f, -4.0f, 1.5f,   0.0f,   5.0f,  -2.0f, 6.0f,  1.75f};
constexpr Sixteen kUnit4 = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1};
constexpr float kQuarter = 1.57079633f;

template <typename Matrix>
class EitherMatrix : public testing::Test {};
using Matrices = testing::Types<Matrix3<float>, Matrix4<float>>;
TYPED_TEST_SUITE(EitherMatrix, Matrices);

TYPED_TEST(EitherMatrix, StoresColumnAfterColumnAndBeginsAsTheIdentity) {
  constexpr int kSide = sizeof(TypeParam) / sizeof(float) == 9 ? 3 : 4;
  TypeParam matrix;
  for (int row = 0; row < kSide; ++row) {
    for (int column = 0; column < kSide; ++column) {
      EXPECT_EQ(matrix(row, column), row == column ? 1.0f : 0.0f);
      matrix[row + kSide * column] = static_cast<float>(row + 10 * column);
    }
  }
  EXPECT_EQ(matrix(1, 2), 21.0f);
  EXPECT_EQ(matrix.transpose()(1, 2), 12.0f);
  EXPECT_EQ(matrix.transposeSelf()(2, 1), 21.0f);
  EXPECT_EQ(matrix.zeroSelf()(2, 1), 0.0f);
  EXPECT_TRUE(matrix.identitySelf() == TypeParam(static_cast<const float*>(nullptr)));
  EXPECT_FALSE(matrix.isRowMajor());
  EXPECT_EQ(matrix.storageSize(), sizeof(float) * kSide * kSide);
}

// Kept: +0 and -0 differ, and NaN equals itself.
TYPED_TEST(EitherMatrix, EqualityIsThatOfTheBytes) {
  TypeParam plus, minus;
  minus[1] = -0.0f;
  EXPECT_FALSE(plus == minus);
  EXPECT_TRUE(plus != minus);
  plus[5] = std::numeric_limits<float>::quiet_NaN();
  const TypeParam copy = plus;
  EXPECT_TRUE(plus == copy);
}

template <typename Elements>
void expectInverse(const Elements& elements, const Elements& unit, const Elements& singular) {
  const auto inverse = of(elements).inverse();
  EXPECT_THAT(product(inverse, elements), testing::Pointwise(testing::FloatNear(2e-6f), unit));
  auto itself = of(elements);
  EXPECT_TRUE(itself.inverseSelf() == inverse);
  // Only a determinant of exactly zero is singular.
  EXPECT_TRUE(of(singular).inverse() == of(singular));
  EXPECT_TRUE(of(singular).inverseSelf() == of(singular));
}

TEST(Matrices, InverseTimesMatrixIsTheIdentity) {
  expectInverse(kAny3, kUnit3, {1, 2, 3, 2, 4, 6, -0.0f, 1, 5});
  expectInverse(kAny4, kUnit4, {1, 2, 3, 4, 2, 4, 6, 8, 0, -0.0f, 1, 0, 9, 0, 0, 1});
  // Determinants of 1e-30.
  EXPECT_NEAR(Matrix3<float>::scaleMatrix(1e-15f, 1e-15f).inverse()[4], 1e15f, 1e9f);
  EXPECT_NEAR(Matrix4<float>::scaleMatrix(1e-10f, 1e-10f, 1e-10f).inverse()[5], 1e10f, 1e4f);
}

TEST(Matrices, CofactorsAreTheInverseTimesTheDeterminant) {
  std::array<double, 16> cofactors{};
  // Single precision: 16777216 + 1 is lost before the result is widened.
  of(Nine{1, 0, 0, 0, 16777216, 1, 0, -1, 1}).calculaeMatrix(cofactors.data());
  EXPECT_EQ(cofactors[0], 16777216.0);
  // Diagonal (2, 3, 5, 7) with element (0, 1) = 4: determinant 210, the inverse's (0, 1) = -4 / 6.
  of(Sixteen{2, 0, 0, 0, 4, 3, 0, 0, 0, 0, 5, 0, 0, 0, 0, 7}).calculaeMatrix(cofactors.data());
  EXPECT_THAT(cofactors, testing::ElementsAre(105, 0, 0, 0, -140, 70, 0, 0, 0, 0, 42, 0, 0, 0, 0, 30));
}

TEST(Matrix3, NamesItsElementsAndKnowsTheIdentityWithoutTolerance) {
  const Matrix3<float> matrix = of(Nine{1, 2, 3, 4, 5, 6, 7, 8, 9});
  EXPECT_THAT((std::array{matrix.getScaleX(), matrix.getSkewY(), matrix.getSkewX(), matrix.getScaleY(),
                          matrix.getTranslateX(), matrix.getTranslateY()}),
              testing::ElementsAre(1, 2, 4, 5, 7, 8));
  Matrix3<float> unit(2.5f);
  EXPECT_EQ(unit[7], 2.5f);
  EXPECT_TRUE(unit.identitySelf().isIdentity());
  unit[8] = std::nextafter(1.0f, 2.0f);
  EXPECT_FALSE(unit.isIdentity());
}

// What comes before multiplies from the right, what comes after from the left.
TEST(Matrix3, OperationsGiveTheTextBooksMatrices) {
  const Nine moved = {1, 0, 0, 0, 1, 0, 5, 7, 1}, scaled = {3, 0, 0, 0, -2, 0, 0, 0, 1};
  // About (5, 7): 5 - 3 * 5 and 7 + 2 * 7.
  const Nine scaledAbout = {3, 0, 0, 0, -2, 0, -10, 21, 1};
  // 30 degrees: cosine sqrt(3) / 2, sine 1 / 2. About (4, 2): 0.5 * 2 - c * 4 + 4 and -0.5 * 4 - c * 2 + 2.
  const float c = 0.8660254f;
  const Nine turned = {c, 0.5f, 0, -0.5f, c, 0, 0, 0, 1};
  const Nine turnedAbout = {c, 0.5f, 0, -0.5f, c, 0, 5 - 4 * c, -2 * c, 1};
  // Kept: element 1 grows by element 1 * ty; the true product would add element 2 * ty.
  // 2 + 0.125 * 5, 0.5 + 0.5 * 7; -1 + 0.25 * 5, 3 + 0.25 * 7; 7 + 1.5 * 5, -4 + 1.5 * 7
  const Nine movedAfter = {2.625f, 4.0f, 0.125f, 0.25f, 4.75f, 0.25f, 14.5f, 6.5f, 1.5f};
  Matrix3<float> itself = of(kAny3);
  const std::pair<Matrix3<float>, Nine> cases[] = {
      {of(kAny3).setTranslate(5, 7), moved},
      {of(kAny3).setScale(3, -2), scaled},
      {of(kAny3).setScale(3, -2, 5, 7), scaledAbout},
      {of(kAny3).setRotate(30), turned},
      {of(kAny3).setRotate(30, 4, 2), turnedAbout},
      {of(kAny3).preConcat(of(kOther3)), product(kAny3, kOther3)},
      {itself.preConcat(itself), product(kAny3, kAny3)},
      {of(kAny3).preTranslate(5, 7), product(kAny3, moved)},
      {of(kAny3).preScale(3, -2), product(kAny3, scaled)},
      {of(kAny3).preScale(3, -2, 5, 7), product(kAny3, scaledAbout)},
      {of(kAny3).preRotate(30), product(kAny3, turned)},
      {of(kAny3).preRotate(30, 4, 2), product(kAny3, turnedAbout)},
      {of(kAny3).postConcat(of(kOther3)), product(kOther3, kAny3)},
      {of(kAny3).postTranslate(5, 7), movedAfter},
      {of(kAny3).postScale(3, -2), product(scaled, kAny3)},
      {of(kAny3).postScale(3, -2, 5, 7), product(scaledAbout, kAny3)},
      {of(kAny3).postRotate(30), product(turned, kAny3)},
      {of(kAny3).postRotate(30, 4, 2), product(turnedAbout, kAny3)},
  };
  expectNear(cases);
  // A right angle leaves the cosine of single precision.
  const Matrix3<float> quarter = Matrix3<float>::rotateMatrix(90);
  EXPECT_EQ(quarter[1], 1.0f);
  EXPECT_NE(quarter[0], 0.0f);
  EXPECT_LT(std::abs(quarter[0]), 1e-7f);
}

TEST(Matrix3, MapRectBoxesAllFourCorners) {
  const auto expectEdges = [](const auto& box, float left, float top, float right, float bottom) {
    EXPECT_NEAR(box.left, left, 1e-6f);
    EXPECT_NEAR(box.top, top, 1e-6f);
    EXPECT_NEAR(box.right, right, 1e-6f);
    EXPECT_NEAR(box.bottom, bottom, 1e-6f);
  };
  // Half the diagonal of a 2 x 2 square about the origin: sqrt(2). The source may be the target.
  RectF box{-1, -1, 1, 1};
  Matrix3<float>::rotateMatrix(45).mapRect(&box, box);
  expectEdges(box, -1.4142135f, -1.4142135f, 1.4142135f, 1.4142135f);
  Matrix3<float>().mapRect(static_cast<RectF*>(nullptr), box);
  // w = 1 + x / 2: the left edge at 0 keeps its size, the right one at 2 is halved.
  const Matrix3<float> perspective = of(Nine{1, 0, 0.5f, 0, 1, 0, 0, 0, 1});
  perspective.mapRect(&box, RectF{0, -4, 2, 4});
  expectEdges(box, 0.0f, -4.0f, 1.0f, 4.0f);
  // Nothing guards w = 0: at x = -2 the corner goes to infinity.
  perspective.mapRect(&box, RectF{-2, 1, 0, 2});
  EXPECT_TRUE(std::isinf(box.left) || std::isinf(box.right));
  // Whole rectangles are rounded outwards, from 0.5, 0.25, 1.5, 1.75; and to what an int can hold.
  Rect whole;
  Matrix3<float>::scaleMatrix(0.5f, 0.25f).mapRect(&whole, Rect{1, 1, 3, 7});
  expectEdges(whole, 0, 0, 2, 2);
  Matrix3<float>::scaleMatrix(1e20f, 1e20f).mapRect(&whole, Rect{-1, -1, 1, 1});
  EXPECT_EQ(whole.left, std::numeric_limits<int>::min());
  EXPECT_EQ(whole.right, std::numeric_limits<int>::max());
}

TEST(Matrix4, OperationsGiveTheTextBooksMatrices) {
  using M = Matrix4<float>;
  const Sixteen other = {-3, 0.75f, 0.5f, 1, 2, 1, -0.25f, 0, 4, 9, 2, -1, 0.5f, 6, -7, 3};
  const Sixteen moved = {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 2, 3, 4, 1};
  const Sixteen scaled = {2, 0, 0, 0, 0, 3, 0, 0, 0, 0, 4, 0, 0, 0, 0, 1};
  Sixteen turnOnly = kAny4;
  turnOnly[12] = turnOnly[13] = turnOnly[14] = 0;
  // 90 degrees: f = near, so element 5 is 1; aspect 2 halves element 0. near 1, far 3:
  // -(1 + 3) / 2 = -2 and -(2 * 3 * 1) / 2 = -3.
  const Sixteen perspective = {0.5f, 0, 0, 0, 0, 1, 0, 0, 0, 0, -2, -1, 0, 0, -3, 0};
  // 2 / 4, 2 / (2 - 10), -2 / 8, -(1 + 5) / 4, -(10 + 2) / -8, -(1 + 9) / 8
  const Sixteen box = {0.5f, 0, 0, 0, 0, -0.25f, 0, 0, 0, 0, -0.25f, 0, -1.5f, 1.5f, -1.25f, 1};
  // In radians, counter-clockwise: about z, then y, then x.
  const Sixteen turned = {0.346929f,  0.765048f,  0.542533f, 0, -0.681633f, 0.603004f, -0.414442f, 0,
                          -0.644218f, -0.226026f, 0.730682f, 0, 0,          0,         0,          1};
  Vector3<float> upward{0, 0, 5}, diagonal{1, 1, 1};  // of any length
  const std::pair<M, Sixteen> cases[] = {
      {of(kAny4) * of(other), product(kAny4, other)},
      {M::perspectiveMatrix(90, 2, 1, 3), perspective},
      {M::orthoMatrix(1, 5, 10, 2, 1, 9), box},
      {M::translateMatrix(2, 3, 4), moved},
      {M::translateMatrix(Vector3<float>{2, 3, 4}), moved},
      {M::scaleMatrix(2, 3, 4), scaled},
      {M::scaleMatrix(Vector3<float>{2, 3, 4}), scaled},
      {of(kAny4).rotation(), turnOnly},
      {of(kAny4).translation(), {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 5, -2, 6, 1}},
      {M::rotateMatrix(0.3f, -0.7f, 1.1f), turned},
      // Of itself it leaves the fourth row, of a copy not.
      {of(kAny4).rotate(0, 0, kQuarter), {0, 1, 0, 0, -1, 0, 0, 0, 0, 0, 1, 0, 5, -2, 6, 1}},
      {of(kAny4).rotateSelf(0, 0, kQuarter), {0, 1, 0, -0.75f, -1, 0, 0, 1.25f, 0, 0, 1, 0, 5, -2, 6, 1.75f}},
      // Kept: about an axis the angle runs the other way. A third of a turn about the diagonal takes y to x,
      // z to y and x to z.
      {M::rotateMatrix(kQuarter, upward), {0, -1, 0, 0, 1, 0, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}},
      {M::rotateMatrix(2.0943951f, diagonal), {0, 0, 1, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 0, 1}},
      // dir z, up y: z x y = -x, (-x) x z = y.
      {M::rotateMatrix({0, 0, 2}, {0, 3, 1}), {-1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}},
  };
  expectNear(cases);
  EXPECT_EQ(upward.z, 5.0f);
  const M frame = M::rotateMatrix({1, 2, 3}, {0, 1, 0});
  EXPECT_NEAR(frame[9] / frame[8], 2.0f, 1e-5f);
  EXPECT_NEAR(frame[10] / frame[8], 3.0f, 1e-5f);
  EXPECT_FALSE(std::isfinite(M::rotateMatrix({0, 0, 1}, {0, 0, 1})[0]));
  EXPECT_EQ(of(kAny4).row(1).w, -2.0f);
  EXPECT_EQ(of(kAny4).column(3).z, 6.0f);
}

}  // namespace
}  // namespace Qelt
