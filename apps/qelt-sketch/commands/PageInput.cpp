#include "commands/PageInput.h"

#include <cstdio>
#include <memory>
#include <utility>

#include "ink/InkmlReader.h"
#include "ink/SourceText.h"
#include "ink/XmlWalk.h"
#include "output/PngReader.h"
#include "text/Refusal.h"
#include "text/Utf8.h"

namespace QeltDesktop {
namespace {

constexpr std::string_view kPngSignature("\x89PNG\r\n\x1A\n", 8);

// The page that a picture carries.
std::string inkOf(const std::string& name, std::string_view png) {
  std::optional<std::string> ink = PngReader(name, png, kMostInkBytes).text(kInkKeyword);
  if (!ink) throw Refusal(name + ": the picture carries no ink");
  if (!isUtf8(*ink)) throw Refusal(name + ": the picture's ink is not UTF-8");
  return std::move(*ink);
}

// The instruction behind the page, of which there is at most one.
class InstructionFinder final : public XmlVisitor {
 public:
  explicit InstructionFinder(const SourceText& source) : mSource(source) {}

  void elementBegins(const XmlElement&) override { ++mDepth; }
  void elementEnds() override { mEnded = --mDepth == 0; }
  void textComes(const XmlText&) override {}
  void instructionComes(const XmlInstruction& instruction) override {
    if (!mEnded || instruction.target != kInstructionTarget) return;
    if (found) throw mSource.refusalAt(instruction.offset, "a second instruction", kInstructionTarget);
    found = std::string(instruction.data);
  }

  std::optional<std::string> found;

 private:
  const SourceText& mSource;
  std::size_t mDepth = 0;
  bool mEnded = false;
};

}  // namespace

PageInput readPageInput(const std::string& path) {
  SourceText source = path == kStandardInput ? SourceText::fromStandardInput() : SourceText::fromFile(path);
  if (!source.text().starts_with(kPngSignature)) return {readInkml(source), std::nullopt};
  const std::string name = source.name();
  source = SourceText(name, inkOf(name, source.text()));
  Page page = readInkml(source);
  InstructionFinder finder(source);
  walkXml(source, finder);
  return {std::move(page), finder.found};
}

bool maybePng(const std::string& path) {
  if (path == kStandardInput) return true;
  const std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(std::fopen(path.c_str(), "rb"), &std::fclose);
  if (!file) return false;
  std::string start(kPngSignature.size(), '\0');
  return std::fread(start.data(), 1, start.size(), file.get()) == start.size() && start == kPngSignature;
}

}  // namespace QeltDesktop
