#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace QeltTests {

// Golden files lie beside this one. They hold what a version drew when it was released, and guard against
// change; that it was right is for other tests to say. With QELT_RECORD_GOLDEN set in the environment the
// tests write them anew instead of comparing: only ever for a new version, or a new golden test.
bool recordsGolden();
std::string goldenPath(const std::string& file);

// Lines of words and numbers.
using Trace = std::vector<std::string>;

// Compares a trace with the golden file of that name, word by word, numbers within 2e-5 of themselves (or of
// 1); or records it.
void expectGoldenTrace(const Trace& trace, const std::string& file);

// The same to the last bit: the numbers are the shortest decimals that read back as the same float. On every
// processor whose C library works out sines as the GNU one does; elsewhere as expectGoldenTrace.
void expectExactGoldenTrace(const Trace& trace, const std::string& file);

// Ink on paper: 255 minus the alpha of each pixel, row by row.
struct GreyPicture {
  int width = 0, height = 0;
  std::vector<std::uint8_t> pixels;
};

// How far two pictures are apart.
struct Difference {
  double mean;    // mean absolute difference over the pixels with ink in either, of 255
  double ink;     // relative difference of the ink in all
  double farOff;  // share of the inked pixels that differ by more than 40
};
Difference differenceOf(const GreyPicture& a, const GreyPicture& b);

// Compares a picture with the golden file of that name (PGM), or records it. Another correct GL
// implementation passes: it rounds blends and edges its own way, pixel by pixel. Other sizes, densities or
// grain do not.
void expectGoldenPicture(const GreyPicture& picture, const std::string& file);

}  // namespace QeltTests
