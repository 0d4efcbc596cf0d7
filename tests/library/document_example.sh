#!/usr/bin/env bash
# document_example.sh DOCUMENT bmp|png WORK_FOLDER COMPILER [OPTION...] [-- EMULATOR...]: the first C block of a document
# compiles as strict C99 with the given options, and succeeds with every file of samples/ of that format; with a BMP that
# is built here, too.
# The program takes the name of such a file as its argument and returns 0 when all is well.
set -euo pipefail
root=$(cd "$(dirname "${BASH_SOURCE[0]}")/../.." && pwd)
document=$1 format=$2 work=$3
shift 3
compile=()
while [[ $# -gt 0 && $1 != -- ]]; do
    compile+=("$1")
    shift
done
emulator=("${@:2}")

fail() {
    printf '%s: %s\n' "$document" "$*"
    exit 1
}

mkdir -p "$work"
cd "$work"
[[ -f $root/$document ]] || fail 'not found'
awk '{ sub(/\r$/, "") }
     inside && /^ *```/ { exit }
     inside
     /^ *```[cC]( |$)/ { inside = 1 }' "$root/$document" >example.c
grep -q 'main *(' example.c || fail 'its first ```c block, which must be a whole program, is missing or has no main'

"${compile[0]}" -std=c99 -pedantic -Wall -Wextra -Werror example.c -o example "${compile[@]:1}" ||
    fail 'the C example does not compile'

# 2 x 2 pixels, 24 bits: red and green below blue and white.
{
    printf 'BM\x46\0\0\0\0\0\0\0\x36\0\0\0'
    printf '\x28\0\0\0\x02\0\0\0\x02\0\0\0\x01\0\x18\0\0\0\0\0\x10\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0'
    printf '\0\0\xff\0\xff\0\0\0\xff\0\0\xff\xff\xff\0\0'
} >tiny.bmp

pictures=0
for picture in tiny.bmp "$root"/samples/*; do
    [[ $picture == *."$format" && -f $picture ]] || continue
    "${emulator[@]}" ./example "$picture" || fail "the C example fails for $picture"
    pictures=$((pictures + 1))
done
[[ $pictures -gt 0 ]] || fail "no ${format}s to try it with"
