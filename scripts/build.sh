#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# Configures and builds one build tree.
#   scripts/build.sh <build dir> [extra cmake arguments...]
set -euo pipefail
here="$(cd "$(dirname "$0")/.." && pwd)"
dir="$1"; shift
mkdir -p "$dir"
cmake -G Ninja -S "$here" -B "$dir" "$@" > "$dir/configure.log" 2>&1 || { cat "$dir/configure.log"; exit 1; }
cmake --build "$dir" -j"$(nproc)"
