#pragma once

#include <cstdint>
#include <span>

namespace QeltDesktop {

// Takes a picture part by part, from its top row to its last.
class PictureSink {
 public:
  virtual ~PictureSink() = default;
  // Once, before any rows. Sizes in pixels, at least 1.
  virtual void begin(int width, int height) = 0;
  // One or more whole rows: RGBA8, the colour not premultiplied, without padding.
  virtual void takeRows(std::span<const std::uint8_t> rows) = 0;
};

}  // namespace QeltDesktop
