#!/usr/bin/env bash
# Runs the BM_Yuv benchmarks and prints each of our operations beside
# libyuv's: operation, size, ours Mpixel/s, libyuv Mpixel/s, ratio (ours
# divided by libyuv: above 1, ours is faster).
#
#   bench/ratios.sh [BENCH] [benchmark options...]
#
# BENCH defaults to build/release/bench/qkcore_bench. Each row is the median
# of 3 repetitions run in random order, so that a busy machine slows both
# sides alike; later options override these (e.g. --benchmark_repetitions=1,
# --benchmark_filter='BM_Yuv/nv12.*/4000').
set -euo pipefail
cd "$(dirname "$0")/.."
bench=build/release/bench/qkcore_bench
if [ $# -gt 0 ] && [[ "$1" != --* ]]; then
  bench=$1
  shift
fi
json=$(mktemp)
log=$(mktemp)
trap 'rm -f "$json" "$log"' EXIT
"$bench" --benchmark_filter='^BM_Yuv/' --benchmark_repetitions=3 --benchmark_enable_random_interleaving=true \
  --benchmark_report_aggregates_only=true --benchmark_out="$json" --benchmark_out_format=json "$@" >"$log" 2>&1 ||
  { cat "$log" >&2; exit 1; }

python3 - "$json" <<'EOF'
import json, sys

rates = {}  # (operation, size) -> {side: Mpixel/s}
place = {}  # (operation, size) -> where it was registered
for run in json.load(open(sys.argv[1]))["benchmarks"]:
    # The median when repeated, the single run otherwise.
    if run.get("run_type") == "aggregate" and run.get("aggregate_name") != "median":
        continue
    # BM_Yuv/<operation>/<side>/<width>/<height>[/real_time]
    operation, side, width, height = run["run_name"].split("/")[1:5]
    key = (operation, f"{width}x{height}")
    rates.setdefault(key, {})[side] = run["Mpixel/s"]
    here = (run["family_index"], run["per_family_instance_index"])
    place[key] = min(place.get(key, here), here)
order = sorted(rates, key=lambda key: place[key])

rows = [("operation", "size", "ours Mpixel/s", "libyuv Mpixel/s", "ratio")]
for operation, size in order:
    ours, libyuv = rates[(operation, size)].get("ours"), rates[(operation, size)].get("libyuv")
    cell = lambda rate: f"{rate:.0f}" if rate is not None else "-"
    ratio = f"{ours / libyuv:.2f}" if ours and libyuv else "-"
    rows.append((operation, size, cell(ours), cell(libyuv), ratio))
widths = [max(len(row[i]) for row in rows) for i in range(5)]
for row in rows:
    print("  ".join(cell.ljust(w) if i < 2 else cell.rjust(w) for i, (cell, w) in enumerate(zip(row, widths))))
EOF
