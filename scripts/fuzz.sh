#!/usr/bin/env bash
# Fuzzes one target of tests/fuzz for SECONDS seconds, or every target in
# turn, in build/fuzz (clang: libFuzzer, AddressSanitizer and
# UndefinedBehaviorSanitizer on the library and the target).
#
#   scripts/fuzz.sh TARGET SECONDS
#     TARGET: options, image, geometry, decode, load (or fuzz_<name>), or all
#
# The run starts from a scratch copy of tests/fuzz/corpus/fuzz_<target> in
# build/fuzz/run/<target>/corpus and writes crashing inputs to
# build/fuzz/run/<target>/findings; nothing lands in the source tree. To keep
# what it found, see the lines printed at the end.
set -euo pipefail
cd "$(dirname "$0")/.."

targets=(options image geometry decode load)
if [ $# -ne 2 ] || ! [[ "$2" =~ ^[0-9]+$ ]]; then
  echo "usage: scripts/fuzz.sh TARGET SECONDS   (TARGET: ${targets[*]}, or all)" >&2
  exit 2
fi
name=${1#fuzz_}
seconds=$2
if [ "$name" = all ]; then
  selected=("${targets[@]}")
elif [[ " ${targets[*]} " == *" $name "* ]]; then
  selected=("$name")
else
  echo "fuzz.sh: unknown target '$1' (${targets[*]}, or all)" >&2
  exit 2
fi

scripts/install-deps.sh
cmake -S . -B build/fuzz -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo \
  -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ \
  -DQK_FUZZ=ON -DQK_BUILD_TESTS=OFF -DQK_BUILD_BENCH=OFF -DQKCORE_WERROR=OFF >/dev/null
cmake --build build/fuzz -j 2 --target "${selected[@]/#/fuzz_}"

# Inputs only need to be as long as the parameters a target reads; pictures
# are kept short so that each run stays fast. The malloc limit stops any
# single allocation far beyond what these inputs justify (images of at most
# 128 KB, pictures of the platform decoders at most 16 MB). The JPEG codec
# module takes any picture the size rule allows, up to 2 GiB: it reserves
# that much for a header that claims it, and the RSS limit checks that only
# the pages it decodes are used.
max_len() {
  case "$1" in
    options) echo 512 ;;
    image | geometry) echo 256 ;;
    *) echo 65536 ;;
  esac
}
malloc_limit() {
  case "$1" in
    decode | load) echo 2048 ;;
    *) echo 128 ;;
  esac
}

for target in "${selected[@]}"; do
  run=build/fuzz/run/$target
  rm -rf "$run"
  mkdir -p "$run/corpus" "$run/findings"
  cp tests/fuzz/corpus/"fuzz_$target"/* "$run/corpus/" 2>/dev/null || true
  dict=()
  [ -f "tests/fuzz/fuzz_$target.dict" ] && dict=(-dict="tests/fuzz/fuzz_$target.dict")
  echo "== fuzz_$target for $seconds s (log: $run/fuzz.log)"
  status=0
  ASAN_OPTIONS=detect_leaks=1:abort_on_error=1:strict_string_checks=1 \
  UBSAN_OPTIONS=print_stacktrace=1:halt_on_error=1 \
    "build/fuzz/tests/fuzz/fuzz_$target" "$run/corpus" "${dict[@]}" \
      -max_total_time="$seconds" -max_len="$(max_len "$target")" -timeout=10 \
      -rss_limit_mb=2048 -malloc_limit_mb="$(malloc_limit "$target")" \
      -artifact_prefix="$run/findings/" -print_final_stats=1 >"$run/fuzz.log" 2>&1 || status=$?
  grep -E '^(stat::number_of_executed_units|Done )' "$run/fuzz.log" || true
  if [ "$status" -ne 0 ] || [ -n "$(ls -A "$run/findings")" ]; then
    echo "fuzz_$target found something (status $status): $run/findings, details in $run/fuzz.log"
    echo "  minimise: build/fuzz/tests/fuzz/fuzz_$target -minimize_crash=1 -runs=10000 $run/findings/<file>"
    echo "  keep it:  tests/fuzz/crashers/fuzz_$target/<what-it-does> (the replay tests run it)"
  fi
  echo "  new corpus inputs: build/fuzz/tests/fuzz/fuzz_$target -merge=1 tests/fuzz/corpus/fuzz_$target $run/corpus"
done
