#!/usr/bin/env bash
# Installs every Debian package the build, the tests and the benchmarks need.
# Idempotent and non-interactive: packages already present are not touched.
set -euo pipefail
packages=(build-essential cmake pkg-config libfftw3-dev libxml2-dev libxml2-utils
          libexpat1-dev libtiff-dev libgeotiff-dev googletest libgtest-dev libgmock-dev
          libbenchmark-dev gdal-bin python3
          clang-14 libfuzzer-14-dev valgrind)
missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done
if [ ${#missing[@]} -eq 0 ]; then
  exit 0
fi
SUDO=""
if [ "$(id -u)" -ne 0 ]; then SUDO="sudo"; fi
export DEBIAN_FRONTEND=noninteractive
$SUDO apt-get update -qq
$SUDO apt-get install -y -qq --no-install-recommends "${missing[@]}"
