#!/usr/bin/env bash
# Installs what building and testing libqel needs, from Debian's packages,
# when it is missing. Safe to run again.
set -euo pipefail
packages=(build-essential cmake git googletest libgtest-dev libbenchmark-dev
          libboost-dev pkg-config binutils ccache)
# Doxygen builds the API reference (the docs target), which the tests build.
packages+=(doxygen)
# The Python module (QEL_BUILD_PYTHON) and its tests.
packages+=(python3-dev python3-pybind11 python3-numpy python3-pytest)
# Headless Chromium renders qelcalc's SVG pictures once (the test skips without it).
packages+=(chromium)
missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done
if [ ${#missing[@]} -gt 0 ]; then
  echo "installing: ${missing[*]}"
  sudo_cmd=""
  [ "$(id -u)" -ne 0 ] && sudo_cmd="sudo"
  $sudo_cmd apt-get update -qq
  DEBIAN_FRONTEND=noninteractive $sudo_cmd apt-get install -y -qq "${missing[@]}"
fi
