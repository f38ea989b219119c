#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Tests the result of `cmake --install` in a prefix. Verifies a job without environment variables
# that refer to a suite: measures it with the virtual instrument, then shows it. Then builds the
# library's example against the installed headers and library.
#
#   try-installed.sh PREFIX [COMPILER OPTION...]
set -euo pipefail
cd "$(dirname "$0")/.."

prefix=$(cd "$1" && pwd)
shift
[ $# -gt 0 ] || set -- g++
settings=$prefix/lib/tintgate/root/Library/Preferences/NerovaMeasure.conf
profile=$(find /usr/share/color/icc/ghostscript -name default_cmyk.icc)
place=$(mktemp -d)
trap 'rm -rf "$place"' EXIT
mkdir "$place/tmp"
printf 'instrument = virtual\nprofile = %s\nerror = 0.4\n' "$profile" >"$settings"

env -i HOME="$place" TMPDIR="$place/tmp" PATH="$prefix/bin:/usr/bin:/bin" \
  ASAN_OPTIONS="${ASAN_OPTIONS:-}" LSAN_OPTIONS="${LSAN_OPTIONS:-}" \
  TINTGATE_STORE="$place/store" JOB="$place/job" PROFILE="$profile" bash -euo pipefail <<'INSIDE'
cp /usr/share/color/icc/TR006.ti3 "$HOME/proof.txt"
tintgate-check -t FOGRA39L "$HOME/proof.txt" --page >/dev/null
[ -s "$HOME/proof.html" ]
tintgate-store make
tintgate-store user add anna --password-file - <<<gate
docs/example-job/make-job.py "$JOB" --unmeasured --references "$PROFILE"
tintgate-store import "$JOB/tickets.json"
tintgate-store file put "$JOB/server" /server
Tintgate "KEY_KZ_HOST:=:$TINTGATE_STORE" 0 7 en_US 0 gate anna
tintgate-store jobs | grep -w passed
folder=$TMPDIR/Tintgate/JobID_7
for _ in $(seq 100); do
  compgen -G "$folder/report-*.html" && exit
  sleep 0.1
done
echo "there is no page in $folder" >&2
exit 1
INSIDE

pc=$(find "$prefix" -name tintgate.pc)
PKG_CONFIG_PATH=$(dirname "$pc")
export PKG_CONFIG_PATH
# shellcheck disable=SC2046 # Options are words.
"$@" -std=c++17 -Wall -Wextra -Werror "$prefix/share/doc/libtintgate-dev/examples/compare.cpp" \
  $(pkg-config --cflags --libs tintgate) \
  "-Wl,-rpath,$(pkg-config --variable=libdir tintgate)" -o "$place/compare"
sets=/usr/share/color/icc
"$place/compare" "$sets/FOGRA39L.ti3" "$sets/FOGRA39L.ti3" \
  "$prefix/share/tintgate/presets/CVP_0002.xml"
code=0
"$place/compare" "$sets/FOGRA39L.ti3" "$sets/FOGRA28L.ti3" \
  "$prefix/share/tintgate/presets/CVP_0002.xml" || code=$?
[ "$code" -eq 1 ]
words=$("$place/compare" "$sets/FOGRA39L.ti3" "$place/none" \
  "$prefix/share/tintgate/presets/CVP_0002.xml" 2>&1) || true
grep "An input file is missing" <<<"$words"
