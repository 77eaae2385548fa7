#!/usr/bin/env bash
# The recorder on a device that has nothing of the stand-ins: record_test.sh RECORDER DEVICE DAEMON REPLAYER [EMULATOR...]
# REPLAYER: the simulator that replays what was recorded, or none.
set -u
recorder=$1 device=$2 daemon=$3 replayer=$4
shift 4
emulator=("$@")
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
failures=0
for library in log socket reg mem nv led ipc adabsp tr181 cfg; do
    ln -s "$device" "$work/libkiv$library.so.1"
done
ln -s "$device" "$work/libubox.so.1"

fail() {
    echo "FAILED: $*"
    failures=$((failures + 1))
}

# record SECONDS VARIABLE=VALUE...: runs the daemon on the device for so long, then cuts its power.
record() {
    local seconds=$1 variables=() variable
    shift
    for variable in LD_LIBRARY_PATH="$work" LD_PRELOAD="$recorder" OTHER_DEVICE_FLOOD=0 "$@"; do
        [ ${#emulator[@]} = 0 ] || variables+=(-E)
        variables+=("$variable")
    done
    if [ ${#emulator[@]} = 0 ]; then
        env "${variables[@]}" timeout -s KILL "$seconds" "$daemon" >/dev/null 2>"$work/errors"
    else
        timeout -s KILL "$seconds" "${emulator[@]}" "${variables[@]}" "$daemon" >/dev/null 2>"$work/errors"
    fi
}

# replay FILE: the daemon does it again, and the story of it holds.
replay() {
    local said
    said=$("$replayer" replay --lines --trace "$work/again" --daemon "$daemon" "$work/$1" 2>&1) || fail "$said"
    cmp -s <(head -$(wc -l <"$work/again") "$work/$1") "$work/again" || fail "the replay is another trace"
    "$replayer" story "$work/$1" >"$work/$1.scn"
    said=$("$replayer" run --quiet --daemon "$daemon" "$work/$1.scn" 2>&1) || fail "the story does not hold: $said"
}

# is FILE TEXT: a line of the file holds it.
is() {
    grep -qF -- "$2" "$work/$1" || fail "$1 has no '$2'"
}

record 2 KIV_RECORD="$work/story"
is story 'main kiv_trace(1, "kiv_mirta_led", "1.0.0")'
is story 'main kiv_cfg_get_item(6000, 128) = 10, "DRIVER_UFI"'
is story 'main time() = '
is story 'main pthread_self() = '
is story 'sleep(40)'
is story 'receive kiv_recv_msg(7, 1036) = 76, cmd 12034 dest 38 source 27 len 64 event 0x1 "1\x01" raw '
is story 'receive kiv_bsp_set_leds_sync(sms_green off 0) = -19'
is story 'timer kiv_timer_fire('
! grep -q log_level "$work/story" || fail "a library's own call is recorded"
[ ! -s "$work/errors" ] || fail "$(cat "$work/errors")"
[ "$replayer" = none ] || replay story

# Another start goes on behind the first, and what a power cut has left of a line goes.
printf '12.000000 main kiv_' >>"$work/story"
record 1 KIV_RECORD="$work/story"
[ "$(grep -c 'kiv_trace(1' "$work/story")" = 2 ] || fail "the second start has no head of its own"
[ "$(grep -cvE '^[0-9]+\.[0-9]{6} [a-z0-9]+ [a-z0-9_A-Z]+\(.*\)( = .*)?$' "$work/story")" = 0 ] || fail "half a line is left"

# Two files in turn hold the newest lines; each says what it belongs to.
record 3 KIV_RECORD="$work/flood" KIV_RECORD_MAX=64K OTHER_DEVICE_FLOOD=300
for file in flood flood.1; do
    [ "$(stat -c %s "$work/$file")" -le 32768 ] || fail "$file is larger than half of KIV_RECORD_MAX"
    [[ $(head -1 "$work/$file") == *'kiv_trace_goes_on(1, "kiv_mirta_led", "1.0.0", "DRIVER_UFI")' ]] || fail "$file: head"
done

# What cannot be recorded stops nobody.
for place in /dev/full "$work" "$work/missing/file"; do
    record 1 KIV_RECORD="$place"
    [ $? = 137 ] || fail "$place: the daemon has ended"
    is errors "$place: nothing is recorded"
done
(ulimit -f 16; record 2 KIV_RECORD="$work/limited" OTHER_DEVICE_FLOOD=300; [ $? = 137 ]) || fail "a file size limit ends it"

exit "$failures"
