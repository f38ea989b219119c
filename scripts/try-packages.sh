#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Installs the packages of scripts/package.sh in a fresh Debian 12 without a compiler and verifies a
# job there: measures it with the virtual instrument, then shows it. Then installs a compiler and
# builds the example of libtintgate-dev. Needs root, debootstrap and a mirror.
#
#   try-packages.sh [FOLDER]      a folder for the root, which is kept (default: a temporary one)
set -euo pipefail
cd "$(dirname "$0")/.."

packages=(build/package/*.deb)
[ -e "${packages[0]}" ] || { echo "There are no packages; run scripts/package.sh first" >&2; exit 1; }
root=${1:-$(mktemp -d)}
leave() {
  umount "$root/proc" 2>/dev/null || true
  [ $# -gt 0 ] || rm -rf "$root"
}
trap 'leave '"${1:+kept}" EXIT

chmod 755 "$root"  # Otherwise only its owner could enter "/".
[ -e "$root/bin/sh" ] || debootstrap --variant=minbase bookworm "$root" >/dev/null
mount -t proc proc "$root/proc"
cp /etc/resolv.conf "$root/etc/"
mkdir -p "$root/packages"
cp "${packages[@]}" "$root/packages/"
mkdir -p "$root/packages/dev"
mv "$root"/packages/libtintgate-dev_* "$root/packages/dev/"

chroot "$root" bash -euo pipefail <<'INSIDE'
export DEBIAN_FRONTEND=noninteractive LANG=C
apt-get update -q >/dev/null
apt-get install -y -q --no-install-recommends /packages/*.deb \
  python3 icc-profiles-free libgs-common >/dev/null
! command -v gcc g++ c++ cc >/dev/null || { echo "there is a compiler"; exit 1; }

useradd --create-home --shell /bin/bash press
mkdir -p /etc/tintgate
profile=$(find /usr/share/color/icc/ghostscript -name default_cmyk.icc)
printf 'instrument = virtual\nprofile = %s\nerror = 0.4\n' "$profile" >/etc/tintgate/measure.conf
su press -c "profile='$profile' bash -euo pipefail" <<'PRESS'
cd
cp /usr/share/color/icc/TR006.ti3 proof.txt
tintgate-check -t FOGRA39L proof.txt --page
grep -c . proof.html
export TINTGATE_STORE=$HOME/store
tintgate-store make
tintgate-store user add anna --password-file - <<<gate
tintgate-store key set system System/Jdf/Updates int 4
/usr/share/doc/tintgate/example-job/make-job.py job --unmeasured --references "$profile"
tintgate-store import job/tickets.json
tintgate-store file put job/server /server
code=0
Tintgate "KEY_KZ_HOST:=:$TINTGATE_STORE" 0 7 en_US 0 gate anna || code=$?
tintgate-store jobs
folder=/tmp/tintgate-$(id -u)/Tintgate/JobID_7
for _ in $(seq 100); do
  compgen -G "$folder/report-*.html" && break
  sleep 0.1
done
tintgate-report --text "$folder/output.json" | head -n 12
tintgate-report "$folder/output.json" --label label.pdf --pdf certificate.pdf
ls -l label.pdf certificate.pdf
man -w Tintgate tintgate-check tintgate-store tintgate-report NerovaMeasure NerovaVerify 2>/dev/null || true
echo "exit code of the job: $code"
exit "$code"
PRESS

apt-get install -y -q --no-install-recommends /packages/dev/*.deb g++ pkg-config >/dev/null
# shellcheck disable=SC2046 # Options are words.
g++ -std=c++17 -Wall -Wextra -Werror /usr/share/doc/libtintgate-dev/examples/compare.cpp \
  $(pkg-config --cflags --libs tintgate) -o /tmp/compare
/tmp/compare /usr/share/color/icc/FOGRA39L.ti3 /usr/share/color/icc/FOGRA39L.ti3 \
  /usr/share/tintgate/presets/CVP_0002.xml
INSIDE
