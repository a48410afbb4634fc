// Feeds the ink reader any bytes: it reads a page or refuses it, naming file and line, and keeps what Ink.h
// says of the pages it reads. What the writer makes of a page reads back; written again it is the same.

#include <sys/mman.h>
#include <unistd.h>

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "FuzzInput.h"
#include "ink/InkmlReader.h"
#include "ink/InkmlWriter.h"
#include "ink/SourceText.h"
#include "text/Refusal.h"

namespace {

using QeltDesktop::Page;

void check(const Page& page) {
  if (page.strokes.empty()) QeltTests::breakOff("the reader", "a page without traces");
  for (const QeltDesktop::Stroke& stroke : page.strokes) {
    if (stroke.samples.empty()) QeltTests::breakOff("the reader", "a trace without samples");
    if (stroke.brush.width && !(*stroke.brush.width > 0.0f))
      QeltTests::breakOff("the reader", "a brush of no width");
    for (const QeltDesktop::Sample& sample : stroke.samples) {
      if (!std::isfinite(sample.x) || !std::isfinite(sample.y))
        QeltTests::breakOff("the reader", "a point that is not finite");
    }
  }
}

void checkWritten(const Page& page) {
  const std::string once = QeltDesktop::writeInkml(page.strokes);
  const Page back = QeltDesktop::readInkml(QeltDesktop::SourceText("written", once));
  check(back);
  if (back.strokes.size() != page.strokes.size())
    QeltTests::breakOff("the writer", "a stroke too many or few");
  if (QeltDesktop::writeInkml(back.strokes) != once) QeltTests::breakOff("the writer", "another page");
}

// A file of these bytes, for that is where encodings are told apart.
std::string fileOf(const std::uint8_t* data, std::size_t size) {
  static const int file = memfd_create("ink", 0);
  if (ftruncate(file, 0) != 0 || pwrite(file, data, size, 0) != static_cast<ssize_t>(size)) std::abort();
  return "/proc/self/fd/" + std::to_string(file);
}

// "name:line: what", in one line.
bool namesPlace(const std::string& text, const std::string& name) {
  if (text.rfind(name + ":", 0) != 0) return false;
  const std::size_t line = name.size() + 1;
  const std::size_t end = text.find_first_not_of("0123456789", line);
  return end != std::string::npos && end > line && text[line] != '0' && text.compare(end, 2, ": ") == 0 &&
         text.find_first_of("\n\r") == std::string::npos;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size > 65536) return -1;
  const std::string name = fileOf(data, size);
  try {
    const Page page = QeltDesktop::readInkmlFile(name);
    check(page);
    checkWritten(page);
  } catch (const QeltDesktop::Refusal& refusal) {
    if (!namesPlace(refusal.what(), name))
      QeltTests::breakOff("the reader", "a refusal without file and line");
  }
  return 0;
}
