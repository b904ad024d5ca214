#!/bin/sh
# SPDX-License-Identifier: MIT
# OpenOCD 0.12 and jexjtag play the same SVF files and must agree.
#
#   tests/svf/openocd_agree.sh BUILD_DIR [FILE.svf ...]     (default: tests/svf/data/*.svf)
#
# The peer side: OpenOCD's `svf` command through remote_bitbang to
# bitbang_chain.py, a server with its own model of jtag_sim's default chain
# that logs what the devices saw (instructions loaded, user registers
# written, resets).  Our side: `jexjtag svf` on jtag_sim, and, when the
# program has a remote_bitbang target, `jexjtag svf` through the same kind
# of server.  Each must give what the file's "! expect:" line says: pass, a
# TDO mismatch at the named line (the same line for all), or an error
# (OpenOCD's wording and line for faults in the file differ: only the
# failure is compared there; "openocd=pass" marks a fault OpenOCD lets
# through, such as MAXIMUM below the minimum time, which it ignores).  Where
# both players ran through the server, the devices must have seen the same
# (each log without what playing an empty file gives: the connection's own
# chain examination).  A generated 64 Kbit SDR through four BYPASS devices
# is played the same way.  Loopback only; every wait is bounded.
# Exit 0 when everything agrees, 1 otherwise, 77 when OpenOCD is missing.
set -u

build=$(cd "${1:?usage: openocd_agree.sh BUILD_DIR [FILE.svf ...]}" && pwd)
shift
here=$(cd "$(dirname "$0")" && pwd)
jexjtag=$build/bin/jexjtag
command -v openocd >/dev/null 2>&1 || { echo "openocd not found: skipped"; exit 77; }
have_svf=no
"$jexjtag" svf --help >/dev/null 2>&1 && have_svf=yes
have_rbb=no
[ $have_svf = yes ] && "$jexjtag" targets 2>/dev/null | grep -q remote_bitbang && have_rbb=yes
echo "jexjtag svf: $have_svf; jexjtag through remote_bitbang: $have_rbb"

work=$(mktemp -d "${TMPDIR:-/tmp}/svf-agree-XXXXXX")
server_pid=
cleanup() {
    [ -n "$server_pid" ] && kill "$server_pid" 2>/dev/null && wait "$server_pid" 2>/dev/null
    rm -rf "$work"
}
trap cleanup EXIT INT TERM
export JEXJTAG_LOCK_DIR="$work/locks"
mkdir -p "$JEXJTAG_LOCK_DIR"
printf '! nothing\n' > "$work/empty.svf"

default_chain=0x4BA00477:4:idcode=0xE:user=0xA:userbits=35,0x0362D093:6:idcode=0x9,0x41111043:8:idcode=0xE0:user=0x32
default_taps='jtag newtap dp tap -irlen 4 -expected-id 0x4ba00477; jtag newtap xc7 tap -irlen 6 -expected-id 0x0362d093; jtag newtap ecp5 tap -irlen 8 -expected-id 0x41111043'

# use_server KIND: a bitbang_chain.py for that chain, started once and kept
# for every player and file (one client at a time; each connection
# rewrites $work/events); sets $port.
server_kind=
use_server() {
    [ "$server_kind" = "$1" ] && return 0
    [ -n "$server_pid" ] && kill "$server_pid" 2>/dev/null && wait "$server_pid" 2>/dev/null
    : > "$work/server.out"
    timeout 900 python3 "$here/bitbang_chain.py" --chain "$1" --log "$work/events" > "$work/server.out" 2>&1 &
    server_pid=$!
    server_kind=$1
    port=
    i=0
    while [ $i -lt 100 ]; do
        port=$(sed -n 's/^listening on 127\.0\.0\.1:\([0-9][0-9]*\)$/\1/p' "$work/server.out")
        [ -n "$port" ] && return 0
        sleep 0.1
        i=$((i + 1))
    done
    echo "bitbang_chain.py did not start: $(cat "$work/server.out")"
    return 1
}

# ours ARGS...: "pass", "mismatch LINE" or "error".
ours() {
    timeout 300 "$jexjtag" svf "$@" --json > "$work/ours.json" 2> "$work/ours.err"
    rc=$?
    outcome=$(sed -n 's/^  "outcome": "\([a-z_]*\)",$/\1/p' "$work/ours.json")
    if [ $rc -eq 0 ] && [ "$outcome" = passed ]; then echo pass
    elif [ "$outcome" = mismatch ]; then
        echo "mismatch $(sed -n '/"first_mismatch"/,/}/s/^ *"line": \([0-9]*\),$/\1/p' "$work/ours.json")"
    else echo error
    fi
}

