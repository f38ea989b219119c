#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Installs the Debian packages for building, testing and the demo. Fast if they are all there.
set -euo pipefail

packages=(
  # To build
  g++ cmake ninja-build pkg-config python3 libwxgtk3.2-dev liblcms2-dev libpugixml-dev
  nlohmann-json3-dev libicu-dev libplist-dev libmd-dev libsqlite3-dev libsodium-dev libcli11-dev
  libexpat1-dev libpq-dev libjs-chart.js libsystemd-dev libtomlplusplus-dev libxxhash-dev
  libcairo2-dev libglib2.0-dev libpango1.0-dev libqrencode-dev zlib1g-dev
  # To test and to measure
  libgtest-dev libgmock-dev libbenchmark-dev python3-jsonschema argyll liblcms2-utils chromium
  postgresql pgbouncer dbus clang-format-16 clang-tidy-16 poppler-utils zbar-tools
  fonts-dejavu-core fonts-droid-fallback
  # Data of printing conditions, and CMYK profiles
  icc-profiles-free libgs-common
)

installed=$(dpkg-query --show --showformat='${db:Status-Status} ${Package}\n' "${packages[@]}" \
  2>/dev/null | sed -n 's/^installed //p' || true)
missing=()
for package in "${packages[@]}"; do
  grep -qxF "$package" <<<"$installed" || missing+=("$package")
done
if [ ${#missing[@]} -eq 0 ]; then
  exit 0
fi

if [ "$(id -u)" -eq 0 ]; then
  as_root=()
elif command -v sudo >/dev/null; then
  as_root=(sudo)
else
  echo "These Debian packages are missing, and there is neither root nor sudo to install them:" >&2
  echo "  ${missing[*]}" >&2
  echo "Have them installed (apt-get install ...), then run this again." >&2
  exit 1
fi
echo "Installing ${missing[*]}"
"${as_root[@]}" apt-get update -q
"${as_root[@]}" env DEBIAN_FRONTEND=noninteractive apt-get install -y -q --no-install-recommends \
  "${missing[@]}"
