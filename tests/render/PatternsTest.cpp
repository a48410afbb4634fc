#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
#include <fstream>
#include <iterator>
#include <string>

#include "render/PatternTextures.h"

namespace Qelt {
namespace {

// Documents show this grain and these shapes: they are the bytes they were when the first version was
// released, and those of the pictures in the repository. What makes them fit for paper, their maker sees to.
void expectReleased(const std::string& bytes, std::uint64_t checksum, const char* picture) {
  std::uint64_t sum = 14695981039346656037u;
  for (const char byte : bytes) sum = (sum ^ static_cast<unsigned char>(byte)) * 1099511628211u;
  EXPECT_EQ(sum, checksum) << picture;
  std::string path = QELT_SOURCE_DIR "/resources/";
  std::ifstream file(path += picture, std::ios::binary);
  const std::string all{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  ASSERT_GT(all.size(), bytes.size()) << picture;
  EXPECT_TRUE(all.substr(all.size() - bytes.size()) == bytes) << picture;
}

TEST(Patterns, AreThoseOfTheReleaseAndOfThePicturesInTheRepository) {
  const auto bytes = [](const unsigned char* begin, std::size_t count) {
    return std::string(reinterpret_cast<const char*>(begin), count);
  };
  expectReleased(bytes(g_backgroundPtn, 150 * 150), 0x47659C59ECCFEBACu, "paper-grain.pgm");
  expectReleased(bytes(g_pointPtn, 3 * 100 * 100), 0xB6031D9C4DFDC9EBu, "stamp-shapes.pgm");
}

}  // namespace
}  // namespace Qelt
