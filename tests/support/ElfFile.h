#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace QeltTests {

// What a loader sees of a 64-bit shared library, read from the file.
struct ElfFile {
  // Throws std::runtime_error when the file is no 64-bit ELF file.
  explicit ElfFile(const std::string& path);

  std::string soname;
  std::vector<std::string> needed;        // in the file's order
  std::vector<std::string> exported;      // demangled, sorted, each once
  std::vector<std::uint64_t> alignments;  // of the loaded segments
};

}  // namespace QeltTests
