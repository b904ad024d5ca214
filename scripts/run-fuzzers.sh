#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# Builds the libFuzzer targets (clang, separate build directory) when needed
# and runs every fuzzer found in <builddir>/fuzz for $FUZZ_SECONDS seconds
# (default 60) on its seed corpus: the directories listed in
# <builddir>/fuzz/<name>.seeds (see fuzz/CMakeLists.txt), else
# fuzz/corpus/<name>/.  Fails when any
# fuzzer fails; crash inputs are kept in <builddir>/fuzz-artifacts/.
#
#   scripts/run-fuzzers.sh [builddir]        (default: build-fuzz)
#   FUZZ_SECONDS=300 scripts/run-fuzzers.sh
set -uo pipefail

root=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)
build=${1:-$root/build-fuzz}
seconds=${FUZZ_SECONDS:-60}
jobs=${JOBS:-2}

if [[ ! -f $build/CMakeCache.txt ]]; then
    CC=${CC:-clang} CXX=${CXX:-clang++} cmake -G Ninja -S "$root" -B "$build" \
        -DCMAKE_BUILD_TYPE=RelWithDebInfo -DJEXJTAG_BUILD_FUZZERS=ON \
        -DJEXJTAG_BUILD_TESTS=OFF -DJEXJTAG_BUILD_BENCHMARKS=OFF || exit 1
fi
cmake --build "$build" -j "$jobs" --target fuzzers || exit 1

artifacts=$build/fuzz-artifacts
mkdir -p "$artifacts"
failed=()
ran=0
for fuzzer in "$build"/fuzz/*; do
    [[ -f $fuzzer && -x $fuzzer ]] || continue
    name=$(basename "$fuzzer")
    # New inputs go to a scratch directory; the seed corpus stays as it is.
    work=$(mktemp -d)
    seeds=()
    if [[ -f $build/fuzz/$name.seeds ]]; then
        while IFS= read -r dir; do [[ -d $dir ]] && seeds+=("$dir"); done < "$build/fuzz/$name.seeds"
    else
        # Seed corpora are named after the fuzzer without its "_fuzzer" suffix.
        corpus=$root/fuzz/corpus/${name%_fuzzer}
        [[ -d $corpus ]] || corpus=$root/fuzz/corpus/$name
        [[ -d $corpus ]] && seeds=("$corpus")
    fi
    echo "== $name: ${seconds}s on ${seeds[*]:-an empty corpus}"
    log=$build/$name.log
    "$fuzzer" -max_total_time="$seconds" -timeout=10 -print_final_stats=1 \
        -artifact_prefix="$artifacts/$name-" "$work" "${seeds[@]}" > "$log" 2>&1
    status=$?
    # The full run is in the log; show its summary (or its end, on failure).
    if [[ $status -eq 0 ]]; then
        grep -E '^(Done|stat::number_of_executed_units|stat::peak_rss_mb)' "$log" | sed 's/^/   /'
    else
        tail -n 40 "$log"
    fi
    rm -rf "$work"
    ran=$((ran + 1))
    if [[ $status -ne 0 ]]; then
        echo "== $name FAILED (exit $status); inputs in $artifacts"
        failed+=("$name")
    else
        echo "== $name passed"
    fi
done

if [[ $ran -eq 0 ]]; then
    echo "no fuzzer found in $build/fuzz"
    exit 1
fi
echo "fuzzing: $((ran - ${#failed[@]})) of $ran fuzzers found nothing"
[[ ${#failed[@]} -eq 0 ]]
