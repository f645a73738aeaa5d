#!/usr/bin/env bash
# SIGINT and SIGTERM end a recording early, with status 0 and complete files. SIGINT also ends a program
# that hangs before it records.
. "$(dirname "$0")/common.sh"

# A background job of a script ignores SIGINT; env restores the default for the program.
RECORD=(env --default-signal=INT "${ON_CARD[@]}" "$ZARVO_RECORD")

for signal in INT TERM; do
  out=$FOLDER/$signal
  "${RECORD[@]}" --seconds 600 --channels 1-4 --output "$out" >"$FOLDER/log" 2>&1 &
  recorder=$!
  expect "no data came: $(cat "$FOLDER/log")" wait_until 30 test -s "$out/ch04.m4v" -a -s "$out/audio4.g726"
  kill -s "$signal" "$recorder"
  status=0
  wait "$recorder" || status=$?
  expect_equal "status after SIG$signal" 0 "$status"
  expect_decodes "$out"/ch0{1,2,3,4}.m4v "$out"/audio{1,2,3,4}.g726
  for file in "$out"/ch*.m4v; do
    told=$(sed -nE "s|^$file: ([0-9]+) frames, .*|\\1|p" "$FOLDER/log")
    expect_equal "frames in $file and in its line" "$told" "$(decoded_frames "$file")"
  done
done

# The second file is a pipe that nobody reads: opening it hangs, as a bad driver's open may.
mkdir "$FOLDER/hang"
mkfifo "$FOLDER/hang/ch02.m4v"
"${RECORD[@]}" --seconds 600 --channels 1-2 --output "$FOLDER/hang" >"$FOLDER/log" 2>&1 &
recorder=$!
expect "no file came: $(cat "$FOLDER/log")" wait_until 30 test -e "$FOLDER/hang/ch01.m4v"
kill -s INT "$recorder"
expect "the program hangs in spite of SIGINT" wait_until 10 process_gone "$recorder"
status=0
wait "$recorder" || status=$?
expect_equal "status after SIGINT before the recording" 130 "$status"
