# SPDX-License-Identifier: Apache-2.0
# Fresh Debian systems to try things in, for scripts that source this. Needs root and debootstrap.

# makeRoot RELEASE DIRECTORY: a base system (bookworm, trixie, …) in a new directory. What was
# bootstrapped is kept as build/releases/RELEASE.tar for the next time. `top` is the
# repository.
makeRoot()
{
    for program in debootstrap unshare git tar; do
        if ! command -v "$program" >/dev/null; then
            echo "$program is needed for a fresh Debian; please install it." >&2
            exit 1
        fi
    done
    if [ "$(id -u)" -ne 0 ]; then
        echo "A base system is bootstrapped by root only." >&2
        exit 1
    fi
    base=$top/build/releases/$1.tar
    if [ ! -f "$base" ]; then
        mkdir -p "$top/build/releases"
        if ! debootstrap --variant=minbase "$1" "$2.base" >"$2.log" 2>&1; then
            tail -n 20 "$2.log" >&2
            echo "The release $1 could not be bootstrapped." >&2
            exit 1
        fi
        tar -C "$2.base" -cf "$base.part" .
        mv "$base.part" "$base"
        rm -rf "$2.base"
    fi
    mkdir "$2"
    tar -C "$2" -xf "$base"
    # No package starts its services.
    printf '#!/bin/sh\nexit 101\n' >"$2/usr/sbin/policy-rc.d"
    chmod 755 "$2/usr/sbin/policy-rc.d"
}

# inRoot DIRECTORY COMMAND...: runs it in there. The mounts are in a namespace of their own, and
# go with it. Of the environment, DEB_BUILD_OPTIONS is passed on.
inRoot()
{
    unshare --mount --propagation private sh -euc '
        root=$1
        shift
        mount --rbind /dev "$root/dev"
        mount --rbind /sys "$root/sys"
        mount -t proc proc "$root/proc"
        exec env -i PATH=/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin HOME=/root \
            LANG=C.UTF-8 DEBIAN_FRONTEND=noninteractive DEB_BUILD_OPTIONS="${DEB_BUILD_OPTIONS-}" \
            chroot "$root" "$@" </dev/null' sh "$@"
}
