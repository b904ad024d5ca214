#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# Installs the Debian packages the build, the tests and the fuzzers need,
# when they are missing.  Safe to run again.
set -euo pipefail

packages=(
  build-essential cmake ninja-build pkg-config python3
  libgtest-dev libgmock-dev googletest libbenchmark-dev
  libxerces-c-dev
  clang libclang-rt-dev
  libftdi1-dev                         # the USB cable (FTDI MPSSE adapters)
  openocd                              # peer: remote_bitbang client, SVF player
  python3-pytest python3-setuptools    # the Python package and its tests
  dpkg-dev file                        # Debian packages (dpkg-shlibdeps)
)

missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done
if [ ${#missing[@]} -eq 0 ]; then
  exit 0
fi

sudo=""
if [ "$(id -u)" -ne 0 ]; then sudo="sudo"; fi
echo "setup: installing ${missing[*]}"
$sudo apt-get update -qq
DEBIAN_FRONTEND=noninteractive $sudo apt-get install -y -qq --no-install-recommends "${missing[@]}"
