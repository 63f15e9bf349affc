#!/usr/bin/env bash
# The packages bear the project's version, and the library packages that of the binary interface.
#
# Usage: package_version_test.sh SOURCE-DIR VERSION ABI-VERSION
set -euo pipefail
cd "$1"
version=$2
abi=$3

fail() { echo "FAILED: $*" >&2; exit 1; }

newest=$(sed -n '1s/^libfileindex (\([^)]*\)) .*/\1/p' debian/changelog)
[ "$newest" = "$version" ] || fail "debian/changelog is at ${newest:-no version}, the project at $version"
for library in libfileindex libvanoplatform; do
    symbols=debian/$library$abi.symbols
    grep -q "^Package: $library$abi\$" debian/control || fail "debian/control has no $library$abi"
    grep -q "^$library\.so\.$abi $library$abi " "$symbols" || fail "$symbols is of another interface"
done
echo "packages of $version, binary interface $abi"
