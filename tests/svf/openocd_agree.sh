#!/bin/sh
# SPDX-License-Identifier: MIT
# OpenOCD 0.12 and jexjtag play the same SVF files and must agree.
#
#   tests/svf/openocd_agree.sh BUILD_DIR [FILE.svf ...]     (default: tests/svf/data/*.svf)
#
# For each file, on jtag_sim's default chain: `jexjtag svf` on jtag_sim
# directly, `jexjtag svf` through `jexjtag serve` with --target
# remote_bitbang, and OpenOCD's `svf` command through a `jexjtag serve` of
# its own.  All three must give what the file's "! expect:" line says:
# pass, or a TDO mismatch at the named line (the same line for all), or an
# error (OpenOCD's wording and line for syntax errors differ: only the
# failure is compared there).  "openocd=pass" on the expect line marks a
# fault OpenOCD is known to let through (it ignores RUNTEST MAXIMUM).  A generated 2 Mbit SDR on a chain of four
# BYPASS devices is played the same way.  Loopback only; every wait is
# bounded.  Exit 0 when everything agrees, 1 otherwise, 77 when OpenOCD or
# `jexjtag serve` is missing (skip).
set -u

build=$(cd "${1:?usage: openocd_agree.sh BUILD_DIR [FILE.svf ...]}" && pwd)
shift
here=$(cd "$(dirname "$0")" && pwd)
jexjtag=$build/bin/jexjtag
command -v openocd >/dev/null 2>&1 || { echo "openocd not found: skipped"; exit 77; }
"$jexjtag" serve --help >/dev/null 2>&1 || { echo "jexjtag serve not built: skipped"; exit 77; }

work=$(mktemp -d "${TMPDIR:-/tmp}/svf-agree-XXXXXX")
serve_pid=
cleanup() {
    [ -n "$serve_pid" ] && kill "$serve_pid" 2>/dev/null && wait "$serve_pid" 2>/dev/null
    rm -rf "$work"
}
trap cleanup EXIT INT TERM
export JEXJTAG_LOCK_DIR="$work/locks"
mkdir -p "$JEXJTAG_LOCK_DIR"

default_chain=0x4BA00477:4:idcode=0xE:user=0xA:userbits=35,0x0362D093:6:idcode=0x9,0x41111043:8:idcode=0xE0:user=0x32
oocd_default_taps='jtag newtap dp tap -irlen 4 -expected-id 0x4ba00477; jtag newtap xc7 tap -irlen 6 -expected-id 0x0362d093; jtag newtap ecp5 tap -irlen 8 -expected-id 0x41111043'

# start_serve CHAIN PORTNAME: a `jexjtag serve` on jtag_sim; sets $port.
start_serve() {
    : > "$work/serve.out"
    timeout 300 "$jexjtag" serve --listen 127.0.0.1:0 --chain "$1" --arg "port=$2" > "$work/serve.out" 2> "$work/serve.err" &
    serve_pid=$!
    port=
    i=0
    while [ $i -lt 100 ]; do
        port=$(sed -n 's/^listening on 127\.0\.0\.1:\([0-9][0-9]*\)$/\1/p' "$work/serve.out")
        [ -n "$port" ] && return 0
        sleep 0.1
        i=$((i + 1))
    done
    echo "jexjtag serve did not start: $(cat "$work/serve.err")"
    return 1
}
stop_serve() {
    kill "$serve_pid" 2>/dev/null
    wait "$serve_pid" 2>/dev/null
    serve_pid=
}

# ours ARGS...: prints "pass", "mismatch LINE" or "error LINE".
ours() {
    timeout 120 "$jexjtag" svf --json "$@" > "$work/ours.json" 2> "$work/ours.err"
    rc=$?
    python3 - "$work/ours.json" "$rc" <<'PY'
import json, sys
rc = int(sys.argv[2])
try:
    r = json.load(open(sys.argv[1]))
except Exception:
    print("error 0"); sys.exit()
if rc == 0 and r["outcome"] == "passed": print("pass")
elif r["outcome"] == "mismatch": print("mismatch", r["first_mismatch"]["line"])
else: print("error", (r.get("error") or {}).get("line", 0))
PY
}

