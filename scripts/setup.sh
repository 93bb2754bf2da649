#!/usr/bin/env bash
# Installs what the build needs from Debian's packages; quick when all is there already.
set -euo pipefail
packages=(cmake ninja-build g++ ccache clang-format libgtest-dev libgmock-dev libbenchmark-dev
          qt6-base-dev qt6-svg-dev qt6-tools-dev libqt6opengl6-dev qt6-qpa-plugins libgl-dev fonts-dejavu-core fonts-liberation2 pkgconf
          pybind11-dev python3-dev python3-numpy python3-pytest clang libclang-rt-14-dev
          python3-pymeasure python3-pyvisa-py liblxi-dev)
missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done
if [ ${#missing[@]} -gt 0 ]; then
  sudo=""
  [ "$(id -u)" -eq 0 ] || sudo="sudo"
  echo "Installing: ${missing[*]}"
  $sudo apt-get update -qq
  DEBIAN_FRONTEND=noninteractive $sudo apt-get install -y -qq --no-install-recommends "${missing[@]}"
fi
