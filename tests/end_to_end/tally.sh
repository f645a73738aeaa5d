#!/usr/bin/env bash
# zarvo_record tells what is missing, while it records and at the end, and fails on a file that cannot grow.
. "$(dirname "$0")/common.sh"

# start OPTION...: starts zarvo_record in the background and waits for data of the first channel.
start() {
  "${ON_CARD[@]}" "$ZARVO_RECORD" --output "$FOLDER/out" "$@" >"$FOLDER/stdout" 2>"$FOLDER/stderr" &
  RECORDER=$!
  expect "no data came: $(cat "$FOLDER/stderr")" wait_until 30 test -s "$FOLDER/out/ch01.m4v"
}

# expect_end STATUS
expect_end() {
  local status=0
  wait "$RECORDER" || status=$?
  expect_equal "status ($(cat "$FOLDER/stderr"))" "$1" "$status"
}

# expect_lines COUNT PATTERN FILE
expect_lines() { expect_equal "lines with '$2' in: $(cat "$FOLDER/$3")" "$1" "$(grep -cE -- "$2" "$FOLDER/$3")"; }

case $1 in
  # The recorder is stopped for 7 of 12 seconds. Catches: missing frames or a gap that the recorder does not
  # report.
  gap)
    start --seconds 12
    sleep 2
    kill -STOP "$RECORDER"
    sleep 7
    kill -CONT "$RECORDER"
    expect_end 3
    expect_lines 16 'expected 359, missing (1[5-9]|2[0-9])[0-9], longest gap (6.9|7|8)' stdout
    expect_lines 4 'expected 7[45][0-9], missing [34][0-9]{2}, longest gap (6.9|7|8)' stdout
    expect_lines 20 'are missing' stderr
    expect_lines 0 'frames/s' stderr # not a terminal
    ;;
  # Opens and reads of the card fail from second 2 on.
  vanish)
    export ZARVO_VIRTUAL_CARD='@2 vanish'
    start --seconds 0 --channels 1-2 --audio 1
    told() { [ "$(grep -c 'nothing has come for' "$FOLDER/stderr")" = 3 ]; }
    expect "no line says that the streams have stopped" wait_until 30 told
    kill -TERM "$RECORDER"
    expect_end 3
    ;;
  terminal)
    command=$(printf '%q ' "${ON_CARD[@]}" "$ZARVO_RECORD" --seconds 3 --channels 1 --output "$FOLDER/out")
    script -qec "$command" /dev/null >"$FOLDER/stdout" || [ $? -eq 3 ] || die "$(cat "$FOLDER/stdout")"
    expect_lines 1 '[12] s: [0-9]+ frames/s, [0-9]+ kbit/s, [0-9]+ missing' stdout
    ;;
  # The limit comes down while the file grows: the kernel sends SIGXFSZ, and the write fails.
  limit)
    start --seconds 600 --channels 1
    prlimit --pid "$RECORDER" --fsize="$(($(stat -c %s "$FOLDER/out/ch01.m4v") + 10000))"
    expect_end 1
    expect_lines 1 'cannot write to .*: File too large' stderr
    ;;
esac
