#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# pkgconfig_relocatable.sh BUILD_DIR DEMO_SOURCE WORK_DIR CC CFLAGS
# Installs into a prefix, moves the prefix elsewhere, and builds and runs
# a C host with the flags pkg-config gives there: jexjtag.pc finds its
# prefix from its own place.
set -euo pipefail
build="$1" demo="$2" work="$3" cc="$4" flags="$5"
rm -rf "$work"
mkdir -p "$work"
cmake --install "$build" --prefix "$work/installed" > "$work/install.log"
mv "$work/installed" "$work/moved"

pc=$(find "$work/moved" -name jexjtag.pc)
export PKG_CONFIG_PATH="$(dirname "$pc")" PKG_CONFIG_LIBDIR=/nonexistent
cflags=$(pkg-config --cflags jexjtag)
libs=$(pkg-config --libs jexjtag)
libdir=$(pkg-config --variable=libdir jexjtag)
case "$cflags $libs $libdir" in
  *"$work/installed"*) echo "jexjtag.pc names the prefix it was installed to: $cflags $libs"; exit 1 ;;
esac
test -f "$libdir/libJexJtag.so"

# shellcheck disable=SC2086 # the flags are word lists
"$cc" $flags $cflags "$demo" $libs -o "$work/demo_host"
LD_LIBRARY_PATH="$libdir" "$work/demo_host" > "$work/demo.log"
grep -q "jtag_sim" "$work/demo.log"
echo "pkg-config jexjtag works from a moved prefix: $cflags $libs"
