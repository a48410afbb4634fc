#include "commands/PageInput.h"

#include <cstdint>
#include <cstdio>
#include <memory>
#include <new>
#include <utility>
#include <vector>

#include <spng.h>

#include "ink/InkmlReader.h"
#include "ink/SourceText.h"
#include "ink/XmlWalk.h"
#include "play/PageDrawing.h"
#include "text/Refusal.h"
#include "text/Utf8.h"

namespace QeltDesktop {
namespace {

constexpr std::string_view kPngSignature("\x89PNG\r\n\x1A\n", 8);

// Goes through a whole picture for the page that it carries.
class PictureReader {
 public:
  PictureReader(const std::string& name, std::string_view png)
      : mName(name), mPng(png), mDecoder(spng_ctx_new(0), &spng_ctx_free) {
    if (!mDecoder) throw std::bad_alloc();
    check(spng_set_image_limits(mDecoder.get(), kLongestSide, kLongestSide));
    check(spng_set_crc_action(mDecoder.get(), SPNG_CRC_ERROR, SPNG_CRC_ERROR));
    // So that a small file cannot fill the memory. Of text that is unpacked, the room that is kept for it
    // counts, which is doubled whenever it is full.
    constexpr std::size_t kMostKept = 2 * kMostInkBytes + kMostInkBytes / 2;
    check(spng_set_chunk_limits(mDecoder.get(), kMostKept, kMostKept));
    check(spng_set_png_buffer(mDecoder.get(), png.data(), png.size()));
  }

  std::string ink() {
    decodeRows();
    check(spng_decode_chunks(mDecoder.get()));
    std::uint32_t count = 0;
    std::vector<spng_text> texts;
    int error = spng_get_text(mDecoder.get(), nullptr, &count);
    if (error == 0) {
      texts.resize(count);
      error = spng_get_text(mDecoder.get(), texts.data(), &count);
    }
    if (error != SPNG_ECHUNKAVAIL) check(error);
    const spng_text* found = nullptr;
    for (const spng_text& text : texts) {
      if (std::string_view(text.keyword) != kInkKeyword) continue;
      if (found != nullptr) throw refusal("the picture carries ink twice");
      found = &text;
    }
    if (found == nullptr)
      throw refusal(holdsDamagedInk() ? "the picture's ink is damaged" : "the picture carries no ink");
    if (found->type != SPNG_ITXT) throw refusal("the picture's ink is not in an iTXt chunk");
    if (found->length > kMostInkBytes) throw refusal("the picture's ink is too large");
    std::string ink(found->text, found->length);
    if (!isUtf8(ink)) throw refusal("the picture's ink is not UTF-8");
    return ink;
  }

 private:
  // The rows themselves do not matter, but text may stand behind them, and a picture that was cut is refused.
  void decodeRows() {
    spng_ihdr header{};
    check(spng_get_ihdr(mDecoder.get(), &header));
    if (std::uint64_t{header.width} * header.height > kMostPixels) throw refusal("the picture is too large");
    check(spng_decode_image(mDecoder.get(), nullptr, 0, SPNG_FMT_PNG, SPNG_DECODE_PROGRESSIVE));
    constexpr std::size_t kMostBytesAPixel = 8;
    std::vector<std::uint8_t> row(header.width * kMostBytesAPixel);
    std::size_t size = 0;
    check(spng_decoded_image_size(mDecoder.get(), SPNG_FMT_PNG, &size));
    size /= header.height;
    int error = 0;
    while (error == 0) error = spng_decode_row(mDecoder.get(), row.data(), size);
    if (error != SPNG_EOI) check(error);
  }

  void check(int error) const {
    if (error == SPNG_EMEM) throw std::bad_alloc();
    if (error != 0) throw refusal(std::string("not a sound PNG picture: ") + spng_strerror(error));
  }

  Refusal refusal(const std::string& what) const { return Refusal(mName + ": " + what); }

  // The decoder passes over text that it cannot read.
  bool holdsDamagedInk() const {
    return mPng.find("iTXt" + std::string(kInkKeyword) + '\0') != std::string_view::npos;
  }

  const std::string& mName;
  const std::string_view mPng;
  const std::unique_ptr<spng_ctx, void (*)(spng_ctx*)> mDecoder;
};

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
  source = SourceText(name, PictureReader(name, source.text()).ink());
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
