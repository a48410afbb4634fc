#pragma once

#include <cstdint>
#include <string>
#include <vector>

// Golden files lie beside this one. They hold what a version drew when it was released, and guard against
// change; that it was right is for other tests to say. With QELT_RECORD_GOLDEN set in the environment the
// tests write them anew instead of comparing: only ever for a new version, or a new golden test.
namespace QeltTests {

// Lines of a word and numbers: the shortest decimals that read back as the same float.
using Trace = std::vector<std::string>;
std::string traceLine(const char* word, const std::vector<float>& numbers);

// Compares a trace with the golden file of that name to the last bit, or records it. Recorded on x86-64; on
// 64-bit ARM the same tests hold the other processor to the files. Skips the test where the C library may
// round sines in another way.
void expectGoldenTrace(const Trace& trace, const std::string& file);

// Ink on paper: 255 minus the alpha of each pixel, row by row.
struct GreyPicture {
  int width = 0, height = 0;
  std::vector<std::uint8_t> pixels;
  std::vector<std::uint8_t> channels;  // red, green, blue and alpha of each, as they were read
  std::string renderer;                // GL's name and version of what drew it
};

// Compares a picture with the golden file of that name (PGM), or records it. On a renderer that renderers.txt
// names for it, every pixel must be the approved one, colour included. Any other correct GL implementation
// passes as well: it rounds blends and edges its own way, pixel by pixel. Other sizes, densities or grain do
// not. With QELT_APPROVE_RENDERER set, what the running renderer draws is added to renderers.txt: for a new
// renderer, once somebody has looked at its pictures.
void expectGoldenPicture(const GreyPicture& picture, const std::string& file);

}  // namespace QeltTests