# openocd_svf FILE TAPS: "pass", "mismatch LINE" or "error".
openocd_svf() {
    timeout 300 openocd -c "adapter driver remote_bitbang" -c "remote_bitbang host 127.0.0.1" \
        -c "remote_bitbang port $port" -c "transport select jtag" -c "gdb_port disabled" \
        -c "tcl_port disabled" -c "telnet_port disabled" -c "$2" -c init \
        -c "svf -quiet $1" -c shutdown > "$work/oocd.log" 2>&1
    line=$(sed -n 's/.*tdo check error at line \([0-9][0-9]*\).*/\1/p' "$work/oocd.log" | head -n 1)
    if grep -q "svf file programmed successfully" "$work/oocd.log"; then echo pass
    elif [ -n "$line" ]; then echo "mismatch $line"
    else echo error
    fi
}

# play_served PLAYER FILE KIND TAPS: plays FILE through the server (which
# use_server started); prints the outcome, leaves what the devices saw in
# $work/events.
play_served() {
    rm -f "$work/events"
    if [ "$1" = oocd ]; then out=$(openocd_svf "$2" "$4")
    else out=$(ours "$2" --target remote_bitbang --arg host=127.0.0.1 --arg "port=$port")
    fi
    i=0
    while [ ! -f "$work/events" ] && [ $i -lt 100 ]; do sleep 0.05; i=$((i + 1)); done
    echo "$out"
}

# seen PLAYER FILE KIND TAPS: as play_served; what the devices saw for FILE
# alone (without what an empty file gives, counted once per player and
# chain in agree) goes to $work/seen.PLAYER.
seen() {
    skipfile="$work/skip.$1.$3"
    out=$(play_served "$@")
    skip=0
    [ -f "$skipfile" ] && skip=$(cat "$skipfile")
    tail -n +$((skip + 1)) "$work/events" > "$work/seen.$1" 2>/dev/null
    echo "$out"
}

failures=0
# agree FILE CHAIN KIND TAPS EXPECTED [OPENOCD_EXPECTED]: "pass", "mismatch LINE" or "error".
agree() {
    name=$(basename "$1")
    want=$5
    use_server "$3" || { failures=$((failures + 1)); return; }
    if [ $have_rbb = yes ]; then
        for player in oocd ours; do
            [ -f "$work/skip.$player.$3" ] && continue
            play_served $player "$work/empty.svf" "$3" "$4" > /dev/null
            wc -l < "$work/events" > "$work/skip.$player.$3"
        done
    fi
    c=$(seen oocd "$1" "$3" "$4")
    problems=
    [ "$c" = "${6:-$want}" ] || problems="$problems OpenOCD '$c';"
    if [ $have_svf = yes ]; then
        a=$(ours "$1" --chain "$2" --arg port=svf-agree)
        [ "$a" = "$want" ] || problems="$problems jexjtag '$a';"
    fi
    if [ $have_rbb = yes ]; then
        b=$(seen ours "$1" "$3" "$4")
        [ "$b" = "$want" ] || problems="$problems jexjtag through remote_bitbang '$b';"
        if [ "$want" != error ] && [ -z "${6:-}" ] && ! cmp -s "$work/seen.oocd" "$work/seen.ours"; then
            problems="$problems the devices saw different things: $(diff "$work/seen.oocd" "$work/seen.ours" | head -n 6 | tr '\n' ' ');"
        fi
    fi
    if [ -z "$problems" ]; then
        echo "ok   $name: $want"
    else
        echo "FAIL $name: expected '$want';$problems"
        failures=$((failures + 1))
    fi
}

if [ $# -eq 0 ]; then set -- "$here"/data/*.svf; fi
for file in "$@"; do
    kind=$(sed -n 's/^! expect: \([a-z]*\).*/\1/p' "$file" | head -n 1)
    line=$(sed -n 's/^! expect: .*line=\([0-9]*\).*/\1/p' "$file" | head -n 1)
    oocd=$(sed -n 's/^! expect: .*openocd=\([a-z]*\).*/\1/p' "$file" | head -n 1)
    case "$kind" in
    pass) want=pass ;;
    mismatch) want="mismatch $line" ;;
    *) want=error ;;
    esac
    agree "$file" "$default_chain" default "$default_taps" "$want" ${oocd:+"$oocd"}
done

# A generated 64 Kbit SDR through four BYPASS devices: TDO is TDI one hex digit late.
python3 - "$work/big.svf" <<'PY'
import random, sys
random.seed(7)
p = "9" + "".join(random.choice("0123456789ABCDEF") for _ in range(16383))
lines = lambda s: "\n".join(s[i:i + 64] for i in range(0, len(s), 64))
with open(sys.argv[1], "w") as f:
    f.write("! expect: pass\nSTATE RESET;\nSIR 8 TDI (FF);\nSDR %d TDI (%s)\n TDO (%s);\n"
            % (len(p) * 4 + 4, lines(p), lines(p + "0")))
PY
agree "$work/big.svf" none:2,none:2,none:2,none:2 bypass4 \
    'jtag newtap b0 tap -irlen 2; jtag newtap b1 tap -irlen 2; jtag newtap b2 tap -irlen 2; jtag newtap b3 tap -irlen 2' pass

[ $failures -eq 0 ] && echo "all agree" && exit 0
echo "$failures disagreement(s)"
exit 1
