#!/usr/bin/env bash
# Builds the examples against an installed library as a caller would, by the CMake package and by
# pkg-config, and runs them. To be run where /usr/vano and /volume1 may be written.
#
# Usage: callers.sh SOURCE-DIR WORK-DIR [LIBRARY-DIR]
#
# LIBRARY-DIR is where the library lies when that is no standard place; CMAKE_PREFIX_PATH and
# PKG_CONFIG_PATH name it then too.
set -euo pipefail
source=$1
work=$2
library=${3-}

fail() { echo "FAILED: $*" >&2; exit 1; }

flags=$(pkg-config --cflags --libs fileindex)
[ -n "$flags" ] || fail "pkg-config knows nothing"

echo "== every public header compiles on its own"
count=0
for header in "$(pkg-config --variable=includedir fileindex)"/fileindex/*.h; do
    echo "#include <fileindex/${header##*/}>" >"$work/one.cpp"
    # shellcheck disable=SC2086 # the flags are words
    g++ -std=c++17 -Wall -Wextra -Wpedantic -Werror -fsyntax-only "$work/one.cpp" $flags
    count=$((count + 1))
done
[ "$count" -ge 15 ] || fail "only $count headers were installed"

echo "== fileindex.h is C"
echo '#include <fileindex/fileindex.h>' >"$work/one.c"
# shellcheck disable=SC2086
gcc -std=c11 -Wall -Wextra -Wpedantic -Werror -fsyntax-only "$work/one.c" $flags

echo "== by the CMake package"
cmake -S "$source/tests/interface/consumer" -B "$work/cmake" -DEXAMPLES="$source/examples" \
    >"$work/cmake.log" || { cat "$work/cmake.log"; fail "configure"; }
cmake --build "$work/cmake" >"$work/build.log" || { cat "$work/build.log"; fail "build"; }

echo "== by pkg-config"
mkdir "$work/pkgconfig"
[ -z "$library" ] || flags+=" -Wl,-rpath-link,$library"
# shellcheck disable=SC2016 # no command, but a fence
sed -n '/^```c$/,/^```$/{//!p}' "$source/README.md" >"$work/readme.c"
# shellcheck disable=SC2086
gcc -std=c11 -Wall -Wextra -Werror "$work/readme.c" $flags -o "$work/readme"
# shellcheck disable=SC2086
gcc -std=c11 -Wall -Wextra -Werror "$source/examples/membership.c" $flags \
    -o "$work/pkgconfig/membership"
# shellcheck disable=SC2086
g++ -std=c++17 -Wall -Wextra -Werror "$source/examples/add_folder.cpp" $flags \
    -o "$work/pkgconfig/add_folder"

[ -z "$library" ] || export LD_LIBRARY_PATH=$library
mkdir -p /volume1/photos/2016
echo '{"photos": "/volume1/photos"}' >/usr/vano/etc/shares.json
for flavour in cmake pkgconfig; do
    echo "== run: $flavour"
    rm -f /usr/vano/etc/fileindex/folder.conf
    "$work/$flavour/membership" /volume1/photos/2016 && fail "$flavour: indexed before it was added"
    # Nothing listens on the daemon's socket here: the folder is saved, the rest is reported.
    "$work/$flavour/add_folder" /photos/2016 || true
    grep -q '"/photos/2016"' /usr/vano/etc/fileindex/folder.conf || fail "$flavour: not saved"
    "$work/$flavour/membership" /volume1/photos/2016 || fail "$flavour: not indexed after it was added"
    "$work/$flavour/membership" /volume1/photos2 && fail "$flavour: a sibling is indexed"
done
echo "== run: the program of the README"
[ "$("$work/readme" /volume1/photos/2016)" = "/volume1/photos/2016: indexed" ] ||
    fail "the README's program says something else"
echo "all as it should be"
