#!/usr/bin/env bash
# Builds the library and the qkimage tool, then runs the tool's demo: a drawn
# 4000x3000 NV21 test picture through the camera road, each step timed.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/install-deps.sh

cmake -S . -B build/release -G Ninja -DCMAKE_BUILD_TYPE=Release -DQKCORE_WERROR=ON
cmake --build build/release -j "$(nproc)" --target qkimage
build/release/tools/qkimage/qkimage demo --out build/release/qkimage-demo
