#!/usr/bin/env bash
# qkimage as a user meets it: help, option forms, standard streams, error
# sentences, outputs that appear only when complete, and the codec commands
# and the demo end to end.
set -euo pipefail
tool=$1
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
cd "$work"

fail() { echo "FAIL: $*"; exit 1; }
run() {  # run STATUS PATTERN ARGS...: the exit status, and PATTERN in stdout or stderr
    local status=$1 pattern=$2 got=0
    shift 2
    "$tool" "$@" >out.txt 2>err.txt || got=$?
    [ "$got" -eq "$status" ] && grep -qE -- "$pattern" out.txt err.txt ||
        fail "qkimage $* gave status $got and: $(cat out.txt err.txt)"
}
size_is() { [ "$(stat -c %s "$1")" -eq "$2" ] || fail "$1 holds $(stat -c %s "$1") bytes, want $2"; }

# The demo at a small size draws the frame the later checks use.
run 0 "PSNR Y [0-9.]+ dB, chroma [0-9.]+ dB" demo --size 320x240 --out demo
for file in picture.nv21 picture.jpg turned-half.png centre.png; do [ -s "demo/$file" ] || fail "demo wrote no $file"; done
size_is demo/picture.nv21 115200

"$tool" --help >help.txt
for command in formats convert rotate scale crop encode decode save load demo options; do
    grep -q "^  $command .*" help.txt && grep -q "e.g. qkimage $command" help.txt || fail "help lacks $command"
done
echo junk >junk.bin
head -c 36 /dev/zero >zero.rgba
while IFS='|' read -r status pattern args; do
    eval "run $status \"$pattern\" $args"
done <<'EOF'
0|^usage: qkimage encode |encode --help
0|^usage: qkimage decode |help decode
0|YUYV +yuyv422/YUY2|-h
0|^qkimage [0-9]+\.[0-9]+\.[0-9]+$|--version
2|unknown command 'frobnicate'|frobnicate
2|--quality must be a whole number from 1 to 100|encode --size 2x2 --format NV21 --quality 101 x o.jpg
2|^qkimage encode: YUVP needs an even width and height|encode --size=3x2 --format=yuv420p x o.jpg
2|100000x100000 RGBA is larger than 2 GiB|convert --size 100000x100000 --from RGBA --to NV21 x o
2|larger than 2 GiB for every format|formats 100000x100000
2|crop rectangle 10x10 at 5,5 does not fit 8x8|crop --size 8x8 --format RGBA --at 5,5 --to 10x10 x o
2|unknown option '--frobs'|decode --frobs 1 --format RGBA x o
0|moves by one pixel|rotate --size 3x3 --format RGBA --angle 90 zero.rgba o.rgba
1|^qkimage decode: could not decode 'junk.bin' as a JPEG|decode --format RGBA junk.bin o
1|QK_ERROR_CODEC_FAILED|--verbose decode --format RGBA junk.bin o
EOF
! grep -q QK_ERROR <("$tool" decode --format RGBA junk.bin o 2>&1) || fail "a library report without --verbose"

# Option forms and standard streams give the same bytes as files do.
"$tool" convert --size 320x240 --from NV21 --to RGBA demo/picture.nv21 frame.rgba
"$tool" convert --size=320x240 --from=nv21 --to=rgba - - <demo/picture.nv21 >piped.rgba
cmp -s frame.rgba piped.rgba || fail "--name=value with - - gave other bytes"

# Codec round trips: JPEG back to a frame of the right size; PNG back to
# the same RGBA bytes; a raw save and load keep them too.
"$tool" encode --size 320x240 --format NV21 --quality 90 demo/picture.nv21 - | "$tool" decode --format NV21 - back.nv21 >size.txt
size_is back.nv21 115200
[ "$(cat size.txt)" = "320x240 NV21" ] || fail "decode printed '$(cat size.txt)'"
[ "$("$tool" decode --format RGBA demo/picture.jpg - 2>&1 >/dev/null)" = "320x240 RGBA" ] || fail "decode size line"
"$tool" save --size 320x240 --format RGBA frame.rgba jpg.png  # the temporary file must not say ".jpg"
"$tool" load --format RGBA jpg.png loaded.rgba >/dev/null
cmp -s frame.rgba loaded.rgba || fail "PNG save and load changed the pixels"
"$tool" save --size 320x240 --format RGBA frame.rgba frame.raw
"$tool" load --size 320x240 --format RGBA - reloaded.rgba <frame.raw >/dev/null
cmp -s frame.rgba reloaded.rgba || fail "raw save and load changed the pixels"
# An odd-sized picture becomes NV21 cut to even, with a warning.
"$tool" save --size 3x3 --format RGBA zero.rgba odd.png
run 0 "cut to 2x2" decode --format NV21 odd.png odd.nv21
size_is odd.nv21 6

# A failed write leaves the existing output as it was and no temporary.
echo precious >keep.rgba
(ulimit -f 8; run 1 "cannot write 'keep.rgba': File too large" convert --size 320x240 --from NV21 --to RGBA \
    demo/picture.nv21 keep.rgba)
[ "$(cat keep.rgba)" = precious ] || fail "a failed write changed the existing output"
run 1 "is not a 2x2 RGBA frame" save --size 2x2 --format RGBA junk.bin keep.rgba
[ "$(cat keep.rgba)" = precious ] && [ -z "$(ls -A | grep '^\.')" ] || fail "a temporary file was left behind"
echo "qkimage codec commands: all checks passed"
