#!/usr/bin/env bash
# Cross-builds the library, the tool and the tests for 64-bit ARM with
# Debian's g++-aarch64-linux-gnu and runs every test under qemu-aarch64
# (user-mode emulation: no binfmt registration needed, ctest starts each
# executable through the emulator). Benchmarks are not built.
#
#   scripts/run-tests-aarch64.sh          build directory build/aarch64
#   QK_BUILD_DIR=DIR scripts/run-tests-aarch64.sh
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/install-deps.sh aarch64
jobs=$(nproc)
build=${QK_BUILD_DIR:-build/aarch64}

echo "== AArch64 build, tests under qemu-aarch64"
cmake -S . -B "$build" -G Ninja -DCMAKE_BUILD_TYPE=Release \
  -DCMAKE_TOOLCHAIN_FILE="$PWD/cmake/aarch64-linux-gnu.cmake" -DQK_BUILD_BENCH=OFF -DQKCORE_WERROR=ON
cmake --build "$build" -j "$jobs"
(cd "$build" && ctest -j "$jobs" --timeout 600 --output-on-failure)
