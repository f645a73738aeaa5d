#!/usr/bin/env bash
# zarvo_export on small trees of recordings, made from streams of the card. What ffmpeg reads from a clip is
# compared with the frames of the recordings.
. "$(dirname "$0")/common.sh"

ROOT=$FOLDER/Data
VIDEO=$ROOT/Video/20261125/CH03
AUDIO=$ROOT/Audio/20261125/CH02
RECORDED=$FOLDER/stream
mkdir -p "$VIDEO" "$AUDIO"

# record SECONDS OPTION...: a stream of channel 3, and where its groups begin in it. A slow machine takes longer for as
# many groups.
record() {
  local seconds
  for seconds in "$1" $(($1 * 2)) $(($1 * 4)); do
    rm -rf "$RECORDED"
    "${ON_CARD[@]}" "$ZARVO_RECORD" --channels 3 --audio 2 --output "$RECORDED" --seconds "$seconds" "${@:2}" >/dev/null 2>&1 || true
    mv "$RECORDED"/ch03.* "$RECORDED/video"
    mapfile -t GROUPS_AT < <(LC_ALL=C grep -obUaP '\x00\x00\x01\x00\x00\x00\x01\x20|\xff\xd8\xff\xdb' "$RECORDED/video" | cut -d : -f 1)
    GROUPS_AT+=("$(stat -c %s "$RECORDED/video")")
    [ ${#GROUPS_AT[@]} -lt "$1" ] || return 0
  done
}

# header CODEC WIDTH HEIGHT RATE: the header of a recording.
header() {
  local number
  printf '%s' "$1"
  for number in "$2" "$3" "$4"; do
    # shellcheck disable=SC2059 # a format with escapes
    printf "$(printf '\\x%02x\\x%02x\\0\\0' $((number & 255)) $((number >> 8)))"
  done
  printf 'Channel 3\0\0\0\0\0\0\0'
}

bytes() { head -c "${GROUPS_AT[$2]}" "$RECORDED/video" | tail -c +$((GROUPS_AT[$1] + 1)); }

# part NAME FIRST END: a recording of the groups from FIRST up to END, which is not in it.
HEADER=(MPG4 352 240 30)
part() { { header "${HEADER[@]}"; bytes "$2" "$3"; } >"$VIDEO/$1.rec"; }

# index NAME FIRST END TIME MOTION: its index. A group lasts 1001 ms; MOTION lists the groups with motion.
index() {
  local at=$((10#$(date -d "2026-11-25 $4" +%s) * 1000)) group offset frames=0 moved=0
  {
    echo "{\"event\":\"start\",\"time\":$at,\"offset\":32,\"standard\":\"ntsc\",\"rate\":\"30\",\"fields\":1,\"audio\":[2]}"
    for ((group = $2; group <= $3; group++)); do
      offset=$((32 + GROUPS_AT[group] - GROUPS_AT[$2]))
      [ "$group" -lt "$3" ] && echo -n '{"intra":true' || echo -n '{"event":"stop"'
      echo ",\"time\":$at,\"offset\":$offset,\"frames\":$frames,\"bytes\":0,\"motion\":$moved,\"lost\":0}"
      frames=30 moved=0 at=$((at + 1001))
      [[ " ${5:-} " != *" $group "* ]] || moved=7
    done
  } >"$VIDEO/$1.idx"
}

# hour_tree: channel 3 from 13:59:58 on: two groups in hour 13, two in hour 14, two in its second part, which
# begins at 14:00:06, and the others from 15:00:00 on.
hour_tree() {
  part 20261125-13 0 2 && index 20261125-13 0 2 13:59:58 "${1:-}"
  part 20261125-14 2 4 && index 20261125-14 2 4 14:00:00 "${1:-}"
  part 20261125-14.1 4 6 && index 20261125-14.1 4 6 14:00:06 "${1:-}"
  part 20261125-15 6 8 && index 20261125-15 6 8 15:00:00 "${1:-}"
}

# hashes INPUT...: a line for each frame that ffmpeg reads.
hashes() { ffmpeg -nostdin -v error "$@" -map 0:v -c copy -f framehash - | sed -n 's/^[^#].*, *//p'; }
source_hashes() {
  bytes "$1" "$2" >"$FOLDER/source"
  hashes -f "${3:-m4v}" -i "$FOLDER/source"
}
entry() { ffprobe -v error -select_streams "$1" -show_entries "$2" -of default=nw=1:nk=1 "$3"; }
# times CLIP: the times of its frames in milliseconds.
times() { entry v packet=pts_time "$1" | awk '{ printf "%.0f\n", $1 * 1000 }'; }

# export_clip STATUS ARGUMENT...: the program must end with that status. Standard error goes to a file.
export_clip() {
  local expected=$1 status=0
  shift
  "$ZARVO_EXPORT" "$@" >"$FOLDER/out" 2>"$FOLDER/errors" || status=$?
  expect_equal "status of zarvo_export $* ($(cat "$FOLDER/errors"))" "$expected" "$status"
}
says() { expect "no line '$1' but: $(cat "$FOLDER/errors")" grep -q -- "$1" "$FOLDER/errors"; }
RANGE=(--root "$ROOT" --channel 3 --from '2026-11-25 13:59' --to)

case $1 in
  # Two hours and a part. Catches: a frame missing or doubled where files meet; a gap that closes; a wrong rate,
  # shape or date; samples that move against the pictures.
  range)
    record 9
    hour_tree
    for hour in 13 14 14.1 15; do head -c 6000 "$RECORDED/audio2.g726" >"$AUDIO/20261125-$hour.aud"; done
    for type in mkv mp4; do
      clip=$FOLDER/clip.$type
      export_clip 3 "${RANGE[@]}" 15:30 --audio 2 "$clip"
      says 'no pictures from 2026-11-25 14:00:02 to 2026-11-25 14:00:06, for 4.00 seconds'
      expect_equal "frames of $type" "$(source_hashes 0 8)" "$(hashes -i "$clip")"
      expect_equal "errors of $type" '' "$(ffmpeg -nostdin -v error -i "$clip" -f null - 2>&1)"
      expect_equal "shape of $type" 4:3 "$(entry v stream=display_aspect_ratio "$clip")"
      expect_equal "date of $type" 2026-11-25T13:59:58.000000Z "$(entry v format_tags=creation_time "$clip")"
      expect_equal "title of $type" 'Channel 3, 2026-11-25 13:59:58' "$(entry v format_tags=title "$clip")"
      # Where the hour changes nothing is missing; the parts begin 8 and 3602 seconds, in whole periods, after the first frame.
      expect_equal "times of $type" '0 33 1969 2002 8008 3601998' \
        "$(times "$clip" | sed -n '1p;2p;60p;61p;121p;181p' | paste -s -d ' ')"
    done
    expect_equal "rate" 30000/1001 "$(entry v stream=avg_frame_rate "$FOLDER/clip.mkv")"
    cat "$AUDIO"/20261125-{13,14,14.1,15}.aud >"$FOLDER/samples"
    ffmpeg -nostdin -v error -i "$FOLDER/clip.mkv" -map 0:a -c copy -f data - | cmp - "$FOLDER/samples"
    expect_equal "times of the samples" '3.984000 8.000000 9.984000 3602.000000' \
      "$(entry a packet=pts_time "$FOLDER/clip.mkv" | sed -n '250p;251p;375p;376p' | paste -s -d ' ')"
    expect_equal "codec of the samples in mp4" aac "$(entry a stream=codec_name "$FOLDER/clip.mp4")"
    while read -r second expected; do
      peak=$(ffmpeg -nostdin -i "$FOLDER/clip.mp4" -map 0:a -af "atrim=start=$second:duration=0.5,volumedetect" -f null - 2>&1 |
        sed -n 's/.*max_volume: \(.*\)\.. dB/\1/p')
      expect_equal "sound at $second s, $peak dB" "$expected" "$([ "$peak" -lt -60 ] && echo silent || echo loud)"
    done <<<$'9 loud\n100 silent\n3603 loud'

    # From the intra frame at or before --from, up to --to.
    export_clip 3 --root "$ROOT" --channel 3 --from '2026-11-25 14:00:01' --to 14:00:07 "$FOLDER/short.mkv"
    expect_equal "frames of six seconds" "$(source_hashes 2 5)" "$(hashes -i "$FOLDER/short.mkv")"

    # Recordings by name, without indexes: one after the other.
    rm "$VIDEO"/*.idx
    export_clip 0 "$VIDEO"/20261125-14.rec "$VIDEO"/20261125-14.1.rec "$FOLDER/files.mp4"
    says '14.rec has no index: its times count from 2026-11-25 14:00:00, the start of its hour'
    expect_equal "frames of two files" "$(source_hashes 2 6)" "$(hashes -i "$FOLDER/files.mp4")"
    # The dialog was started at 15:29:58 and stopped two seconds later.
    touch -d '2026-11-25 15:30:00' "$VIDEO/20261125-15.rec"
    export_clip 0 --root "$ROOT" --channel 3 --from '2026-11-25 15:29:59' --to 15:35 "$FOLDER/dialog.mkv"
    expect_equal "frames of the last second" "$(source_hashes 7 8)" "$(hashes -i "$FOLDER/dialog.mkv")"
    says 'nothing is recorded after 2026-11-25 15:30:00'
    expect "a line about the start" test "$(grep -c before "$FOLDER/errors")" -eq 0
    expect_equal "date of the dialog's" 2026-11-25T15:29:58.999000Z "$(entry v format_tags=creation_time "$FOLDER/dialog.mkv")"
    expect_equal "rate of two files" 30000/1001 "$(entry v stream=avg_frame_rate "$FOLDER/files.mp4")"
    ;;

  # Sizes, codecs and rates that the encoder offers. The second column is the header; two fields make twice the rate.
  formats)
    while read -r options codec width height label rate two_fields; do
      # shellcheck disable=SC2086 # options are words
      record 2 ${options//,/ }
      HEADER=("$codec" "$width" "$height" "$label")
      part 20261125-13 0 ${#GROUPS_AT[@]}-1
      for type in mkv mp4; do
        # shellcheck disable=SC2086 # an option or nothing
        export_clip 0 $two_fields "$VIDEO/20261125-13.rec" "$FOLDER/$label.$type" --force
        expect_equal "frames of $options" "$(source_hashes 0 ${#GROUPS_AT[@]}-1 "$([ "$codec" = MPG4 ] && echo m4v || echo mjpeg)")" "$(hashes -i "$FOLDER/$label.$type")"
        expect_equal "shape of $options in $type" "$width $height 4:3" \
          "$(entry v stream=width,height,display_aspect_ratio "$FOLDER/$label.$type" | paste -s -d ' ')"
        # Matroska stores the length of a period in nanoseconds.
        got=$(entry v stream=avg_frame_rate "$FOLDER/$label.$type")
        [ "$type" = mp4 ] || got=$(awk "BEGIN { if ((($got) / ($rate) - 1) ^ 2 < 1e-12) print \"$rate\"; else print \"$got\" }")
        expect_equal "rate of $options in $type" "$rate" "$got"
      done
    done <<'TABLE'
--codec,mjpeg                   MJPG 352 240 22 22500/1001
--scale,d1,--standard,pal       MPG4 720 576 20 20/1
--scale,d1,--standard,pal       MPG4 720 576 16 50/3
--scale,half-d1                 MPG4 720 240 30 60000/1001 --two-fields
TABLE
    ;;

  # Catches: a damaged frame in the clip; a frame that moves in time because one before it is skipped; a clip that
  # is silent about what it lacks.
  damage)
    record 9
    hour_tree
    rm "$VIDEO/20261125-14.1.idx"
    truncate -s -100 "$VIDEO/20261125-14.1.rec"                                                # torn
    hole=$((32 + GROUPS_AT[1] + 15 * (GROUPS_AT[2] - GROUPS_AT[1]) / 30))                      # not on the disk
    dd if=/dev/zero of="$VIDEO/20261125-13.rec" bs=1 seek=$hole count=64 conv=notrunc status=none
    { header "${HEADER[@]}"; head -c 5000 /dev/zero; bytes 6 8; } >"$VIDEO/20261125-15.rec"      # garbage in front
    HEADER=(MPG4 704 480 30)
    part 20261125-15.1 0 1 # another size
    HEADER=(MPG4 352 240 30)
    export_clip 3 "${RANGE[@]}" 17:30 "$FOLDER/clip.mkv"
    says '13.rec: the frame at byte [0-9]* is damaged: 1[0-9] frames skipped'
    says '14.1.rec: the frame at byte [0-9]*, the last one, is torn'
    says '15.rec: bytes 32 to 5032 belong to no intra frame'
    says '15.1.rec: skipped, its size'
    says 'no recording of channel 3 from 2026-11-25 16:00:00 to 2026-11-25 18:00:00'
    expect_equal "errors" '' "$(ffmpeg -nostdin -v error -i "$FOLDER/clip.mkv" -f null - 2>&1)"
    expect_equal "frames that are not in the recordings" '' \
      "$(comm -13 <(source_hashes 0 8 | sort) <(hashes -i "$FOLDER/clip.mkv" | sort))"
    kept=$(times "$FOLDER/clip.mkv")
    source=$(source_hashes 0 8 | wc -l) # a slow machine misses frames
    expect "$(wc -w <<<"$kept") of $source frames" test "$(wc -w <<<"$kept")" -ge $((source - 21))
    expect "the frame behind the damaged ones has moved" grep -qx 2002 <<<"$kept"

    # Only a decoder sees this.
    part 20261125-13 0 2
    head -c 400 /dev/urandom | dd of="$VIDEO/20261125-13.rec" bs=1 seek=$hole conv=notrunc status=none
    export_clip 3 --check "$VIDEO/20261125-13.rec" "$FOLDER/checked.mkv"
    expect_equal "errors of what was checked" '' "$(ffmpeg -nostdin -v error -i "$FOLDER/checked.mkv" -f null - 2>&1)"
    ;;

  # Groups 1, 4 and 5 have motion. Two seconds around them: groups 0 to 3 from the one, and 4 and 5; group 3 ends
  # two seconds before group 4 begins.
  motion)
    record 9
    hour_tree '1 4 5'
    export_clip 0 "${RANGE[@]}" 15:30 --motion "$FOLDER/clip.mp4"
    expect_equal "frames with motion" "$(source_hashes 0 6)" "$(hashes -i "$FOLDER/clip.mp4")"
    expect_equal "time of group 4" 4004 "$(times "$FOLDER/clip.mp4" | sed -n 121p)"
    rm -r "$VIDEO" && mkdir "$VIDEO"
    hour_tree
    export_clip 1 "${RANGE[@]}" 15:30 --motion "$FOLDER/still.mp4"
    says 'there is no motion'
    rm "$VIDEO"/*.idx
    export_clip 1 "${RANGE[@]}" 15:30 --motion "$FOLDER/still.mp4"
    says '15.rec: no index tells of motion'
    ;;

  list)
    record 9
    hour_tree '1 4 5'
    echo "{\"event\":\"gap\",\"time\":$(date -d '2026-11-25 15:00:02' +%s)000,\"offset\":32,\"ms\":1500}" >>"$VIDEO/20261125-15.idx"
    echo '{"intra":true,"ti' >>"$VIDEO/20261125-15.idx"
    part 20261125-16 0 1
    head -c 6000 "$RECORDED/audio2.g726" >"$AUDIO/20261125-14.1.aud"
    export_clip 0 --root "$ROOT" --list
    for line in 'channel 3 *2026-11-25 14:00:06  2026-11-25 14:00:08 *0:00:02 *0:00:02 *0 *0:00:00  .*14.1.rec' \
      'channel 3 *2026-11-25 15:00:00 .* 1 *0:00:01  .*15.rec' 'channel 3 .* no index .*16.rec' 'audio 2 *2026-11-25 14:00:06  2026-11-25 14:00:08 *0:00:02'; do
      expect "no line '$line': $(cat "$FOLDER/out")" grep -q "^$line" "$FOLDER/out"
    done
    export_clip 0 --root "$ROOT" --json --from '2026-11-25 14:30'
    expect "the hour before is listed" test "$(grep -c '"file"' "$FOLDER/out")" -eq 2
    expect "no gap in: $(cat "$FOLDER/out")" grep -q '"seconds": 1.5' "$FOLDER/out"
    export_clip 0 --root "$ROOT" --svg "$FOLDER/picture.svg"
    convert "$FOLDER/picture.svg" "$FOLDER/picture.png" # fails for a file that is no SVG
    export_clip 1 --root "$ROOT" --svg "$FOLDER/picture.svg"
    ;;

  # Nothing but a whole clip appears under its name.
  output)
    record 3
    part 20261125-13 0 2
    file=$VIDEO/20261125-13.rec
    while IFS='|' read -r status pattern arguments; do
      eval "export_clip $status $arguments"
      says "$pattern"
    done <<'TABLE'
2|neither .mkv nor .mp4|"$file" "$FOLDER/clip.avi"
2|'14' is not a time such as|--root "$ROOT" --from 14 "$FOLDER/clip.mkv"
2|--to is not behind --from|--root "$ROOT" --from "2026-11-25 14:00" --to "2026-11-25 13:00" "$FOLDER/clip.mkv"
2|needs --from and --to|--root "$ROOT" --channel 3 "$FOLDER/clip.mkv"
2|number from 1 to 16|--root "$ROOT" --channel 17 "$FOLDER/clip.mkv"
1|Video is not a folder|--root "$FOLDER" --channel 3 --from "2026-11-25 14:00" --to 15:00 "$FOLDER/clip.mkv"
1|no recording header|"$0" "$FOLDER/clip.mkv"
1|No such file or directory|"$file" "$FOLDER/missing/clip.mkv"
TABLE
    expect_equal "files left behind" "Data errors out stream" "$(cd "$FOLDER" && echo *)"

    export_clip 0 "$file" "$FOLDER/clip.mkv"
    export_clip 1 "$file" "$FOLDER/clip.mkv"
    says 'clip.mkv exists; --force overwrites it'
    export_clip 0 --force "$file" "$FOLDER/clip.mkv"

    # Stopped in the middle, and out of room.
    # shellcheck disable=SC2046 # words
    "$ZARVO_EXPORT" $(yes "$file" | head -n 5000) "$FOLDER/long.mkv" 2>"$FOLDER/errors" &
    expect "the export does not begin" wait_until 20 test -s "$FOLDER/long.mkv.part"
    kill -TERM $! && wait $! && die "a stopped export succeeds"
    says 'stopped; no clip is written'
    # shellcheck disable=SC2046 # words
    (ulimit -f 100 && trap '' XFSZ && export_clip 1 $(yes "$file" | head -n 5) "$FOLDER/long.mkv")
    says 'File too large'
    expect_equal "files left behind" "Data clip.mkv errors out stream" "$(cd "$FOLDER" && echo *)"
    ;;
esac
