#!/usr/bin/env bash
# Builds the library and the qkimage tool, then runs the tool on its default input.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/install-deps.sh

cmake -S . -B build/release -G Ninja -DCMAKE_BUILD_TYPE=Release
cmake --build build/release -j "$(nproc)" --target qkimage
build/release/tools/qkimage/qkimage formats 4000x3000
