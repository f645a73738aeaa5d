#!/usr/bin/env bash
# zarvo_record --output - writes one stream to standard output and nothing else.
. "$(dirname "$0")/common.sh"

RECORD=("${ON_CARD[@]}" "$ZARVO_RECORD" --channels 3 --output -)

# Catches: a line of the program or of the SDK in the stream.
"${RECORD[@]}" --seconds 2 2>"$FOLDER/log" >"$FOLDER/all.m4v" || [ $? -eq 3 ] || die "$(cat "$FOLDER/log")"
expect_decodes "$FOLDER/all.m4v"
told=$(sed -nE 's/^ch03.m4v: ([0-9]+) frames, .*/\1/p' "$FOLDER/log")
expect_equal "frames in the stream and in its line" "$told" "$(decoded_frames "$FOLDER/all.m4v")"

# A reader that has enough ends the recording, and that is no failure.
"${RECORD[@]}" --seconds 0 2>"$FOLDER/log" | head -c 20000 >"$FOLDER/part" || die "status ${PIPESTATUS[*]}"

# Catches: a recorder that waits for ever for a reader that does not read, at SIGTERM or when its time is over.
mkfifo "$FOLDER/pipe"
exec 3<>"$FOLDER/pipe"
for seconds in 0 3; do
  "${RECORD[@]}" --codec mjpeg --seconds $seconds 2>"$FOLDER/log" >"$FOLDER/pipe" &
  recorder=$!
  sleep 2 # until the pipe is full: 64 KiB
  [ $seconds -gt 0 ] || kill -TERM "$recorder"
  expect "the recorder does not end" wait_until 20 process_gone "$recorder"
done
