#!/usr/bin/env bash
# Installs the Debian 12 packages the build and the tests need, when missing.
set -euo pipefail

packages=(
  cmake ninja-build g++ pkg-config
  libgtest-dev libgmock-dev libbenchmark-dev
  # picture codecs of the library and the JPEG codec module
  libjpeg62-turbo-dev libturbojpeg0-dev libspng-dev libwebp-dev libgif-dev zlib1g-dev
  # the PNG and libyuv yardsticks of the benchmarks
  libpng-dev libyuv-dev
  # fuzzing (libFuzzer and the sanitizers' runtime)
  clang libclang-rt-14-dev
)
# Optional group "aarch64" (scripts/run-tests-aarch64.sh): the cross compiler,
# the emulator, and the arm64 runtime and libraries of Debian's multiarch.
if [ "${1:-}" = aarch64 ]; then
  packages+=(
    g++-aarch64-linux-gnu qemu-user libc6:arm64 libstdc++6:arm64 libgtest-dev:arm64
    libjpeg62-turbo-dev:arm64 libturbojpeg0-dev:arm64 libspng-dev:arm64 libwebp-dev:arm64
    libgif-dev:arm64 zlib1g-dev:arm64
  )
elif [ $# -gt 0 ]; then
  echo "usage: scripts/install-deps.sh [aarch64]" >&2
  exit 2
fi

missing=()
for package in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$package" 2>/dev/null | grep -q 'install ok installed' || missing+=("$package")
done
[ ${#missing[@]} -eq 0 ] && exit 0

echo "Installing: ${missing[*]}"
if [ "$(id -u)" -ne 0 ]; then
  echo "install-deps: run as root to install the packages above" >&2
  exit 1
fi
export DEBIAN_FRONTEND=noninteractive
if [[ " ${missing[*]}" == *:arm64* ]] && ! dpkg --print-foreign-architectures | grep -qx arm64; then
  dpkg --add-architecture arm64
fi
apt-get update -q
apt-get install -y -q --no-install-recommends "${missing[@]}"
