#!/usr/bin/env bash
# Installs the build into a prefix of its own, builds the examples against it as a caller would, by
# the CMake package and by pkg-config, and runs them. To be run inside the sandbox.
#
# Usage: install_test.sh SOURCE-DIR BUILD-DIR
set -euo pipefail
source=$1
build=$2
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
prefix=$work/prefix

fail() { echo "FAILED: $*" >&2; exit 1; }

cmake --install "$build" --prefix "$prefix" >"$work/install.log"

echo "== every public header compiles on its own"
flags=$(PKG_CONFIG_PATH=$(dirname "$(find "$prefix" -name fileindex.pc)") \
    pkg-config --cflags --libs fileindex)
[ -n "$flags" ] || fail "pkg-config knows nothing"
count=0
for header in "$prefix"/include/fileindex/*.h; do
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
    -DCMAKE_PREFIX_PATH="$prefix" >"$work/cmake.log" || { cat "$work/cmake.log"; fail "configure"; }
cmake --build "$work/cmake" >"$work/build.log" || { cat "$work/build.log"; fail "build"; }

echo "== by pkg-config"
library=$(dirname "$(find "$prefix" -name 'libfileindex.so.1')")
mkdir "$work/pkgconfig"
# shellcheck disable=SC2086
gcc -std=c11 -Wall -Wextra -Werror "$source/examples/membership.c" $flags \
    -Wl,-rpath-link,"$library" -o "$work/pkgconfig/membership"
# shellcheck disable=SC2086
g++ -std=c++17 -Wall -Wextra -Werror "$source/examples/add_folder.cpp" $flags \
    -Wl,-rpath-link,"$library" -o "$work/pkgconfig/add_folder"

echo "== the installed tool finds the installed library"
"$prefix/bin/fileindexctl" --help >"$work/help.log" || fail "fileindexctl --help"
grep -q '^Usage:' "$work/help.log" || fail "no usage in $(cat "$work/help.log")"

echo "== the shells find the completion of the installed tool"
[[ $(head -n 1 "$prefix/share/zsh/vendor-completions/_fileindexctl") == "#compdef fileindexctl" ]] ||
    fail "no completion for zsh"
loader=/usr/share/bash-completion/bash_completion
if [[ -r $loader ]]; then
    XDG_DATA_DIRS=$prefix/share bash -c '. "$1" && _completion_loader fileindexctl; complete -p fileindexctl' \
        bash "$loader" >"$work/complete.log" 2>&1 || fail "$(cat "$work/complete.log")"
    grep -q -- '-F _fileindexctl fileindexctl' "$work/complete.log" || fail "$(cat "$work/complete.log")"
else
    echo "skipped for bash: bash-completion is not installed"
fi

export LD_LIBRARY_PATH=$library

mkdir -p /usr/vano/etc/fileindex /volume1/photos/2016
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
echo "all as it should be"
