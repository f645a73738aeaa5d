#!/usr/bin/env bash
# zarvo_recorder as a service runs it. Each case is an argument.
. "$(dirname "$0")/common.sh"

ROOT=$FOLDER/root
DAY=20261125
RECORDER=
OUT=$FOLDER/stdout
ERR=$FOLDER/stderr
mkdir "$ROOT"
export ZARVO_STALL=$FOLDER/stall ZARVO_CARD_SOCKET=$FOLDER/card

# small_disk: mounts a small disk as the root. Ends the test where that is not allowed.
small_disk() {
  if ! { [ "$(id -u)" -eq 0 ] && mount -t tmpfs -o size="$1" tmpfs "$ROOT" 2>/dev/null; }; then
    echo "skipped: no right to mount a small disk"
    exit 77
  fi
}
end_all() {
  [ -z "$RECORDER" ] || kill -9 "$RECORDER" 2>/dev/null || true
  while umount -l "$ROOT" 2>/dev/null; do :; done
  clean_up
}
trap end_all EXIT

# start OPTION...: starts the recorder at the time of set_clock and waits until it writes.
start() {
  local before
  before=$(bytes)
  ZARVO_PRELOAD=$ZARVO_STALLED_DISK:$(find /usr/lib -name libfaketimeMT.so.1 -print -quit)
  use_card "$CARD"
  "${ON_CARD[@]}" "$ZARVO_RECORDER" --root "$ROOT" "$@" >"$OUT" 2>"$ERR" &
  RECORDER=$!
  expect "nothing is recorded: $(cat "$ERR")" wait_until 60 grown $((before + 10000))
}

# stop: ends the recorder with SIGTERM; sets FRAMES to the video frames and LOST to the losses that it tells at
# the end.
stop() {
  local status=0 last
  kill -TERM "$RECORDER"
  wait "$RECORDER" || status=$?
  RECORDER=
  last=$(tail -n 1 "$OUT")
  [[ $last =~ ([0-9]+)\ frames.*\ ([0-9]+)\ lost ]] || die "no last line: $last"
  FRAMES=${BASH_REMATCH[1]} LOST=${BASH_REMATCH[2]}
  expect_equal "status of the recorder ($(cat "$ERR"))" $((LOST > 0 ? 3 : 0)) "$status"
}

files() { find "$ROOT" -name "*.$1" "${@:2}" | sort; }
bytes() { find "$ROOT" -name '*.rec' -printf '%s\n' | awk '{ sum += $1 } END { print sum + 0 }'; }
# grown BYTES: whether all recordings together have at least so many.
grown() { [ "$(bytes)" -ge "$1" ]; }
# goes_on: waits until the recordings have grown by some frames of all channels.
goes_on() { expect "the recording does not go on: $(cat "$ERR")" wait_until 60 grown $(($(bytes) + 200000)); }
told() { grep -qE -- "$1" "$ERR"; }
# wait_told PATTERN: waits for a line on standard error.
wait_told() { expect "no line '$1' in: $(cat "$ERR")" wait_until 60 told "$1"; }

# expect_whole: every file decodes without an error line, and all frames that came and are not lost are in the
# files.
expect_whole() {
  local file found=0
  mapfile -t all < <(files rec; files aud)
  expect_decodes "${all[@]}"
  while read -r file; do found=$((found + $(decoded_frames "$file"))); done < <(files rec)
  expect_equal "video frames in the files" $((FRAMES - VIDEO_LOST)) "$found"
}

# index_sum KEY PATTERN: the sum of a key in the index lines with the pattern.
index_sum() { files idx | xargs cat | grep -- "$2" | grep -o "\"$1\":[0-9]*" | awk -F : '{ sum += $2 } END { print sum + 0 }'; }

VIDEO_LOST=0
set_clock '2026-11-25 14:10:00'

