#!/usr/bin/env bash
# SIGHUP, SIGINT and SIGTERM end a recording early, with complete files.
. "$(dirname "$0")/common.sh"

# A background job of a script ignores SIGINT, and a program under nohup ignores SIGHUP; env restores the
# default.
RECORD=(env --default-signal=INT --default-signal=HUP "${ON_CARD[@]}" "$ZARVO_RECORD")

for signal in HUP INT TERM; do
  out=$FOLDER/$signal
  "${RECORD[@]}" --seconds 600 --channels 1-4 --output "$out" >"$FOLDER/log" 2>&1 &
  recorder=$!
  expect "no data came: $(cat "$FOLDER/log")" wait_until 30 test -s "$out/ch04.m4v" -a -s "$out/audio4.g726"
  kill -s "$signal" "$recorder"
  status=0
  wait "$recorder" || status=$?
  # 3 is right too: a slow build loses frames.
  expect "status $status after SIG$signal" test "$status" -eq 0 -o "$status" -eq 3
  expect_decodes "$out"/ch0{1,2,3,4}.m4v "$out"/audio{1,2,3,4}.g726
  for file in "$out"/ch*.m4v; do
    told=$(sed -nE "s|^$file: ([0-9]+) frames, .*|\\1|p" "$FOLDER/log")
    expect_equal "frames in $file and in its line" "$told" "$(decoded_frames "$file")"
  done
done
