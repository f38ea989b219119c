#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Builds everything and runs all tests, first as delivered, then under the address and
# undefined-behaviour sanitizers, and lints what is not committed yet. Arguments select other presets
# by name.
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
presets=("$@")
if [ ${#presets[@]} -eq 0 ]; then
  presets=(release asan)
fi
for preset in "${presets[@]}"; do
  echo "== $preset"
  cmake --preset "$preset" >/dev/null
  cmake --build --preset "$preset"
  ctest --preset "$preset" --parallel "$(nproc)"
done
scripts/lint.sh HEAD
