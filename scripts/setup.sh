#!/usr/bin/env bash
# Installs what the build needs and is missing, from Debian's packages.
set -euo pipefail

packages=(
  g++ cmake ninja-build pkg-config make
  googletest libgtest-dev libgmock-dev libbenchmark-dev
  clang-format g++-multilib
  libtiff-dev libpng-dev libjpeg-dev
  libegl-dev libgl-dev libglu1-mesa-dev libegl-mesa0 libgl1-mesa-dri
  libsdl2-dev libx11-dev libcairo2-dev libpango1.0-dev fonts-dejavu-core xvfb xauth xdotool
  libexiv2-dev
  liblcms2-dev libgs-common  # display colour: LittleCMS, and a CMYK press profile it reads
  libexempi-dev
  libsuitesparse-dev libopenblas-dev libtbb-dev
  clang-14 libclang-rt-14-dev  # the fuzz targets: clang with libFuzzer's runtime
)

missing=()
for p in "${packages[@]}"; do
  if ! dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed"; then
    missing+=("$p")
  fi
done

if [ ${#missing[@]} -gt 0 ]; then
  echo "setup: installing ${missing[*]}"
  SUDO=""
  [ "$(id -u)" -ne 0 ] && SUDO="sudo"
  $SUDO apt-get update -q
  DEBIAN_FRONTEND=noninteractive $SUDO apt-get install -y -q --no-install-recommends "${missing[@]}"
fi
