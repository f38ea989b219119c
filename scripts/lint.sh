#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Checks sources with clang-tidy as .clang-tidy says: those that differ from main (or from the
# commit that is given), with --all every source. Takes a configured build/release, whose
# generated headers are built. A changed header is checked through the sources beside it.
set -euo pipefail
cd "$(dirname "$0")/.."

[ -f build/release/compile_commands.json ] || cmake --preset release >/dev/null
ninja -C build/release exitcodes_header statuses_header textkeys_header >/dev/null
database=build/release/lint
mkdir -p $database
# Clang knows one option less, and would take the compiler's precompiled header for its own.
headers=build/release/tests/support/CMakeFiles/test_headers.dir/cmake_pch.hxx
[ ! -f $headers ] || cp $headers $database/test_headers.hxx
sed -e 's/ -fvect-cost-model=dynamic//' \
  -e "s#-include [^ ]*/cmake_pch.hxx#-include $PWD/$database/test_headers.hxx#" \
  build/release/compile_commands.json >$database/compile_commands.json

if [ "${1:-}" = --all ]; then
  files=$(git ls-files '*.cpp')
else
  base=$(git merge-base HEAD "${1:-main}" 2>/dev/null || git rev-parse HEAD)
  changed=$(git diff --name-only --diff-filter=d "$base" -- '*.cpp' '*.h'; git ls-files -o --exclude-standard '*.cpp' '*.h')
  files=$(for file in $changed; do
    case $file in
      *.cpp) echo "$file" ;;
      *.h) [ ! -f "${file%.h}.cpp" ] || echo "${file%.h}.cpp" ;;
    esac
  done | sort -u)
fi
# What the build does not compile (benches of absent peers) has no command.
files=$(for file in $files; do
  if grep -qF "\"file\": \"$PWD/$file\"" $database/compile_commands.json; then echo "$file"; fi
done)
[ -n "$files" ] || { echo "nothing to check"; exit 0; }

echo "$files" | xargs -n 4 -P "$(nproc)" clang-tidy-16 --quiet -p $database \
  --warnings-as-errors='*' --extra-arg=-Wno-unknown-warning-option
