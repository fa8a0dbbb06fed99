#!/usr/bin/env bash
# qkimage convert end to end: a known conversion, a round trip through another
# format, and refusals with a message and a non-zero exit.
set -euo pipefail
tool=$1
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

bytes() { od -An -v -tu1 "$1" | tr -s ' \n' ' ' | sed 's/^ //; s/ $//'; }
expect_failure() {  # expect_failure STATUS MESSAGE-PART ARGS...
    local status=$1 message=$2
    shift 2
    local got=0
    "$tool" convert "$@" 2>"$work/err" || got=$?
    if [ "$got" -ne "$status" ] || ! grep -q -- "$message" "$work/err"; then
        echo "FAIL: convert $* gave status $got and: $(cat "$work/err")"
        exit 1
    fi
}

# 2x2 NV12: luma 76 149 29 255, chroma U 85 V 255.
printf '\114\225\035\377\125\377' >"$work/frame.nv12"
"$tool" convert --size 2x2 --from NV12 --to RGBA "$work/frame.nv12" "$work/frame.rgba"
want="254 0 0 255 255 73 72 255 207 0 0 255 255 179 178 255"
[ "$(bytes "$work/frame.rgba")" = "$want" ] || { echo "FAIL: NV12 to RGBA gave $(bytes "$work/frame.rgba")"; exit 1; }

# Layout moves lose nothing: NV12 -> YUYV -> NV21 -> NV12 gives the frame back.
"$tool" convert --to YUYV --from nv12 --size 2x2 "$work/frame.nv12" "$work/frame.yuyv"
"$tool" convert --size 2x2 --from YUYV --to NV21 "$work/frame.yuyv" "$work/frame.nv21"
"$tool" convert --size 2x2 --from NV21 --to NV12 "$work/frame.nv21" "$work/back.nv12"
cmp -s "$work/frame.nv12" "$work/back.nv12" || { echo "FAIL: round trip changed the frame"; exit 1; }

expect_failure 2 "usage" --size 2x2 --from NV12 "$work/frame.nv12" "$work/out"
expect_failure 2 "unknown format 'XYZW'" --size 2x2 --from NV12 --to XYZW "$work/frame.nv12" "$work/out"
expect_failure 2 "bad size '2x0'" --size 2x0 --from NV12 --to RGBA "$work/frame.nv12" "$work/out"
expect_failure 2 "no size" --size 2x2 --from JPEG --to RGBA "$work/frame.nv12" "$work/out"
expect_failure 1 "cannot read" --size 2x2 --from NV12 --to RGBA "$work/missing" "$work/out"
expect_failure 1 "holds 6 bytes; a 4x2 NV12 frame has 12" --size 4x2 --from NV12 --to RGBA "$work/frame.nv12" "$work/out"
expect_failure 1 "cannot convert NV12 to D16" --size 2x2 --from NV12 --to D16 "$work/frame.nv12" "$work/out"
# 3x2 RGBA is a valid frame, but NV12 needs even dimensions.
head -c 24 /dev/zero >"$work/odd.rgba"
expect_failure 1 "QK_ERROR_INVALID_SIZE" --size 3x2 --from RGBA --to NV12 "$work/odd.rgba" "$work/out"
[ ! -e "$work/out" ] || { echo "FAIL: a failed conversion wrote its output"; exit 1; }
echo "convert tool: all checks passed"
