#!/usr/bin/env bash
# Tries what the README promises on a fresh distribution: `./dev demo` and `./dev test`, from a clean clone of what is
# committed, in a system that has nothing but git.
#
#   in_distribution.sh bookworm|trixie [COMMAND...]     COMMAND, one word each: demo and test unless they are named
#
# The system is made by debootstrap under build/distribution, which takes root, and stays there to be looked at; the next
# run makes it anew. The source of the date library goes into the clone if it is in .deps/date, for mirrors that have no
# source packages. CMAKE_BUILD_PARALLEL_LEVEL and variables that name a proxy are passed on.

set -euo pipefail

die() {
    printf 'in_distribution: %s\n' "$*" >&2
    exit 2
}

case ${1:-} in
bookworm | trixie) suite=$1 ;;
*) die "name the distribution: bookworm or trixie" ;;
esac
[[ $(id -u) -eq 0 ]] || die "making a system takes root"
command -v debootstrap >/dev/null || die "debootstrap is not installed: apt-get install debootstrap"

# What is mounted is mounted for this process alone, and gone when it ends, however it ends.
if [[ ${KVT_MOUNTS_ARE_PRIVATE:-} != yes ]]; then
    KVT_MOUNTS_ARE_PRIVATE=yes exec unshare --mount --propagation private -- "${BASH_SOURCE[0]}" "$@"
fi

shift
[[ $# -gt 0 ]] || set -- demo test
repository=$(realpath -- "$(dirname -- "${BASH_SOURCE[0]}")/../..")
root=$repository/build/distribution/$suite

rm -rf -- "$root"
mkdir -p "$root"
debootstrap --variant=minbase --include=ca-certificates,git "$suite" "$root"
git clone --quiet --no-local -- "$repository" "$root/kvt"
if [[ -f $repository/.deps/date/src/tz.cpp ]]; then
    mkdir -p "$root/kvt/.deps"
    cp -R -- "$repository/.deps/date" "$root/kvt/.deps/date"
fi

# minbase has no names of hosts of its own, and the kernel's file systems are not in it.
cp -- /etc/resolv.conf /etc/hosts "$root/etc/"
mount -t proc proc "$root/proc"
mount --rbind /sys "$root/sys"
mount -t devpts -o newinstance,ptmxmode=0666 devpts "$root/dev/pts"
mount -t tmpfs tmpfs "$root/dev/shm"

passed_on=()
for variable in CMAKE_BUILD_PARALLEL_LEVEL http_proxy https_proxy no_proxy; do
    if [[ -n ${!variable:-} ]]; then
        passed_on+=("$variable=${!variable}")
    fi
done
for command in "$@"; do
    printf '== %s: ./dev %s\n' "$suite" "$command"
    chroot "$root" /usr/bin/env -i HOME=/root PATH=/usr/sbin:/usr/bin:/sbin:/bin "${passed_on[@]}" \
        /kvt/dev "$command" </dev/null
done
