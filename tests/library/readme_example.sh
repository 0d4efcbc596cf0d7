#!/usr/bin/env bash
# readme_example.sh WORK_FOLDER COMPILER [OPTION...] [-- EMULATOR...]: the first C block of README.md compiles as strict
# C99 with the given options, and decodes: first the BMP built here, then every BMP of samples/.
# The program takes the name of a BMP file as its argument and returns 0 when it was decoded.
set -euo pipefail
root=$(cd "$(dirname "${BASH_SOURCE[0]}")/../.." && pwd)
work=$1
shift
compile=()
while [[ $# -gt 0 && $1 != -- ]]; do
    compile+=("$1")
    shift
done
emulator=("${@:2}")

fail() {
    printf 'README.md: %s\n' "$*"
    exit 1
}

mkdir -p "$work"
cd "$work"
[[ -f $root/README.md ]] || fail 'not found'
awk '{ sub(/\r$/, "") }
     inside && /^ *```/ { exit }
     inside
     /^ *```[cC]( |$)/ { inside = 1 }' "$root/README.md" >example.c
grep -q 'main *(' example.c || fail 'its first ```c block, which must be a whole program, is missing or has no main'

"${compile[0]}" -std=c99 -pedantic -Wall -Wextra -Werror example.c -o example "${compile[@]:1}" ||
    fail 'the C example does not compile'

# 2 x 2 pixels, 24 bits: red and green below blue and white.
{
    printf 'BM\x46\0\0\0\0\0\0\0\x36\0\0\0'
    printf '\x28\0\0\0\x02\0\0\0\x02\0\0\0\x01\0\x18\0\0\0\0\0\x10\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0'
    printf '\0\0\xff\0\xff\0\0\0\xff\0\0\xff\xff\xff\0\0'
} >tiny.bmp

for picture in tiny.bmp "$root"/samples/*.bmp; do
    [[ -f $picture ]] || continue
    "${emulator[@]}" ./example "$picture" || fail "the C example fails for $picture"
done
