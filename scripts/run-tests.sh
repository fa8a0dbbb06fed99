#!/usr/bin/env bash
# Builds and runs every test three times: in the optimised build, under
# AddressSanitizer + UndefinedBehaviorSanitizer with leak checking, and for
# AArch64 under qemu.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/install-deps.sh
jobs=$(nproc)

echo "== optimised build"
cmake -S . -B build/release -G Ninja -DCMAKE_BUILD_TYPE=Release -DQKCORE_WERROR=ON
cmake --build build/release -j "$jobs"
(cd build/release && ctest -j "$jobs" --timeout 600 --output-on-failure)

# clang: its UndefinedBehaviorSanitizer also catches pointer arithmetic that
# leaves its object, which GCC's does not.
echo "== AddressSanitizer + UndefinedBehaviorSanitizer build (clang)"
CC=clang CXX=clang++ cmake -S . -B build/asan -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo -DQK_SANITIZE=ON \
  -DQK_BUILD_BENCH=OFF -DQKCORE_WERROR=ON
cmake --build build/asan -j "$jobs"
(cd build/asan &&
  ASAN_OPTIONS=detect_leaks=1:abort_on_error=1:strict_string_checks=1 \
  UBSAN_OPTIONS=print_stacktrace=1:halt_on_error=1 \
  ctest -j "$jobs" --timeout 600 --output-on-failure)

# The device's architecture: the NEON kernels and every test, cross-built and
# run under qemu-aarch64.
scripts/run-tests-aarch64.sh
