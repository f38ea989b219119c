#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Builds everything and runs all tests: as it is delivered, then under the address and
# undefined-behaviour sanitizers. Names of presets as arguments choose others.
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
