#include <dlfcn.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <memory>

#include "pencommon/Pen.h"

namespace {

// Loads, makes and deletes a pen, unloads; false as soon as one step fails. A library that keeps itself in
// the process (a unique global, a thread-local destructor) is found still loaded.
bool comesAndGoes() {
  void* library = dlopen(QELT_PLUGIN_PATH, RTLD_NOW | RTLD_LOCAL);
  if (library == nullptr) {
    std::fprintf(stderr, "%s\n", dlerror());
    return false;
  }
  const auto create = reinterpret_cast<Qelt::Pen* (*)()>(dlsym(library, "createPenInst"));
  if (create == nullptr) return false;
  std::unique_ptr<Qelt::Pen> pen(create());
  if (pen == nullptr) return false;
  pen.reset();
  if (dlclose(library) != 0) return false;
  if (dlopen(QELT_PLUGIN_PATH, RTLD_NOW | RTLD_NOLOAD) != nullptr) {
    std::fprintf(stderr, "still loaded\n");
    return false;
  }
  return true;
}

// In a process of its own, and first, as death tests are: other tests keep the library loaded.
TEST(LoadDeathTest, EveryNameResolvesAndTheLibraryCanBeUnloadedAndLoadedAgain) {
  EXPECT_EXIT(
      {
        bool well = true;
        for (int round = 0; round < 20 && well; ++round) well = comesAndGoes();
        std::_Exit(well ? 0 : 1);
      },
      testing::ExitedWithCode(0), "");
}

}  // namespace
