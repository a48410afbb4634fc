#include "render/StampVertices.h"

#include <gmock/gmock.h>

#include <array>
#include <cstddef>
#include <vector>

namespace Qelt {
namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;

TEST(SquareQuadTest, IsCentredAndAsWideAsTheStamp) {
  const StampQuad quad = stampQuad({10.0f, 20.0f}, squareExtent(4.0f));
  EXPECT_THAT((std::vector<float>{quad.left, quad.top, quad.right, quad.bottom}),
              ElementsAre(8.0f, 18.0f, 12.0f, 22.0f));
}

TEST(AntialiasedQuadTest, AddsHalfAPixelOfMargin) {
  // a' = 10 + 0.5; inner radius (10.5 - 1) / 10.5 / 2.
  const StampQuad quad = stampQuad({100.0f, 50.0f}, antialiasedExtent(10.0f, {1.0f, 1.0f}));
  EXPECT_THAT((std::vector<float>{quad.left, quad.top, quad.right, quad.bottom}),
              ElementsAre(89.5f, 39.5f, 110.5f, 60.5f));
  EXPECT_FLOAT_EQ(quad.innerRadius, 9.5f / 10.5f * 0.5f);
  EXPECT_EQ(quad.alphaByWidth, 1.0f);
}

TEST(AntialiasedQuadTest, WidensThinStampsAndDimsThem) {
  // k = 0.5 / 0.2 = 2.5: half a pixel wide, 0.4 as strong, all of it rim.
  const StampQuad quad = stampQuad({0.0f, 0.0f}, antialiasedExtent(0.2f, {1.0f, 1.0f}));
  EXPECT_FLOAT_EQ(quad.alphaByWidth, 0.4f);
  EXPECT_FLOAT_EQ(quad.right, 1.0f);
  EXPECT_FLOAT_EQ(quad.bottom, 1.0f);
  EXPECT_FLOAT_EQ(quad.innerRadius, 0.0f);
}

TEST(AntialiasedQuadTest, CountsInDevicePixelsOfEachAxis) {
  // 4 units are 8 pixels in x (half a unit a pixel) and 2 in y: a' = 8.5, b' = 2.5, the inner radius by the
  // larger: 7.5 / 8.5 / 2; half extents 0.5 * 8.5 and 2 * 2.5.
  const StampQuad wide = stampQuad({0.0f, 0.0f}, antialiasedExtent(4.0f, {0.5f, 2.0f}));
  EXPECT_FLOAT_EQ(wide.right, 4.25f);
  EXPECT_FLOAT_EQ(wide.bottom, 5.0f);
  EXPECT_FLOAT_EQ(wide.innerRadius, 7.5f / 8.5f * 0.5f);
  EXPECT_EQ(wide.alphaByWidth, 1.0f);

  // 0.5 units are 1 pixel in x and 0.25 in y. The thinner axis decides: k = 2, so a' = 2.5 and b' = 1.
  const StampQuad thin = stampQuad({0.0f, 0.0f}, antialiasedExtent(0.5f, {0.5f, 2.0f}));
  EXPECT_FLOAT_EQ(thin.alphaByWidth, 0.5f);
  EXPECT_FLOAT_EQ(thin.right, 1.25f);
  EXPECT_FLOAT_EQ(thin.bottom, 2.0f);
  EXPECT_FLOAT_EQ(thin.innerRadius, 1.5f / 2.5f * 0.5f);

  // The same with the axes exchanged.
  const StampQuad other = stampQuad({0.0f, 0.0f}, antialiasedExtent(0.5f, {2.0f, 0.5f}));
  EXPECT_FLOAT_EQ(other.alphaByWidth, 0.5f);
  EXPECT_FLOAT_EQ(other.right, 2.0f);
  EXPECT_FLOAT_EQ(other.bottom, 1.25f);
}

TEST(AntialiasedQuadTest, TakesExactlyHalfAPixelAsItIs) {
  const StampQuad quad = stampQuad({0.0f, 0.0f}, antialiasedExtent(0.5f, {1.0f, 1.0f}));
  EXPECT_EQ(quad.alphaByWidth, 1.0f);
  EXPECT_EQ(quad.right, 1.0f);
}

TEST(StampVerticesTest, AreTwoTrianglesInThePromisedOrder) {
  const StampQuad quad{1.0f, 2.0f, 3.0f, 4.0f, 0.25f, 0.75f};
  const StampLook look{0.5f, 0.125f, 2.0f, {-0.6f, 0.8f}};
  // clang-format off
  const float nine[] = {
      1, 2, 0, 1,  0.5f, 0.125f, 2,  -0.6f, 0.8f,
      1, 4, 0, 0,  0.5f, 0.125f, 2,  -0.6f, 0.8f,
      3, 2, 1, 1,  0.5f, 0.125f, 2,  -0.6f, 0.8f,
      3, 2, 1, 1,  0.5f, 0.125f, 2,  -0.6f, 0.8f,
      1, 4, 0, 0,  0.5f, 0.125f, 2,  -0.6f, 0.8f,
      3, 4, 1, 0,  0.5f, 0.125f, 2,  -0.6f, 0.8f,
  };
  // clang-format on
  // One float more than is written, to see that it stays.
  std::array<float, 55> written;
  written.fill(-7.0f);
  writeStamp<9>(written.data(), quad, look);
  EXPECT_THAT(std::vector<float>(written.begin(), written.end() - 1), ElementsAreArray(nine));
  EXPECT_EQ(written.back(), -7.0f);

  std::array<float, 67> eleven;
  eleven.fill(-7.0f);
  writeStamp<11>(eleven.data(), quad, look);
  EXPECT_EQ(eleven.back(), -7.0f);
  for (std::size_t vertex = 0; vertex < 6; ++vertex) {
    for (std::size_t value = 0; value < 9; ++value)
      EXPECT_EQ(eleven[vertex * 11 + value], nine[vertex * 9 + value]);
    EXPECT_EQ(eleven[vertex * 11 + 9], 0.25f);
    EXPECT_EQ(eleven[vertex * 11 + 10], 0.75f);
  }
}

// The appender writes blocks of 16; whatever the count, the batch holds every stamp once and in order.
TEST(StampAppenderTest, AppendsEveryStampInOrderWhateverTheCount) {
  for (const std::size_t count : {0u, 1u, 15u, 16u, 17u, 32u, 100u}) {
    std::vector<float> batch{42.0f};  // what is there stays
    StampAppender<9> stamps(&batch, count);
    for (std::size_t i = 0; i < count; ++i) {
      const auto x = static_cast<float>(i);
      stamps.add(stampQuad({x, 0.0f}, squareExtent(2.0f)), {x, 0.0f, 1.0f, {0.0f, 1.0f}});
    }
    stamps.flush();
    ASSERT_EQ(batch.size(), 1 + count * 54) << count;
    EXPECT_EQ(batch[0], 42.0f);
    for (std::size_t i = 0; i < count; ++i) EXPECT_EQ(batch[1 + i * 54 + 4], static_cast<float>(i));
  }
  StampAppender<9> nowhere(nullptr, 40);
  for (int i = 0; i < 40; ++i) nowhere.add({}, {});
  nowhere.flush();
}

TEST(ReserveStampsTest, MakesRoomAndAtLeastDoubles) {
  std::vector<float> batch;
  reserveStamps(&batch, 3, 66);
  EXPECT_GE(batch.capacity(), 198u);
  batch.resize(198);
  reserveStamps(&batch, 1, 66);
  EXPECT_GE(batch.capacity(), 396u);
  reserveStamps(nullptr, 1, 66);  // nowhere to make room
}

}  // namespace
}  // namespace Qelt