# openocd_svf FILE TAPS: prints "pass", "mismatch LINE" or "error".
openocd_svf() {
    timeout 300 openocd -c "adapter driver remote_bitbang" -c "remote_bitbang host 127.0.0.1" \
        -c "remote_bitbang port $port" -c "transport select jtag" -c "gdb_port disabled" \
        -c "tcl_port disabled" -c "telnet_port disabled" -c "$2" -c init \
        -c "svf -quiet $1" -c shutdown > "$work/oocd.log" 2>&1
    if grep -q "svf file programmed successfully" "$work/oocd.log"; then
        echo pass
    elif line=$(sed -n 's/.*tdo check error at line \([0-9][0-9]*\).*/\1/p' "$work/oocd.log" | head -n 1) && [ -n "$line" ]; then
        echo "mismatch $line"
    else
        echo error
    fi
}

failures=0
# agree FILE CHAIN TAPS EXPECTED [OPENOCD_EXPECTED]: "pass", "mismatch LINE" or "error".
agree() {
    name=$(basename "$1")
    a=$(ours "$1" --chain "$2" --arg "port=agree-direct")
    start_serve "$2" agree-served || { failures=$((failures + 1)); return; }
    b=$(ours "$1" --target remote_bitbang --arg host=127.0.0.1 --arg "port=$port")
    stop_serve
    start_serve "$2" agree-oocd || { failures=$((failures + 1)); return; }
    c=$(openocd_svf "$1" "$3")
    stop_serve
    case "$4" in error) a=${a%% *}; b=${b%% *} ;; esac
    if [ "$a" = "$4" ] && [ "$b" = "$4" ] && [ "$c" = "${5:-$4}" ]; then
        echo "ok   $name: $4"
    else
        echo "FAIL $name: expected '$4', jexjtag '$a', through serve '$b', OpenOCD '$c'"
        failures=$((failures + 1))
    fi
}

if [ $# -eq 0 ]; then set -- "$here"/data/*.svf; fi
for file in "$@"; do
    kind=$(sed -n 's/^! expect: \([a-z]*\).*/\1/p' "$file" | head -n 1)
    line=$(sed -n 's/^! expect: .*line=\([0-9]*\).*/\1/p' "$file" | head -n 1)
    case "$kind" in
    pass) want=pass ;;
    mismatch) want="mismatch $line" ;;
    *) want=error ;;
    esac
    oocd=$(sed -n 's/^! expect: .*openocd=\([a-z]*\).*/\1/p' "$file" | head -n 1)
    agree "$file" "$default_chain" "$oocd_default_taps" "$want" ${oocd:+"$oocd"}
done

# A generated 2 Mbit SDR through four BYPASS devices: TDO is TDI one hex digit late.
python3 - "$work/big.svf" <<'PY'
import random, sys
random.seed(7)
p = "9" + "".join(random.choice("0123456789ABCDEF") for _ in range(524287))
lines = lambda s: "\n".join(s[i:i + 64] for i in range(0, len(s), 64))
with open(sys.argv[1], "w") as f:
    f.write("! expect: pass\nSTATE RESET;\nSIR 8 TDI (FF);\nSDR %d TDI (%s)\n TDO (%s);\n"
            % (len(p) * 4 + 4, lines(p), lines(p + "0")))
PY
agree "$work/big.svf" none:2,none:2,none:2,none:2 \
    'jtag newtap b0 tap -irlen 2; jtag newtap b1 tap -irlen 2; jtag newtap b2 tap -irlen 2; jtag newtap b3 tap -irlen 2' pass

[ $failures -eq 0 ] && echo "all agree" && exit 0
echo "$failures disagreement(s)"
exit 1
