#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Formats all C++ in the tree with clang-format. With --check, changes nothing, prints the
# differences and fails if there are any.
set -euo pipefail
cd "$(dirname "$0")/.."

mode=(-i)
[ "${1:-}" = --check ] && mode=(--dry-run --Werror --ferror-limit=3)
find . \( -path ./build -o -path ./.git \) -prune -o \( -name '*.cpp' -o -name '*.h' \) -print0 |
  xargs -0 -n 40 -P "$(nproc)" clang-format-16 "${mode[@]}"
