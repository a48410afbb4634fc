#include "commands/Compare.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include "commands/PageInput.h"
#include "ink/SourceText.h"
#include "output/OutputFile.h"
#include "output/Picture.h"
#include "output/PngReader.h"
#include "output/PngWriter.h"
#include "output/Terminal.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

namespace fs = std::filesystem;
using Pixel = std::span<const std::uint8_t, 4>;

constexpr int kChannelMost = 255;

// By how many levels of 255 two pixels look different: the most among opacity and the colours as they are
// seen through it. Pictures of 16 bits a channel are compared with 8; never 0 for what those tell apart.
int levelsBetween(Pixel one, Pixel other) {
  int most = std::abs(one[3] - other[3]);
  for (std::size_t c = 0; c < 3; ++c) {
    const int apart = std::abs(one[c] * one[3] - other[c] * other[3]);
    most = std::max(most, (apart + kChannelMost - 1) / kChannelMost);
  }
  return most;
}

// A picture of what differs: where pixels are alike, the picture is a faint grey.
constexpr std::array<std::uint8_t, 4> kWithinTolerance{255, 176, 0, 255}, kBeyond{224, 0, 32, 255};
std::array<std::uint8_t, 4> faint(Pixel pixel) {
  const int grey = (pixel[0] + pixel[1] + pixel[2]) / 3;
  const int shade = (kChannelMost - grey) * pixel[3] / (4 * kChannelMost);
  const auto level = static_cast<std::uint8_t>(kChannelMost - shade);
  return {level, level, level, kChannelMost};
}

struct Difference {
  std::uint64_t pixels = 0, differing = 0;
  int most = 0;
  std::string sizes;  // where those differ; the pixels do not count then

  bool isNone() const { return sizes.empty() && differing == 0; }
  bool isWithin(int tolerance) const { return sizes.empty() && most <= tolerance; }
  std::string text() const {
    if (!sizes.empty()) return sizes;
    if (differing == 0) return "alike";
    return std::to_string(differing) + " of " + std::to_string(pixels) +
           (pixels == 1 ? " pixel" : " pixels") + (differing == 1 ? " differs" : " differ") + ", by " +
           std::to_string(most) + " of 255 at most";
  }
};

std::string sizeOf(const PngReader& picture) {
  return std::to_string(picture.width()) + "x" + std::to_string(picture.height());
}

// An empty picture that holds both, one over the other.
Picture frameOf(const PngReader& before, const PngReader& after, const fs::path& output) {
  const int width = std::max(before.width(), after.width());
  const int height = std::max(before.height(), after.height());
  if (std::int64_t{width} * height > kMostPixels)
    throw Refusal(output.string() + ": cannot be written: too large, " + std::to_string(width) + " x " +
                  std::to_string(height) + " pixels");
  return {width, height, {}};
}

// Row by row, to the end of both; what differs is shown in `marked` too, which is a frame of both. Where
// sizes differ, what only one of them has is beyond any tolerance, and where neither has a pixel the frame
// stays clear.
Difference differenceOf(PngReader& before, PngReader& after, int tolerance, Picture* marked) {
  Difference found;
  if (before.width() != after.width() || before.height() != after.height())
    found.sizes = sizeOf(before) + " pixels before, " + sizeOf(after) + " after";
  found.pixels = static_cast<std::uint64_t>(after.width()) * static_cast<std::uint64_t>(after.height());
  for (int y = 0; y < std::max(before.height(), after.height()); ++y) {
    std::span<const std::uint8_t> was, is;
    if (y < before.height()) was = before.nextRow();
    if (y < after.height()) is = after.nextRow();
    if (marked == nullptr && (!found.sizes.empty() || std::ranges::equal(was, is))) continue;
    const auto [common, all] = std::minmax({was.size(), is.size()});
    for (std::size_t at = 0; at < common; at += 4) {
      const Pixel pixel = is.subspan(at).first<4>();
      const int levels = levelsBetween(was.subspan(at).first<4>(), pixel);
      found.differing += levels > 0 ? 1 : 0;
      found.most = std::max(found.most, levels);
      if (marked == nullptr) continue;
      const auto shown = levels == 0 ? faint(pixel) : levels <= tolerance ? kWithinTolerance : kBeyond;
      std::ranges::copy(shown, marked->pixelAt(0, y) + at);
    }
    for (std::size_t at = common; marked != nullptr && at < all; at += 4)
      std::ranges::copy(kBeyond, marked->pixelAt(0, y) + at);
  }
  before.finish();
  after.finish();
  return found;
}

