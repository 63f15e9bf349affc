# shellcheck shell=bash
# A minimal Debian in memory, in namespaces of its own: for scripts that need a whole system to try
# something on. To be sourced; the functions of the second part set or use
#
#   place   a directory with room, mounted by make_system
#   root    the system's root directory in it

# The release of this machine, for which its packages are built.
SUITE=$(. /etc/os-release && echo "${VERSION_CODENAME-}")
readonly SUITE
readonly SIZE=3G
readonly EXIT_CANNOT=77 # the usual code for a skipped test

step() { printf '\n-- %s\n' "$*"; }
fail() { echo "${0##*/}: $*" >&2; exit 1; }
cannot() { echo "${0##*/}: $*" >&2; exit "$EXIT_CANNOT"; }
mistake() { echo "${0##*/}: $*, see --help" >&2; exit 2; }

# --- first part: outside ----------------------------------------------------------------------

check_namespaces() {
    namespaces=(--mount --pid --fork --kill-child --mount-proc --propagation private)
    [ "$EUID" -eq 0 ] || cannot "this needs root"
    unshare "${namespaces[@]}" true 2>/dev/null || cannot "no namespaces on this machine"
}

# Runs this script again in namespaces: with --inside, the place, and the arguments.
enter_namespaces() { # ARGUMENT...
    local status=0
    place=$(mktemp -d)
    unshare "${namespaces[@]}" "$BASH" "$0" --inside "$place" "$@" || status=$?
    rmdir "$place"
    exit "$status"
}

# --- second part: inside ----------------------------------------------------------------------

# Where apt gets Debian's packages of this release: URI and suite, one a line, the release first.
sources() {
    # shellcheck disable=SC2016 # apt expands it
    apt-get indextargets --format '$(REPO_URI) $(RELEASE)' \
        'Created-By: Packages' 'Origin: Debian' 'Component: main' |
        grep -E " $SUITE(-updates|-security)?\$" | sort -u -k 2
}

make_base() { # ROOT
    local mirror
    mirror=$(sources | awk -v suite="$SUITE" '$2 == suite { print $1; exit }')
    [ -n "$mirror" ] || cannot "apt knows no Debian $SUITE: its configuration, or 'apt-get update'"
    debootstrap --variant=minbase --include=ca-certificates "$SUITE" "$1" "$mirror" \
        >"$place/log" 2>&1 || { tail -n 20 "$place/log"; cannot "debootstrap failed"; }
    rm -f "$1"/var/cache/apt/archives/*.deb
}

# What makes the system this machine's for now: where packages come from, and nothing is started.
furnish() { # ROOT
    sources | sed 's/.*/deb & main/' >"$1/etc/apt/sources.list"
    apt-config dump --no-empty --format '%f "%v";%n' Acquire >"$1/etc/apt/apt.conf.d/90machine"
    cp /etc/resolv.conf "$1/etc/resolv.conf"
    printf '#!/bin/sh\nexit 101\n' >"$1/usr/sbin/policy-rc.d"
    chmod 755 "$1/usr/sbin/policy-rc.d"
    echo force-unsafe-io >"$1/etc/dpkg/dpkg.cfg.d/unsafe-io"
    mount -t proc proc "$1/proc"
    mount -t sysfs -o ro sysfs "$1/sys"
    mount -t devpts -o newinstance,ptmxmode=0666,mode=0620 devpts "$1/dev/pts"
}

# The whole system, from the archive BASE when it is there; kept in it when it is not.
make_system() { # PLACE [BASE]
    place=$1
    root=$place/root
    local base=${2-}
    step "a minimal $SUITE"
    mount -t tmpfs -o "mode=755,size=$SIZE" "${0##*/}" "$place"
    mkdir "$root"
    unset TMPDIR # it would be looked for in the new system too
    if [ -n "$base" ] && [ -e "$base" ]; then
        tar --extract --numeric-owner --directory "$root" --file "$base"
        echo "from $base"
    else
        make_base "$root"
        [ -z "$base" ] || tar --create --auto-compress --numeric-owner --directory "$root" --file "$base" .
        echo "made by debootstrap"
    fi
    furnish "$root"
}

in_root() {
    env --ignore-environment PATH=/usr/sbin:/usr/bin:/sbin:/bin HOME=/root LANG=C.UTF-8 \
        DEBIAN_FRONTEND=noninteractive chroot "$root" "$@"
}

apt_in_root() {
    in_root apt-get --quiet=2 --yes --no-install-recommends "$@" >"$place/log" 2>&1 ||
        { cat "$place/log"; fail "apt-get $1 failed"; }
}
