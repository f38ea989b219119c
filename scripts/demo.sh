#!/usr/bin/env bash
# Builds the tool and shows it at work on real data: characterisations of printing conditions, and
# CMYK profiles, as Debian ships them. The result files stay in build/demo.
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
cmake --preset release >/dev/null
cmake --build --preset release --target Tintgate
exec python3 scripts/demo.py build/release/bin/Tintgate build/demo
