#!/usr/bin/env bash
# What gdb shows of the program in tests/gdb with the pretty-printers of an installed copy, which it has to find by
# itself: no command here loads them.
#
#   gdb_printers.sh BUILD SOURCE WORK COMPILER CMAKE GDB install|process|core|stripped|plain_charset|before_any_encoding
#
# `install` comes first.

set -euo pipefail
export LC_ALL=C.UTF-8

build=$1
source=$2
work=$3
compiler=$4
cmake=$5
gdb=$6
prefix=$work/prefix

library_dir() {
    dirname "$(find "$prefix" -name libkvt.so)"
}

install() {
    local libdir flavour=()
    rm -rf "$work"
    mkdir -p "$work"
    "$cmake" --install "$build" --prefix "$work/stripped" --strip >"$work/install.log"
    "$cmake" --install "$build" --prefix "$prefix" >>"$work/install.log"
    libdir=$(library_dir)
    [[ -f $prefix/share/gdb/auto-load$libdir/$(basename "$(realpath "$libdir/libkvt.so")")-gdb.py ]]
    # clang leaves out a type that it takes to be described elsewhere, unless it gets this flag.
    if "$compiler" --version | grep -q clang; then
        flavour=(-fstandalone-debug)
    fi
    "$compiler" -std=c++17 -O0 -g "${flavour[@]}" "-I$prefix/include" "$source/shown.cpp" -o "$work/shown" \
        "-L$libdir" -lkvt "-Wl,-rpath,$libdir"
}

# run_gdb ARGUMENT...: gdb without anybody's settings, which trusts the prefix and looks for scripts in it. With the
# prefix /usr gdb does both by itself.
run_gdb() {
    "$gdb" -nx -batch -iex "add-auto-load-safe-path $prefix" \
        -iex "add-auto-load-scripts-directory $prefix/share/gdb/auto-load" \
        -iex 'set width 0' -iex 'set confirm off' -iex 'set debuginfod enabled off' \
        -iex "set environment LD_LIBRARY_PATH $(library_dir)" "$@" 2>&1
}

# compare FILE: what comes in is what the file says, line by line.
compare() {
    diff -u "$1" -
}

# What was printed between the marks.
between_marks() {
    sed -n '/^--- begin$/,/^--- end$/p' | sed '1d;$d'
}

# show COMMAND... : what the commands print when the program has come to where all objects are made.
show() {
    local command arguments=()
    for command in "$@"; do
        arguments+=(-ex "$command")
    done
    run_gdb -ex 'break stopHere' -ex run -ex up -ex 'echo --- begin\n' "${arguments[@]}" -ex 'echo --- end\n' \
        "$work/shown" | tee "$work/last.log" | between_marks
}

process() {
    # Nothing may be called in the program.
    show 'set may-call-functions off' 'info locals' | compare "$source/shown.txt"
    # A value that is nowhere in memory, the limit on elements, and a printer set aside.
    show 'set $copy = utf16' 'print $copy' 'set print elements 4' 'print utf8' 'print utf32' 'print array' \
        'print/r fixed' |
        compare "$source/special.txt"
}

core() {
    show "generate-core-file $work/core" >/dev/null
    run_gdb -ex 'frame function main' -ex 'echo --- begin\n' -ex 'info locals' -ex 'echo --- end\n' \
        "$work/shown" "$work/core" | tee "$work/last.log" | between_marks | compare "$source/shown.txt"
}

# The library as distributions package it, without any symbol but the exported ones.
stripped() {
    prefix=$work/stripped
    local libdir
    libdir=$(library_dir)
    if readelf -S "$libdir/libkvt.so" | grep -E '\.(symtab|debug_info)'; then
        echo "the library is not stripped"
        return 1
    fi
    show 'info sharedlibrary libkvt' | grep -F "$libdir/libkvt.so"
    show 'info locals' >"$work/stripped.txt"
    # Only the library's own type information describes arrays. Older gdb stops there, and newer asks the printers.
    local arrays='^$'
    if grep -q 'rray = <incomplete type>$' "$work/stripped.txt"; then
        arrays='rray = '
    fi
    grep -v "$arrays" "$source/shown.txt" | diff -u - <(grep -v "$arrays" "$work/stripped.txt")
}

plain_charset() {
    LC_ALL=C show 'print utf8' 'print russian' 'print transcoding' | compare "$source/plain_charset.txt"
}

before_any_encoding() {
    run_gdb -ex 'break stopEarly' -ex run -ex up -ex 'echo --- begin\n' -ex 'print early' -ex 'print earlyText' \
        -ex 'print earlyEncoding' -ex 'echo --- end\n' "$work/shown" |
        tee "$work/last.log" | between_marks | compare "$source/early.txt"
}

case $7 in
install | process | core | stripped | plain_charset | before_any_encoding) "$7" ;;
*) exit 2 ;;
esac
