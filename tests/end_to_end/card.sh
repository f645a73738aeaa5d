#!/usr/bin/env bash
# zarvo_card beside a running program: it changes what the operator sees, and shows what the program does.
#   card.sh log      the log of a recording; the table of items in the documentation
#   card.sh window   a camera is lost and comes back in each of the six layouts of the preview; a snapshot
. "$(dirname "$0")/common.sh"

export ZARVO_CARD_SOCKET=$FOLDER/card ZARVO_VIRTUAL_CARD=control=$FOLDER/card
card() { "$ZARVO_CARD_PROGRAM" "$@"; }

show_log() {
  local expected
  diff <(card --list) <(sed -n '/^| item /,/^$/p' "$ZARVO_ROOT/docs/virtual-card.md" | sed '$d') ||
    die "the table in docs/virtual-card.md is not the one of zarvo_card --list"

  # The item slow delays each call, so the log begins before the recording starts.
  ZARVO_VIRTUAL_CARD+=';slow=20' "${ON_CARD[@]}" "$ZARVO_RECORD" --seconds 2 --channels 3 --audio 1 --output "$FOLDER/out" >/dev/null &
  expect "no socket appeared" wait_until 20 test -S "$FOLDER/card"
  card log --no-reads --only encoder >"$FOLDER/log" &
  expect "the log stays empty" wait_until 20 test -s "$FOLDER/log"
  card slow=
  expect "no state" grep -qx 'standard NTSC' <(card state)
  expect "a wrong item is not refused" grep -q 'expected: channels 1-16' <(card lost=17 2>&1 || true)
  expect_equal "kicks in the counters" 0 "$(card --json counters | sed -n 's/.*"kicks": \([0-9]*\).*/\1/p')"
  wait # the log ends with the card
  expect "the socket is left over" test ! -e "$FOLDER/card"
  expected='SET_SCALE channel=2 value=2|SET_GOP channel=2 value=30|ENC_IOC_START = 0|SET_SCALE channel=2 value=0|ENC_IOC_STOP = 0|encoder close = 0'
  expect_equal "order of the commands" "$expected" \
    "$(grep -oE "$expected" "$FOLDER/log" | uniq | paste -sd '|')"
}

# area_of CHANNEL: the area of its window in the preview: x y x_end y_end.
area_of() {
  card state | awk -v channel="$1" '
    $1 ~ /^window.*channel$/ { found = ($2 == channel) }
    $1 ~ /^window.*area$/ && found { gsub(",", " ", $2); print $2; exit }'
}

# colour: "blue" when the middle of the area (x y x_end y_end) of the preview window is blue, else "other".
colour() {
  local mean
  mean=$(import -silent -window "$PREVIEW" -crop "$(($3 - $1 - 40))x$(($4 - $2 - 40))+$(($1 + 20))+$(($2 + 20))" +repage \
    -format '%[fx:mean.b>0.5&&mean.r<0.3&&mean.g<0.3&&standard_deviation<0.1]' info:)
  if [ "$mean" = 1 ]; then echo blue; else echo other; fi
}
# shellcheck disable=SC2086,SC2317 # the area is four words; called by wait_until
is_blue() { [ "$(colour $AREA)" = blue ]; }
# shellcheck disable=SC2317 # called by wait_until
is_not_blue() { ! is_blue; }

lose_in_each_layout() {
  local split
  open_program
  click btnPreviewStart
  wait_preview
  enter edtFocus 3
  click btnSetFocus
  for split in 1 4 6 8 9 16; do
    click "btnSplit$split"
    AREA=
    area_known() { AREA=$(area_of 3) && [ -n "$AREA" ]; }
    expect "channel 3 has no window in $split" wait_until 10 area_known
    expect "camera 3 is blue in $split before it is lost" wait_until 10 is_not_blue
    card lost=3
    expect "camera 3 does not turn blue in $split" wait_until 10 is_blue
    [ -z "${ZARVO_SHOTS:-}" ] || picture "$PREVIEW" "$ZARVO_SHOTS/lost-$split.png"
    card lost=
    expect "camera 3 does not come back in $split" wait_until 10 is_not_blue
  done
  card snapshot 3 "$FOLDER/three.png"
  expect_equal "size of the snapshot" 720x480 "$(identify -format %wx%h "$FOLDER/three.png")"
  ! card snapshot 3 "$FOLDER/none/three.png" 2>/dev/null || die "a snapshot that cannot be written counts as done"
  end_program
}

case $1 in
  log) show_log ;;
  window) lose_in_each_layout ;;
esac
