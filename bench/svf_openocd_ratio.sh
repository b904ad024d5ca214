#!/bin/sh
# SPDX-License-Identifier: MIT
# The SVF player beside OpenOCD's on the same file through the same server:
# a generated 16 Mbit SDR (with TDO compare) on a `jexjtag serve` of
# jtag_sim with four BYPASS devices, played by `jexjtag svf --target
# remote_bitbang` and by OpenOCD's `svf`; prints both times and the ratio.
#
#   bench/svf_openocd_ratio.sh BUILD_DIR
set -eu
build=$(cd "${1:?usage: svf_openocd_ratio.sh BUILD_DIR}" && pwd)
jexjtag=$build/bin/jexjtag
command -v openocd >/dev/null 2>&1 || { echo "openocd not found"; exit 1; }
work=$(mktemp -d "${TMPDIR:-/tmp}/svf-ratio-XXXXXX")
serve_pid=
trap '[ -n "$serve_pid" ] && kill "$serve_pid" 2>/dev/null; rm -rf "$work"' EXIT INT TERM
export JEXJTAG_LOCK_DIR="$work"

python3 - "$work/sdr16.svf" <<'PY'
import random, sys
random.seed(5)
p = "9" + "".join(random.choice("0123456789ABCDEF") for _ in range(4 * 1024 * 1024 - 2))
lines = lambda s: "\n".join(s[i:i + 64] for i in range(0, len(s), 64))
open(sys.argv[1], "w").write("STATE RESET;\nSIR 8 TDI (FF);\nSDR %d TDI (%s)\n TDO (%s);\n"
                             % (len(p) * 4 + 4, lines(p), lines(p + "0")))
PY
bits=$((4 * 1024 * 1024 * 4))

timeout 900 "$jexjtag" serve --chain none:2,none:2,none:2,none:2 --arg port=svf-ratio > "$work/serve.out" &
serve_pid=$!
i=0
until port=$(sed -n 's/^listening on 127\.0\.0\.1:\([0-9][0-9]*\)$/\1/p' "$work/serve.out" 2>/dev/null) && [ -n "$port" ]; do
    i=$((i + 1)); [ $i -lt 100 ] || { echo "serve did not start"; exit 1; }; sleep 0.1
done

now() { python3 -c 'import time; print(time.monotonic())'; }
t0=$(now)
"$jexjtag" svf "$work/sdr16.svf" --target remote_bitbang --arg host=127.0.0.1 --arg "port=$port" > /dev/null
t1=$(now)
timeout 900 openocd -c "adapter driver remote_bitbang" -c "remote_bitbang host 127.0.0.1" \
    -c "remote_bitbang port $port" -c "transport select jtag" -c "gdb_port disabled" -c "tcl_port disabled" \
    -c "telnet_port disabled" \
    -c "jtag newtap b0 tap -irlen 2; jtag newtap b1 tap -irlen 2; jtag newtap b2 tap -irlen 2; jtag newtap b3 tap -irlen 2" \
    -c init -c "svf -quiet $work/sdr16.svf" -c shutdown > "$work/oocd.log" 2>&1
t2=$(now)
grep -q "programmed successfully" "$work/oocd.log" || { echo "OpenOCD failed:"; tail -5 "$work/oocd.log"; exit 1; }
python3 - "$t0" "$t1" "$t2" "$bits" <<'PY'
import sys
t0, t1, t2, bits = map(float, sys.argv[1:])
ours, oocd = t1 - t0, t2 - t1
print("jexjtag svf: %.2f s, %.1f Mbit/s" % (ours, bits / ours / 1e6))
print("OpenOCD svf: %.2f s, %.1f Mbit/s" % (oocd, bits / oocd / 1e6))
print("ratio: %.1fx" % (oocd / ours))
PY
