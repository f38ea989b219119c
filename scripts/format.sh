#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Formats all C++ of the tree as .clang-format says; with --check it changes nothing, prints what
# differs and fails.
set -euo pipefail
cd "$(dirname "$0")/.."

mode=(-i)
[ "${1:-}" = --check ] && mode=(--dry-run --Werror --ferror-limit=3)
find . \( -path ./build -o -path ./.git \) -prune -o \( -name '*.cpp' -o -name '*.h' \) -print0 |
  xargs -0 -n 40 -P "$(nproc)" clang-format-16 "${mode[@]}"
