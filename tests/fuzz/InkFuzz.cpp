// Feeds the ink reader any bytes: it reads a page or refuses it, naming file and line, and keeps what Ink.h
// says of the pages it reads.

#include <sys/mman.h>
#include <unistd.h>

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "FuzzInput.h"
#include "InkmlReader.h"
#include "Refusal.h"
#include "SourceText.h"

namespace {

using QeltDesktop::Page;

void check(const Page& page) {
  if (page.traces.empty()) QeltTests::breakOff("the reader", "a page without traces");
  for (const QeltDesktop::Trace& trace : page.traces) {
    if (trace.samples.empty()) QeltTests::breakOff("the reader", "a trace without samples");
    if (trace.brush.width && !(*trace.brush.width > 0.0f))
      QeltTests::breakOff("the reader", "a brush of no width");
    for (const QeltDesktop::Sample& sample : trace.samples) {
      if (!std::isfinite(sample.x) || !std::isfinite(sample.y))
        QeltTests::breakOff("the reader", "a point that is not finite");
    }
  }
}

// As a file: that is where other encodings are told apart.
Page readAsFile(const std::uint8_t* data, std::size_t size) {
  static const int file = memfd_create("ink", 0);
  if (ftruncate(file, 0) != 0 || pwrite(file, data, size, 0) != static_cast<ssize_t>(size)) std::abort();
  return QeltDesktop::readInkmlFile("/proc/self/fd/" + std::to_string(file));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size > 65536) return -1;
  const bool marked =
      size >= 2 && ((data[0] == 0xFE && data[1] == 0xFF) || (data[0] == 0xFF && data[1] == 0xFE));
  try {
    if (marked) {
      check(readAsFile(data, size));
    } else {
      check(QeltDesktop::readInkml({"page", std::string(reinterpret_cast<const char*>(data), size)}));
    }
  } catch (const QeltDesktop::Refusal& refusal) {
    const std::string text = refusal.what();
    if (!marked && text.rfind("page:", 0) != 0)
      QeltTests::breakOff("the reader", "a refusal without its file");
  }
  return 0;
}
