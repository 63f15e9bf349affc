#!/bin/bash
# Compares the symbols that a library exports with the boundary: LIBRARY HEADER DIAGNOSIS-HEADER
set -euo pipefail

library=$1
header=$2
diagnosis=$3

expected() {
    grep -oE '\b(VANO|VLIB)[A-Za-z0-9]+\(' "$header" | grep -v 'VANOShareFree().$' | tr -d '('
    sed -nE 's/^\[\[gnu::weak\]\] .* ([A-Za-z]+)\(.*/VANO::PLATFORM::\1/p' "$diagnosis"
    printf 'VANO::VANOTIFYD::MonitorQueue::%s\n' Delete MonitorQueue Upsert '~MonitorQueue'
}

exported() {
    nm --dynamic --defined-only --demangle "$library" | cut -d' ' -f3- | cut -d'(' -f1
}

[[ $(exported | wc -l) -gt 0 ]] || { echo "no symbols in $library"; exit 1; }
diff --label declared --label exported -u <(expected | sort -u) <(exported | sort -u)
