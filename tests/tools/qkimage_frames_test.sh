#!/usr/bin/env bash
# qkimage's frame subcommands end to end: known results on tiny raw frames,
# and refusals with a message and a non-zero exit.
set -euo pipefail
tool=$1
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

bytes() { od -An -v -tu1 "$1" | tr -s ' \n' ' ' | sed 's/^ //; s/ $//'; }
expect_bytes() {  # expect_bytes FILE "B0 B1 ..."
    [ "$(bytes "$1")" = "$2" ] || { echo "FAIL: $1 holds $(bytes "$1"), want $2"; exit 1; }
}
expect_failure() {  # expect_failure STATUS MESSAGE-PART COMMAND ARGS...
    local status=$1 message=$2
    shift 2
    local got=0
    "$tool" "$@" 2>"$work/err" || got=$?
    if [ "$got" -ne "$status" ] || ! grep -q -- "$message" "$work/err"; then
        echo "FAIL: qkimage $* gave status $got and: $(cat "$work/err")"
        exit 1
    fi
}

# convert: 2x2 NV12, luma 76 149 29 255 and chroma U 85 V 255.
printf '\114\225\035\377\125\377' >"$work/frame.nv12"
"$tool" convert --size 2x2 --from NV12 --to RGBA "$work/frame.nv12" "$work/frame.rgba"
expect_bytes "$work/frame.rgba" "254 0 0 255 255 73 72 255 207 0 0 255 255 179 178 255"
# Layout moves lose nothing: NV12 -> YUYV -> NV21 -> NV12 gives the frame back.
"$tool" convert --to YUYV --from nv12 --size 2x2 "$work/frame.nv12" "$work/frame.yuyv"
"$tool" convert --size 2x2 --from YUYV --to NV21 "$work/frame.yuyv" "$work/frame.nv21"
"$tool" convert --size 2x2 --from NV21 --to NV12 "$work/frame.nv21" "$work/back.nv12"
cmp -s "$work/frame.nv12" "$work/back.nv12" || { echo "FAIL: round trip changed the frame"; exit 1; }

# rotate: a 2x1 RGBA frame a quarter turn counter-clockwise: its right pixel on top.
printf '\001\002\003\004\005\006\007\010' >"$work/pair.rgba"
"$tool" rotate --size 2x1 --format RGBA --angle 90 "$work/pair.rgba" "$work/turned.rgba"
expect_bytes "$work/turned.rgba" "5 6 7 8 1 2 3 4"
# scale: the same frame twice as wide.
"$tool" scale --size 2x1 --format RGBA --to 4x1 "$work/pair.rgba" "$work/wide.rgba"
expect_bytes "$work/wide.rgba" "1 2 3 4 1 2 3 4 5 6 7 8 5 6 7 8"
# crop: the right half of a 4x2 NV12 frame: luma 2 3 6 7 and the chroma pair 10 11.
printf '\000\001\002\003\004\005\006\007\010\011\012\013' >"$work/wide.nv12"
"$tool" crop --size 4x2 --format NV12 --at 2,0 --to 2x2 "$work/wide.nv12" "$work/half.nv12"
expect_bytes "$work/half.nv12" "2 3 6 7 10 11"

expect_failure 2 "missing option '--to'" convert --size 2x2 --from NV12 "$work/frame.nv12" "$work/out"
expect_failure 2 "unknown --to 'XYZW'" convert --size 2x2 --from NV12 --to XYZW "$work/frame.nv12" "$work/out"
expect_failure 2 "bad --size '2x0'" convert --size 2x0 --from NV12 --to RGBA "$work/frame.nv12" "$work/out"
expect_failure 2 "JPEG is an encoded format, not a raw frame" convert --size 2x2 --from JPEG --to RGBA "$work/frame.nv12" "$work/out"
expect_failure 1 "cannot read .*No such file" convert --size 2x2 --from NV12 --to RGBA "$work/missing" "$work/out"
expect_failure 1 "is not a 4x2 NV12 frame of 12 bytes" convert --size 4x2 --from NV12 --to RGBA "$work/frame.nv12" "$work/out"
expect_failure 2 "D16 frames convert only to D16" convert --size 2x2 --from NV12 --to D16 "$work/frame.nv12" "$work/out"
# 3x2 RGBA is a valid frame, but NV12 needs even dimensions.
head -c 24 /dev/zero >"$work/odd.rgba"
expect_failure 2 "NV12 needs an even width and height, not 3x2" convert --size 3x2 --from RGBA --to NV12 "$work/odd.rgba" "$work/out"
expect_failure 2 "multiple of 90" rotate --size 2x1 --format RGBA --angle 45 "$work/pair.rgba" "$work/out"
expect_failure 2 "crop rectangle 1x1 at 2,0 does not fit 2x1" crop --size 2x1 --format RGBA --at 2,0 --to 1x1 "$work/pair.rgba" "$work/out"
expect_failure 1 "is not a 1x1 RGBA frame" scale --size 1x1 --format RGBA --to 2x2 "$work/pair.rgba" "$work/out"
[ ! -e "$work/out" ] || { echo "FAIL: a failed command wrote its output"; exit 1; }
echo "qkimage frame commands: all checks passed"
