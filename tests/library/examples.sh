#!/usr/bin/env bash
# examples.sh WORK_FOLDER BMP_ROWS GRAPHICS_LIBRARY TOOL [EMULATOR...]: the example programs decode every BMP of samples/,
# at its own size and reduced, to the same picture; and to that of the tool, unless TOOL is empty. What they cannot
# decode they refuse.
set -euo pipefail
samples=$(cd "$(dirname "${BASH_SOURCE[0]}")/../../samples" && pwd)
work=$1 bmp_rows=$2 graphics_library=$3 tool=$4
emulator=("${@:5}")

fail() {
    printf '%s\n' "$*"
    exit 1
}

run() {
    "${emulator[@]}" "$@"
}

# 320 x 240 pixels, in a box of these sides.
expect_picture() {
    local picture=$1 width=$2 height=$3
    run "$bmp_rows" "$picture" "$width" "$height" rows.ppm || fail "bmp_rows fails for $picture"
    run "$graphics_library" "$picture" "$width" "$height" whole.ppm || fail "graphics_library fails for $picture"
    [[ $(head -c 15 rows.ppm | sed -n 2p) == "$width $height" ]] || fail "bmp_rows: wrong size for $picture"
    cmp rows.ppm whole.ppm || fail "the examples differ for $picture at $width x $height"
    [[ -n $tool ]] || return 0
    "$tool" "$picture" --box "${width}x$height" --format rgb --quiet -o tool.ppm || fail "the tool fails for $picture"
    cmp rows.ppm tool.ppm || fail "the examples differ from the tool for $picture at $width x $height"
}

expect_refusal() {
    local picture=$1
    ! run "$bmp_rows" "$picture" 9 9 rows.ppm 2>/dev/null || fail "bmp_rows decodes $picture"
    ! run "$graphics_library" "$picture" 9 9 whole.ppm 2>/dev/null || fail "graphics_library decodes $picture"
}

mkdir -p "$work"
cd "$work"
pictures=0
for picture in "$samples"/*.bmp; do
    expect_picture "$picture" 320 240
    expect_picture "$picture" 160 120
    pictures=$((pictures + 1))
done
[[ $pictures -gt 0 ]] || fail "no samples in $samples"

expect_refusal "$samples/sunset.png"
expect_refusal no-such-file.bmp
printf 'BM' >short.bmp
expect_refusal short.bmp
