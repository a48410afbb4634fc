#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

namespace QeltTests {

// A test with a folder of its own, which goes with it.
class InFolder : public testing::Test {
 protected:
  InFolder() {
    std::string folder = testing::TempDir() + "qelt-test-XXXXXX";
    if (mkdtemp(folder.data()) == nullptr) std::abort();
    mFolder = folder;
  }
  ~InFolder() override { std::filesystem::remove_all(mFolder); }

  const std::filesystem::path& folder() const { return mFolder; }
  std::filesystem::path path(const std::string& name) const { return mFolder / name; }
  // Makes the folders that the name has.
  void write(const std::string& name, const std::string& bytes) const {
    std::filesystem::create_directories(path(name).parent_path());
    std::ofstream(path(name), std::ios::binary) << bytes;
  }

 private:
  std::filesystem::path mFolder;
};

}  // namespace QeltTests
