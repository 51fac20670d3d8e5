#!/usr/bin/env bash
# Installs the Debian packages the build needs, when some are missing.
set -euo pipefail
packages=(build-essential cmake pkg-config googletest libgtest-dev libgmock-dev libbenchmark-dev
          libcli11-dev nlohmann-json3-dev libzip-dev zip unzip clang lld libclang-rt-14-dev python3)
if [ "${ZON_WITH_ORACLES:-0}" = 1 ]; then
  packages+=(assimp-utils admesh gdal-bin lib3mf-dev)
  # DICOM slices written by independent tools.
  packages+=(dcmtk python3-pydicom)
fi
missing=()
for p in "${packages[@]}"; do
  dpkg -s "$p" >/dev/null 2>&1 || missing+=("$p")
done
[ ${#missing[@]} -eq 0 ] && exit 0
if [ "$(id -u)" -ne 0 ]; then
  echo "missing packages: ${missing[*]} (run as root, or install them with apt-get)" >&2
  exit 1
fi
export DEBIAN_FRONTEND=noninteractive
apt-get update -qq
apt-get install -y -qq --no-install-recommends "${missing[@]}"
