#!/usr/bin/env bash
# kill -9 at random moments while 16 channels record. The files must hold every byte of each frame whose
# callback had returned, and at most one more frame, cut off. ZARVO_KILLS is the number of kills (3).
#
# The card's log shows what was delivered: the SDK acknowledges a frame (ENC_IOC_MPEG4_DONE) after its
# callback has returned.
. "$(dirname "$0")/common.sh"

readonly STREAM_HEADER_BYTES=20   # the SDK puts it in front of each intra frame
readonly STREAM_HEADER_BEGINS='\x00\x00\x01\x20'

set_clock '2026-03-03 14:10:00' # far from a change of the hour
mkdir -p "$FOLDER/work/Data"
open_display
trap clean_up EXIT
export ZARVO_VIRTUAL_CARD="log=$FOLDER/card.log"
for ((round = 1; round <= ${ZARVO_KILLS:-3}; ++round)); do
  rm -rf "$FOLDER"/work/Data/* "$FOLDER/card.log"
  start_program "$FOLDER/work"
  record_cif
  wait_line kbps 2
  sleep "0.$((RANDOM % 900 + 100))" # the random moment
  kill -9 "$DEMO"
  wait "$DEMO" 2>/dev/null || true
  DEMO=

  read -r frames bytes < <(acknowledged "$FOLDER/card.log")
  mapfile -t files < <(find "$FOLDER/work/Data" -name '*.rec')
  expect_equal "files" 16 "${#files[@]}"
  expect "round $round: only $frames frames were delivered" test "$frames" -gt 100
  intra=$(cat "${files[@]}" | LC_ALL=C grep -aoP "$STREAM_HEADER_BEGINS" | wc -l)
  written=$(($(cat "${files[@]}" | wc -c) - 16 * RECORD_HEADER_BYTES))
  # The last intra frame may be the one that is cut off.
  least=$((bytes + (intra - 1) * STREAM_HEADER_BYTES))
  expect "round $round: $least bytes delivered, only $written in the files" test "$written" -ge "$least"
  found=0
  for file in "${files[@]}"; do
    IFS=, read -r good all < <(packets "$file")
    found=$((found + all))
    expect "round $round: $file: $good of $all frames decode" test "$((all - good))" -le 1
  done
  expect "round $round: $frames frames delivered, $found in the files" \
    test "$found" -ge "$frames" -a "$found" -le $((frames + 1))
done
