#!/usr/bin/env bash
# Verifies a job with the programs that `cmake --install` put into a prefix, and with nothing in the
# environment that leads to a suite: measured by the virtual instrument, then shown.
#
#   try-installed.sh PREFIX
set -euo pipefail
cd "$(dirname "$0")/.."

prefix=$(cd "$1" && pwd)
settings=$prefix/lib/tintgate/root/Library/Preferences/NerovaMeasure.conf
profile=$(find /usr/share/color/icc/ghostscript -name default_cmyk.icc)
place=$(mktemp -d)
trap 'rm -rf "$place"' EXIT
mkdir "$place/tmp"
printf 'instrument = virtual\nprofile = %s\nerror = 0.4\n' "$profile" >"$settings"

env -i HOME="$place" TMPDIR="$place/tmp" PATH="$prefix/bin:/usr/bin:/bin" \
  ASAN_OPTIONS="${ASAN_OPTIONS:-}" LSAN_OPTIONS="${LSAN_OPTIONS:-}" \
  TINTGATE_STORE="$place/store" JOB="$place/job" PROFILE="$profile" bash -euo pipefail <<'INSIDE'
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
