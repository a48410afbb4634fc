# Debian's cross compiler for 64-bit ARM, with the arm64 packages of tools/install-packages --arm64.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR aarch64)
set(CMAKE_C_COMPILER aarch64-linux-gnu-gcc)
set(CMAKE_CXX_COMPILER aarch64-linux-gnu-g++)
set(CMAKE_LIBRARY_ARCHITECTURE aarch64-linux-gnu)
# pkg-config would otherwise answer with this machine's own libraries.
set(ENV{PKG_CONFIG_LIBDIR} /usr/lib/aarch64-linux-gnu/pkgconfig:/usr/share/pkgconfig)

# No -L: with libc6:arm64 installed it mixes two versions of the C library, and the program hangs.
# Nothing in front that would end it in time: tests send signals to the programs that they start. The limits are ctest's.
set(CMAKE_CROSSCOMPILING_EMULATOR qemu-aarch64)
