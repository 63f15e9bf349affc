#!/usr/bin/env bash
# What debian/ says agrees with the project: its version, that of the binary interface, and the
# libraries that it is built with.
#
# Usage: packaging_test.sh SOURCE-DIR VERSION ABI-VERSION
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

# The lists that stand in parentheses, or between a field and the next.
needed=$(sed -n '/^readonly BUILD=(/,/)/p' scripts/install-deps | grep -o 'lib[a-z0-9.+-]*-dev')
declared=$(sed -n '/^Build-Depends:/,/^[A-Z].*:/p' debian/control | grep -o 'lib[a-z0-9.+-]*-dev')
missing=$(comm -23 <(sort -u <<<"$needed") <(sort -u <<<"$declared"))
[ -z "$missing" ] || fail "Build-Depends in debian/control lacks $missing"
echo "packages of $version, binary interface $abi"
