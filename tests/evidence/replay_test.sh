#!/usr/bin/env bash
# Recordings against the real daemon: replay_test.sh SIMULATOR DAEMON SOURCES
set -u
simulator=$1 daemon=$2 sources=$3
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
tested=$daemon
failures=0

fail() {
    echo "FAILED: $*"
    failures=$((failures + 1))
}

# expect STATUS TEXT ARGUMENT...: the replay ends so, and says that.
expect() {
    local status=$1 text=$2 said
    shift 2
    said=$("$simulator" replay --daemon "$tested" "$@" 2>&1)
    [ $? = "$status" ] && [[ $said == *"$text"* ]] || fail "replay $*: not status $status with '$text' but: $said"
}

for recording in "$sources"/tests/recordings/*.trace; do
    expect 0 "the same to the end" "$recording"
done

while read -r scenario; do
    "$simulator" run --quiet --daemon "$daemon" --trace "$work/run" "$scenario" >/dev/null || fail "$scenario"
    expect 0 "the same to the end" --lines --trace "$work/again" "$work/run"
    cmp "$work/run" "$work/again" || fail "$scenario: the replay's trace is another one"
    "$simulator" story "$work/run" >"$work/story.scn" || fail "$scenario: no story"
    "$simulator" run --quiet --daemon "$daemon" --trace "$work/told" "$work/story.scn" >/dev/null || fail "$scenario: story"
    cmp <(grep set_leds "$work/run") <(grep set_leds "$work/told") || fail "$scenario: the story shows something else"
done < <(find "$sources/scenarios" -name '*.scn')

# A daemon with one fault is caught at the line that shows it.
recording=$sources/tests/recordings/handheld.trace
line=$(grep -n 'wifi blue on' "$recording" | head -1 | cut -d: -f1)
sed 's/wifi blue on/wifi blue oN/' "$daemon" >"$work/faulty"
chmod +x "$work/faulty"
tested=$work/faulty
expect 1 "handheld.trace:$line: differs" "$recording"
tested=$daemon

# What a killed device leaves is replayed as far as it goes.
head -c 20000 "$recording" >"$work/cut"
expect 0 "the same to the end" "$work/cut"
head -$((line - 1)) "$recording" >"$work/ends-early"
expect 0 "the daemon goes on with receive kiv_syslog_append(6, " "$work/ends-early"

# What cannot be replayed is refused.
tail -n +100 "$recording" >"$work/headless"
expect 2 "its beginning is missing" "$work/headless"
(sed -n 1,50p "$recording"; echo "50.000000 main f() = 0"; sed -n 51,90p "$recording") >"$work/shuffled"
expect 2 "not in their order" "$work/shuffled"
(head -50 "$recording"; head -c 300 "$daemon"; echo; tail -50 "$recording") >"$work/garbage"
expect 2 "no line of a trace" "$work/garbage"
truncate -s 65M "$work/enormous"
expect 2 "larger than 64 MiB" "$work/enormous"

# What the daemon writes on a device tells of an LED what its trace tells, also as syslog keeps it.
mkdir "$work/device"
printf 'product UFI\nnv battery_value=80\nstart\nnotify MAIN POWERON\nnotify SLEEP 1\n' >"$work/evening"
KIV_DEVICE_DIR=$work/device KIV_TRACE=$work/device/trace KIV_LOG=$work/log "$daemon" >/dev/null 2>&1 &
"$simulator" live --device "$work/device" "$work/evening" >/dev/null || fail "the session"
kill $!
while read -r line; do
    echo "Nov 22 20:15:04 cpe kiv_mirta_led[312]: ${line#* * * * }"
    echo "Nov 22 20:15:04 cpe kernel: kiv_led_set_bat_led_off"
done <"$work/log" >"$work/syslog"
for asked in "$work/device/trace" "--log $work/log" "--log $work/syslog"; do
    # shellcheck disable=SC2086 # an option and a file
    said=$("$simulator" why $asked bat_green)
    [[ $said == "bat_green shows blink"*"notify SLEEP 1"* ]] || fail "why $asked: $said"
done
"$simulator" why --log "$daemon" bat_green 2>/dev/null
[ $? = 2 ] || fail "a program for a log"

exit "$failures"
