#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# Sets everything up, builds the library with its plug-ins and runs the main
# job on the built-in simulated cable: jexjtag scan prints its chain.
set -euo pipefail
here="$(cd "$(dirname "$0")/.." && pwd)"
"$here/scripts/setup.sh"
"$here/scripts/build.sh" "$here/build" -DCMAKE_BUILD_TYPE=RelWithDebInfo -DJEXJTAG_BUILD_TESTS=OFF \
  -DJEXJTAG_BUILD_BENCHMARKS=OFF
"$here/build/bin/jexjtag" scan
