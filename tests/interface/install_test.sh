#!/usr/bin/env bash
# Installs the build into a prefix of its own and tries the tool and the callers with what is there.
# To be run inside the sandbox.
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

export CMAKE_PREFIX_PATH=$prefix CMAKE_GENERATOR=Ninja
PKG_CONFIG_PATH=$(dirname "$(find "$prefix" -name fileindex.pc)")
export PKG_CONFIG_PATH
mkdir -p /usr/vano/etc/fileindex
"$source/tests/interface/callers.sh" "$source" "$work" \
    "$(dirname "$(find "$prefix" -name 'libfileindex.so.1')")"
