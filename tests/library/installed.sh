#!/usr/bin/env bash
# installed.sh BUILD_FOLDER CONFIGURATION WORK_FOLDER GENERATOR OPTION COMPILER [EMULATOR...]: what `cmake --install`
# leaves is found by CMake and by pkg-config, wherever it lies, and a C program that links it, shared or static, decodes
# a sample. OPTION names the build's toolchain file, if it has one, to CMake.
set -euo pipefail
root=$(cd "$(dirname "${BASH_SOURCE[0]}")/../.." && pwd)
build=$1 configuration=$2 work=$3 generator=$4 option=$5 compiler=$6
emulator=("${@:7}")

fail() {
    printf '%s\n' "$*"
    exit 1
}

expect_picture() {
    local program=$1
    rm -f rows.ppm
    LD_LIBRARY_PATH='' "${emulator[@]}" "./$program" "$root/samples/sunset.bmp" 160 120 rows.ppm || fail "$program fails"
    [[ $(sed -n '2{p;q}' rows.ppm) == '160 120' ]] || fail "$program: wrong size"
    [[ -f first.ppm ]] || cp rows.ppm first.ppm
    cmp rows.ppm first.ppm || fail "$program: another picture"
}

rm -rf "$work"
mkdir -p "$work"
cd "$work"
cmake --install "$build" --config "$configuration" --prefix "$work/first" >install.log || fail 'not installed'
mv first moved
package=$(cd "$(dirname "$(find "$work/moved" -name PelmImageDecoderConfig.cmake)")" && pwd)

cat >CMakeLists.txt <<'EOF'
cmake_minimum_required(VERSION 3.25)
project(user LANGUAGES C)
find_package(PelmImageDecoder 0.1 REQUIRED)
add_executable(shared rows.c)
target_link_libraries(shared Pelm::PelmImageDecoder Pelm::PelmHost)
add_executable(static rows.c)
target_link_libraries(static Pelm::PelmImageDecoderStatic Pelm::PelmHostStatic)
EOF
cp "$root/examples/bmp_rows.c" rows.c
cmake -G "$generator" -B . -DPelmImageDecoder_DIR="$package" -DCMAKE_C_COMPILER="$compiler" "$option" \
    >configure.log 2>&1 || fail "$(cat configure.log)"
cmake --build . >build.log 2>&1 || fail "$(cat build.log)"
expect_picture shared
expect_picture static

if ! command -v pkg-config >/dev/null; then
    echo 'pkg-config is not installed: not tried'
    exit
fi
PKG_CONFIG_LIBDIR=$(dirname "$(find "$work/moved" -name PelmHost.pc)")
export PKG_CONFIG_LIBDIR
unset PKG_CONFIG_PATH
eval "flags=($(pkg-config --cflags --libs PelmImageDecoder PelmHost))" # quoted by pkg-config
"$compiler" rows.c "${flags[@]}" -Wl,-rpath,"$(pkg-config --variable=libdir PelmHost)" -o by-pkg-config ||
    fail 'pkg-config names other flags than are needed'
expect_picture by-pkg-config
