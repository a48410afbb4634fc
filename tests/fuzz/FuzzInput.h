#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>

namespace QeltTests {

// Ends the process, for a fuzzer to see.
[[noreturn]] inline void breakOff(const char* who, const char* what) {
  std::fprintf(stderr, "%s broke its word: %s\n", who, what);
  std::abort();
}

// Turns the bytes of a fuzz input into decisions and numbers. Past its end everything is 0.
class FuzzInput {
 public:
  FuzzInput(const std::uint8_t* data, std::size_t size) : mData(data), mEnd(data + size) {}

  bool isEmpty() const { return mData == mEnd; }

  std::uint8_t byte() { return isEmpty() ? std::uint8_t{0} : *mData++; }
  // 0 to choices - 1.
  int pick(int choices) { return byte() % choices; }
  bool flag() { return (byte() & 1) != 0; }

  std::int32_t word() {
    std::uint32_t value = 0;
    for (int i = 0; i < 4; ++i) value = value << 8 | byte();
    return static_cast<std::int32_t>(value);
  }

  // A number as pens see them, mostly: within a page, in eighths.
  float usual() { return static_cast<float>(static_cast<std::int16_t>(byte() << 8 | byte())) / 128.0f; }

  // Any float at all.
  float any() {
    switch (pick(4)) {
      case 0: {
        const std::int32_t bits = word();
        float value;
        std::memcpy(&value, &bits, sizeof value);
        return value;
      }
      case 1:
        return odd();
      default:
        return usual();
    }
  }

  // Floats that arithmetic stumbles over.
  float odd() {
    using Limits = std::numeric_limits<float>;
    // clang-format off
    constexpr std::array<float, 20> kOdd{
        0.0f, -0.0f, 1.0f, -1.0f, Limits::infinity(), -Limits::infinity(), Limits::quiet_NaN(), Limits::max(),
        Limits::lowest(), Limits::min(), Limits::denorm_min(), 1e19f, -1e19f, 16777216.0f, 1e-3f, 3.1415927f,
        -3.1415927f, 0.79f, 0.75f, 0.4f};
    // clang-format on
    return kOdd[static_cast<std::size_t>(pick(static_cast<int>(kOdd.size())))];
  }

 private:
  const std::uint8_t* mData;
  const std::uint8_t* mEnd;
};

}  // namespace QeltTests
