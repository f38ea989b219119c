#!/usr/bin/env bash
# Times the whole program against its peers; takes about three minutes.
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
cmake --preset release >/dev/null
cmake --build --preset release --target bench_tool
