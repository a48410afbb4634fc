// Runs a fuzz target without a fuzzer: over the files and folders named, then over inputs made from them by
// a fixed rule.
//
//   REPLAY [--generate COUNT] PATH...

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <string>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace {

using Bytes = std::vector<std::uint8_t>;

Bytes read(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  if (!file) {
    std::fprintf(stderr, "%s: cannot be read\n", path.c_str());
    std::exit(1);
  }
  return Bytes(std::istreambuf_iterator<char>(file), {});
}

void run(const Bytes& bytes) {
  LLVMFuzzerTestOneInput(bytes.data(), bytes.size());
}

// Some bytes changed by chance: in one input, or in a piece of it with a piece of another after it.
Bytes mixed(const Bytes& one, const Bytes& other, std::mt19937& random) {
  const auto below = [&random](std::size_t bound) { return bound == 0 ? 0 : random() % bound; };
  Bytes made = one;
  if (below(2) == 0) {
    made.resize(below(one.size() + 1));
    made.insert(made.end(), other.begin() + static_cast<std::ptrdiff_t>(below(other.size() + 1)),
                other.end());
    for (std::size_t more = below(24); more > 0; --more) made.push_back(static_cast<std::uint8_t>(random()));
  }
  for (std::size_t changes = below(8); changes > 0 && !made.empty(); --changes) {
    made[below(made.size())] = static_cast<std::uint8_t>(random());
  }
  made.resize(std::min<std::size_t>(made.size(), 4000));
  return made;
}

}  // namespace

int main(int argc, char** argv) {
  long generated = 0;
  std::vector<std::filesystem::path> files;
  for (int i = 1; i < argc; ++i) {
    const std::string argument = argv[i];
    if (argument == "--generate" && i + 1 < argc) {
      generated = std::strtol(argv[++i], nullptr, 10);
    } else if (std::filesystem::is_directory(argument)) {
      for (const auto& entry : std::filesystem::directory_iterator(argument)) files.push_back(entry.path());
    } else {
      files.emplace_back(argument);
    }
  }
  // Folders come in no order.
  std::sort(files.begin(), files.end());
  std::vector<Bytes> seeds;
  for (const auto& file : files) seeds.push_back(read(file));
  if (seeds.empty()) {
    std::fprintf(stderr, "no seeds\n");
    return 1;
  }
  for (const Bytes& seed : seeds) run(seed);
  std::mt19937 random(20250101);
  for (long i = 0; i < generated; ++i) {
    run(mixed(seeds[random() % seeds.size()], seeds[random() % seeds.size()], random));
  }
  std::printf("%zu seeds, %ld generated inputs\n", seeds.size(), generated);
  return 0;
}
