#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Builds the Debian packages in build/package.
set -euo pipefail
cd "$(dirname "$0")/.."

scripts/setup.sh
cmake --preset package >/dev/null
cmake --build --preset package
cd build/package
rm -f ./*.deb
cpack -G DEB
if command -v lintian >/dev/null; then
  lintian --fail-on error ./*.deb
fi
