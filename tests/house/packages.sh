#!/usr/bin/env bash
# Tries the Debian packages that `./dev package` made in a fresh system of this machine's own distribution: lintian has no
# errors, they are installed, run, serve a program that is built with them, and leave nothing behind.
#
#   packages.sh [FOLDER]      with the packages; build/package unless it is named
#
# The system is made by debootstrap, which takes root, and goes away at the end.

set -euo pipefail

die() {
    printf 'packages: %s\n' "$*" >&2
    exit 2
}

[[ $(id -u) -eq 0 ]] || die "making a system takes root"
command -v debootstrap >/dev/null || die "debootstrap is not installed: apt-get install debootstrap"
if [[ ${KVT_MOUNTS_ARE_PRIVATE:-} != yes ]]; then
    KVT_MOUNTS_ARE_PRIVATE=yes exec unshare --mount --propagation private -- "${BASH_SOURCE[0]}" "$@"
fi

repository=$(realpath -- "$(dirname -- "${BASH_SOURCE[0]}")/../..")
packages=$(realpath -- "${1:-$repository/build/package}")
suite=$(. /etc/os-release && printf '%s' "$VERSION_CODENAME")
root=$(mktemp -d "${TMPDIR:-/tmp}/kvt-packages-XXXXXX")
chmod 755 "$root"
trap 'umount -R "$root/proc" 2>/dev/null || true; rm -rf -- "$root"' EXIT

printf '== lintian\n'
if command -v lintian >/dev/null; then
    lintian --fail-on error "$packages"/*.deb
else
    printf 'left out: lintian is not installed\n'
fi

printf '== a fresh %s\n' "$suite"
debootstrap --variant=minbase --include=ca-certificates "$suite" "$root" >/dev/null
cp -- /etc/resolv.conf /etc/hosts "$root/etc/"
mount -t proc proc "$root/proc"
mkdir "$root/packages"
cp -- "$packages"/*.deb "$root/packages/"
cp -- "$repository/tests/consumer/consumer.cpp" "$root/packages/"

inside() {
    chroot "$root" /usr/bin/env -i HOME=/root PATH=/usr/sbin:/usr/bin:/sbin:/bin DEBIAN_FRONTEND=noninteractive \
        ${http_proxy:+http_proxy="$http_proxy"} ${https_proxy:+https_proxy="$https_proxy"} "$@" </dev/null
}

printf '== installed\n'
inside apt-get -q update >/dev/null
inside sh -c 'apt-get -q install -y --no-install-recommends /packages/kvt_*.deb /packages/libkvt0_*.deb' >/dev/null
inside kvt --version
[[ $(inside sh -c 'printf "M\374ller" | kvt convert --from windows-1252 --to UTF-8') == Müller ]] ||
    die "the installed command does not convert"
inside sh -c 'apt-get -q install -y --no-install-recommends /packages/libkvt-dev_*.deb /packages/kvt-doc_*.deb \
    g++ pkg-config' >/dev/null
inside sh -c 'g++ -std=c++20 -o /packages/consumer /packages/consumer.cpp $(pkg-config --cflags --libs kvt) &&
    /packages/consumer'

printf '== removed\n'
inside apt-get -q purge -y kvt libkvt0 libkvt-dev kvt-doc >/dev/null
left=$(inside find / -xdev -name '*kvt*' -not -path '/packages*' -not -path '/proc/*' -not -path '/var/log/*' \
    -not -path '/var/cache/*')
[[ -z $left ]] || die "left behind: $left"
printf 'the packages install, run and go\n'
