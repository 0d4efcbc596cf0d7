#!/usr/bin/env bash
# header.sh HEADER COMPILER OPTION...: a public header compiles alone, whatever else the program includes.
set -euo pipefail
printf '#include "%s"\n' "$1" | "${@:2}" -pedantic -Wall -Wextra -Wconversion -Werror -fsyntax-only -
