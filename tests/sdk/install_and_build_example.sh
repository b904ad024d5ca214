#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# install_and_build_example.sh BUILD_DIR EXAMPLE_DIR WORK_DIR CXX CXXFLAGS
set -euo pipefail
build="$1" example="$2" work="$3" cxx="$4" flags="$5"
rm -rf "$work"
mkdir -p "$work"
prefix="$work/prefix"
cmake --install "$build" --prefix "$prefix" > "$work/install.log"
test -f "$prefix/include/jexjtag/cable/CableBase.hpp"
find "$prefix" -name libjexjtag_cable.a | grep -q .

launcher=()
if command -v ccache > /dev/null; then launcher=(-DCMAKE_CXX_COMPILER_LAUNCHER=ccache); fi
cmake -S "$example" -B "$work/build" -G Ninja -DCMAKE_PREFIX_PATH="$prefix" \
  -DCMAKE_CXX_COMPILER="$cxx" -DCMAKE_CXX_FLAGS="$flags" "${launcher[@]}" > "$work/configure.log"
cmake --build "$work/build" > "$work/build.log"

# The installed program finds the example through the plug-in root.
export JEXJTAG_PLUGIN_DIR="$work/build/plugins" JEXJTAG_LOCK_DIR="$work/locks"
jexjtag="$prefix/bin/jexjtag"
"$jexjtag" targets | grep -q " wire_cable "
"$jexjtag" info --target wire_cable --arg cable=byte | grep -q "loopback cable: eight flip-flops"
"$jexjtag" scan --target wire_cable | grep -q "no devices found"
# Eight flip-flops: the first byte out is the ones of the TMS moves before it.
test "$("$jexjtag" shift dr 0x00A5 --target wire_cable --arg cable=byte 2> /dev/null)" = "0xA5FF"
echo "the example cable builds against the installed SDK and works"
