#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Builds the tool and demonstrates it on real data from Debian packages: characterization data of
# printing conditions, and CMYK profiles. First it compares files, then it verifies the jobs of a
# print room. The results stay in build/demo.
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
cmake --preset release >/dev/null
cmake --build --preset release --target tintgate-check Tintgate tintgate-store tintgate-report ComGUI \
  NerovaMeasure viewer plist-reader
python3 scripts/demo_check.py build/release/bin/tintgate-check build/demo/check
python3 scripts/demo.py build/release/bin/Tintgate build/demo/files
exec python3 scripts/demo_jobs.py build/release build/demo/jobs
