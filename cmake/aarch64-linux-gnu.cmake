# Cross build for 64-bit ARM Linux with Debian's g++-aarch64-linux-gnu and the
# arm64 packages of Debian's multiarch (dpkg --add-architecture arm64). Every
# test runs under qemu-aarch64: ctest runs the test executables through
# CMAKE_CROSSCOMPILING_EMULATOR, and the tool's shell tests through a
# wrapper that tests/CMakeLists.txt writes with the same emulator.
# scripts/run-tests-aarch64.sh installs all of it and runs the suite.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR aarch64)
set(QK_TARGET_TRIPLE aarch64-linux-gnu)

set(CMAKE_C_COMPILER ${QK_TARGET_TRIPLE}-gcc)
set(CMAKE_CXX_COMPILER ${QK_TARGET_TRIPLE}-g++)
set(CMAKE_LIBRARY_ARCHITECTURE ${QK_TARGET_TRIPLE})

# pkg-config reads the arm64 .pc files only.
set(ENV{PKG_CONFIG_LIBDIR} /usr/lib/${QK_TARGET_TRIPLE}/pkgconfig:/usr/share/pkgconfig)
set(ENV{PKG_CONFIG_PATH} "")

# The target runs on Debian's arm64 runtime (libc6:arm64, libstdc++6:arm64,
# installed beside the arm64 -dev packages): with -L / the arm64 loader and
# C library come from one package, and the loader finds every arm64 library
# in /usr/lib/aarch64-linux-gnu. Not -L /usr/aarch64-linux-gnu: that tree's
# loader, of the cross toolchain's C library, then picks up the multiarch
# libc.so.6 of another release, and the first thread a program starts hangs.
set(CMAKE_CROSSCOMPILING_EMULATOR qemu-aarch64 -L /)
