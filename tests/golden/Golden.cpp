#include "golden/Golden.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <map>
#include <sstream>
#include <utility>

namespace QeltTests {

namespace {

bool isSet(const char* variable) {
  return std::getenv(variable) != nullptr;
}

std::string goldenPath(const std::string& file) {
  return QELT_SOURCE_DIR "/tests/golden/" + file;
}

// The GNU C library works out sines and cosines with fused operations where the processor has them.
bool roundsAsRecorded() {
#if !defined __GLIBC__
  return false;
#elif defined __x86_64__
  return __builtin_cpu_supports("fma") != 0;
#else
  return true;
#endif
}

GreyPicture readPgm(const std::string& path) {
  GreyPicture picture;
  std::ifstream file(path, std::ios::binary);
  std::string magic;
  int most = 0;
  file >> magic >> picture.width >> picture.height >> most;
  file.get();
  picture.pixels.assign(std::istreambuf_iterator<char>(file), {});
  if (magic != "P5" || most != 255) picture = {};
  return picture;
}

void writePgm(const std::string& path, const GreyPicture& picture) {
  std::ofstream file(path, std::ios::binary);
  file << "P5\n" << picture.width << " " << picture.height << "\n255\n";
  file.write(reinterpret_cast<const char*>(picture.pixels.data()),
             static_cast<std::streamsize>(picture.pixels.size()));
}

// A checksum of all it holds (FNV-1a).
std::string sumOf(const GreyPicture& picture) {
  std::uint64_t sum = 0xcbf29ce484222325u;
  for (const std::uint8_t byte : picture.channels) sum = (sum ^ byte) * 0x100000001b3u;
  return (std::ostringstream() << std::hex << sum).str();
}

// The lines of renderers.txt: picture, checksum, renderer. By picture and renderer.
using Approvals = std::map<std::pair<std::string, std::string>, std::string>;

Approvals readApprovals() {
  Approvals approvals;
  std::ifstream in(goldenPath("renderers.txt"));
  for (std::string file, sum, renderer; in >> file >> sum >> std::ws && std::getline(in, renderer);)
    approvals[{file, renderer}] = sum;
  return approvals;
}

void approve(const GreyPicture& picture, const std::string& file) {
  Approvals approvals = readApprovals();
  approvals[{file, picture.renderer}] = sumOf(picture);
  std::ofstream out(goldenPath("renderers.txt"));
  for (const auto& [of, sum] : approvals) out << of.first << " " << sum << " " << of.second << "\n";
}

// How far two pictures of one size are apart.
struct Difference {
  double mean = 0.0;    // mean absolute difference over the pixels with ink in either, of 255
  double ink = 0.0;     // relative difference of the ink in all
  double farOff = 0.0;  // share of the inked pixels that differ by more than 40
};

Difference differenceOf(const GreyPicture& a, const GreyPicture& b) {
  double inked = 0.0, sum = 0.0, far = 0.0, inkOfA = 0.0, inkOfB = 0.0;
  for (std::size_t i = 0; i < a.pixels.size(); ++i) {
    if (a.pixels[i] == 255 && b.pixels[i] == 255) continue;
    const int off = std::abs(a.pixels[i] - b.pixels[i]);
    inked += 1.0;
    sum += off;
    far += off > 40 ? 1.0 : 0.0;
    inkOfA += 255 - a.pixels[i];
    inkOfB += 255 - b.pixels[i];
  }
  if (inked == 0.0) return {};
  return {sum / inked, std::abs(inkOfA - inkOfB) / std::max(inkOfA, inkOfB), far / inked};
}

}  // namespace

std::string traceLine(const char* word, const std::vector<float>& numbers) {
  std::string text = word;
  for (const float number : numbers) {
    char digits[32];
    const auto [end, error] = std::to_chars(digits, digits + sizeof digits, number);
    text.append(" ").append(digits, end);
  }
  return text;
}

void expectGoldenTrace(const Trace& trace, const std::string& file) {
  if (isSet("QELT_RECORD_GOLDEN")) {
    std::ofstream out(goldenPath(file));
    for (const std::string& line : trace) out << line << "\n";
    return;
  }
  std::ifstream in(goldenPath(file));
  ASSERT_TRUE(in) << file;
  if (!roundsAsRecorded()) GTEST_SKIP() << "the C library rounds sines in another way here";
  Trace golden;
  for (std::string line; std::getline(in, line);) golden.push_back(line);
  int shown = 0;
  for (std::size_t i = 0; i < std::min(trace.size(), golden.size()) && shown < 5; ++i) {
    if (trace[i] == golden[i]) continue;
    ++shown;
    ADD_FAILURE() << file << ":" << i + 1 << "\n  drawn  " << trace[i] << "\n  golden " << golden[i];
  }
  EXPECT_EQ(trace.size(), golden.size()) << file;
}

void expectGoldenPicture(const GreyPicture& picture, const std::string& file) {
  if (isSet("QELT_RECORD_GOLDEN")) {
    writePgm(goldenPath(file), picture);
    approve(picture, file);
    return;
  }
  if (isSet("QELT_APPROVE_RENDERER")) approve(picture, file);
  const GreyPicture golden = readPgm(goldenPath(file));
  ASSERT_EQ(picture.width, golden.width) << file;
  ASSERT_EQ(picture.height, golden.height) << file;
  ASSERT_EQ(picture.pixels.size(), golden.pixels.size()) << file;
  const Difference difference = differenceOf(picture, golden);
  testing::Test::RecordProperty("mean", std::to_string(difference.mean));
  testing::Test::RecordProperty("ink", std::to_string(difference.ink));
  testing::Test::RecordProperty("farOff", std::to_string(difference.farOff));
  EXPECT_LE(difference.mean, 4.0) << file;
  EXPECT_LE(difference.ink, 0.02) << file;
  EXPECT_LE(difference.farOff, 0.01) << file;
  const Approvals approvals = readApprovals();
  const auto approved = approvals.find({file, picture.renderer});
  if (approved != approvals.end()) {
    EXPECT_EQ(sumOf(picture), approved->second) << file;
  }
  if (testing::Test::HasFailure()) {
    const std::string drawn = testing::TempDir() + file;
    writePgm(drawn, picture);
    ADD_FAILURE() << "what was drawn lies in " << drawn;
  }
}

}  // namespace QeltTests
