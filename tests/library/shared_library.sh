#!/usr/bin/env bash
# shared_library.sh decoder|host|testing FILE: what a built shared library offers to the dynamic linker and asks of it.
# NM and READELF name the tools for its architecture.
set -euo pipefail
export LC_ALL=C
root=$(dirname "${BASH_SOURCE[0]}")/../..
kind=$1
library=$2
failures=0

fail() {
    printf '%s: %s\n' "$library" "$*"
    failures=$((failures + 1))
}

# The names of all functions that public headers declare, sorted.
declared_in() {
    sed -nE 's/^PELM_API [^(]*[ *]([A-Za-z0-9_]+)\(.*/\1/p' "${@/#/$root/include/}" | sort
}

expected_symbols() { # of the decoder library
    sed '/^#/d; /^$/d' "$root/docs/exported_symbols.txt"
}

# nm's names, without versions.
dynamic_symbols() {
    "$NM" -D "$@" "$library" | awk '{ sub(/@.*/, "", $NF); print $NF }' | sort -u
}

dynamic_entries() { # their values, for one kind such as NEEDED
    "$READELF" -dW "$library" | sed -nE "s/.*\($1\).*\[(.*)\]/\1/p"
}

section_size() { # 0 for none
    local size
    size=$("$READELF" -SW "$library" | sed 's/^ *\[ *[0-9]*\] *//' | awk -v name="$1" '$1 == name { print $5 }')
    echo $((16#${size:-0}))
}

exports_exactly() { # a sorted list in standard input
    local difference
    if ! difference=$(diff -u --label expected --label exported - <(dynamic_symbols --defined-only)); then
        fail "the exported symbols are not those expected:"
        printf '%s\n' "$difference"
    fi
}

imports_only_services_and_c_runtime() {
    local name
    while read -r name; do
        case $name in
        memset | memcpy | memmove | memcmp | __stack_chk_fail | __stack_chk_guard) ;;
        raise) ;; # libgcc's division on ARM, when dividing by zero
        __cxa_finalize | __gmon_start__ | _ITM_registerTMCloneTable | _ITM_deregisterTMCloneTable) ;;
        *) declared_in PelmHost.h | grep '^ZOTARPELM_' | grep -qx -- "$name" || fail "needs $name from elsewhere" ;;
        esac
    done < <(dynamic_symbols --undefined-only)
}

needs_only_libc() {
    local needed
    while read -r needed; do
        case $needed in
        libc.so.6 | ld-linux*.so.*) ;; # the loader defines some of the C library's symbols
        *) fail "needs $needed" ;;
        esac
    done < <(dynamic_entries NEEDED)
}

# The start-up files put a pointer into .data and a byte into .bss; the decoder's one variable is a byte
# (frame/processor.cpp), which ARM's compiler puts on the next word.
has_no_more_variables() {
    local pointer=8
    "$READELF" -h "$library" | grep -q 'Class: *ELF32' && pointer=4
    [[ $(section_size .data) -le $pointer ]] || fail "has variables: $(section_size .data) bytes of .data"
    [[ $(section_size .bss) -le 8 ]] || fail "has variables: $(section_size .bss) bytes of .bss"
}

# is_well_linked SONAME: read-only code, its own symbols open to replacement, and the name that applications are linked with.
is_well_linked() {
    [[ $(dynamic_entries SONAME) == "$1" ]] || fail "its soname is '$(dynamic_entries SONAME)', not $1"
    if "$READELF" -dW "$library" | grep -E 'SYMBOLIC|TEXTREL'; then
        fail "has the dynamic entry above"
    fi
}

case $kind in
decoder)
    expected_symbols | sort -c || fail "docs/exported_symbols.txt is not sorted"
    exports_exactly < <(expected_symbols)
    imports_only_services_and_c_runtime
    has_no_more_variables
    is_well_linked libPelmImageDecoder.so.1
    ;;
host)
    exports_exactly < <(declared_in PelmAnimation.h PelmHost.h)
    is_well_linked libPelmHost.so.1
    ;;
testing)
    exports_exactly < <({
        declared_in PelmHost.h | grep '^ZOTARPELM_'
        declared_in PelmHostTesting.h
    } | sort)
    is_well_linked libPelmHostTesting.so.1
    ;;
esac
needs_only_libc
[[ $failures -eq 0 ]]
