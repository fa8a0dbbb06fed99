#!/usr/bin/env bash
# The build installed into a scratch prefix as a packager would, then a client
# built against that tree by find_package and by pkg-config, in C and in C++,
# and run with no library path in the environment.
#   install_test.sh BUILD_DIR LIBDIR CMAKE GENERATOR CC CXX "FLAGS" "LINK_FLAGS"
set -euo pipefail
build=$1 libdir=$2 cmake=$3 generator=$4 cc=$5 cxx=$6 flags=$7 link_flags=$8
here=$(cd "$(dirname "$0")" && pwd)
source=$(dirname "$(dirname "$here")")
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
prefix=$work/prefix lib=$work/prefix/$libdir
fail() { echo "FAIL: $*"; exit 1; }
unset LD_LIBRARY_PATH

"$cmake" --install "$build" --prefix "$prefix" >/dev/null

# The headers, and exactly these other files (no static archive, stand-in or
# benchmark), the library's name and search path, the tool's search path.
diff <(ls "$source/include/qkcore") <(ls "$prefix/include/qkcore") || fail "headers differ"
diff - <(cd "$prefix" && find . ! -type d ! -path './include/*' -printf '%p %l\n' | LC_ALL=C sort |
    sed 's/Targets-[a-z]*/Targets-CONFIG/; s/ $//'
    readelf -d "$lib/libqkcore.so.0.1.0" bin/qkimage | grep -oE '(soname|runpath): .*') <<END || fail "installed tree"
./bin/qkimage
./$libdir/cmake/qkcore/qkcoreConfig.cmake
./$libdir/cmake/qkcore/qkcoreConfigVersion.cmake
./$libdir/cmake/qkcore/qkcoreTargets-CONFIG.cmake
./$libdir/cmake/qkcore/qkcoreTargets.cmake
./$libdir/libqkcore.so libqkcore.so.0
./$libdir/libqkcore.so.0 libqkcore.so.0.1.0
./$libdir/libqkcore.so.0.1.0
./$libdir/libveljpeginterface.so
./$libdir/pkgconfig/qkcore.pc
soname: [libqkcore.so.0]
runpath: [\$ORIGIN]
runpath: [\$ORIGIN/../$libdir]
END
# The package names no path of the build and no dependency.
grep -rlF -e "$source" -e "$build" -e INTERFACE_LINK_LIBRARIES "$lib/cmake" "$lib/pkgconfig" && fail "leaks"
"$prefix/bin/qkimage" formats 16x8 | grep -q '^NV12 ' || fail "installed qkimage does not run"

# The client both ways; the pkg-config build records where the library lies,
# as any program linked against a library outside the system's paths must.
"$cmake" -S "$here/consumer" -B "$work/cmake" -G "$generator" -DCMAKE_PREFIX_PATH="$prefix" \
    -DCMAKE_C_COMPILER="$cc" -DCMAKE_CXX_COMPILER="$cxx" -DCMAKE_BUILD_TYPE=Release -DCMAKE_C_FLAGS="$flags" \
    -DCMAKE_CXX_FLAGS="$flags" -DCMAKE_EXE_LINKER_FLAGS="$flags $link_flags" >"$work/log" || fail "$(cat "$work/log")"
grep -qF "qkcore_DIR:PATH=$lib/cmake/qkcore" "$work/cmake/CMakeCache.txt" || fail "found another qkcore"
"$cmake" --build "$work/cmake" >"$work/log" || fail "$(cat "$work/log")"
export PKG_CONFIG_PATH=$lib/pkgconfig
read -ra pc <<<"$(pkg-config --cflags --libs qkcore) -Wl,-rpath,$(pkg-config --variable=libdir qkcore)"
read -ra extra <<<"-Wall -Wextra -Werror -pedantic $flags $link_flags"
"$cc" -std=c11 "${extra[@]}" "$here/consumer/main.c" "${pc[@]}" -o "$work/pc_c"
"$cxx" -std=c++17 "${extra[@]}" "$here/consumer/main.cpp" "${pc[@]}" -o "$work/pc_cpp"

# One image layout in both languages; the JPEG through the installed module.
for client in cmake/consumer_c cmake/consumer_cpp pc_c pc_cpp; do
    diff - <("$work/$client") <<END || fail "$client"
layout 48: 8 16 20 24 28 32 40; refused -2, 1 error
NV21 to RGBA: 0, pixel 238 14 13 255
JPEG ffd8: decoded 0, 64x48, red within 3: 1
END
done
