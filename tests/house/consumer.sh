#!/usr/bin/env bash
# Builds and runs the program in tests/consumer against an installed copy of the library.
#
#   consumer.sh BUILD SOURCE WORK COMPILER CMAKE install|find_package|pkg_config|versioned|command
#
# `install` comes first. It installs under one prefix and moves the copy to another, so that a path of the machine
# that built it would show.

set -euo pipefail

build=$1
source=$2
work=$3
compiler=$4
cmake=$5
prefix=$work/moved/prefix

library_dir() {
    dirname "$(find "$prefix" -name libkvt.so)"
}

install_copy() {
    rm -rf "$work"
    mkdir -p "$work/moved"
    "$cmake" --install "$build" --prefix "$work/first" >"$work/install.log"
    mv "$work/first" "$prefix"
}

find_package() {
    rm -rf "$work/find_package"
    "$cmake" -S "$source" -B "$work/find_package" -G Ninja \
        "-DCMAKE_CXX_COMPILER=$compiler" "-DCMAKE_PREFIX_PATH=$prefix" -DCMAKE_CXX_STANDARD=17
    grep -F "$prefix/" "$work/find_package/CMakeCache.txt" | grep -F kvt_DIR
    "$cmake" --build "$work/find_package"
    "$work/find_package/consumer"
}

pkg_config() {
    local libdir
    libdir=$(library_dir)
    export PKG_CONFIG_PATH=$libdir/pkgconfig
    pkg-config --modversion kvt
    # The flags are a list of words.
    # shellcheck disable=SC2046
    "$compiler" ${CXXFLAGS:-} -std=c++17 "$source/consumer.cpp" -o "$work/pkg_config_consumer" \
        $(pkg-config --cflags --libs kvt)
    LD_LIBRARY_PATH=$libdir "$work/pkg_config_consumer"
}

versioned() {
    local libdir soname
    libdir=$(library_dir)
    soname=$(objdump -p "$libdir/libkvt.so" | sed -n 's/^ *SONAME *//p')
    echo "soname: $soname"
    [[ $soname == libkvt.so.[0-9]* ]]
    [[ $(readlink "$libdir/libkvt.so") == "$soname" ]]
    [[ $(readlink "$libdir/$soname") == "$soname".*.* ]]
}

command() {
    "$prefix/bin/kvt" --version
    for page in man/man1/kvt.1 man/man1/kvt-convert.1 bash-completion/completions/kvt zsh/site-functions/_kvt \
        fish/vendor_completions.d/kvt.fish; do
        [[ -s $prefix/share/$page ]]
    done
}

case $6 in
install) install_copy ;;
find_package | pkg_config | versioned | command) "$6" ;;
*) exit 2 ;;
esac
