#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# Builds the Debian packages and checks them the way a user meets them:
# unpacked (dpkg-deb -x) into a throwaway root, a consumer project built
# against that root with find_package(JexJtag) and with pkg-config, the
# unpacked jexjtag program scanning the simulated chain, and the unpacked
# Python package reading it.
#   scripts/test-packages.sh [build dir]      (default: build-pkg)
# The build dir is configured with the prefix /usr, as Debian packages are
# (the library then lands in /usr/lib/<triplet>).
set -euo pipefail
here="$(cd "$(dirname "$0")/.." && pwd)"
build="${1:-$here/build-pkg}"
root="$(mktemp -d /tmp/jexjtag-packages.XXXXXX)"
trap 'rm -rf "$root"' EXIT
unset JEXJTAG_LIBRARY JEXJTAG_PLUGIN_DIR JEXJTAG_DATA_DIR
export JEXJTAG_LOCK_DIR="$root/locks"
fail() { echo "test-packages: $*" >&2; exit 1; }

echo "=== packages"
"$here/scripts/build.sh" "$build" -DCMAKE_BUILD_TYPE=RelWithDebInfo -DCMAKE_INSTALL_PREFIX=/usr \
  -DJEXJTAG_BUILD_TESTS=OFF -DJEXJTAG_BUILD_BENCHMARKS=OFF
cmake --build "$build" --target package > "$build/package.log" 2>&1 || { cat "$build/package.log"; fail "packaging failed"; }
debs=("$build"/*.deb)
for name in libjexjtag1 libjexjtag-dev jexjtag python3-jexjtag; do
  ls "$build/${name}_"*.deb > /dev/null 2>&1 || fail "no package $name"
done
for deb in "${debs[@]}"; do
  echo "$(basename "$deb"): $(dpkg-deb -f "$deb" Depends)"
  dpkg-deb -x "$deb" "$root/fs"
done
multiarch="$(gcc -print-multiarch 2>/dev/null || true)"
lib="$root/fs/usr/lib${multiarch:+/$multiarch}"
dpkg-deb -f "$build"/libjexjtag1_*.deb Depends | grep -q libc6 || fail "libjexjtag1 lacks the dpkg-shlibdeps dependencies"
dpkg-deb -f "$build"/jexjtag_*.deb Depends | grep -q libjexjtag1 || fail "jexjtag does not depend on libjexjtag1"
objdump -p "$lib/libJexJtag.so.1" | grep -q 'SONAME *libJexJtag.so.1$' || fail "SONAME is not libJexJtag.so.1"
for f in "$lib/libJexJtag.so" "$lib/jexjtag/plugins/jexjtag/jtag_sim/jtag_sim.so" "$root/fs/usr/share/jexjtag/idcode.lst" \
         "$root/fs/usr/share/man/man1/jexjtag.1.gz" "$root/fs/usr/share/bash-completion/completions/jexjtag" \
         "$root/fs/usr/include/jexjtag/jexjtag.h" "$root/fs/usr/include/jexjtag/cable/CableBase.hpp" \
         "$lib/libjexjtag_cable.a" "$root/fs/usr/lib/python3/dist-packages/jexjtag/_install.py"; do
  [ -e "$f" ] || fail "missing ${f#$root/fs}"
done

echo "=== consumer: find_package(JexJtag)"
cmake -S "$here/tests/packaging/consumer" -B "$root/consumer" -DCMAKE_PREFIX_PATH="$root/fs/usr" > "$root/consumer.log" 2>&1 \
  && cmake --build "$root/consumer" >> "$root/consumer.log" 2>&1 || { cat "$root/consumer.log"; fail "consumer (CMake) failed to build"; }
LD_LIBRARY_PATH="$lib" "$root/consumer/consumer"

echo "=== consumer: pkg-config jexjtag"
flags="$(PKG_CONFIG_LIBDIR="$lib/pkgconfig" pkg-config --cflags --libs jexjtag)"  # the .pc file is relocatable
# shellcheck disable=SC2086  # the flags are words
cc -o "$root/consumer-pc" "$here/tests/packaging/consumer/consumer.c" $flags
LD_LIBRARY_PATH="$lib" "$root/consumer-pc" > /dev/null

echo "=== jexjtag scan"
"$root/fs/usr/bin/jexjtag" scan | tee "$root/scan.txt"
grep -q "0x0362D093" "$root/scan.txt" || fail "jexjtag scan did not read the simulated chain"
(. "$root/fs/usr/share/bash-completion/completions/jexjtag"; PATH="$root/fs/usr/bin:$PATH"
 COMP_WORDS=(jexjtag sc); COMP_CWORD=1; _jexjtag; [ "${COMPREPLY[*]}" = "scan" ]) || fail "bash completion"

echo "=== python3 -c 'import jexjtag'"
PYTHONPATH="$root/fs/usr/lib/python3/dist-packages" python3 - <<'PY'
import jexjtag
with jexjtag.Session() as session, session.open("jtag_sim") as target, target.locked():
    devices = target.autodetect()
    print(devices)
    assert [d.idcode for d in devices] == [0x4BA00477, 0x0362D093, 0x41111043]
    target.shift_ir(0x09, 6, device=1)
    assert target.shift_dr(0, 32, device=1) == 0x0362D093
try:
    jexjtag.Session().open("no_such_cable")
except jexjtag.JtagError as error:
    print("JtagError:", error)
else:
    raise SystemExit("no JtagError for an unknown target type")
PY
echo "=== packages passed"
