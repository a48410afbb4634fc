#include <dlfcn.h>
#include <gmock/gmock.h>
#include <malloc.h>
#include <stdlib.h>

namespace {

// The leak checker looks when the GL driver and the EGL implementation are unloaded: their few caches, held
// by variables of theirs, would be reported from an "<unknown module>". What stays loaded is seen to still
// hold them.
void keepDriverLoaded() {
  dlopen("libEGL_mesa.so.0", RTLD_NOW | RTLD_NODELETE);
  for (const char* path :
       {"/usr/lib/x86_64-linux-gnu/dri/swrast_dri.so", "/usr/lib/aarch64-linux-gnu/dri/swrast_dri.so"}) {
    if (dlopen(path, RTLD_NOW | RTLD_NODELETE) != nullptr) return;
  }
}

}  // namespace

// Read by the sanitizers' runtimes before main; plain builds never call them. They look for them among what
// the program exports.
extern "C" {
#pragma GCC visibility push(default)
const char* __asan_default_options() {
  // A request for too much memory answers null to new (std::nothrow), as it does without the sanitizer.
  return "allocator_may_return_null=1:detect_stack_use_after_return=1:strict_string_checks=1";
}
const char* __ubsan_default_options() {
  return "print_stacktrace=1";
}
const char* __tsan_default_options() {
  return "second_deadlock_stack=1:suppressions=" QELT_SOURCE_DIR "/tests/support/tsan.supp";
}
#pragma GCC visibility pop
}

int main(int argc, char** argv) {
  setenv("EGL_PLATFORM", "surfaceless", 0);
  // Freed memory is used again instead of given back: the kernel took longer to hand out cleared pages for
  // the next picture than a test to draw it.
  mallopt(M_MMAP_MAX, 0);
  mallopt(M_TRIM_THRESHOLD, -1);
  testing::InitGoogleMock(&argc, argv);
  // Listing the cases needs no driver.
  if (QELT_SANITIZED && !testing::GTEST_FLAG(list_tests)) keepDriverLoaded();
  return RUN_ALL_TESTS();
}
