#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# Sets everything up and runs every test twice: a normal build, and an
# AddressSanitizer + UndefinedBehaviorSanitizer build.  Then runs each fuzzer
# for FUZZ_SECONDS (default 60) when there are any.
set -euo pipefail
here="$(cd "$(dirname "$0")/.." && pwd)"
"$here/scripts/setup.sh"

total=0
run_suite() {
  local dir="$1"; shift
  echo "=== build $(basename "$dir")"
  "$here/scripts/build.sh" "$dir" "$@"
  echo "=== test $(basename "$dir")"
  (cd "$dir" && ctest --output-on-failure -j"$(nproc)") | tee "$dir/ctest.log"
  local n
  n=$(sed -n 's/.*tests passed, 0 tests failed out of \([0-9]*\).*/\1/p' "$dir/ctest.log")
  total=$((total + ${n:-0}))
  # ctest runs one test per process; each GoogleTest binary must also pass
  # when run whole, as a host process runs many sessions one after another.
  echo "=== whole test binaries $(basename "$dir")"
  local bin
  for bin in "$dir"/tests/bin/*; do
    [ -f "$bin" ] && [ -x "$bin" ] && grep -qa -- "--gtest_list_tests" "$bin" || continue
    if ! (cd "$dir" && timeout 300 "$bin" > "$bin.whole.log" 2>&1); then
      tail -n 40 "$bin.whole.log"
      echo "FAILED when run whole: $bin"
      exit 1
    fi
    total=$((total + 1))
  done
}

run_suite "$here/build" -DCMAKE_BUILD_TYPE=RelWithDebInfo
echo "=== Debian packages"
"$here/scripts/test-packages.sh" "$here/build-pkg"
ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1:halt_on_error=1 \
  run_suite "$here/build-asan" -DCMAKE_BUILD_TYPE=Debug -DJEXJTAG_SANITIZE=ON -DJEXJTAG_BUILD_BENCHMARKS=OFF

fuzzers=0
if [ -x "$here/scripts/run-fuzzers.sh" ]; then
  "$here/scripts/run-fuzzers.sh" "$here/build-fuzz"
  fuzzers=$(find "$here/build-fuzz/fuzz" -maxdepth 1 -type f -executable | wc -l)
fi
echo "=== all tests passed (normal and sanitizer builds, then the fuzzers)"
echo "$((total + fuzzers)) passed, 0 failed"
