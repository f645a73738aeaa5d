#!/usr/bin/env bash
# kill -9 at random moments while 16 channels record. Whatever the program said it had delivered is in
# the files, and at most the last frame of a file is torn. ZARVO_KILLS sets how many times (3).
. "$(dirname "$0")/common.sh"

mkdir -p "$FOLDER/work/Data"
open_display
trap clean_up EXIT
for ((round = 1; round <= ${ZARVO_KILLS:-3}; ++round)); do
  rm -rf "$FOLDER"/work/Data/*
  start_program "$FOLDER/work"
  record_cif
  wait_line kbps 3
  sleep "0.$((RANDOM % 900 + 100))" # the random moment
  kill -9 "$DEMO"
  wait "$DEMO" 2>/dev/null || true
  DEMO=

  # Each line tells the bytes since the line before it in units of 128, rounded down.
  told=$(awk '/kbps/ { sum += $1 * 128 } END { print sum + 0 }' "$LOG")
  mapfile -t files < <(find "$FOLDER/work/Data" -name '*.rec')
  expect_equal "files" 16 "${#files[@]}"
  written=$(($(cat "${files[@]}" | wc -c) - 16 * RECORD_HEADER_BYTES))
  expect "round $round: $told bytes delivered, only $written in the files" test "$written" -ge "$told"
  for file in "${files[@]}"; do
    stream_input "$file"
    IFS=, read -r frames packets < <(ffprobe -v quiet -count_frames -count_packets \
      -show_entries stream=nb_read_frames,nb_read_packets -of csv=p=0 "${STREAM[@]}")
    expect "round $round: $file: $frames of $packets frames decode" test "$((packets - frames))" -le 1
  done
done
