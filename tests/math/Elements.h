#pragma once

#include <gtest/gtest.h>

#include <array>
#include <cstddef>

namespace QeltTests {

// The elements of a matrix of `Side` x `Side`, column after column.
template <std::size_t Side>
using Elements = std::array<float, Side * Side>;

template <typename Matrix, std::size_t Count>
void expectNear(const Matrix& matrix, const std::array<float, Count>& expected, float tolerance) {
  for (std::size_t index = 0; index < Count; ++index)
    EXPECT_NEAR(matrix[index], expected[index], tolerance) << "element " << index;
}

// The text-book product, written without the class: rows of the left times columns of the right.
template <std::size_t Side, typename Left, typename Right>
Elements<Side> naiveProduct(const Left& left, const Right& right) {
  Elements<Side> result{};
  for (std::size_t row = 0; row < Side; ++row) {
    for (std::size_t column = 0; column < Side; ++column) {
      double sum = 0.0;
      for (std::size_t k = 0; k < Side; ++k) sum += double(left[row + Side * k]) * right[k + Side * column];
      result[row + Side * column] = static_cast<float>(sum);
    }
  }
  return result;
}

}  // namespace QeltTests