case $1 in
  # Two changes of the hour, and a clock that goes back. The player takes a file.
  hour)
    set_clock '2026-11-25 14:59:56'
    start
    all_there() { [ "$(files "$2" -name "$DAY-$1.$2" | wc -l)" = "$3" ]; }
    expect "no files of the second hour" wait_until 60 all_there 15 rec 16
    goes_on
    set_clock '2026-11-25 16:20:00'
    expect "no files of the third hour" wait_until 60 all_there 16 aud 4
    goes_on
    set_clock '2026-11-25 14:20:00'
    expect "no further part of the first hour" wait_until 60 all_there 14.1 rec 16
    goes_on
    stop
    expect_equal "lost" 0 "$LOST"
    expect_whole
    expect_equal "recordings" 64 "$(files rec | wc -l)"
    mkdir "$FOLDER/bin"
    printf '#!/bin/sh\necho "$@" >%s\n' "$FOLDER/played" >"$FOLDER/bin/ffplay"
    chmod +x "$FOLDER/bin/ffplay"
    PATH=$FOLDER/bin:$PATH "$ZARVO_BUILD/programs/players/Videoplayer" "$ROOT/Video/$DAY/CH03/$DAY-14.1.rec"
    expect "the player does not take the rate" grep -q -- '-framerate 30 ' "$FOLDER/played"
    ;;
  # The disk takes nothing for ZARVO_STALL_SECONDS (8).
  stall)
    start
    touch "$ZARVO_STALL"
    sleep "${ZARVO_STALL_SECONDS:-8}"
    rm "$ZARVO_STALL"
    goes_on
    stop
    expect_equal "lost ($(cat "$ERR"))" 0 "$LOST"
    expect_whole
    expect_equal "losses of the card" '' "$(grep 'did not read' "$ERR" || true)"
    ;;
  # A buffer that is too small for the stall.
  overrun)
    start --buffer 1 --audio none
    touch "$ZARVO_STALL"
    wait_told 'the buffer is full'
    sleep 3
    rm "$ZARVO_STALL"
    wait_told 'channel 16: the buffer was full: [0-9]+ frames are lost'
    goes_on
    stop
    expect "nothing is lost" test "$LOST" -gt 100
    VIDEO_LOST=$LOST
    expect_whole
    expect_equal "losses in the index" "$LOST" "$(index_sum frames '"buffer"')"
    ;;
  # kill -9 at ZARVO_KILLS (3) random moments. What was in the buffer is lost: less than 50 ms on a good disk, a
  # quarter of a second here. The next start goes on in new parts and leaves the others alone.
  kill)
    for ((round = 0; round < ${ZARVO_KILLS:-3}; ++round)); do
      before=$(files rec | xargs -r sha256sum)
      ZARVO_VIRTUAL_CARD="log=$FOLDER/card.log" start
      sleep "0.$((RANDOM % 900 + 100))"
      kill -9 "$RECORDER"
      wait "$RECORDER" 2>/dev/null || true
      read -r delivered _ < <(acknowledged "$FOLDER/card.log")
      rm "$FOLDER/card.log"
      part=
      [ "$round" -eq 0 ] || part=.$round
      found=0
      for file in "$ROOT/Video/$DAY"/CH*/"$DAY-14$part.rec"; do
        IFS=, read -r good all < <(packets "$file")
        expect "round $round: $file: $good of $all frames decode" test "$((all - good))" -le 1
        found=$((found + all))
      done
      expect "round $round: $delivered frames delivered, $found in the files" \
        test "$found" -ge $((delivered - 120)) -a "$found" -le $((delivered + 1))
      [ -z "$before" ] || sha256sum --check --quiet <<<"$before"
      done
    RECORDER=
    ;;
  # The disk fills up, and the root vanishes and becomes read-only: each time the recorder says so, and loses
  # nothing that it can keep in its buffer.
  disk)
    small_disk 24m
    mkdir "$ROOT/root"
    MOUNT=$ROOT ROOT=$ROOT/root
    start
    head -c 32m /dev/zero >"$MOUNT/filler" 2>/dev/null || true
    wait_told 'recording pauses: 0.0 % of the disk is free'
    rm "$MOUNT/filler"
    wait_told 'recording goes on'
    goes_on
    mount --bind "$ROOT" "$ROOT"
    mount -o remount,bind,ro "$ROOT"
    set_clock '2026-11-26 00:10:00'
    wait_told "channel 16: .*: Read-only file system"
    umount "$ROOT"
    wait_told 'channel 16: goes on in .*00.rec'
    goes_on
    mv "$ROOT" "$ROOT.away"
    wait_told 'channel 16: .*00.rec: No such file'
    mv "$ROOT.away" "$ROOT"
    goes_on
    stop
    expect_equal "lost ($(cat "$ERR"))" 0 "$LOST"
    expect_whole
    expect "no disk error in the index" test "$(files idx | xargs cat | grep -c '"disk"')" -ge 32
    ROOT=$MOUNT
    ;;
  # The oldest hours make room, the current one stays, also while its files are paused.
  delete)
    small_disk 16m
    mkdir -p "$ROOT"/{Video,Audio}/20261120/CH01
    head -c 5m /dev/zero >"$ROOT/Video/20261120/CH01/20261120-10.rec"
    head -c 5m /dev/zero >"$ROOT/Audio/20261120/CH01/20261120-11.aud"
    start --min-free 60 --when-full delete-oldest
    wait_told 'deleted the recordings of hour 20261120-10'
    wait_told 'deleted the recordings of hour 20261120-11'
    wait_told 'recording pauses'
    expect_equal "recordings" 16 "$(files rec | wc -l)"
    set_clock '2026-11-25 15:10:00'
    wait_told 'deleted the recordings of hour 20261125-14'
    wait_told 'recording goes on'
    goes_on
    stop
    expect "an old folder stays" test ! -e "$ROOT/Video/20261120"
    expect_equal "recordings of the last hour" 16 "$(files rec -name '*-15.rec' | wc -l)"
    ;;
  # Both fields of each frame. Catches: a clip that plays at half the speed.
  fields)
    start --two-fields --channels 1-2 --audio none
    goes_on
    stop
    expect_whole
    expect_equal "indexes that tell both fields" 2 "$(files idx | xargs grep -l '"fields":2' | wc -l)"
    "$ZARVO_EXPORT" "$ROOT/Video/$DAY/CH02/$DAY-14.rec" "$FOLDER/clip.mp4" 2>"$ERR"
    of_clip() { ffprobe -v error -select_streams v -show_entries "$1" -of default=nw=1:nk=1 "$FOLDER/clip.mp4"; }
    expect_equal "rate of the clip" 60000/1001 "$(of_clip stream=r_frame_rate)"
    read -r begun ended < <(grep -oE '(start|stop)","time":[0-9]+' "$ROOT/Video/$DAY/CH02/$DAY-14.idx" |
      grep -oE '[0-9]+$' | paste -sd ' ')
    expect "a clip of $(of_clip format=duration) s of $((ended - begun)) ms" \
      awk -v clip="$(of_clip format=duration)" -v ms=$((ended - begun)) 'BEGIN { exit !(clip > ms / 1100 && clip < ms / 900) }'
    ;;
  # Cameras 1 and 2 move, 3 and 4 stand still. Catches: motion that the index does not tell, or tells where there is
  # none; a clip of what is still.
  motion)
    ZARVO_VIRTUAL_CARD='still=3,4' start --channels 1-4 --audio none
    goes_on
    stop
    for channel in 1 2 3 4; do
      status=0
      "$ZARVO_EXPORT" --root "$ROOT" --channel $channel --from '2026-11-25 14:00' --to 15:00 --motion \
        "$FOLDER/$channel.mp4" 2>"$ERR" || status=$?
      expect_equal "status for camera $channel ($(cat "$ERR"))" $((channel > 2)) "$status"
      [ "$channel" -le 2 ] || expect "camera $channel has motion: $(cat "$ERR")" told 'there is no motion'
    done
    for channel in 1 2; do
      clip_frames=$(ffprobe -v error -count_packets -show_entries stream=nb_read_packets -of default=nw=1:nk=1 "$FOLDER/$channel.mp4")
      expect "$clip_frames frames in the clip of camera $channel" test "$clip_frames" -ge 30
    done
    ;;
  # What systemd sees; a second recorder; streams that stop and go on.
  service)
    perl -MIO::Socket::UNIX -e '
      my $socket = IO::Socket::UNIX->new(Type => SOCK_DGRAM, Local => $ARGV[0]) or die; $| = 1;
      while (defined $socket->recv(my $text, 4096)) { print "$text\n" }' "$FOLDER/notify" >"$FOLDER/notified" &
    listener=$!
    expect "no socket" wait_until 20 test -S "$FOLDER/notify"
    export NOTIFY_SOCKET=$FOLDER/notify ZARVO_VIRTUAL_CARD=control=$FOLDER/card
    start --channels 1-2 --audio 2 --quiet
    status=0
    "${ON_CARD[@]}" "$ZARVO_RECORDER" --root "$ROOT" >"$FOLDER/second" 2>&1 || status=$?
    expect_equal "status of a second recorder" 1 "$status"
    expect "the second recorder is not told why" grep -q "another recorder uses $ROOT" "$FOLDER/second"
    expect "the service is not told" wait_until 20 grep -qx 'WATCHDOG=1' "$FOLDER/notified"
    "$ZARVO_CARD_PROGRAM" stall=mpeg4 stall=audio
    wait_told 'channel 2: nothing has come for'
    fed=$(grep -cx 'WATCHDOG=1' "$FOLDER/notified")
    more() { [ "$(grep -c '^STATUS=' "$FOLDER/notified")" -gt "$1" ]; }
    expect "no status" wait_until 20 more $(($(grep -c '^STATUS=' "$FOLDER/notified") + 2))
    expect_equal "feedings of the watchdog without frames" "$fed" "$(grep -cx 'WATCHDOG=1' "$FOLDER/notified")"
    "$ZARVO_CARD_PROGRAM" reset
    wait_told 'channel 2: gap of '
    wait_told 'audio input 2: gap of '
    kill -USR1 "$RECORDER"
    expect "no table" wait_until 20 grep -qE '^channel 2 +[0-9]+ +[0-9]+ ' "$OUT"
    "$ZARVO_CARD_PROGRAM" stall=mpeg4 stall=audio
    silent_again() { [ "$(grep -c 'channel 2: nothing has come for' "$ERR")" -gt 1 ]; }
    expect "the second silence is not told" wait_until 60 silent_again
    kill -TERM "$RECORDER"
    wait "$RECORDER"
    kill "$listener"
    # Catches: a silence at the end that looks recorded.
    expect "a gap is not told" test "$(grep -cE '(channel|input) 2: gap of' "$ERR")" -ge 4
    for index in $(files idx); do
      expect "no gap at the end of $(tail -n 3 "$index")" \
        grep -qzP '"gap","time":(\d+),"offset":(\d+),"ms":\d{4,}\}\n\{"event":"stop","time":\1,"offset":\2,' "$index"
    done
    expect_equal "first and last word to the service" 'READY=1 STOPPING=1' \
      "$(grep -xE 'READY=1|STOPPING=1' "$FOLDER/notified" | paste -sd ' ')"
    expect "no gap in the index" test "$(index_sum ms '"gap"')" -ge 4000
    expect_equal "files" 6 "$(find "$ROOT" -type f ! -name '.*' | wc -l)"
    for wrong in '--rate 29' '--bps 3M --qp 4' '--min-free 0' '--standard pal --rate 30' 'word' '--scale d1 --channels 1-16'; do
      status=0
      # shellcheck disable=SC2086 # options are words
      "${ON_CARD[@]}" "$ZARVO_RECORDER" --root "$ROOT" $wrong 2>"$ERR" || status=$?
      expect_equal "status for $wrong ($(cat "$ERR"))" 2 "$status"
    done
    # Catches: a recorder that waits for ever for a reader that does not read.
    mkfifo "$FOLDER/full"
    exec 3<>"$FOLDER/full"
    head -c 65536 /dev/zero >&3
    OUT=$FOLDER/full start --channels 1 --audio none
    kill -USR1 "$RECORDER"
    kill -TERM "$RECORDER"
    expect "a reader holds the recorder up" wait_until 30 process_gone "$RECORDER"
    ;;
esac