void refuseToOverwrite(const fs::path& output, const fs::path& input) {
  std::error_code error;
  if (fs::equivalent(output, input, error))
    throw Refusal(output.string() + ": cannot be written: it is a picture to compare");
}

// A pair of its own is marked always; among those of folders only what differs is, in a folder made for it.
enum class Marking { Always, WhereDifferent };

Difference comparePictures(const fs::path& before, const fs::path& after, int tolerance,
                           const std::optional<fs::path>& output, Marking marking) {
  const SourceText was = SourceText::fromFile(before.string()), is = SourceText::fromFile(after.string());
  PngReader beforeReader(was.name(), was.text(), kMostInkBytes),
      afterReader(is.name(), is.text(), kMostInkBytes);
  std::optional<Picture> marked;
  if (output) marked = frameOf(beforeReader, afterReader, *output);
  Difference found = differenceOf(beforeReader, afterReader, tolerance, marked ? &*marked : nullptr);
  if (marked && (!found.isNone() || marking == Marking::Always)) {
    refuseToOverwrite(*output, before);
    refuseToOverwrite(*output, after);
    if (marking == Marking::WhereDifferent) {
      std::error_code error;
      fs::create_directories(output->parent_path(), error);  // what fails here is told by the file
    }
    OutputFile file(output->string());
    file.write(encodePng(*marked));
    file.commit();
  }
  return found;
}

// Which of two folders have a picture.
struct Presence {
  bool before = false, after = false;
};

std::map<std::string, Presence> picturesIn(const fs::path& before, const fs::path& after) {
  std::map<std::string, Presence> pictures;
  for (const auto& [folder, presence] : {std::pair(&before, &Presence::before), {&after, &Presence::after}}) {
    std::error_code error;
    fs::recursive_directory_iterator at(*folder, error);
    for (; !error && at != fs::recursive_directory_iterator(); at.increment(error)) {
      if (at->path().extension() == ".png" && at->is_regular_file(error))
        pictures[at->path().lexically_relative(*folder).string()].*presence = true;
    }
    if (error) throw Refusal(folder->string() + ": cannot be read: " + error.message());
  }
  if (pictures.empty())
    throw Refusal(before.string() + ", " + after.string() + ": no picture (*.png) in either");
  return pictures;
}

int compareFolders(const CompareOptions& options) {
  const fs::path before = options.before, after = options.after;
  const std::map<std::string, Presence> pictures = picturesIn(before, after);
  std::size_t alike = 0, within = 0, different = 0, alone = 0, unreadable = 0;
  {
    Progress progress("comparing picture", pictures.size());
    for (const auto& [name, presence] : pictures) {
      progress.step();
      if (!presence.before || !presence.after) {
        ++alone;
        progress.clear();
        std::printf("%s: only in %s\n", printable(name).c_str(),
                    printable(presence.before ? options.before : options.after).c_str());
        continue;
      }
      try {
        std::optional<fs::path> output;
        if (options.output) output = fs::path(*options.output) / name;
        const Difference found =
            comparePictures(before / name, after / name, options.tolerance, output, Marking::WhereDifferent);
        ++(found.isNone() ? alike : found.isWithin(options.tolerance) ? within : different);
        if (found.isNone()) continue;
        progress.clear();
        std::printf("%s: %s\n", printable(name).c_str(), found.text().c_str());
      } catch (const Refusal& refusal) {
        ++unreadable;
        progress.clear();
        std::fprintf(stderr, "%s\n", printable(refusal.what()).c_str());
      }
    }
  }
  std::printf("%zu %s: %zu alike, %zu within the tolerance, %zu different, %zu in one folder only, ",
              pictures.size(), pictures.size() == 1 ? "picture" : "pictures", alike, within, different,
              alone);
  std::printf("%zu not compared\n", unreadable);
  finishStandardOutput();
  return different + alone + unreadable == 0 ? 0 : 1;
}

}  // namespace

int compare(const CompareOptions& options) {
  std::error_code error;
  const bool areFolders = fs::is_directory(options.before, error);
  if (areFolders != fs::is_directory(options.after, error))
    throw Refusal(options.before + ", " + options.after +
                  ": a folder compares with a folder, a picture with a picture");
  if (areFolders) return compareFolders(options);
  std::optional<fs::path> output;
  if (options.output) output = *options.output;
  const Difference found =
      comparePictures(options.before, options.after, options.tolerance, output, Marking::Always);
  std::printf("%s: %s\n", printable(options.after).c_str(), found.text().c_str());
  finishStandardOutput();
  return found.isWithin(options.tolerance) ? 0 : 1;
}

}  // namespace QeltDesktop
