#include "support/ElfFile.h"

#include <cxxabi.h>
#include <elf.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>
#include <memory>
#include <stdexcept>

namespace QeltTests {

namespace {

std::string demangled(const char* name) {
  int status = 0;
  const std::unique_ptr<char, void (*)(void*)> text(abi::__cxa_demangle(name, nullptr, nullptr, &status),
                                                    std::free);
  return status == 0 ? text.get() : name;
}

class Reader {
 public:
  explicit Reader(const std::string& path) : mPath(path) {
    std::ifstream file(path, std::ios::binary);
    mBytes.assign(std::istreambuf_iterator<char>(file), {});
  }

  template <typename Record>
  Record at(std::uint64_t offset) const {
    if (offset > mBytes.size() || mBytes.size() - offset < sizeof(Record)) fail();
    Record record;
    std::memcpy(&record, mBytes.data() + offset, sizeof(record));
    return record;
  }

  const char* text(std::uint64_t offset) const {
    if (std::find(mBytes.begin() + std::min(offset, std::uint64_t(mBytes.size())), mBytes.end(), '\0') ==
        mBytes.end()) {
      fail();
    }
    return mBytes.data() + offset;
  }

  [[noreturn]] void fail() const { throw std::runtime_error(mPath + ": not a whole 64-bit ELF file"); }

 private:
  std::string mPath;
  std::vector<char> mBytes;
};

}  // namespace

ElfFile::ElfFile(const std::string& path) {
  const Reader file(path);
  const auto header = file.at<Elf64_Ehdr>(0);
  if (std::memcmp(header.e_ident, ELFMAG, SELFMAG) != 0 || header.e_ident[EI_CLASS] != ELFCLASS64)
    file.fail();

  for (int index = 0; index < header.e_phnum; ++index) {
    const auto segment = file.at<Elf64_Phdr>(header.e_phoff + index * sizeof(Elf64_Phdr));
    if (segment.p_type == PT_LOAD) alignments.push_back(segment.p_align);
  }
  for (int index = 0; index < header.e_shnum; ++index) {
    const auto section = file.at<Elf64_Shdr>(header.e_shoff + index * sizeof(Elf64_Shdr));
    if (section.sh_type != SHT_DYNSYM && section.sh_type != SHT_DYNAMIC) continue;
    const auto strings = file.at<Elf64_Shdr>(header.e_shoff + section.sh_link * sizeof(Elf64_Shdr));
    for (std::uint64_t offset = 0; offset < section.sh_size; offset += section.sh_entsize) {
      if (section.sh_type == SHT_DYNSYM) {
        const auto symbol = file.at<Elf64_Sym>(section.sh_offset + offset);
        if (symbol.st_name == 0 || symbol.st_shndx == SHN_UNDEF) continue;
        exported.push_back(demangled(file.text(strings.sh_offset + symbol.st_name)));
      } else {
        const auto entry = file.at<Elf64_Dyn>(section.sh_offset + offset);
        if (entry.d_tag == DT_NEEDED) needed.emplace_back(file.text(strings.sh_offset + entry.d_un.d_val));
        if (entry.d_tag == DT_SONAME) soname = file.text(strings.sh_offset + entry.d_un.d_val);
        if (entry.d_tag == DT_NULL) break;
      }
    }
  }
  std::sort(exported.begin(), exported.end());
  exported.erase(std::unique(exported.begin(), exported.end()), exported.end());
}

}  // namespace QeltTests
