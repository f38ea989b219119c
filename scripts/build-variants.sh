#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Builds everything with the second compiler and with each build type, without presets. Installs
# each build and runs a job there. Takes an hour on two cores and keeps build/variants-NAME.
# Arguments select variants by name.
#
#   default      no build type: must be optimised
#   Release, Debug, MinSizeRel       g++
#   clang        clang++-14, Release
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
variants=("$@")
[ $# -gt 0 ] || variants=(default Release Debug MinSizeRel clang)

for variant in "${variants[@]}"; do
  build=build/variants-$variant
  options=()
  case $variant in
    default) ;;
    clang) options=(-DCMAKE_BUILD_TYPE=Release -DCMAKE_C_COMPILER=clang-14
      -DCMAKE_CXX_COMPILER=clang++-14) ;;
    *) options=(-DCMAKE_BUILD_TYPE="$variant") ;;
  esac
  echo "== $variant"
  cmake -S . -B "$build" -G Ninja -DCMAKE_EXPORT_COMPILE_COMMANDS=ON "${options[@]}" >/dev/null
  cmake --build "$build"
  if [ "$variant" != Debug ] &&
    grep -F '/cli/main.cpp' "$build/compile_commands.json" | grep -qv -e ' -O[23s]'; then
    echo "$variant is not optimised" >&2
    exit 1
  fi
  rm -rf "$build/prefix"
  cmake --install "$build" --prefix "$PWD/$build/prefix" >/dev/null
  scripts/try-installed.sh "$build/prefix"
done
